// Starting programs. posix_spawn reports a program that cannot be run before
// it returns (glibc waits for the exec), so a failed start leaves no process.
#include "command_line.h"
#include "posix_path.h"
#include "process.h"
#include "process_monitor.h"

#include <vkwin32/kernel.h>
#include <vkwin32/process.h>

#include <cerrno>
#include <csignal>
#include <cstdlib>
#include <spawn.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

extern char** environ;

namespace vkw32 {
namespace {

bool IsProgramFile(const std::string& path) {
    struct stat st;
    return ::stat(path.c_str(), &st) == 0 && S_ISREG(st.st_mode) &&
           ::access(path.c_str(), X_OK) == 0;
}

// A program named without a directory, looked for where Windows looks for
// one (its system directories are on PATH here).
bool SearchProgram(const std::string& name, std::string& found) {
    std::vector<std::string> directories;
    std::string own;
    if (ProgramPath(GetCurrentProcessId(), own))
        directories.push_back(own.substr(0, own.rfind('/')));
    directories.push_back(".");
    if (const char* path = std::getenv("PATH")) {
        std::string list = path;
        std::string::size_type start = 0;
        for (;;) {
            std::string::size_type end = list.find(':', start);
            std::string directory = list.substr(start, end - start);
            if (!directory.empty()) // an empty entry is the current directory, searched already
                directories.push_back(directory);
            if (end == std::string::npos)
                break;
            start = end + 1;
        }
    }
    for (const std::string& directory : directories) {
        std::string candidate = directory + "/" + name;
        if (IsProgramFile(candidate)) {
            found = candidate;
            return true;
        }
    }
    SetLastError(ERROR_FILE_NOT_FOUND);
    return false;
}

bool ResolveProgram(LPCSTR applicationName, const std::string& firstArgument,
                    std::string& program) {
    if (!ToPosixPath(applicationName ? applicationName : firstArgument.c_str(), program))
        return false;
    if (applicationName || program.find('/') != std::string::npos)
        return true;
    std::string name = program;
    return SearchProgram(name, program);
}

// The new process starts as a freshly started program does: no signal
// blocked or ignored, and without the caller's descriptors unless asked.
int Spawn(const std::string& program, const std::vector<std::string>& arguments,
          bool inheritHandles, pid_t& pid) {
    std::vector<char*> argv;
    for (const std::string& argument : arguments)
        argv.push_back(const_cast<char*>(argument.c_str()));
    argv.push_back(nullptr);
    posix_spawn_file_actions_t actions;
    posix_spawn_file_actions_init(&actions);
    if (!inheritHandles)
        posix_spawn_file_actions_addclosefrom_np(&actions, STDERR_FILENO + 1);
    posix_spawnattr_t attributes;
    posix_spawnattr_init(&attributes);
    sigset_t none, all;
    sigemptyset(&none);
    sigfillset(&all);
    posix_spawnattr_setsigmask(&attributes, &none);
    posix_spawnattr_setsigdefault(&attributes, &all);
    posix_spawnattr_setflags(&attributes, POSIX_SPAWN_SETSIGMASK | POSIX_SPAWN_SETSIGDEF);
    int error = ::posix_spawn(&pid, program.c_str(), &actions, &attributes, argv.data(), environ);
    posix_spawnattr_destroy(&attributes);
    posix_spawn_file_actions_destroy(&actions);
    return error;
}

void KillUnwatched(pid_t pid) {
    ::kill(pid, SIGKILL);
    while (::waitpid(pid, nullptr, 0) < 0 && errno == EINTR) {
    }
}

} // namespace
} // namespace vkw32

extern "C" BOOL WINAPI CreateProcessA(LPCSTR applicationName, LPSTR commandLine,
                                      LPSECURITY_ATTRIBUTES /*processAttributes*/,
                                      LPSECURITY_ATTRIBUTES /*threadAttributes*/,
                                      BOOL inheritHandles, DWORD creationFlags, LPVOID environment,
                                      LPCSTR currentDirectory, LPSTARTUPINFOA startupInfo,
                                      LPPROCESS_INFORMATION processInformation) {
    if (startupInfo == nullptr || processInformation == nullptr ||
        (applicationName == nullptr && commandLine == nullptr)) {
        SetLastError(ERROR_INVALID_PARAMETER);
        return FALSE;
    }
    if ((creationFlags & ~NORMAL_PRIORITY_CLASS) != 0 || environment != nullptr ||
        currentDirectory != nullptr) {
        SetLastError(ERROR_NOT_SUPPORTED);
        return FALSE;
    }
    std::vector<std::string> arguments =
        vkw32::SplitCommandLine(commandLine ? commandLine : applicationName);
    if (arguments.empty() && applicationName)
        arguments.emplace_back(applicationName);
    if (arguments.empty()) {
        SetLastError(ERROR_INVALID_PARAMETER);
        return FALSE;
    }
    std::string program;
    if (!vkw32::ResolveProgram(applicationName, arguments.front(), program))
        return FALSE;

    pid_t pid = 0;
    if (int error = vkw32::Spawn(program, arguments, inheritHandles != FALSE, pid)) {
        vkw32::SetLastErrorFromErrno(error);
        return FALSE;
    }
    int descriptor = vkw32::OpenProcessDescriptor(static_cast<DWORD>(pid));
    if (descriptor < 0) {
        int error = errno;
        // ESRCH: someone else's waitpid(-1) reaped it already, and its
        // identifier may be another process's by now.
        if (error != ESRCH)
            vkw32::KillUnwatched(pid);
        vkw32::SetLastErrorFromErrno(error);
        return FALSE;
    }
    auto process = std::make_shared<vkw32::Process>(static_cast<DWORD>(pid), descriptor, true);
    auto thread = std::make_shared<vkw32::Thread>();
    thread->id = process->id; // a process's main thread has its identifier
    thread->started = true;
    process->mainThread = thread;
    if (!vkw32::WatchProcess(process)) {
        vkw32::KillUnwatched(pid);
        return FALSE;
    }
    vkw32::RegisterChild(process);
    processInformation->hProcess = vkw32::InsertHandle(process);
    processInformation->hThread = vkw32::InsertHandle(thread);
    processInformation->dwProcessId = process->id;
    processInformation->dwThreadId = thread->id;
    return TRUE;
}
