// The file names of a process's program and modules.
#include "kernel/module.h"
#include "kernel/process.h"

#include <vkwin32/kernel.h>
#include <vkwin32/psapi.h>

#include <algorithm>
#include <cstring>

namespace {

bool IsBuffer(LPSTR buffer, DWORD size) {
    if (buffer == nullptr && size > 0) {
        SetLastError(ERROR_INVALID_PARAMETER);
        return false;
    }
    return true;
}

// Only while the process runs: an ended process's identifier may name
// another process by now.
bool ProgramOf(const vkw32::Process& process, std::string& path) {
    bool ended;
    {
        vkw32::KernelLock lock;
        ended = process.IsSignaled();
    }
    if (ended) {
        SetLastError(ERROR_ACCESS_DENIED);
        return false;
    }
    return vkw32::ProgramPath(process.id, path);
}

bool ModulePath(const vkw32::Process& process, HMODULE module, std::string& path) {
    if (module == nullptr)
        return ProgramOf(process, path);
    // Module handles are addresses in their own process.
    if (process.id != GetCurrentProcessId()) {
        SetLastError(ERROR_INVALID_HANDLE);
        return false;
    }
    return vkw32::ModuleFilePath(module, path);
}

} // namespace

extern "C" DWORD WINAPI GetProcessImageFileNameA(HANDLE handle, LPSTR imageFileName, DWORD size) {
    std::shared_ptr<vkw32::Process> process = vkw32::LookupHandleAs<vkw32::Process>(handle);
    std::string path;
    if (!process || !IsBuffer(imageFileName, size) || !ProgramOf(*process, path))
        return 0;
    if (path.size() >= size) {
        SetLastError(ERROR_INSUFFICIENT_BUFFER);
        return 0;
    }
    std::memcpy(imageFileName, path.c_str(), path.size() + 1);
    return static_cast<DWORD>(path.size());
}

extern "C" DWORD WINAPI GetModuleFileNameExA(HANDLE handle, HMODULE module, LPSTR fileName,
                                             DWORD size) {
    std::shared_ptr<vkw32::Process> process = vkw32::LookupHandleAs<vkw32::Process>(handle);
    if (!process || !IsBuffer(fileName, size))
        return 0;
    std::string path;
    if (!ModulePath(*process, module, path))
        return 0;
    if (size == 0) {
        SetLastError(ERROR_INSUFFICIENT_BUFFER);
        return 0;
    }
    const std::size_t length = std::min<std::size_t>(path.size(), size - 1);
    std::memcpy(fileName, path.data(), length);
    fileName[length] = '\0';
    return static_cast<DWORD>(length);
}
