// CArchive: the framework's binary archive over a CFile, for loading or for
// storing. Numbers are little-endian; strings use the framework's length
// prefix (one byte below 255, then 0xFF and 16 bits below 0xFFFE, then 0xFF,
// 0xFFFF and 32 bits). A long whose value does not fit its 32-bit slot, or a
// misuse of the mode, raises CArchiveException.
#pragma once

#include <vaskel/export.h>
#include <vaskel/framework/exceptions.h>
#include <vaskel/framework/file.h>
#include <vaskel/framework/string.h>

namespace vaskel {

class VASKEL_API CArchive {
public:
    enum Mode { store = 0, load = 1, bNoFlushOnDelete = 2 };

    CArchive(CFile* file, UINT mode, int bufferSize = 4096);
    CArchive(const CArchive&) = delete;
    CArchive& operator=(const CArchive&) = delete;
    // Closes the archive unless bNoFlushOnDelete was given; errors are dropped.
    ~CArchive();

    bool IsLoading() const { return (m_nMode & load) != 0; }
    bool IsStoring() const { return (m_nMode & load) == 0; }
    bool IsBufferEmpty() const;
    CFile* GetFile() const { return m_pFile; }

    // Up to count bytes; fewer only at the end of the file.
    UINT Read(void* buffer, UINT count);
    void Write(const void* buffer, UINT count);
    // Storing: writes the buffer out. Loading: gives the unread bytes back to
    // the file, so it is positioned behind what the archive consumed.
    void Flush();
    // Flushes and detaches from the file; the file stays open.
    void Close();
    // Detaches without writing anything.
    void Abort();

    CArchive& operator<<(BYTE value);
    CArchive& operator<<(WORD value);
    CArchive& operator<<(short value);
    CArchive& operator<<(char value);
    CArchive& operator<<(WCHAR value);
    CArchive& operator<<(bool value);
    CArchive& operator<<(int value);
    CArchive& operator<<(unsigned int value);
    CArchive& operator<<(long value);
    CArchive& operator<<(unsigned long value);
    CArchive& operator<<(long long value);
    CArchive& operator<<(unsigned long long value);
    CArchive& operator<<(float value);
    CArchive& operator<<(double value);
    CArchive& operator<<(const CString& value);

    CArchive& operator>>(BYTE& value);
    CArchive& operator>>(WORD& value);
    CArchive& operator>>(short& value);
    CArchive& operator>>(char& value);
    CArchive& operator>>(WCHAR& value);
    CArchive& operator>>(bool& value);
    CArchive& operator>>(int& value);
    CArchive& operator>>(unsigned int& value);
    CArchive& operator>>(long& value);
    CArchive& operator>>(unsigned long& value);
    CArchive& operator>>(long long& value);
    CArchive& operator>>(unsigned long long& value);
    CArchive& operator>>(float& value);
    CArchive& operator>>(double& value);
    // Also reads the wide form (0xFF 0xFFFE, then a prefix counting UTF-16
    // units), converted to the ANSI code page.
    CArchive& operator>>(CString& value);

private:
    void CheckStoring();
    void CheckLoading();
    void WriteBytes(const void* data, UINT count);
    // Exactly count bytes, or the end-of-file archive exception.
    void ReadExact(void* data, UINT count);
    template <class T>
    CArchive& Put(T value);
    template <class T>
    T Take();
    DWORD ReadStringLength(bool& wide);
    void FillBuffer();

    CFile* m_pFile;
    UINT m_nMode;
    UINT m_nBufferSize;
    BYTE* m_buffer;
    BYTE* m_cursor;
    BYTE* m_end;
};

} // namespace vaskel
