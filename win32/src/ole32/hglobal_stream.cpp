// A stream on global memory. Reads stop at the end of the stream; a write past
// the end grows the block (STG_E_MEDIUMFULL when it cannot); seeking before
// the start is STG_E_SEEKERROR, seeking past the end is allowed. The block
// holds at most 4 GiB - 1 bytes, as on Windows: a larger size is
// STG_E_INVALIDFUNCTION for SetSize and STG_E_MEDIUMFULL for Write. Commit and
// Revert do nothing, region locks are not supported. Clones share the block
// and its size, each with its own seek pointer.
#include "ref_counted.h"

#include <vkwin32/kernel.h>
#include <vkwin32/objbase.h>

#include <algorithm>
#include <cstring>
#include <memory>
#include <mutex>
#include <new>
#include <unordered_set>

namespace {

const ULONGLONG maxStreamBytes = 0xFFFFFFFFull;

// The state every clone of a stream shares: the block and the stream's size.
struct SharedBlock {
    std::mutex mutex;
    HGLOBAL handle = nullptr;
    ULONGLONG size = 0;
    bool deleteOnRelease = false;

    ~SharedBlock() {
        if (deleteOnRelease)
            GlobalFree(handle);
    }

    // Called with the mutex held.
    HRESULT Resize(ULONGLONG bytes) {
        if (bytes > maxStreamBytes)
            return STG_E_INVALIDFUNCTION;
        if (bytes == size)
            return S_OK;
        // GMEM_MOVEABLE lets a fixed block move too; its handle changes then.
        HGLOBAL resized = GlobalReAlloc(handle, static_cast<SIZE_T>(bytes), GMEM_MOVEABLE);
        if (!resized)
            return E_OUTOFMEMORY;
        handle = resized;
        size = bytes;
        return S_OK;
    }
};

// Every live stream made here, so that GetHGlobalFromStream can tell them from
// other streams without trusting an unknown pointer.
struct StreamRegistry {
    std::mutex mutex;
    std::unordered_set<const IStream*> streams;
};

StreamRegistry& Streams() {
    static StreamRegistry* registry = new StreamRegistry; // outlives every static destructor
    return *registry;
}

class HGlobalStream final : public vkw32::RefCounted<IStream> {
public:
    explicit HGlobalStream(std::shared_ptr<SharedBlock> shared, ULONGLONG position = 0)
        : shared_(std::move(shared)), position_(position) {
        StreamRegistry& registry = Streams();
        std::lock_guard<std::mutex> lock(registry.mutex);
        registry.streams.insert(this);
    }

    ~HGlobalStream() {
        StreamRegistry& registry = Streams();
        std::lock_guard<std::mutex> lock(registry.mutex);
        registry.streams.erase(this);
    }

    HGlobalStream(const HGlobalStream&) = delete;
    HGlobalStream& operator=(const HGlobalStream&) = delete;

    // The block, if stream is one of ours.
    static bool HandleOf(IStream* stream, HGLOBAL* handle) {
        StreamRegistry& registry = Streams();
        std::lock_guard<std::mutex> lock(registry.mutex);
        if (registry.streams.count(stream) == 0)
            return false;
        auto* ours = static_cast<HGlobalStream*>(stream);
        std::lock_guard<std::mutex> blockLock(ours->shared_->mutex);
        *handle = ours->shared_->handle;
        return true;
    }

    HRESULT STDMETHODCALLTYPE QueryInterface(REFIID riid, void** object) override {
        if (!object)
            return E_POINTER;
        if (riid == IID_IUnknown || riid == IID_ISequentialStream || riid == IID_IStream) {
            *object = static_cast<IStream*>(this);
            AddRef();
            return S_OK;
        }
        *object = nullptr;
        return E_NOINTERFACE;
    }

    HRESULT STDMETHODCALLTYPE Read(void* pv, ULONG cb, ULONG* pcbRead) override {
        if (pcbRead)
            *pcbRead = 0;
        if (!pv && cb > 0)
            return STG_E_INVALIDPOINTER;
        std::lock_guard<std::mutex> lock(shared_->mutex);
        ULONG count = 0;
        if (position_ < shared_->size)
            count = static_cast<ULONG>(std::min<ULONGLONG>(cb, shared_->size - position_));
        if (count > 0) {
            const char* data = static_cast<const char*>(GlobalLock(shared_->handle));
            if (!data)
                return E_HANDLE; // the caller freed the block under the stream
            std::memcpy(pv, data + position_, count);
            GlobalUnlock(shared_->handle);
            position_ += count;
        }
        if (pcbRead)
            *pcbRead = count;
        return S_OK;
    }

