// Splitting a path into drive, directory, file name and extension, and
// joining such parts. UTF-8 never uses an ASCII byte inside a multibyte
// character, so ':', the separators and '.' are found byte by byte.
#include <vkwin32/crt.h>

#include <cerrno>
#include <cstring>

namespace {

struct Part {
    char* buffer;
    size_t size;
    const char* first;
    size_t length;
};

// A buffer and its size name a part together, or leave it out together.
bool IsConsistent(const char* buffer, size_t size) {
    return (buffer == nullptr) == (size == 0);
}

// Appends to a NUL-terminated result of capacity bytes, keeping room for the
// NUL; false when the text does not fit.
class PathWriter {
public:
    PathWriter(char* buffer, size_t capacity) : m_buffer(buffer), m_capacity(capacity) {}

    bool Append(const char* text, size_t length) {
        if (length >= m_capacity - m_used)
            return false;
        std::memcpy(m_buffer + m_used, text, length);
        m_used += length;
        return true;
    }
    void Terminate() { m_buffer[m_used] = '\0'; }

private:
    char* m_buffer;
    size_t m_capacity;
    size_t m_used = 0;
};

bool IsSeparator(char c) {
    return c == '\\' || c == '/';
}

bool AppendParts(PathWriter& out, const char* drive, const char* dir, const char* fileName,
                 const char* ext) {
    if (drive != nullptr && drive[0] != '\0') {
        const char letter[] = {drive[0], ':'};
        if (!out.Append(letter, sizeof letter))
            return false;
    }
    if (dir != nullptr && dir[0] != '\0') {
        size_t length = std::strlen(dir);
        if (!out.Append(dir, length))
            return false;
        if (!IsSeparator(dir[length - 1]) && !out.Append("\\", 1))
            return false;
    }
    if (fileName != nullptr && fileName[0] != '\0' && !out.Append(fileName, std::strlen(fileName)))
        return false;
    if (ext != nullptr && ext[0] != '\0') {
        if (ext[0] != '.' && !out.Append(".", 1))
            return false;
        if (!out.Append(ext, std::strlen(ext)))
            return false;
    }
    return true;
}

} // namespace

extern "C" errno_t _splitpath_s(const char* path, char* drive, size_t driveSize, char* dir,
                                size_t dirSize, char* fileName, size_t fileNameSize, char* ext,
                                size_t extSize) {
    if (path == nullptr || !IsConsistent(drive, driveSize) || !IsConsistent(dir, dirSize) ||
        !IsConsistent(fileName, fileNameSize) || !IsConsistent(ext, extSize)) {
        errno = EINVAL;
        return EINVAL;
    }
    const char* rest = path;
    if (path[0] != '\0' && path[1] == ':')
        rest += 2;
    const char* name = rest;
    for (const char* p = rest; *p != '\0'; ++p) {
        if (IsSeparator(*p))
            name = p + 1;
    }
    const char* end = name + std::strlen(name);
    const char* dot = std::strrchr(name, '.');
    if (dot == nullptr)
        dot = end;
    Part parts[] = {
        {drive, driveSize, path, static_cast<size_t>(rest - path)},
        {dir, dirSize, rest, static_cast<size_t>(name - rest)},
        {fileName, fileNameSize, name, static_cast<size_t>(dot - name)},
        {ext, extSize, dot, static_cast<size_t>(end - dot)},
    };
    for (const Part& part : parts) {
        if (part.buffer != nullptr && part.length >= part.size) {
            for (const Part& emptied : parts) {
                if (emptied.buffer != nullptr)
                    emptied.buffer[0] = '\0';
            }
            errno = ERANGE;
            return ERANGE;
        }
    }
    for (const Part& part : parts) {
        if (part.buffer != nullptr) {
            std::memcpy(part.buffer, part.first, part.length);
            part.buffer[part.length] = '\0';
        }
    }
    return 0;
}

extern "C" errno_t _makepath_s(char* path, size_t sizeInBytes, const char* drive, const char* dir,
                               const char* fileName, const char* ext) {
    if (path == nullptr || sizeInBytes == 0) {
        errno = EINVAL;
        return EINVAL;
    }
    PathWriter out(path, sizeInBytes);
    if (!AppendParts(out, drive, dir, fileName, ext)) {
        path[0] = '\0';
        errno = ERANGE;
        return ERANGE;
    }
    out.Terminate();
    return 0;
}
