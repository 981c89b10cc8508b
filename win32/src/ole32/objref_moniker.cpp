// Object-reference monikers. A moniker made from an object holds a reference
// to it and binds to it directly; its display name is "objref:" + Base64 of a
// normal marshal packet + ":", a new packet each time, so each name binds
// once. MkParseDisplayName turns such a name (prefix in any case) back into a
// moniker that holds the packet and unmarshals it when bound: a forged or
// stale name fails then, with the marshalling's error, and nothing is
// dereferenced. Other texts are MK_E_SYNTAX. Composition, inversion, relative
// paths, times of change, persistence and parsing through the moniker are
// E_NOTIMPL.
#include "ref_counted.h"

#include <vkwin32/kernel.h>
#include <vkwin32/objbase.h>

#include <boost/beast/core/detail/base64.hpp>

#include <cstring>
#include <functional>
#include <new>
#include <string>
#include <vector>

namespace {

const CLSID clsidObjrefMoniker = {0x00000327, 0x0000, 0x0000, {0xC0, 0, 0, 0, 0, 0, 0, 0x46}};

// Answered only by this file's monikers, to recognise them in IsEqual.
const IID iidObjrefMonikerSelf = {
    0x5D0B6C31, 0x8E2A, 0x4F67, {0x9B, 0x1E, 0x3C, 0x74, 0xA2, 0x05, 0xD8, 0x19}};

const char16_t prefix[] = u"objref:";
const size_t prefixLength = sizeof prefix / sizeof prefix[0] - 1;

namespace base64 = boost::beast::detail::base64;

// The identity of an object: its IUnknown, without keeping a reference.
IUnknown* Identity(IUnknown* object) {
    IUnknown* identity = nullptr;
    if (FAILED(object->QueryInterface(IID_IUnknown, reinterpret_cast<void**>(&identity))))
        return object;
    identity->Release();
    return identity;
}

// Marshals the object into a normal packet.
HRESULT MarshalPacket(IUnknown* object, std::vector<unsigned char>* packet) {
    IStream* stream = nullptr;
    HRESULT result = CreateStreamOnHGlobal(nullptr, TRUE, &stream);
    if (FAILED(result))
        return result;
    result =
        CoMarshalInterface(stream, IID_IUnknown, object, MSHCTX_INPROC, nullptr, MSHLFLAGS_NORMAL);
    if (SUCCEEDED(result)) {
        HGLOBAL block = nullptr;
        GetHGlobalFromStream(stream, &block);
        STATSTG stat;
        result = stream->Stat(&stat, STATFLAG_NONAME);
        const unsigned char* data = static_cast<const unsigned char*>(GlobalLock(block));
        if (SUCCEEDED(result) && data) {
            try {
                packet->assign(data, data + stat.cbSize.QuadPart);
            } catch (const std::bad_alloc&) {
                result = E_OUTOFMEMORY;
            }
        } else if (SUCCEEDED(result)) {
            result = E_UNEXPECTED;
        }
        if (data)
            GlobalUnlock(block);
        if (FAILED(result)) {
            // The packet is lost: release what it named.
            LARGE_INTEGER start{};
            stream->Seek(start, STREAM_SEEK_SET, nullptr);
            CoReleaseMarshalData(stream);
        }
    }
    stream->Release();
    return result;
}

HRESULT UnmarshalPacket(const std::vector<unsigned char>& packet, REFIID riid, void** object) {
    IStream* stream = nullptr;
    HRESULT result = CreateStreamOnHGlobal(nullptr, TRUE, &stream);
    if (FAILED(result))
        return result;
    ULONG written = 0;
    result = stream->Write(packet.data(), static_cast<ULONG>(packet.size()), &written);
    if (SUCCEEDED(result)) {
        LARGE_INTEGER start{};
        result = stream->Seek(start, STREAM_SEEK_SET, nullptr);
    }
    if (SUCCEEDED(result))
        result = CoUnmarshalInterface(stream, riid, object);
    stream->Release();
    return result;
}

// "objref:" + Base64 + ":" as task memory.
HRESULT DisplayName(const std::vector<unsigned char>& packet, LPOLESTR* name) {
    std::string encoded(base64::encoded_size(packet.size()), '\0');
    encoded.resize(base64::encode(&encoded[0], packet.data(), packet.size()));
    size_t length = prefixLength + encoded.size() + 1;
    auto* text = static_cast<LPOLESTR>(CoTaskMemAlloc((length + 1) * sizeof(OLECHAR)));
    if (!text)
        return E_OUTOFMEMORY;
    std::memcpy(text, prefix, prefixLength * sizeof(OLECHAR));
    for (size_t i = 0; i < encoded.size(); ++i)
        text[prefixLength + i] = static_cast<OLECHAR>(encoded[i]);
    text[length - 1] = u':';
    text[length] = u'\0';
    *name = text;
    return S_OK;
}

// The characters of an objref name at the start of text, or 0 when there is
// none there; its packet in packet.
size_t ParseName(LPCOLESTR text, std::vector<unsigned char>* packet) {
    for (size_t i = 0; i < prefixLength; ++i) {
        OLECHAR c = text[i];
        if (c >= u'A' && c <= u'Z')
            c = static_cast<OLECHAR>(c - u'A' + u'a');
        if (c != prefix[i])
            return 0; // also stops at the terminator
    }
    std::string encoded;
    size_t end = prefixLength;
    for (; text[end] != u':'; ++end) {
        OLECHAR c = text[end];
        if (c == u'\0' || c >= 0x80)
            return 0;
        encoded.push_back(static_cast<char>(c));
    }
    // Padded Base64 only: whole groups of four, '=' only at the end.
    size_t padding = 0;
    while (padding < 2 && padding < encoded.size() && encoded[encoded.size() - 1 - padding] == '=')
        ++padding;
    if (encoded.empty() || encoded.size() % 4 != 0)
        return 0;
    packet->resize(base64::decoded_size(encoded.size()));
    auto decoded = base64::decode(packet->data(), encoded.data(), encoded.size());
    if (decoded.second != encoded.size() - padding)
        return 0;
    packet->resize(decoded.first);
    return end + 1;
}

class ObjrefMoniker final : public vkw32::RefCounted<IMoniker> {
public:
    // Holds a reference to the object.
    explicit ObjrefMoniker(IUnknown* object) : object_(object) { object_->AddRef(); }

