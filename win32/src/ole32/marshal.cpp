// Interface marshalling within the process. A marshalled interface is an entry
// in a process-wide table; its packet names the entry by a number that is
// never reused and carries the process's random secret, so a packet that was
// forged, copied from another process or already consumed is refused without
// anything being dereferenced. The entry holds one reference to the
// interface, released when a normal packet is read, when the packet is
// released, or when the apartment that marshalled it ends. Releases happen
// outside the table's lock: the object's Release may call COM again.
#include "apartment.h"

#include <vkwin32/objbase.h>

#include <cstring>
#include <mutex>
#include <new>
#include <random>
#include <unordered_map>
#include <vector>

namespace {

const unsigned char signature[8] = {'v', 'k', 'o', 'b', 'j', 'r', 'e', 'f'};

// signature, entry number, secret, interface identifier; little-endian.
const ULONG packetBytes = 8 + 8 + 16 + 16;

struct Secret {
    unsigned char bytes[16];
};

// Fixed at first use for the life of the process.
const Secret& ProcessSecret() {
    static const Secret secret = [] {
        Secret made{};
        std::random_device device;
        for (unsigned i = 0; i < sizeof made.bytes; i += 4) {
            unsigned value = device();
            for (unsigned b = 0; b < 4; ++b)
                made.bytes[i + b] = static_cast<unsigned char>(value >> (8 * b));
        }
        return made;
    }();
    return secret;
}

struct Entry {
    IUnknown* itf; // the marshalled interface, one reference held
    IID iid;
    bool normal;             // consumed by its first unmarshal
    std::uint64_t apartment; // the apartment that marshalled it
};

struct MarshalTable {
    std::mutex lock;
    std::unordered_map<std::uint64_t, Entry> entries;
    std::uint64_t lastId = 0;
};

MarshalTable& Table() {
    // Never destroyed: entries may outlive static destruction order.
    static MarshalTable* table = new MarshalTable;
    return *table;
}

void PutU64(unsigned char* out, std::uint64_t value) {
    for (unsigned i = 0; i < 8; ++i)
        out[i] = static_cast<unsigned char>(value >> (8 * i));
}

std::uint64_t GetU64(const unsigned char* in) {
    std::uint64_t value = 0;
    for (unsigned i = 0; i < 8; ++i)
        value |= static_cast<std::uint64_t>(in[i]) << (8 * i);
    return value;
}

void PutIid(unsigned char* out, const IID& iid) {
    for (unsigned i = 0; i < 4; ++i)
        out[i] = static_cast<unsigned char>(iid.Data1 >> (8 * i));
    out[4] = static_cast<unsigned char>(iid.Data2);
    out[5] = static_cast<unsigned char>(iid.Data2 >> 8);
    out[6] = static_cast<unsigned char>(iid.Data3);
    out[7] = static_cast<unsigned char>(iid.Data3 >> 8);
    std::memcpy(out + 8, iid.Data4, 8);
}

IID GetIid(const unsigned char* in) {
    IID iid{};
    for (unsigned i = 0; i < 4; ++i)
        iid.Data1 |= static_cast<std::uint32_t>(in[i]) << (8 * i);
    iid.Data2 = static_cast<std::uint16_t>(in[4] | in[5] << 8);
    iid.Data3 = static_cast<std::uint16_t>(in[6] | in[7] << 8);
    std::memcpy(iid.Data4, in + 8, 8);
    return iid;
}

// Compares every byte, so that the time taken tells nothing about the secret.
bool SameSecret(const unsigned char* in) {
    const Secret& secret = ProcessSecret();
    unsigned char difference = 0;
    for (unsigned i = 0; i < sizeof secret.bytes; ++i)
        difference |= static_cast<unsigned char>(in[i] ^ secret.bytes[i]);
    return difference == 0;
}

bool ValidFlags(DWORD destContext, DWORD mshlflags) {
    if (destContext > MSHCTX_CROSSCTX)
        return false;
    DWORD kind = mshlflags & ~static_cast<DWORD>(MSHLFLAGS_NOPING);
    return kind == MSHLFLAGS_NORMAL || kind == MSHLFLAGS_TABLESTRONG || kind == MSHLFLAGS_TABLEWEAK;
}

struct Packet {
    std::uint64_t id;
    IID iid;
};

// Reads one packet: the stream's own failure as it came, a short read as
// STG_E_READFAULT, a packet not made by this process as RPC_E_INVALID_OBJREF.
HRESULT ReadPacket(IStream* stream, Packet* packet) {
    unsigned char bytes[packetBytes];
    ULONG read = 0;
    HRESULT result = stream->Read(bytes, packetBytes, &read);
    if (FAILED(result))
        return result;
    if (read != packetBytes)
        return STG_E_READFAULT;
    if (std::memcmp(bytes, signature, sizeof signature) != 0 || !SameSecret(bytes + 16))
        return RPC_E_INVALID_OBJREF;
    packet->id = GetU64(bytes + 8);
    packet->iid = GetIid(bytes + 32);
    return S_OK;
}

// Takes the entry a packet names out of the table, or for a table packet
// (unless remove) a new reference to its interface. A packet that names no
// entry was consumed, released or disconnected; one whose interface differs
// from its entry's was altered.
HRESULT FindEntry(const Packet& packet, bool remove, IUnknown** itf, IID* iid) {
    MarshalTable& table = Table();
    std::lock_guard<std::mutex> hold(table.lock);
    auto found = table.entries.find(packet.id);
    if (found == table.entries.end())
        return CO_E_OBJNOTCONNECTED;
    if (found->second.iid != packet.iid)
        return RPC_E_INVALID_OBJREF;
    *itf = found->second.itf;
    *iid = found->second.iid;
    if (remove || found->second.normal) {
        table.entries.erase(found); // its reference passes to the caller
    } else {
        // Under the lock, so that a release cannot drop the entry's reference
        // first. AddRef must not re-enter COM.
        (*itf)->AddRef();
    }
    return S_OK;
}

} // namespace