    HRESULT STDMETHODCALLTYPE Write(const void* pv, ULONG cb, ULONG* pcbWritten) override {
        if (pcbWritten)
            *pcbWritten = 0;
        if (!pv)
            return STG_E_INVALIDPOINTER;
        if (cb == 0)
            return S_OK;
        std::lock_guard<std::mutex> lock(shared_->mutex);
        // The position may be anywhere up to 2^64 - 1; the end must still fit.
        if (position_ > maxStreamBytes || cb > maxStreamBytes - position_)
            return STG_E_MEDIUMFULL;
        const ULONGLONG end = position_ + cb;
        if (end > shared_->size) {
            const ULONGLONG oldSize = shared_->size;
            if (FAILED(shared_->Resize(end)))
                return STG_E_MEDIUMFULL;
            // Bytes between the old end and a seek pointer past it read as zero.
            if (position_ > oldSize) {
                char* data = static_cast<char*>(GlobalLock(shared_->handle));
                if (!data)
                    return E_HANDLE;
                std::memset(data + oldSize, 0, static_cast<SIZE_T>(position_ - oldSize));
                GlobalUnlock(shared_->handle);
            }
        }
        char* data = static_cast<char*>(GlobalLock(shared_->handle));
        if (!data)
            return E_HANDLE;
        std::memcpy(data + position_, pv, cb);
        GlobalUnlock(shared_->handle);
        position_ = end;
        if (pcbWritten)
            *pcbWritten = cb;
        return S_OK;
    }

    HRESULT STDMETHODCALLTYPE Seek(LARGE_INTEGER dlibMove, DWORD dwOrigin,
                                   ULARGE_INTEGER* plibNewPosition) override {
        std::lock_guard<std::mutex> lock(shared_->mutex);
        HRESULT result = S_OK;
        ULONGLONG base = 0;
        switch (dwOrigin) {
        case STREAM_SEEK_SET:
            // The displacement is unsigned from the start.
            base = 0;
            break;
        case STREAM_SEEK_CUR:
            base = position_;
            break;
        case STREAM_SEEK_END:
            base = shared_->size;
            break;
        default:
            result = STG_E_SEEKERROR;
            break;
        }
        if (SUCCEEDED(result)) {
            const ULONGLONG move = static_cast<ULONGLONG>(dlibMove.QuadPart);
            if (dwOrigin == STREAM_SEEK_SET) {
                position_ = move;
            } else if (dlibMove.QuadPart < 0) {
                // Magnitude of a negative displacement, without negating INT64_MIN.
                const ULONGLONG back = ~move + 1;
                if (back > base)
                    result = STG_E_SEEKERROR;
                else
                    position_ = base - back;
            } else if (move > ~0ull - base) {
                result = STG_E_SEEKERROR;
            } else {
                position_ = base + move;
            }
        }
        // A failed seek leaves the pointer where it was and reports it.
        if (plibNewPosition)
            plibNewPosition->QuadPart = position_;
        return result;
    }

    HRESULT STDMETHODCALLTYPE SetSize(ULARGE_INTEGER libNewSize) override {
        std::lock_guard<std::mutex> lock(shared_->mutex);
        const ULONGLONG oldSize = shared_->size;
        HRESULT result = shared_->Resize(libNewSize.QuadPart);
        if (SUCCEEDED(result) && libNewSize.QuadPart > oldSize)
            result = ZeroFill(oldSize, libNewSize.QuadPart);
        return result;
    }