    // Holds a packet read from a display name.
    explicit ObjrefMoniker(std::vector<unsigned char> packet) : packet_(std::move(packet)) {}

    ~ObjrefMoniker() {
        if (object_)
            object_->Release();
    }

    ObjrefMoniker(const ObjrefMoniker&) = delete;
    ObjrefMoniker& operator=(const ObjrefMoniker&) = delete;

    HRESULT STDMETHODCALLTYPE QueryInterface(REFIID riid, void** object) override {
        if (!object)
            return E_POINTER;
        if (riid == IID_IUnknown || riid == IID_IPersist || riid == IID_IPersistStream ||
            riid == IID_IMoniker || riid == iidObjrefMonikerSelf) {
            *object = static_cast<IMoniker*>(this);
            AddRef();
            return S_OK;
        }
        *object = nullptr;
        return E_NOINTERFACE;
    }

    HRESULT STDMETHODCALLTYPE GetClassID(CLSID* pClassID) override {
        if (!pClassID)
            return E_POINTER;
        *pClassID = clsidObjrefMoniker;
        return S_OK;
    }

    HRESULT STDMETHODCALLTYPE IsDirty() override { return S_FALSE; }

    HRESULT STDMETHODCALLTYPE Load(IStream*) override { return E_NOTIMPL; }

    HRESULT STDMETHODCALLTYPE Save(IStream*, BOOL) override { return E_NOTIMPL; }

    HRESULT STDMETHODCALLTYPE GetSizeMax(ULARGE_INTEGER*) override { return E_NOTIMPL; }

    HRESULT STDMETHODCALLTYPE BindToObject(IBindCtx* pbc, IMoniker* pmkToLeft, REFIID riidResult,
                                           void** ppvResult) override {
        if (!ppvResult)
            return E_POINTER;
        *ppvResult = nullptr;
        if (!pbc)
            return E_INVALIDARG;
        if (pmkToLeft)
            return E_NOTIMPL; // an objref moniker names its object alone
        if (object_)
            return object_->QueryInterface(riidResult, ppvResult);
        return UnmarshalPacket(packet_, riidResult, ppvResult);
    }

    HRESULT STDMETHODCALLTYPE BindToStorage(IBindCtx* pbc, IMoniker* pmkToLeft, REFIID riid,
                                            void** ppvObj) override {
        return BindToObject(pbc, pmkToLeft, riid, ppvObj);
    }

    HRESULT STDMETHODCALLTYPE Reduce(IBindCtx*, DWORD, IMoniker** ppmkToLeft,
                                     IMoniker** ppmkReduced) override {
        if (ppmkToLeft)
            *ppmkToLeft = nullptr;
        if (!ppmkReduced)
            return E_POINTER;
        AddRef();
        *ppmkReduced = this;
        return MK_S_REDUCED_TO_SELF;
    }

    HRESULT STDMETHODCALLTYPE ComposeWith(IMoniker*, BOOL, IMoniker** ppmkComposite) override {
        if (ppmkComposite)
            *ppmkComposite = nullptr;
        return E_NOTIMPL;
    }

    // A simple moniker has no parts to enumerate.
    HRESULT STDMETHODCALLTYPE Enum(BOOL, IEnumMoniker** ppenumMoniker) override {
        if (!ppenumMoniker)
            return E_POINTER;
        *ppenumMoniker = nullptr;
        return S_OK;
    }

    HRESULT STDMETHODCALLTYPE IsEqual(IMoniker* pmkOtherMoniker) override {
        if (!pmkOtherMoniker)
            return E_INVALIDARG;
        IMoniker* other = nullptr;
        if (FAILED(pmkOtherMoniker->QueryInterface(iidObjrefMonikerSelf,
                                                   reinterpret_cast<void**>(&other))))
            return S_FALSE;
        auto* ours = static_cast<ObjrefMoniker*>(other);
        bool same = ours == this;
        if (!same && object_ && ours->object_)
            same = Identity(object_) == Identity(ours->object_);
        else if (!same && !object_ && !ours->object_)
            same = packet_ == ours->packet_;
        other->Release();
        return same ? S_OK : S_FALSE;
    }

