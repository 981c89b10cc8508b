#include <vaskel/text.h>

#include <cstdlib>
#include <cstring>
#include <string>

namespace vaskel {
namespace {

struct Part {
    CString* out;
    size_t limit;
    std::string buffer;

    char* Data() { return out != nullptr ? &buffer[0] : nullptr; }
    size_t Size() const { return buffer.size(); }
};

} // namespace

void VKSplitPath(const char* path, CString* drive, CString* directory, CString* fileName,
                 CString* extension) {
    if (path == nullptr)
        path = "";
    Part parts[] = {{drive, _MAX_DRIVE, {}},
                    {directory, _MAX_DIR, {}},
                    {fileName, _MAX_FNAME, {}},
                    {extension, _MAX_EXT, {}}};
    // Buffers that hold the whole path, so the runtime never meets one too
    // small: on Windows that calls the invalid-parameter handler, which ends
    // the process by default. The part limits are applied afterwards.
    for (Part& part : parts) {
        if (part.out != nullptr)
            part.buffer.assign(std::strlen(path) + 1, '\0');
    }
    bool fits =
        _splitpath_s(path, parts[0].Data(), parts[0].Size(), parts[1].Data(), parts[1].Size(),
                     parts[2].Data(), parts[2].Size(), parts[3].Data(), parts[3].Size()) == 0;
    for (const Part& part : parts)
        fits = fits && (part.out == nullptr || std::strlen(part.buffer.c_str()) < part.limit);
    for (const Part& part : parts) {
        if (part.out != nullptr)
            *part.out = fits ? CString(part.buffer.c_str()) : CString();
    }
}

CString VKGetDrive(const char* path) {
    CString drive;
    VKSplitPath(path, &drive, nullptr, nullptr, nullptr);
    return drive;
}

CString VKGetDirectory(const char* path) {
    CString directory;
    VKSplitPath(path, nullptr, &directory, nullptr, nullptr);
    return directory;
}

CString VKGetFileName(const char* path) {
    CString fileName;
    VKSplitPath(path, nullptr, nullptr, &fileName, nullptr);
    return fileName;
}

CString VKGetFileExt(const char* path) {
    CString extension;
    VKSplitPath(path, nullptr, nullptr, nullptr, &extension);
    return extension;
}

CString VKMakePath(const char* drive, const char* directory, const char* fileName,
                   const char* extension) {
    // Room for every part plus the ':', '\' and '.' the runtime may add, so
    // that it cannot fail; the path limit is applied afterwards.
    size_t size = 4;
    for (const char* part : {drive, directory, fileName, extension})
        size += part != nullptr ? std::strlen(part) : 0;
    std::string path(size, '\0');
    if (_makepath_s(&path[0], size, drive, directory, fileName, extension) != 0)
        return CString();
    size_t length = std::strlen(path.c_str());
    return length < _MAX_PATH ? CString(path.c_str(), static_cast<int>(length)) : CString();
}

} // namespace vaskel