    HRESULT STDMETHODCALLTYPE CopyTo(IStream* pstm, ULARGE_INTEGER cb, ULARGE_INTEGER* pcbRead,
                                     ULARGE_INTEGER* pcbWritten) override {
        if (pcbRead)
            pcbRead->QuadPart = 0;
        if (pcbWritten)
            pcbWritten->QuadPart = 0;
        if (!pstm)
            return STG_E_INVALIDPOINTER;
        // Through a bounded buffer, and without holding the lock while the
        // target writes: the target may be a clone of this stream.
        const ULONG chunk = 64 * 1024;
        std::unique_ptr<char[]> buffer(new (std::nothrow) char[chunk]);
        if (!buffer)
            return E_OUTOFMEMORY;
        ULONGLONG left = cb.QuadPart;
        ULONGLONG totalRead = 0;
        ULONGLONG totalWritten = 0;
        HRESULT result = S_OK;
        while (left > 0) {
            ULONG read = 0;
            result =
                Read(buffer.get(), static_cast<ULONG>(std::min<ULONGLONG>(left, chunk)), &read);
            if (FAILED(result) || read == 0)
                break;
            totalRead += read;
            left -= read;
            ULONG written = 0;
            result = pstm->Write(buffer.get(), read, &written);
            totalWritten += written;
            if (FAILED(result))
                break;
            if (written < read) {
                result = STG_E_MEDIUMFULL;
                break;
            }
        }
        if (pcbRead)
            pcbRead->QuadPart = totalRead;
        if (pcbWritten)
            pcbWritten->QuadPart = totalWritten;
        return result;
    }

    HRESULT STDMETHODCALLTYPE Commit(DWORD) override { return S_OK; }

    HRESULT STDMETHODCALLTYPE Revert() override { return S_OK; }

    HRESULT STDMETHODCALLTYPE LockRegion(ULARGE_INTEGER, ULARGE_INTEGER, DWORD) override {
        return STG_E_INVALIDFUNCTION;
    }

    HRESULT STDMETHODCALLTYPE UnlockRegion(ULARGE_INTEGER, ULARGE_INTEGER, DWORD) override {
        return STG_E_INVALIDFUNCTION;
    }

    HRESULT STDMETHODCALLTYPE Stat(STATSTG* pstatstg, DWORD grfStatFlag) override {
        if (!pstatstg)
            return STG_E_INVALIDPOINTER;
        if ((grfStatFlag & ~static_cast<DWORD>(STATFLAG_NONAME | STATFLAG_NOOPEN)) != 0)
            return STG_E_INVALIDFLAG;
        std::lock_guard<std::mutex> lock(shared_->mutex);
        // The stream has no name, so there is none to allocate either way.
        std::memset(pstatstg, 0, sizeof *pstatstg);
        pstatstg->type = STGTY_STREAM;
        pstatstg->cbSize.QuadPart = shared_->size;
        return S_OK;
    }

    HRESULT STDMETHODCALLTYPE Clone(IStream** ppstm) override {
        if (!ppstm)
            return STG_E_INVALIDPOINTER;
        ULONGLONG position;
        {
            std::lock_guard<std::mutex> lock(shared_->mutex);
            position = position_;
        }
        *ppstm = new (std::nothrow) HGlobalStream(shared_, position);
        return *ppstm ? S_OK : E_OUTOFMEMORY;
    }

private:
    // Called with the mutex held; bytes a growing SetSize adds read as zero.
    HRESULT ZeroFill(ULONGLONG from, ULONGLONG to) {
        char* data = static_cast<char*>(GlobalLock(shared_->handle));
        if (!data)
            return E_HANDLE;
        std::memset(data + from, 0, static_cast<SIZE_T>(to - from));
        GlobalUnlock(shared_->handle);
        return S_OK;
    }

    std::shared_ptr<SharedBlock> shared_;
    ULONGLONG position_; // guarded by shared_->mutex
};

} // namespace

extern "C" HRESULT WINAPI CreateStreamOnHGlobal(HGLOBAL global, BOOL deleteOnRelease,
                                                LPSTREAM* stream) {
    if (!stream)
        return E_INVALIDARG;
    *stream = nullptr;
    std::shared_ptr<SharedBlock> shared(new (std::nothrow) SharedBlock,
                                        std::default_delete<SharedBlock>());
    if (!shared)
        return E_OUTOFMEMORY;
    if (!global) {
        global = GlobalAlloc(GMEM_MOVEABLE, 0);
        if (!global)
            return E_OUTOFMEMORY;
    }
    shared->handle = global;
    shared->size = std::min<ULONGLONG>(GlobalSize(global), maxStreamBytes);
    shared->deleteOnRelease = deleteOnRelease != FALSE;
    *stream = new (std::nothrow) HGlobalStream(std::move(shared));
    return *stream ? S_OK : E_OUTOFMEMORY;
}

extern "C" HRESULT WINAPI GetHGlobalFromStream(LPSTREAM stream, HGLOBAL* global) {
    if (!global)
        return E_INVALIDARG;
    *global = nullptr;
    if (!stream || !HGlobalStream::HandleOf(stream, global))
        return E_INVALIDARG;
    return S_OK;
}
