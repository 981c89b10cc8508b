// Shell folder paths on POSIX: the user's home and the XDG base directories
// stand for the folders that have a meaning here.
#include "kernel/user_dirs.h"

#include <vkwin32/shlobj.h>

#include <cstring>
#include <sys/stat.h>

namespace {

enum class Folder { Home, Config, Data, Absent, Invalid };

Folder FolderOf(int csidl) {
    switch (csidl) {
    case CSIDL_PERSONAL:
    case CSIDL_PROFILE:
        return Folder::Home;
    case CSIDL_APPDATA:
        return Folder::Config;
    case CSIDL_LOCAL_APPDATA:
        return Folder::Data;
    // Virtual folders have no path on Windows either.
    case CSIDL_INTERNET:
    case CSIDL_CONTROLS:
    case CSIDL_PRINTERS:
    case CSIDL_BITBUCKET:
    case CSIDL_DRIVES:
    case CSIDL_NETWORK:
    case CSIDL_CONNECTIONS:
    case CSIDL_COMPUTERSNEARME:
        return Folder::Invalid;
    default:
        break;
    }
    // The identifiers Windows defines between the virtual ones name real
    // folders that do not exist here; the gaps and the rest name nothing.
    const bool defined = csidl >= 0 && csidl <= CSIDL_CDBURN_AREA && csidl != 0x0c &&
                         csidl != 0x0f && (csidl < 0x32 || csidl > 0x34);
    return defined ? Folder::Absent : Folder::Invalid;
}

std::string PosixPathOf(Folder folder) {
    switch (folder) {
    case Folder::Home:
        return vkw32::HomeDirectory();
    case Folder::Config:
        return vkw32::XdgBaseDirectory("XDG_CONFIG_HOME", ".config");
    case Folder::Data:
        return vkw32::XdgBaseDirectory("XDG_DATA_HOME", ".local/share");
    default:
        return {};
    }
}

// The Win32 form: backslashes and no trailing one (but for the root).
std::string Win32PathOf(std::string posix) {
    while (posix.size() > 1 && posix.back() == '/')
        posix.pop_back();
    for (char& c : posix)
        if (c == '/')
            c = '\\';
    return posix;
}

} // namespace

extern "C" HRESULT WINAPI SHGetFolderPathA(HWND /*owner*/, int folder, HANDLE /*token*/,
                                           DWORD /*flags*/, LPSTR path) {
    if (path == nullptr)
        return E_INVALIDARG;
    *path = '\0';
    const Folder kind = FolderOf(folder & ~CSIDL_FLAG_MASK);
    if (kind == Folder::Invalid)
        return E_INVALIDARG;
    const std::string posix = PosixPathOf(kind);
    if (posix.empty())
        return E_FAIL;
    const std::string result = Win32PathOf(posix);
    if (result.size() >= MAX_PATH)
        return HRESULT_FROM_WIN32(ERROR_FILENAME_EXCED_RANGE);
    if (folder & CSIDL_FLAG_CREATE) {
        if (const DWORD error = vkw32::CreatePrivateDirectories(posix))
            return HRESULT_FROM_WIN32(error);
    } else if (!(folder & CSIDL_FLAG_DONT_VERIFY)) {
        struct stat st;
        if (::stat(posix.c_str(), &st) != 0 || !S_ISDIR(st.st_mode))
            return HRESULT_FROM_WIN32(ERROR_FILE_NOT_FOUND);
    }
    std::memcpy(path, result.c_str(), result.size() + 1);
    return S_OK;
}
