// Files and processes: paths held as text, file-system helpers, directory
// walks, processes, the environment and the operating-system version.
// File-system and process helpers report failures as false or empty text and
// never throw for them.
#pragma once

#include <vaskel/export.h>
#include <vaskel/framework/array.h>
#include <vaskel/framework/file_find.h>
#include <vaskel/framework/position.h>
#include <vaskel/framework/string.h>
#include <vaskel/win32.h>

#include <memory>
#include <vector>

namespace vaskel {

// --- Paths

// A file-system path as text. Nodes are the pieces between backslashes; the
// slash is no separator but one of the characters a node may not hold.
// Comparisons ignore case.
class VASKEL_API CPathUrl {
public:
    CPathUrl() = default;
    CPathUrl(const CPathUrl& other) = default;
    CPathUrl(const CString& url) : m_url(url) {}

    const CPathUrl operator=(const CPathUrl& other);
    const CPathUrl operator=(const CString& url);
    const CPathUrl operator=(const char* url);

    void SetUrl(const CString& url) { m_url = url; }
    CString GetUrl() const { return m_url; }
    operator const CString&() const { return m_url; }
    operator const char*() const { return m_url; }
    bool IsEmpty() const { return m_url.IsEmpty(); }

    bool operator==(const CPathUrl& other) const;
    bool operator==(const CString& other) const;
    bool operator==(const char* other) const;
    bool operator!=(const CPathUrl& other) const { return !(*this == other); }
    bool operator!=(const CString& other) const { return !(*this == other); }
    bool operator!=(const char* other) const { return !(*this == other); }
    bool operator<(const char* other) const;

    // The parts of VKSplitPath; a null output skips its part.
    void Split(CString* drive, CString* directory, CString* name, CString* extension) const;
    CString GetDrive() const;
    CString GetDirectory() const;
    CString GetName() const;
    CString GetExtension() const;
    bool HasDrive() const;
    // The name with its extension.
    CString GetFileName() const;
    // The drive and the directory: the folder part, with its backslash.
    CString GetFilePath() const;
    // Everything before the last backslash; empty without one.
    CPathUrl GetParentUrl() const;

    // The walk over the nodes: null for an empty path. Every backslash ends a
    // node, so a text that ends with a backslash yields one last, empty node
    // and 'a\' walks "a" and "". Each step moves forward, so a walk always
    // ends; a position past the end of the text starts again at the first node.
    POSITION GetFirstNodePosition() const;
    CString& GetNextNodePosition(POSITION& pos, CString& node) const;
    CString GetNextNodePosition(POSITION& pos) const;

    // No node holds one of \ / : * ? " < > |; the drive ("C:") may stand
    // before the first node. Empty nodes are allowed, an empty path is not.
    bool IsValid() const;
    // Joins child with a backslash, or adds '.' and the extension; the new
    // text stays even when it is not valid, and the result says whether it is.
    bool AddChild(const char* child);
    bool AddExtension(const char* extension);

