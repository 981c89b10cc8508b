#include <vaskel/fs.h>

#include <vaskel/calendar.h>
#include <vaskel/framework/file.h>
#include <vaskel/text.h>

#include <algorithm>

namespace vaskel {
namespace {

CString Join(const char* directory, const char* name) {
    return VKMakePath(nullptr, directory, name, nullptr);
}

bool IsEmptyText(const char* text) {
    return text == nullptr || *text == '\0';
}

// The attributes of an existing file or directory.
bool AttributesOf(const char* path, BYTE& attributes) {
    CFileStatus status;
    if (IsEmptyText(path) || !CFile::GetStatus(path, status))
        return false;
    attributes = status.m_attribute;
    return true;
}

// A directory the helpers go down into: not "." or "..", and no link, so
// that deleting stays inside the tree and no walk runs in a circle.
bool IsSubdirectory(const CFileFind& find) {
    return find.IsDirectory() && !find.IsDots() && !find.MatchesMask(FILE_ATTRIBUTE_REPARSE_POINT);
}

// Starts a search of pattern in directory. False when there is nothing to
// visit; searchable then tells an empty result (true) from a directory that
// cannot be searched (false).
bool StartSearch(CFileFind& find, const char* directory, const char* pattern, bool& searchable) {
    const CString text = Join(directory, pattern);
    searchable = false;
    if (IsEmptyText(directory) || text.IsEmpty())
        return false;
    if (find.FindFile(text))
        return true;
    const DWORD error = GetLastError();
    searchable = error == ERROR_FILE_NOT_FOUND || error == ERROR_NO_MORE_FILES;
    return false;
}

// The path without the backslashes it ends with, so that its parent is the
// directory that holds it.
CString WithoutTrailingBackslashes(const char* path) {
    CString trimmed(path);
    trimmed.TrimRight('\\');
    return trimmed;
}

CString ParentOf(const char* path) {
    return CPathUrl(WithoutTrailingBackslashes(path)).GetParentUrl();
}

} // namespace

bool FileSystem::FileExists(const char* path) {
    BYTE attributes = 0;
    return AttributesOf(path, attributes) && !(attributes & CFile::directory);
}

bool FileSystem::DirectoryExists(const char* path) {
    BYTE attributes = 0;
    return AttributesOf(path, attributes) && (attributes & CFile::directory);
}

bool FileSystem::DirectoryHasFiles(const char* path, bool recursive) {
    CFileFind find;
    bool searchable;
    if (!StartSearch(find, path, "*", searchable))
        return false;
    for (bool more = true; more;) {
        more = find.FindNextFile();
        if (!find.IsDirectory())
            return true;
        if (recursive && IsSubdirectory(find) && DirectoryHasFiles(find.GetFilePath(), true))
            return true;
    }
    return false;
}

bool FileSystem::CreateNewDirectory(const char* path, bool createParents) {
    if (IsEmptyText(path))
        return false;
    if (createParents) {
        const CString parent = ParentOf(path);
        if (!parent.IsEmpty() && !DirectoryExists(parent) && !CreateNewDirectory(parent, true))
            return false;
    }
    return CreateDirectoryA(path, nullptr) != FALSE;
}

bool FileSystem::EnsureDirectoryExists(const char* path, bool createParents) {
    return DirectoryExists(path) || CreateNewDirectory(path, createParents);
}

bool FileSystem::DeleteDirectoryContent(const char* path) {
    CFileFind find;
    bool searchable;
    if (!StartSearch(find, path, "*", searchable))
        return searchable;
    for (bool more = true; more;) {
        more = find.FindNextFile();
        if (find.IsDots())
            continue;
        const CString entry = find.GetFilePath();
        bool deleted;
        if (IsSubdirectory(find))
            deleted = DeleteDirectoryContent(entry) && RemoveDirectoryA(entry);
        else if (find.IsDirectory())
            deleted = RemoveDirectoryA(entry) != FALSE; // a link: the link alone
        else
            deleted = DeleteFileA(entry) != FALSE;
        if (!deleted)
            return false;
    }
    return true;
}

bool FileSystem::DeleteDirectory(const char* path, bool onlyIfEmpty) {
    if (!onlyIfEmpty && !DeleteDirectoryContent(path))
        return false;
    return RemoveDirectoryA(path) != FALSE;
}

bool FileSystem::DeleteDirectoryFiles(const char* path, bool recursive) {
    return DeleteDirectoryFiles(path, "*", recursive);
}

bool FileSystem::DeleteDirectoryFiles(const char* path, const char* pattern, bool recursive) {
    if (IsEmptyText(pattern))
        pattern = "*";
    CFileFind find;
    bool searchable;
    if (!StartSearch(find, path, pattern, searchable))
        return searchable;
    for (bool more = true; more;) {
        more = find.FindNextFile();
        if (!find.IsDirectory()) {
            if (!DeleteFileA(find.GetFilePath()))
                return false;
        } else if (recursive && IsSubdirectory(find) &&
                   !DeleteDirectoryFiles(find.GetFilePath(), "*", true)) {
            // A subdirectory the pattern names loses every file below it.
            return false;
        }
    }
    return true;
}

bool FileSystem::RenameDirectory(const char* path, const char* newName) {
    if (!DirectoryExists(path))
        return false;
    const CString existing = WithoutTrailingBackslashes(path);
    const CPathUrl parent = CPathUrl(existing).GetParentUrl();
    const CString renamed = Join(parent, newName);
    if (CPathUrl(renamed).GetParentUrl() != parent)
        return false;
    return MoveFileA(existing, renamed) != FALSE;
}

void FileSystem::GetSubDirPathsRecurse(CStringArray& paths, const CString& dir) {
    // An empty text would search the root of the whole file system.
    if (dir.IsEmpty())
        return;
    paths.Add(WithoutTrailingBackslashes(dir));
    CFileFind find;
    if (!find.FindFile(dir + "\\*"))
        return;
    for (bool more = true; more;) {
        more = find.FindNextFile();
        if (IsSubdirectory(find))
            GetSubDirPathsRecurse(paths, find.GetFilePath());
    }
}

CString FileSystem::BuildUniqueDirectoryName(const char* parent, const char* baseName) {
    const CString folder = IsEmptyText(parent)
                               ? GetKnownFolderPath(CSIDL_LOCAL_APPDATA | CSIDL_FLAG_CREATE)
                               : CString(parent);
    if (folder.IsEmpty())
        return CString();
    CString base(baseName);
    if (IsEmptyText(baseName)) {
        const double now = CDateTime::Now();
        base = "temp";
        base += VKBytesToString(reinterpret_cast<const unsigned char*>(&now), sizeof now, 0, 0);
    }
    CString name = base;
    for (int i = 0;; ++i) {
        const CString path = Join(folder, name);
        if (!CPathUrl(path).IsValid())
            return CString();
        if (i == 1000 || !DirectoryExists(path))
            return name;
        name = base + AsString(i);
    }
}

bool FileSystem::CreateEmptyFile(const char* path) {
    CFile file;
    return file.Open(path, CFile::modeCreate | CFile::modeWrite);
}

CString FileSystem::GetKnownFolderPath(int folder) {
    char path[MAX_PATH] = {};
    if (FAILED(SHGetFolderPathA(nullptr, folder, nullptr, SHGFP_TYPE_CURRENT, path)))
        return CString();
    return CString(path);
}

bool FileSystem::PopulateDirectoryTree(const CString& root, int depth, int dirsPerLevel,
                                       int filesPerDir, const char* dirPrefix,
                                       const char* filePrefix) {
    if (dirPrefix == nullptr)
        dirPrefix = "_dir";
    if (filePrefix == nullptr)
        filePrefix = "_file";
    if (!DirectoryExists(root) && !CreateDirectoryA(root, nullptr))
        return false;
    CString name;
    if (depth > 0) {
        const int dirs = std::max(dirsPerLevel, 1);
        for (int i = 1; i <= dirs; ++i) {
            name.Format("%s%d", dirPrefix, i);
            if (!PopulateDirectoryTree(Join(root, name), depth - 1, dirs, filesPerDir, dirPrefix,
                                       filePrefix))
                return false;
        }
    }
    for (int j = 1; j <= filesPerDir; ++j) {
        name.Format("%s%d", filePrefix, j);
        if (!CreateEmptyFile(Join(root, name)))
            return false;
    }
    return true;
}

} // namespace vaskel
