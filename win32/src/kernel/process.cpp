// Process objects, opening processes by identifier, exit codes and termination.
#include "process.h"

#include "posix_path.h"
#include "process_monitor.h"

#include <vkwin32/kernel.h>
#include <vkwin32/process.h>
#include <vkwin32/synch.h>

#include <cerrno>
#include <climits>
#include <csignal>
#include <map>
#include <mutex>
#include <sys/syscall.h>
#include <unistd.h>
#include <vector>

namespace vkw32 {
namespace {

// The children whose objects live, by identifier: a child's identifier stays
// its own until it is reaped, and the monitor holds it until then.
struct ChildTable {
    std::mutex mutex;
    std::map<DWORD, std::weak_ptr<Process>> children;
};

ChildTable& Children() {
    static auto* table = new ChildTable; // outlives every static destructor
    return *table;
}

std::shared_ptr<Process> FindChild(DWORD id) {
    ChildTable& table = Children();
    std::lock_guard<std::mutex> lock(table.mutex);
    auto it = table.children.find(id);
    return it == table.children.end() ? nullptr : it->second.lock();
}

} // namespace

Process::Process(DWORD id, int descriptor, bool child)
    : id(id), descriptor(descriptor), child(child) {}

Process::~Process() {
    if (descriptor < 0)
        return;
    ::close(descriptor);
    if (child) {
        ChildTable& table = Children();
        std::lock_guard<std::mutex> lock(table.mutex);
        // A newer child may have the identifier by now.
        auto it = table.children.find(id);
        if (it != table.children.end() && it->second.expired())
            table.children.erase(it);
    } else {
        DropUnusedWatches();
    }
}

void Process::End(KernelLock& lock, bool codeKnown, DWORD code) {
    exitCodeKnown = codeKnown;
    if (codeKnown)
        exitCode = code;
    m_ended = true;
    Signaled(lock);
    if (mainThread)
        mainThread->Finish(lock, code);
}

// Through syscall(): the C library's wrappers are recent and its header
// lacks C++ linkage in some versions.
int OpenProcessDescriptor(DWORD processId) {
    return static_cast<int>(::syscall(SYS_pidfd_open, static_cast<pid_t>(processId), 0));
}

std::shared_ptr<Process> CurrentProcessObject() {
    static const auto* current = new std::shared_ptr<Process>(
        std::make_shared<Process>(static_cast<DWORD>(::getpid()), -1, false));
    return *current;
}

void RegisterChild(const std::shared_ptr<Process>& process) {
    ChildTable& table = Children();
    std::lock_guard<std::mutex> lock(table.mutex);
    table.children[process->id] = process;
}

bool ProgramPath(DWORD processId, std::string& path) {
    const std::string link = processId == static_cast<DWORD>(::getpid())
                                 ? std::string("/proc/self/exe")
                                 : "/proc/" + std::to_string(processId) + "/exe";
    std::vector<char> buffer(PATH_MAX);
    for (;;) {
        ssize_t length = ::readlink(link.c_str(), buffer.data(), buffer.size());
        if (length < 0) {
            SetLastErrorFromErrno(errno);
            return false;
        }
        if (static_cast<std::size_t>(length) < buffer.size()) {
            path.assign(buffer.data(), static_cast<std::size_t>(length));
            return true;
        }
        buffer.resize(buffer.size() * 2); // readlink cuts a longer target silently
    }
}

} // namespace vkw32

using vkw32::Process;

extern "C" HANDLE WINAPI OpenProcess(DWORD /*desiredAccess*/, BOOL /*inheritHandle*/,
                                     DWORD processId) {
    if (processId == 0 || processId > static_cast<DWORD>(INT_MAX)) {
        SetLastError(ERROR_INVALID_PARAMETER);
        return nullptr;
    }
    if (processId == GetCurrentProcessId())
        return vkw32::InsertHandle(vkw32::CurrentProcessObject());
    if (std::shared_ptr<Process> child = vkw32::FindChild(processId))
        return vkw32::InsertHandle(child);
    int descriptor = vkw32::OpenProcessDescriptor(processId);
    if (descriptor < 0) {
        // EINVAL: a thread that is not a process's main thread.
        SetLastError(errno == ESRCH || errno == EINVAL ? ERROR_INVALID_PARAMETER
                                                       : vkw32::ErrorFromErrno(errno));
        return nullptr;
    }
    auto process = std::make_shared<Process>(processId, descriptor, false);
    if (!vkw32::WatchProcess(process))
        return nullptr;
    return vkw32::InsertHandle(process);
}

extern "C" BOOL WINAPI GetExitCodeProcess(HANDLE handle, LPDWORD exitCode) {
    std::shared_ptr<Process> process = vkw32::LookupHandleAs<Process>(handle);
    if (!process)
        return FALSE;
    if (exitCode == nullptr) {
        SetLastError(ERROR_INVALID_PARAMETER);
        return FALSE;
    }
    vkw32::KernelLock lock;
    if (!process->IsSignaled()) {
        *exitCode = STILL_ACTIVE;
        return TRUE;
    }
    if (!process->exitCodeKnown) {
        SetLastError(ERROR_ACCESS_DENIED);
        return FALSE;
    }
    *exitCode = process->exitCode;
    return TRUE;
}

extern "C" BOOL WINAPI TerminateProcess(HANDLE handle, UINT exitCode) {
    std::shared_ptr<Process> process = vkw32::LookupHandleAs<Process>(handle);
    if (!process)
        return FALSE;
    if (process == vkw32::CurrentProcessObject())
        ::_exit(static_cast<int>(exitCode));
    // Under the wait lock, so that the monitor sees the code whenever it
    // sees the end that SIGKILL causes.
    vkw32::KernelLock lock;
    if (process->IsSignaled()) {
        SetLastError(ERROR_ACCESS_DENIED);
        return FALSE;
    }
    if (::syscall(SYS_pidfd_send_signal, process->descriptor, SIGKILL, nullptr, 0) != 0) {
        // ESRCH: it has ended and was reaped meanwhile.
        SetLastError(errno == ESRCH ? ERROR_ACCESS_DENIED : vkw32::ErrorFromErrno(errno));
        return FALSE;
    }
    if (!process->terminating) {
        process->terminating = true;
        process->terminateCode = exitCode;
    }
    return TRUE;
}
