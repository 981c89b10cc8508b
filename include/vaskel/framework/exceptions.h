// The framework's exceptions and the functions that raise them. They are
// thrown by value and derive from std::exception, so callers catch them by
// reference, as CException or as any of the derived types.
#pragma once

#include <vaskel/export.h>
#include <vaskel/framework/string.h>
#include <vaskel/win32.h>

#include <exception>

namespace vaskel {

class VASKEL_API CException : public std::exception {
public:
    const char* what() const noexcept override;
    // The message of the exception, cut to fit a buffer of maxLength bytes.
    virtual bool GetErrorMessage(char* buffer, UINT maxLength, UINT* helpContext = nullptr) const;
    virtual CString GetErrorMessage() const;
};

class VASKEL_API CMemoryException : public CException {
public:
    const char* what() const noexcept override;
};

class VASKEL_API CInvalidArgException : public CException {
public:
    const char* what() const noexcept override;
};

class VASKEL_API COleException : public CException {
public:
    explicit COleException(HRESULT sc = E_FAIL) : m_sc(sc) {}
    const char* what() const noexcept override;
    CString GetErrorMessage() const override;
    using CException::GetErrorMessage;

    HRESULT m_sc;
};

class VASKEL_API CArchiveException : public CException {
public:
    enum {
        none,
        genericException,
        readOnly,
        endOfFile,
        writeOnly,
        badIndex,
        badClass,
        badSchema,
        bufferFull,
    };
    explicit CArchiveException(int cause = none, const char* archiveName = nullptr);
    const char* what() const noexcept override;
    CString GetErrorMessage() const override;
    using CException::GetErrorMessage;

    int m_cause;
    CString m_strFileName;
};

class VASKEL_API CFileException : public CException {
public:
    enum {
        none,
        genericException,
        fileNotFound,
        badPath,
        tooManyOpenFiles,
        accessDenied,
        invalidFile,
        removeCurrentDir,
        directoryFull,
        badSeek,
        hardIO,
        sharingViolation,
        lockViolation,
        diskFull,
        endOfFile,
    };
    explicit CFileException(int cause = none, LONG osError = -1, const char* fileName = nullptr);
    const char* what() const noexcept override;
    CString GetErrorMessage() const override;
    using CException::GetErrorMessage;

    // The cause that best describes a system error code.
    static int OsErrorToException(LONG osError);

    int m_cause;
    LONG m_lOsError;
    CString m_strFileName;
};

[[noreturn]] VASKEL_API void AfxThrowMemoryException();
[[noreturn]] VASKEL_API void AfxThrowInvalidArgException();
[[noreturn]] VASKEL_API void AfxThrowOleException(HRESULT sc);
[[noreturn]] VASKEL_API void AfxThrowArchiveException(int cause, const char* archiveName = nullptr);
[[noreturn]] VASKEL_API void AfxThrowFileException(int cause, LONG osError = -1,
                                                   const char* fileName = nullptr);

} // namespace vaskel
