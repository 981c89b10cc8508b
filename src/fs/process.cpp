#include <vaskel/fs.h>

namespace vaskel {
namespace {

// What a call left in a buffer of MAX_PATH characters: length characters
// when that many fit, else nothing.
CString FromBuffer(const char* buffer, DWORD length) {
    return length > 0 && length < MAX_PATH ? CString(buffer, static_cast<int>(length)) : CString();
}

} // namespace

CString Process::GetImagePath() {
    char buffer[MAX_PATH] = "";
    return FromBuffer(buffer, GetProcessImageFileNameA(GetCurrentProcess(), buffer, MAX_PATH));
}

CString Process::GetBaseName() {
    return CPathUrl(GetImagePath()).GetFileName();
}

CString Process::GetBaseNameNoExtension() {
    return CPathUrl(GetImagePath()).GetName();
}

CString Process::GetModulePath(HINSTANCE module) {
    char buffer[MAX_PATH] = "";
    return FromBuffer(buffer, GetModuleFileNameExA(GetCurrentProcess(), module, buffer, MAX_PATH));
}

CString Process::GetModuleName(HINSTANCE module) {
    return CPathUrl(GetModulePath(module)).GetFileName();
}

CString Process::GetModuleNameNoExtension(HINSTANCE module) {
    return CPathUrl(GetModulePath(module)).GetName();
}

CString Process::GetLongPath(const char* path) {
    char buffer[MAX_PATH] = "";
    return FromBuffer(buffer, GetLongPathNameA(path, buffer, MAX_PATH));
}

CString Process::GetShortPath(const char* path) {
    char buffer[MAX_PATH] = "";
    return FromBuffer(buffer, GetShortPathNameA(path, buffer, MAX_PATH));
}

bool Process::Execute(const char* application, const char* arguments, DWORD& processId) {
    CString commandLine = application;
    if (!commandLine.IsEmpty())
        commandLine += ' ';
    commandLine += arguments;
    STARTUPINFOA startup{};
    startup.cb = sizeof startup;
    PROCESS_INFORMATION started{};
    // The command line must be writable.
    BOOL created = CreateProcessA(application, commandLine.GetBuffer(), nullptr, nullptr, FALSE,
                                  NORMAL_PRIORITY_CLASS, nullptr, nullptr, &startup, &started);
    commandLine.ReleaseBuffer();
    if (!created)
        return false;
    processId = started.dwProcessId;
    CloseHandle(started.hProcess);
    CloseHandle(started.hThread);
    return true;
}

bool Process::IsRunning(DWORD processId) {
    HANDLE process = OpenProcess(PROCESS_QUERY_INFORMATION | SYNCHRONIZE, FALSE, processId);
    if (process == nullptr)
        return false;
    // The exit code alone cannot tell a process that ended with STILL_ACTIVE
    // from one that runs; the handle's state can.
    DWORD code = 0;
    bool running = GetExitCodeProcess(process, &code) && code == STILL_ACTIVE &&
                   WaitForSingleObject(process, 0) == WAIT_TIMEOUT;
    CloseHandle(process);
    return running;
}

} // namespace vaskel