    HRESULT STDMETHODCALLTYPE Hash(DWORD* pdwHash) override {
        if (!pdwHash)
            return E_POINTER;
        size_t hash;
        if (object_) {
            hash = std::hash<IUnknown*>()(Identity(object_));
        } else {
            hash = std::hash<std::string>()(std::string(packet_.begin(), packet_.end()));
        }
        *pdwHash = static_cast<DWORD>(hash ^ (static_cast<std::uint64_t>(hash) >> 32));
        return S_OK;
    }

    HRESULT STDMETHODCALLTYPE IsRunning(IBindCtx*, IMoniker*, IMoniker*) override {
        return E_NOTIMPL;
    }

    HRESULT STDMETHODCALLTYPE GetTimeOfLastChange(IBindCtx*, IMoniker*, FILETIME*) override {
        return E_NOTIMPL;
    }

    HRESULT STDMETHODCALLTYPE Inverse(IMoniker** ppmk) override {
        if (ppmk)
            *ppmk = nullptr;
        return E_NOTIMPL;
    }

    HRESULT STDMETHODCALLTYPE CommonPrefixWith(IMoniker*, IMoniker** ppmkPrefix) override {
        if (ppmkPrefix)
            *ppmkPrefix = nullptr;
        return E_NOTIMPL;
    }

    HRESULT STDMETHODCALLTYPE RelativePathTo(IMoniker*, IMoniker** ppmkRelPath) override {
        if (ppmkRelPath)
            *ppmkRelPath = nullptr;
        return E_NOTIMPL;
    }

    HRESULT STDMETHODCALLTYPE GetDisplayName(IBindCtx* pbc, IMoniker*,
                                             LPOLESTR* ppszDisplayName) override {
        if (!ppszDisplayName)
            return E_POINTER;
        *ppszDisplayName = nullptr;
        if (!pbc)
            return E_INVALIDARG;
        if (!object_)
            return DisplayName(packet_, ppszDisplayName);
        std::vector<unsigned char> packet;
        HRESULT result = MarshalPacket(object_, &packet);
        if (FAILED(result))
            return result;
        result = DisplayName(packet, ppszDisplayName);
        if (FAILED(result)) {
            // Nobody can read the packet now: release what it named.
            IUnknown* unused = nullptr;
            if (SUCCEEDED(UnmarshalPacket(packet, IID_IUnknown, reinterpret_cast<void**>(&unused))))
                unused->Release();
        }
        return result;
    }

    HRESULT STDMETHODCALLTYPE ParseDisplayName(IBindCtx*, IMoniker*, LPOLESTR, ULONG* pchEaten,
                                               IMoniker** ppmkOut) override {
        if (pchEaten)
            *pchEaten = 0;
        if (ppmkOut)
            *ppmkOut = nullptr;
        return E_NOTIMPL;
    }

    HRESULT STDMETHODCALLTYPE IsSystemMoniker(DWORD* pdwMksys) override {
        if (!pdwMksys)
            return E_POINTER;
        *pdwMksys = MKSYS_OBJREFMONIKER;
        return S_OK;
    }

private:
    IUnknown* object_ = nullptr;        // a made moniker's object, one reference
    std::vector<unsigned char> packet_; // a parsed moniker's packet
};

} // namespace

extern "C" HRESULT WINAPI CreateObjrefMoniker(LPUNKNOWN object, LPMONIKER* moniker) {
    if (!moniker)
        return E_INVALIDARG;
    *moniker = nullptr;
    if (!object)
        return E_INVALIDARG;
    *moniker = new (std::nothrow) ObjrefMoniker(object);
    return *moniker ? S_OK : E_OUTOFMEMORY;
}

extern "C" HRESULT WINAPI MkParseDisplayName(LPBC bindContext, LPCOLESTR name, ULONG* eaten,
                                             LPMONIKER* moniker) {
    if (eaten)
        *eaten = 0;
    if (moniker)
        *moniker = nullptr;
    if (!bindContext || !name || !eaten || !moniker)
        return E_INVALIDARG;
    std::vector<unsigned char> packet;
    size_t length;
    try {
        length = ParseName(name, &packet);
    } catch (const std::bad_alloc&) {
        return E_OUTOFMEMORY;
    }
    if (length == 0)
        return MK_E_SYNTAX;
    if (name[length] != u'\0') {
        // Nothing may follow the name: there are no composite monikers.
        *eaten = static_cast<ULONG>(length);
        return MK_E_SYNTAX;
    }
    *moniker = new (std::nothrow) ObjrefMoniker(std::move(packet));
    if (!*moniker)
        return E_OUTOFMEMORY;
    *eaten = static_cast<ULONG>(length);
    return S_OK;
}
