// CFileFind: a directory search. FindFile starts it; each FindNextFile moves
// to the next entry and tells whether yet another one follows, so the first
// call after FindFile moves to the first entry and a false result still
// leaves the last one to read. The accessors read the current entry; with no
// current entry they give empty text, zero and false.
#pragma once

#include <vaskel/export.h>
#include <vaskel/framework/string.h>
#include <vaskel/win32.h>

namespace vaskel {

class VASKEL_API CFileFind {
public:
    CFileFind();
    CFileFind(const CFileFind&) = delete;
    CFileFind& operator=(const CFileFind&) = delete;
    virtual ~CFileFind();

    // Searches the directory part of name for the entries its last part
    // matches ("dir\*.txt"); false, with the system's last error, when
    // nothing matches or the directory cannot be searched.
    virtual bool FindFile(const char* name = "*.*");
    virtual bool FindNextFile();
    void Close();

    // The name, and the searched directory joined with it by a backslash.
    virtual CString GetFileName() const;
    virtual CString GetFilePath() const;
    // The searched directory as given, without a trailing separator (but for
    // a root such as "\" or "C:\").
    virtual CString GetRoot() const;
    ULONGLONG GetLength() const;

    bool GetCreationTime(FILETIME* time) const;
    bool GetLastAccessTime(FILETIME* time) const;
    bool GetLastWriteTime(FILETIME* time) const;

    DWORD GetAttributes() const;
    // Whether the entry has one of the FILE_ATTRIBUTE_ bits of mask.
    virtual bool MatchesMask(DWORD mask) const;
    // "." or "..".
    virtual bool IsDots() const;
    bool IsDirectory() const { return MatchesMask(FILE_ATTRIBUTE_DIRECTORY); }
    bool IsReadOnly() const { return MatchesMask(FILE_ATTRIBUTE_READONLY); }
    bool IsHidden() const { return MatchesMask(FILE_ATTRIBUTE_HIDDEN); }
    bool IsSystem() const { return MatchesMask(FILE_ATTRIBUTE_SYSTEM); }
    bool IsArchived() const { return MatchesMask(FILE_ATTRIBUTE_ARCHIVE); }
    bool IsTemporary() const { return MatchesMask(FILE_ATTRIBUTE_TEMPORARY); }
    bool IsNormal() const { return MatchesMask(FILE_ATTRIBUTE_NORMAL); }

private:
    HANDLE m_hContext;
    WIN32_FIND_DATAA m_found;
    WIN32_FIND_DATAA m_next;
    bool m_hasFound;
    bool m_hasNext;
    CString m_root;
};

} // namespace vaskel
