// CFile: a binary file on a system file handle, with the framework's open
// flags. Failures of an open file raise CFileException; Open reports them.
#pragma once

#include <vaskel/export.h>
#include <vaskel/framework/exceptions.h>
#include <vaskel/framework/string.h>
#include <vaskel/win32.h>

namespace vaskel {

struct CFileStatus {
    LONGLONG m_ctime = 0; // creation, seconds since 1 January 1970 UTC
    LONGLONG m_mtime = 0; // last write
    LONGLONG m_atime = 0; // last access
    ULONGLONG m_size = 0;
    BYTE m_attribute = 0; // the CFile::Attribute bits
    char m_szFullName[MAX_PATH] = {};
};

class VASKEL_API CFile {
public:
    enum OpenFlags {
        modeRead = 0x00000,
        modeWrite = 0x00001,
        modeReadWrite = 0x00002,
        shareCompat = 0x00000,
        shareExclusive = 0x00010,
        shareDenyWrite = 0x00020,
        shareDenyRead = 0x00030,
        shareDenyNone = 0x00040,
        modeNoInherit = 0x00080,
        modeCreate = 0x01000,
        modeNoTruncate = 0x02000,
        typeText = 0x04000,
        typeBinary = 0x08000,
        osNoBuffer = 0x10000,
        osWriteThrough = 0x20000,
        osRandomAccess = 0x40000,
        osSequentialScan = 0x80000,
    };
    enum Attribute {
        normal = 0x00,
        readOnly = 0x01,
        hidden = 0x02,
        system = 0x04,
        volume = 0x08,
        directory = 0x10,
        archive = 0x20,
    };
    enum SeekPosition { begin = 0, current = 1, end = 2 };
    enum BufferCommand { bufferRead, bufferWrite, bufferCommit, bufferCheck };
    enum BufferFlags { bufferDirect = 0x01, bufferBlocking = 0x02 };

    static const HANDLE hFileNull;

    CFile();
    // Adopts an open handle; the file closes it.
    explicit CFile(HANDLE file);
    // Opens the file or raises CFileException.
    CFile(const char* fileName, UINT openFlags);
    CFile(const CFile&) = delete;
    CFile& operator=(const CFile&) = delete;
    // Closes the file; errors are not reported.
    virtual ~CFile();

    virtual bool Open(const char* fileName, UINT openFlags, CFileException* error = nullptr);
    virtual UINT Read(void* buffer, UINT count);
    virtual void Write(const void* buffer, UINT count);
    virtual ULONGLONG Seek(LONGLONG offset, UINT from);
    void SeekToBegin() { Seek(0, begin); }
    ULONGLONG SeekToEnd() { return Seek(0, end); }
    virtual ULONGLONG GetLength() const;
    virtual void SetLength(ULONGLONG newLength);
    virtual ULONGLONG GetPosition() const;
    virtual void Flush();
    virtual void Close();
    // Closes without reporting errors.
    virtual void Abort();

    virtual CString GetFileName() const;
    virtual CString GetFileTitle() const;
    virtual CString GetFilePath() const;
    virtual void SetFilePath(const char* newName);

    bool GetStatus(CFileStatus& status) const;
    static bool GetStatus(const char* fileName, CFileStatus& status);
    static void Rename(const char* oldName, const char* newName);
    static void Remove(const char* fileName);

    // Direct access to the file's own buffer, for files that keep their data
    // in memory. A plain file has none: bufferCheck answers 0 and the other
    // commands give no room.
    virtual UINT GetBufferPtr(UINT command, UINT count = 0, void** bufferStart = nullptr,
                              void** bufferMax = nullptr);

    operator HANDLE() const { return m_hFile; }

    HANDLE m_hFile;

protected:
    [[noreturn]] void ThrowLastError() const;
    void CheckOpen() const;

    CString m_strFileName;
};

} // namespace vaskel