void vkw32::DisconnectApartment(std::uint64_t apartment) {
    std::vector<IUnknown*> released;
    {
        MarshalTable& table = Table();
        std::lock_guard<std::mutex> hold(table.lock);
        for (auto entry = table.entries.begin(); entry != table.entries.end();) {
            if (entry->second.apartment == apartment) {
                released.push_back(entry->second.itf);
                entry = table.entries.erase(entry);
            } else {
                ++entry;
            }
        }
    }
    for (IUnknown* itf : released)
        itf->Release();
}

extern "C" HRESULT WINAPI CoGetMarshalSizeMax(ULONG* size, REFIID riid, LPUNKNOWN object,
                                              DWORD destContext, LPVOID /*pvDestContext*/,
                                              DWORD mshlflags) {
    if (!size)
        return E_INVALIDARG;
    *size = 0;
    if (!object || !ValidFlags(destContext, mshlflags))
        return E_INVALIDARG;
    if (!vkw32::InApartment())
        return CO_E_NOTINITIALIZED;
    void* itf = nullptr;
    HRESULT result = object->QueryInterface(riid, &itf);
    if (FAILED(result))
        return result;
    static_cast<IUnknown*>(itf)->Release();
    *size = packetBytes;
    return S_OK;
}

extern "C" HRESULT WINAPI CoMarshalInterface(LPSTREAM stream, REFIID riid, LPUNKNOWN object,
                                             DWORD destContext, LPVOID /*pvDestContext*/,
                                             DWORD mshlflags) {
    if (!stream || !object || !ValidFlags(destContext, mshlflags))
        return E_INVALIDARG;
    if (!vkw32::InApartment())
        return CO_E_NOTINITIALIZED;
    void* queried = nullptr;
    HRESULT result = object->QueryInterface(riid, &queried);
    if (FAILED(result))
        return result;
    IUnknown* itf = static_cast<IUnknown*>(queried);

    std::uint64_t id;
    {
        MarshalTable& table = Table();
        std::lock_guard<std::mutex> hold(table.lock);
        id = ++table.lastId;
        DWORD kind = mshlflags & ~static_cast<DWORD>(MSHLFLAGS_NOPING);
        try {
            table.entries.emplace(
                id, Entry{itf, riid, kind == MSHLFLAGS_NORMAL, vkw32::CurrentApartment()});
        } catch (const std::bad_alloc&) {
            id = 0;
        }
    }
    if (id == 0) {
        itf->Release();
        return E_OUTOFMEMORY;
    }

    unsigned char bytes[packetBytes];
    std::memcpy(bytes, signature, sizeof signature);
    PutU64(bytes + 8, id);
    std::memcpy(bytes + 16, ProcessSecret().bytes, 16);
    PutIid(bytes + 32, riid);
    ULONG written = 0;
    result = stream->Write(bytes, packetBytes, &written);
    if (SUCCEEDED(result) && written != packetBytes)
        result = STG_E_MEDIUMFULL;
    if (FAILED(result)) {
        // No packet names the entry: take it back.
        IUnknown* unused = nullptr;
        IID unusedIid;
        if (SUCCEEDED(FindEntry(Packet{id, riid}, true, &unused, &unusedIid)))
            unused->Release();
        return result;
    }
    return S_OK;
}

extern "C" HRESULT WINAPI CoUnmarshalInterface(LPSTREAM stream, REFIID riid, LPVOID* object) {
    if (!object)
        return E_INVALIDARG;
    *object = nullptr;
    if (!stream)
        return E_INVALIDARG;
    if (!vkw32::InApartment())
        return CO_E_NOTINITIALIZED;
    Packet packet;
    HRESULT result = ReadPacket(stream, &packet);
    if (FAILED(result))
        return result;
    IUnknown* itf = nullptr;
    IID marshalled;
    result = FindEntry(packet, false, &itf, &marshalled);
    if (FAILED(result))
        return result;
    // There are no proxies: every apartment of the process gets the object's
    // own interface.
    result = itf->QueryInterface(riid == IID_NULL ? marshalled : riid, object);
    if (FAILED(result))
        *object = nullptr;
    itf->Release();
    return result;
}

extern "C" HRESULT WINAPI CoReleaseMarshalData(LPSTREAM stream) {
    if (!stream)
        return E_INVALIDARG;
    if (!vkw32::InApartment())
        return CO_E_NOTINITIALIZED;
    Packet packet;
    HRESULT result = ReadPacket(stream, &packet);
    if (FAILED(result))
        return result;
    IUnknown* itf = nullptr;
    IID marshalled;
    result = FindEntry(packet, true, &itf, &marshalled);
    if (FAILED(result))
        return result;
    itf->Release();
    return S_OK;
}
