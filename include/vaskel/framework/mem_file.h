// CMemFile: a file kept in memory, growing as it is written, with direct
// access to its buffer.
#pragma once

#include <vaskel/framework/file.h>

namespace vaskel {

class VASKEL_API CMemFile : public CFile {
public:
    explicit CMemFile(UINT growBytes = 1024);
    // Works on the caller's buffer; with growBytes 0 the file cannot grow
    // beyond it. The caller keeps the buffer unless the file grows it.
    CMemFile(BYTE* buffer, UINT bufferSize, UINT growBytes = 0);
    ~CMemFile() override;

    void Attach(BYTE* buffer, UINT bufferSize, UINT growBytes = 0);
    // Hands the buffer to the caller and leaves the file empty. A buffer the
    // file allocated itself is freed with free().
    BYTE* Detach();

    UINT Read(void* buffer, UINT count) override;
    void Write(const void* buffer, UINT count) override;
    ULONGLONG Seek(LONGLONG offset, UINT from) override;
    ULONGLONG GetLength() const override;
    void SetLength(ULONGLONG newLength) override;
    ULONGLONG GetPosition() const override;
    void Flush() override;
    void Close() override;
    void Abort() override;
    // bufferRead: room from the position for up to count bytes, advancing the
    // position; bufferWrite: room for count bytes, growing the file's buffer;
    // bufferCommit: the count bytes were written, the position advances and
    // the length follows; bufferCheck: bufferDirect.
    UINT GetBufferPtr(UINT command, UINT count = 0, void** bufferStart = nullptr,
                      void** bufferMax = nullptr) override;

private:
    void Grow(SIZE_T newSize);
    void FreeOwnBuffer();

    UINT m_nGrowBytes;
    SIZE_T m_nPosition = 0;
    SIZE_T m_nBufferSize = 0;
    SIZE_T m_nFileSize = 0;
    BYTE* m_lpBuffer = nullptr;
    bool m_bAutoDelete = true;
};

} // namespace vaskel