    // A file or a directory of this name exists; with base, below base.
    bool Exists() const;
    bool Exists(const CString& base) const;

private:
    CString m_url;
};

// --- File system

// Static helpers over the file API. Paths join with one backslash.
// Helpers that go down a tree never go through a directory link (a symbolic
// link or junction): deleting stays inside the tree and walks cannot loop.
struct VASKEL_API FileSystem {
    static bool FileExists(const char* path);
    static bool DirectoryExists(const char* path);
    // At least one entry that is not a directory; with recursive, anywhere below.
    static bool DirectoryHasFiles(const char* path, bool recursive);
    // A directory that exists already gives false.
    static bool CreateNewDirectory(const char* path, bool createParents);
    static bool EnsureDirectoryExists(const char* path, bool createParents);
    // Deletes everything below the directory and keeps it. A directory that
    // cannot be searched gives false; the first failure stops, and what was
    // deleted stays deleted.
    static bool DeleteDirectoryContent(const char* path);
    static bool DeleteDirectory(const char* path, bool onlyIfEmpty);
    static bool DeleteDirectoryFiles(const char* path, bool recursive);
    // Deletes the files that match pattern (null or empty: "*"); with
    // recursive, a subdirectory that matches it loses every file below it.
    // Directories stay. A directory that cannot be searched gives false; no
    // match is no failure.
    static bool DeleteDirectoryFiles(const char* path, const char* pattern, bool recursive);
    // newName must be a plain name: the directory stays in its parent.
    static bool RenameDirectory(const char* path, const char* newName);
    // Appends dir (without trailing backslashes) and every directory below
    // it, each before its subdirectories.
    static void GetSubDirPathsRecurse(CStringArray& paths, const CString& dir);
    // A name in parent (null or empty: the local application-data folder)
    // that no directory has yet: baseName, else baseName0 ... baseName999
    // (the last is given even when taken). A null or empty baseName is
    // "temp" and the current date-time in hexadecimal. Empty when the
    // path would not be valid.
    static CString BuildUniqueDirectoryName(const char* parent, const char* baseName);
    // Creates the file, or truncates it, to zero length.
    static bool CreateEmptyFile(const char* path);
    // The path of a shell folder (a CSIDL value with its flags), else empty.
    static CString GetKnownFolderPath(int folder);
    // A tree of depth levels below root, with dirsPerLevel (at least 1)
    // directories named dirPrefix1, dirPrefix2, ... in each directory and
    // filesPerDir empty files filePrefix1, ... in every directory, root
    // included. Null prefixes are "_dir" and "_file".
    static bool PopulateDirectoryTree(const CString& root, int depth, int dirsPerLevel,
                                      int filesPerDir, const char* dirPrefix,
                                      const char* filePrefix);
};

// Walks the entries of a directory that match a pattern ("*", "*.txt"),
// depth first, each directory before its content when recursive; "." and
// ".." never come. The pattern applies at every level, to directories too,
// so only subdirectories whose names match are entered; directory links are
// listed but never entered.
// Calling order: Reset, then MoveNext until it is false, reading Current
// after each true. Before the first Reset MoveNext is false.
//
// A copy has the same root, pattern and recursion and searches of its own:
// the copy of an enumerator in the middle of a walk starts again at the root
// (as after Reset), and neither ever touches the other's searches.
class VASKEL_API FileEnumerator {
public:
    FileEnumerator();
    FileEnumerator(const CString& root, const CString& pattern, bool recursive);
    FileEnumerator(const FileEnumerator& other);
    FileEnumerator& operator=(const FileEnumerator& other);
    virtual ~FileEnumerator();

    const CString& GetRoot() const { return m_root; }
    void SetRoot(const CString& root) { m_root = root; }
    const CString& GetPattern() const { return m_pattern; }
    void SetPattern(const CString& pattern) { m_pattern = pattern; }
    bool GetRecursive() const { return m_recursive; }
    void SetRecursive(bool recursive) { m_recursive = recursive; }

    void Reset();
    bool MoveNext();
    // The search positioned on the current entry; an empty search (no
    // entry) when no walk is under way.
    const CFileFind& Current() const;

protected:
    bool EnterRecursion(const char* dir);
    bool ExitRecursion();

private:
    void CloseAll();

    CString m_root;
    CString m_pattern;
    bool m_recursive = false;
    // The top is the search of the directory being listed; every search
    // below it still has entries left.
    std::vector<std::unique_ptr<CFileFind>> m_searches;
    bool m_more = false;
    bool m_descend = false;
};

// --- Processes, environment and the operating-system version

// The current process's names, path forms, starting programs and asking
// whether a process runs. Paths are read into buffers of MAX_PATH
// characters: a failing call, or a path that does not fit, gives empty text,
// save module paths, which come back cut as the platform cuts them.
struct VASKEL_API Process {
    // The program file as the platform names it: a device path
    // (\Device\HarddiskVolume1\...) on Windows.
    static CString GetImagePath();
    static CString GetBaseName();
    static CString GetBaseNameNoExtension();
    // A null module is the program itself.
    static CString GetModulePath(HINSTANCE module);
    static CString GetModuleName(HINSTANCE module);
    static CString GetModuleNameNoExtension(HINSTANCE module);
    static CString GetLongPath(const char* path);
    static CString GetShortPath(const char* path);
    // Starts the command line "application arguments" (application as it is,
    // unquoted) and does not wait for it; a null application lets the
    // command line name the program. processId is set only on success.
    static bool Execute(const char* application, const char* arguments, DWORD& processId);
    // A process that ended with the exit code STILL_ACTIVE (259) does not run.
    static bool IsRunning(DWORD processId);
};

struct VASKEL_API Environment {
    static DWORD GetLogicalProcessorCount();
};

// The version tests ask the platform once per process; a failed question
// answers false from then on.
// Major version 5 (Windows 2000) or later.
VASKEL_API bool IsWindows2KOrBetter();
// Version 6.1 (Windows 7) or later.
VASKEL_API bool IsWindows7OrBetter();

} // namespace vaskel
