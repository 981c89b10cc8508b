#include <vaskel/framework/mem_file.h>

#include <algorithm>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <limits>

namespace vaskel {

CMemFile::CMemFile(UINT growBytes) : m_nGrowBytes(growBytes) {}

CMemFile::CMemFile(BYTE* buffer, UINT bufferSize, UINT growBytes) : m_nGrowBytes(growBytes) {
    Attach(buffer, bufferSize, growBytes);
}

CMemFile::~CMemFile() {
    FreeOwnBuffer();
}

void CMemFile::FreeOwnBuffer() {
    if (m_bAutoDelete)
        std::free(m_lpBuffer);
    m_lpBuffer = nullptr;
    m_nBufferSize = m_nFileSize = m_nPosition = 0;
    m_bAutoDelete = true;
}

void CMemFile::Attach(BYTE* buffer, UINT bufferSize, UINT growBytes) {
    FreeOwnBuffer();
    m_lpBuffer = buffer;
    m_nBufferSize = buffer ? bufferSize : 0;
    // A caller's buffer that cannot grow holds the file's contents; one that
    // may grow starts empty.
    m_nFileSize = growBytes == 0 ? m_nBufferSize : 0;
    m_nGrowBytes = growBytes;
    m_bAutoDelete = false;
}

BYTE* CMemFile::Detach() {
    BYTE* buffer = m_lpBuffer;
    m_lpBuffer = nullptr;
    m_bAutoDelete = true;
    FreeOwnBuffer();
    return buffer;
}

void CMemFile::Grow(SIZE_T newSize) {
    if (newSize <= m_nBufferSize)
        return;
    if (m_nGrowBytes == 0)
        AfxThrowMemoryException();
    SIZE_T grown = std::max(newSize, m_nBufferSize + m_nBufferSize / 2);
    // Rounding up to the step must not wrap around to a small size.
    if (grown > std::numeric_limits<SIZE_T>::max() - (m_nGrowBytes - 1))
        AfxThrowMemoryException();
    grown = (grown + m_nGrowBytes - 1) / m_nGrowBytes * m_nGrowBytes;
    BYTE* buffer;
    SIZE_T kept;
    if (m_bAutoDelete) {
        buffer = static_cast<BYTE*>(std::realloc(m_lpBuffer, grown));
        kept = m_nBufferSize;
    } else {
        // The caller's buffer stays the caller's: the file moves to its own.
        buffer = static_cast<BYTE*>(std::malloc(grown));
        kept = m_nFileSize;
        if (buffer && kept)
            std::memcpy(buffer, m_lpBuffer, kept);
    }
    if (!buffer)
        AfxThrowMemoryException();
    // New room never shows what the heap held before, whatever a caller commits.
    std::memset(buffer + kept, 0, grown - kept);
    m_lpBuffer = buffer;
    m_nBufferSize = grown;
    m_bAutoDelete = true;
}

UINT CMemFile::Read(void* buffer, UINT count) {
    if (count == 0 || m_nPosition >= m_nFileSize)
        return 0;
    if (buffer == nullptr)
        AfxThrowInvalidArgException();
    SIZE_T available = m_nFileSize - m_nPosition;
    UINT read = static_cast<UINT>(std::min<SIZE_T>(count, available));
    std::memcpy(buffer, m_lpBuffer + m_nPosition, read);
    m_nPosition += read;
    return read;
}

void CMemFile::Write(const void* buffer, UINT count) {
    if (count == 0)
        return;
    if (buffer == nullptr)
        AfxThrowInvalidArgException();
    if (m_nPosition > std::numeric_limits<SIZE_T>::max() - count)
        AfxThrowMemoryException();
    SIZE_T end = m_nPosition + count;
    // The data may come from the file's own buffer, which growing moves.
    const BYTE* data = static_cast<const BYTE*>(buffer);
    std::uintptr_t offset =
        reinterpret_cast<std::uintptr_t>(data) - reinterpret_cast<std::uintptr_t>(m_lpBuffer);
    bool fromOwnBuffer = m_bAutoDelete && offset < m_nBufferSize;
    Grow(end);
    if (fromOwnBuffer)
        data = m_lpBuffer + offset;
    // A gap left by seeking past the end reads as zeros.
    if (m_nPosition > m_nFileSize)
        std::memset(m_lpBuffer + m_nFileSize, 0, m_nPosition - m_nFileSize);
    std::memmove(m_lpBuffer + m_nPosition, data, count);
    m_nPosition = end;
    m_nFileSize = std::max(m_nFileSize, end);
}

ULONGLONG CMemFile::Seek(LONGLONG offset, UINT from) {
    LONGLONG base;
    switch (from) {
    case begin:
        base = 0;
        break;
    case current:
        base = static_cast<LONGLONG>(m_nPosition);
        break;
    case end:
        base = static_cast<LONGLONG>(m_nFileSize);
        break;
    default:
        AfxThrowInvalidArgException();
    }
    if ((offset < 0 && base + offset < 0) ||
        (offset > 0 && base > std::numeric_limits<LONGLONG>::max() - offset))
        AfxThrowFileException(CFileException::badSeek, ERROR_NEGATIVE_SEEK, m_strFileName);
    m_nPosition = static_cast<SIZE_T>(base + offset);
    return m_nPosition;
}

ULONGLONG CMemFile::GetLength() const {
    return m_nFileSize;
}

void CMemFile::SetLength(ULONGLONG newLength) {
    if (newLength > std::numeric_limits<SIZE_T>::max())
        AfxThrowMemoryException();
    SIZE_T size = static_cast<SIZE_T>(newLength);
    if (size > m_nBufferSize)
        Grow(size);
    if (size > m_nFileSize)
        std::memset(m_lpBuffer + m_nFileSize, 0, size - m_nFileSize);
    m_nFileSize = size;
    m_nPosition = std::min(m_nPosition, size);
}

ULONGLONG CMemFile::GetPosition() const {
    return m_nPosition;
}

void CMemFile::Flush() {}

void CMemFile::Close() {
    FreeOwnBuffer();
}

void CMemFile::Abort() {
    FreeOwnBuffer();
}

UINT CMemFile::GetBufferPtr(UINT command, UINT count, void** bufferStart, void** bufferMax) {
    switch (command) {
    case bufferCheck:
        return bufferDirect;
    case bufferCommit: {
        // Only room the buffer has can have been written; the position never
        // moves backwards.
        if (m_nPosition >= m_nBufferSize)
            return 0;
        SIZE_T end = m_nPosition + std::min<SIZE_T>(count, m_nBufferSize - m_nPosition);
        m_nPosition = end;
        m_nFileSize = std::max(m_nFileSize, end);
        return 0;
    }
    case bufferWrite: {
        if (m_nPosition > std::numeric_limits<SIZE_T>::max() - count)
            AfxThrowMemoryException();
        Grow(m_nPosition + count);
        if (m_nPosition > m_nFileSize)
            std::memset(m_lpBuffer + m_nFileSize, 0, m_nPosition - m_nFileSize);
        SIZE_T start = std::min(m_nPosition, m_nBufferSize);
        SIZE_T room = std::min<SIZE_T>(count, m_nBufferSize - start);
        if (bufferStart)
            *bufferStart = m_lpBuffer + start;
        if (bufferMax)
            *bufferMax = m_lpBuffer + start + room;
        return static_cast<UINT>(room);
    }
    case bufferRead: {
        SIZE_T start = std::min(m_nPosition, m_nFileSize);
        SIZE_T room = std::min<SIZE_T>(count, m_nFileSize - start);
        if (bufferStart)
            *bufferStart = m_lpBuffer + start;
        if (bufferMax)
            *bufferMax = m_lpBuffer + start + room;
        m_nPosition = start + room;
        return static_cast<UINT>(room);
    }
    default:
        AfxThrowInvalidArgException();
    }
}

} // namespace vaskel
