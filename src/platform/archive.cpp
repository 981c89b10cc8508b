#include <vaskel/framework/archive.h>

#include <algorithm>
#include <climits>
#include <cstring>
#include <vector>

namespace vaskel {
namespace {

const UINT minimumBufferSize = 128;
// Long strings are read in steps of this size, so a length prefix that
// promises more than the file holds allocates only what actually arrives.
const UINT stringChunk = 64 * 1024;

template <class T>
void Encode(T value, BYTE* out) {
    for (size_t i = 0; i < sizeof(T); ++i)
        out[i] = static_cast<BYTE>(static_cast<ULONGLONG>(value) >> (8 * i));
}

template <class T>
T Decode(const BYTE* in) {
    ULONGLONG value = 0;
    for (size_t i = 0; i < sizeof(T); ++i)
        value |= static_cast<ULONGLONG>(in[i]) << (8 * i);
    return static_cast<T>(value);
}

} // namespace

CArchive::CArchive(CFile* file, UINT mode, int bufferSize)
    : m_pFile(file), m_nMode(mode),
      m_nBufferSize(std::max(minimumBufferSize, static_cast<UINT>(std::max(bufferSize, 0)))) {
    if (file == nullptr)
        AfxThrowInvalidArgException();
    m_buffer = new BYTE[m_nBufferSize];
    m_cursor = m_buffer;
    m_end = IsLoading() ? m_buffer : m_buffer + m_nBufferSize;
}

CArchive::~CArchive() {
    if (m_pFile && !(m_nMode & bNoFlushOnDelete)) {
        try {
            Close();
        } catch (...) {
            // A destructor cannot report; callers who care call Close().
        }
    }
    delete[] m_buffer;
}

bool CArchive::IsBufferEmpty() const {
    return IsLoading() ? m_cursor == m_end : m_cursor == m_buffer;
}

void CArchive::CheckStoring() {
    if (!m_pFile)
        AfxThrowArchiveException(CArchiveException::genericException);
    if (!IsStoring())
        AfxThrowArchiveException(CArchiveException::readOnly);
}

void CArchive::CheckLoading() {
    if (!m_pFile)
        AfxThrowArchiveException(CArchiveException::genericException);
    if (!IsLoading())
        AfxThrowArchiveException(CArchiveException::writeOnly);
}

void CArchive::Flush() {
    if (!m_pFile)
        return;
    if (IsStoring()) {
        UINT pending = static_cast<UINT>(m_cursor - m_buffer);
        m_cursor = m_buffer;
        m_pFile->Write(m_buffer, pending);
    } else if (m_cursor != m_end) {
        LONGLONG unread = m_end - m_cursor;
        m_cursor = m_end = m_buffer;
        m_pFile->Seek(-unread, CFile::current);
    }
}

void CArchive::Close() {
    if (!m_pFile)
        return;
    Flush();
    m_pFile = nullptr;
}

void CArchive::Abort() {
    m_pFile = nullptr;
    m_cursor = m_buffer;
    m_end = IsLoading() ? m_buffer : m_buffer + m_nBufferSize;
}

void CArchive::WriteBytes(const void* data, UINT count) {
    const BYTE* in = static_cast<const BYTE*>(data);
    while (count > 0) {
        if (m_cursor == m_end) {
            Flush();
            // A large block goes to the file directly.
            if (count >= m_nBufferSize) {
                m_pFile->Write(in, count);
                return;
            }
        }
        UINT step = std::min(count, static_cast<UINT>(m_end - m_cursor));
        std::memcpy(m_cursor, in, step);
        m_cursor += step;
        in += step;
        count -= step;
    }
}

void CArchive::Write(const void* buffer, UINT count) {
    CheckStoring();
    if (count == 0)
        return;
    if (buffer == nullptr)
        AfxThrowInvalidArgException();
    WriteBytes(buffer, count);
}

void CArchive::FillBuffer() {
    UINT unread = static_cast<UINT>(m_end - m_cursor);
    std::memmove(m_buffer, m_cursor, unread);
    m_cursor = m_buffer;
    m_end = m_buffer + unread;
    UINT got = m_pFile->Read(m_end, m_nBufferSize - unread);
    m_end += got;
}

UINT CArchive::Read(void* buffer, UINT count) {
    CheckLoading();
    if (count == 0)
        return 0;
    if (buffer == nullptr)
        AfxThrowInvalidArgException();
    BYTE* out = static_cast<BYTE*>(buffer);
    UINT done = 0;
    while (done < count) {
        if (m_cursor == m_end) {
            if (count - done >= m_nBufferSize) {
                // A large block goes straight from the file; a file may
                // deliver it in parts, and only 0 means the end.
                UINT got;
                while (done < count && (got = m_pFile->Read(out + done, count - done)) > 0)
                    done += got;
                break;
            }
            FillBuffer();
            if (m_cursor == m_end)
                break;
        }
        UINT step = std::min(count - done, static_cast<UINT>(m_end - m_cursor));
        std::memcpy(out + done, m_cursor, step);
        m_cursor += step;
        done += step;
    }
    return done;
}

void CArchive::ReadExact(void* data, UINT count) {
    if (Read(data, count) != count)
        AfxThrowArchiveException(CArchiveException::endOfFile);
}

template <class T>
CArchive& CArchive::Put(T value) {
    CheckStoring();
    BYTE bytes[sizeof(T)];
    Encode(value, bytes);
    WriteBytes(bytes, sizeof(T));
    return *this;
}

template <class T>
T CArchive::Take() {
    CheckLoading();
    BYTE bytes[sizeof(T)];
    if (static_cast<size_t>(m_end - m_cursor) >= sizeof(T)) {
        std::memcpy(bytes, m_cursor, sizeof(T));
        m_cursor += sizeof(T);
    } else {
        ReadExact(bytes, sizeof(T));
    }
    return Decode<T>(bytes);
}

CArchive& CArchive::operator<<(BYTE value) {
    return Put<BYTE>(value);
}
CArchive& CArchive::operator<<(WORD value) {
    return Put<WORD>(value);
}
CArchive& CArchive::operator<<(short value) {
    return Put<WORD>(static_cast<WORD>(value));
}
CArchive& CArchive::operator<<(char value) {
    return Put<BYTE>(static_cast<BYTE>(value));
}
CArchive& CArchive::operator<<(WCHAR value) {
    return Put<WORD>(static_cast<WORD>(value));
}
CArchive& CArchive::operator<<(bool value) {
    return Put<BYTE>(value ? 1 : 0);
}
CArchive& CArchive::operator<<(int value) {
    return Put<DWORD>(static_cast<DWORD>(value));
}
CArchive& CArchive::operator<<(unsigned int value) {
    return Put<DWORD>(value);
}

CArchive& CArchive::operator<<(long value) {
    CheckStoring();
    if (static_cast<long>(static_cast<LONG>(value)) != value)
        AfxThrowArchiveException(CArchiveException::genericException);
    return Put<DWORD>(static_cast<DWORD>(value));
}

CArchive& CArchive::operator<<(unsigned long value) {
    CheckStoring();
    if (static_cast<unsigned long>(static_cast<DWORD>(value)) != value)
        AfxThrowArchiveException(CArchiveException::genericException);
    return Put<DWORD>(static_cast<DWORD>(value));
}

CArchive& CArchive::operator<<(long long value) {
    return Put<ULONGLONG>(static_cast<ULONGLONG>(value));
}
CArchive& CArchive::operator<<(unsigned long long value) {
    return Put<ULONGLONG>(value);
}

CArchive& CArchive::operator<<(float value) {
    DWORD bits;
    std::memcpy(&bits, &value, sizeof bits);
    return Put<DWORD>(bits);
}

CArchive& CArchive::operator<<(double value) {
    ULONGLONG bits;
    std::memcpy(&bits, &value, sizeof bits);
    return Put<ULONGLONG>(bits);
}

CArchive& CArchive::operator<<(const CString& value) {
    CheckStoring();
    DWORD length = static_cast<DWORD>(value.GetLength());
    if (length < 0xFF) {
        Put<BYTE>(static_cast<BYTE>(length));
    } else if (length < 0xFFFE) {
        Put<BYTE>(0xFF);
        Put<WORD>(static_cast<WORD>(length));
    } else {
        Put<BYTE>(0xFF);
        Put<WORD>(0xFFFF);
        Put<DWORD>(length);
    }
    WriteBytes(value.GetString(), length);
    return *this;
}

CArchive& CArchive::operator>>(BYTE& value) {
    value = Take<BYTE>();
    return *this;
}
CArchive& CArchive::operator>>(WORD& value) {
    value = Take<WORD>();
    return *this;
}
CArchive& CArchive::operator>>(short& value) {
    value = static_cast<short>(Take<WORD>());
    return *this;
}
CArchive& CArchive::operator>>(char& value) {
    value = static_cast<char>(Take<BYTE>());
    return *this;
}
CArchive& CArchive::operator>>(WCHAR& value) {
    value = static_cast<WCHAR>(Take<WORD>());
    return *this;
}
CArchive& CArchive::operator>>(bool& value) {
    value = Take<BYTE>() != 0;
    return *this;
}
CArchive& CArchive::operator>>(int& value) {
    value = static_cast<int>(static_cast<LONG>(Take<DWORD>()));
    return *this;
}
CArchive& CArchive::operator>>(unsigned int& value) {
    value = Take<DWORD>();
    return *this;
}
CArchive& CArchive::operator>>(long& value) {
    value = static_cast<LONG>(Take<DWORD>());
    return *this;
}
CArchive& CArchive::operator>>(unsigned long& value) {
    value = Take<DWORD>();
    return *this;
}
CArchive& CArchive::operator>>(long long& value) {
    value = static_cast<long long>(Take<ULONGLONG>());
    return *this;
}
CArchive& CArchive::operator>>(unsigned long long& value) {
    value = Take<ULONGLONG>();
    return *this;
}
CArchive& CArchive::operator>>(float& value) {
    DWORD bits = Take<DWORD>();
    std::memcpy(&value, &bits, sizeof value);
    return *this;
}
CArchive& CArchive::operator>>(double& value) {
    ULONGLONG bits = Take<ULONGLONG>();
    std::memcpy(&value, &bits, sizeof value);
    return *this;
}

DWORD CArchive::ReadStringLength(bool& wide) {
    wide = false;
    BYTE shortLength = Take<BYTE>();
    if (shortLength < 0xFF)
        return shortLength;
    WORD mediumLength = Take<WORD>();
    if (mediumLength == 0xFFFE) {
        wide = true;
        shortLength = Take<BYTE>();
        if (shortLength < 0xFF)
            return shortLength;
        mediumLength = Take<WORD>();
    }
    if (mediumLength < 0xFFFF)
        return mediumLength;
    DWORD longLength = Take<DWORD>();
    // No string of 2^32 - 1 characters or more can be held.
    if (longLength == 0xFFFFFFFF)
        AfxThrowArchiveException(CArchiveException::genericException);
    return longLength;
}

CArchive& CArchive::operator>>(CString& value) {
    CheckLoading();
    bool wide;
    DWORD length = ReadStringLength(wide);
    // The length is checked against what a CString can hold only as the text
    // arrives, so a prefix promising more than the input has ends in endOfFile.
    if (!wide) {
        CString text;
        for (DWORD done = 0; done < length;) {
            UINT step = std::min<DWORD>(stringChunk, length - done);
            if (done + step > static_cast<DWORD>(INT_MAX))
                AfxThrowArchiveException(CArchiveException::genericException);
            char* chars = text.GetBuffer(static_cast<int>(done + step));
            ReadExact(chars + done, step);
            done += step;
            text.ReleaseBuffer(static_cast<int>(done));
        }
        value = std::move(text);
        return *this;
    }
    std::vector<WCHAR> units;
    std::vector<BYTE> bytes;
    for (DWORD done = 0; done < length;) {
        UINT step = std::min<DWORD>(stringChunk, length - done);
        // Every UTF-16 unit becomes at least one character of text.
        if (done + step > static_cast<DWORD>(INT_MAX))
            AfxThrowArchiveException(CArchiveException::genericException);
        bytes.resize(static_cast<size_t>(step) * 2);
        ReadExact(bytes.data(), step * 2);
        for (UINT i = 0; i < step; ++i)
            units.push_back(static_cast<WCHAR>(Decode<WORD>(&bytes[2 * i])));
        done += step;
    }
    value = CString(units.data(), static_cast<int>(units.size()));
    return *this;
}

} // namespace vaskel
