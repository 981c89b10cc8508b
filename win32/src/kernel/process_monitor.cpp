// One thread polls a descriptor per watched process and an event descriptor
// that announces changes to the watch list. Descriptors serve children and
// other processes alike, and need neither SIGCHLD, which belongs to the
// program, nor waitpid(-1), which would steal the statuses of children that
// others started.
#include "process_monitor.h"

#include "posix_path.h"

#include <atomic>
#include <cerrno>
#include <csignal>
#include <cstdint>
#include <fcntl.h>
#include <mutex>
#include <poll.h>
#include <pthread.h>
#include <sys/eventfd.h>
#include <sys/wait.h>
#include <unistd.h>
#include <vector>

namespace vkw32 {
namespace {

struct Watch {
    int descriptor;                 // the monitor's own duplicate of the process's
    std::shared_ptr<Process> child; // kept until reaped
    std::weak_ptr<Process> other;   // watched while its object lives
};

// Under the wait lock, after the child was reaped.
DWORD ExitCode(const Process& process, const siginfo_t& info) {
    if (info.si_code == CLD_EXITED)
        return static_cast<DWORD>(info.si_status);
    if (process.terminating && info.si_status == SIGKILL)
        return process.terminateCode;
    return 128 + static_cast<DWORD>(info.si_status);
}

class Monitor {
public:
    bool Add(const std::shared_ptr<Process>& process);
    void Wake();

private:
    bool Start();
    static void* Main(void* self);
    void Run();
    void Ended(int descriptor);
    void DropUnused();

    std::mutex m_mutex; // guards m_watches
    std::vector<Watch> m_watches;
    std::atomic<int> m_wake{-1}; // the event descriptor, once the thread runs
};

Monitor& TheMonitor() {
    static auto* monitor = new Monitor; // its thread outlives every static destructor
    return *monitor;
}

bool Monitor::Add(const std::shared_ptr<Process>& process) {
    int descriptor = ::fcntl(process->descriptor, F_DUPFD_CLOEXEC, 0);
    if (descriptor < 0) {
        SetLastErrorFromErrno(errno);
        return false;
    }
    {
        std::lock_guard<std::mutex> lock(m_mutex);
        if (m_wake < 0 && !Start()) {
            ::close(descriptor);
            return false;
        }
        Watch watch{descriptor, nullptr, {}};
        if (process->child)
            watch.child = process;
        else
            watch.other = process;
        m_watches.push_back(std::move(watch));
    }
    Wake();
    return true;
}

void Monitor::Wake() {
    int wake = m_wake;
    if (wake < 0)
        return;
    const std::uint64_t one = 1;
    // Fails only when the counter is full, and then a wake is pending anyway.
    [[maybe_unused]] ssize_t written = ::write(wake, &one, sizeof one);
}

// Under m_mutex.
bool Monitor::Start() {
    int wake = ::eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK);
    if (wake < 0) {
        SetLastErrorFromErrno(errno);
        return false;
    }
    m_wake = wake;
    // The thread takes no signals: they stay with the program's own threads.
    sigset_t all, previous;
    sigfillset(&all);
    pthread_sigmask(SIG_SETMASK, &all, &previous);
    pthread_attr_t attributes;
    pthread_attr_init(&attributes);
    pthread_attr_setdetachstate(&attributes, PTHREAD_CREATE_DETACHED);
    pthread_t thread;
    int error = pthread_create(&thread, &attributes, &Monitor::Main, this);
    pthread_attr_destroy(&attributes);
    pthread_sigmask(SIG_SETMASK, &previous, nullptr);
    if (error != 0) {
        m_wake = -1;
        ::close(wake);
        SetLastError(ERROR_NOT_ENOUGH_MEMORY);
        return false;
    }
    return true;
}

void* Monitor::Main(void* self) {
    static_cast<Monitor*>(self)->Run();
    return nullptr;
}

void Monitor::Run() {
    std::vector<pollfd> polled;
    for (;;) {
        polled.assign(1, pollfd{m_wake, POLLIN, 0});
        {
            std::lock_guard<std::mutex> lock(m_mutex);
            for (const Watch& watch : m_watches)
                polled.push_back(pollfd{watch.descriptor, POLLIN, 0});
        }
        // Only this thread removes watches, so every descriptor polled stays open.
        if (::poll(polled.data(), polled.size(), -1) < 0)
            continue;
        if (polled[0].revents) {
            // Resets the counter: it only tells that the watch list changed.
            std::uint64_t count;
            [[maybe_unused]] ssize_t drained = ::read(m_wake, &count, sizeof count);
        }
        for (std::size_t i = 1; i < polled.size(); ++i) {
            if (polled[i].revents)
                Ended(polled[i].fd);
        }
        DropUnused();
    }
}

void Monitor::Ended(int descriptor) {
    Watch watch{-1, nullptr, {}};
    {
        std::lock_guard<std::mutex> lock(m_mutex);
        for (auto it = m_watches.begin(); it != m_watches.end(); ++it) {
            if (it->descriptor == descriptor) {
                watch = std::move(*it);
                m_watches.erase(it);
                break;
            }
        }
    }
    // Released last, outside every lock: it may be the object's last reference.
    std::shared_ptr<Process> process = watch.child ? watch.child : watch.other.lock();
    if (process) {
        siginfo_t info{};
        int reaped = -1;
        if (process->child) {
            do
                reaped = ::waitid(P_PIDFD, static_cast<id_t>(descriptor), &info, WEXITED);
            while (reaped < 0 && errno == EINTR);
        }
        // A child reaped by someone else (SIGCHLD ignored, waitpid(-1)) ended
        // without telling how.
        KernelLock lock;
        if (reaped == 0)
            process->End(lock, true, ExitCode(*process, info));
        else
            process->End(lock, false, 0);
    }
    ::close(descriptor);
}

void Monitor::DropUnused() {
    std::vector<int> unused;
    {
        std::lock_guard<std::mutex> lock(m_mutex);
        for (auto it = m_watches.begin(); it != m_watches.end();) {
            if (!it->child && it->other.expired()) {
                unused.push_back(it->descriptor);
                it = m_watches.erase(it);
            } else {
                ++it;
            }
        }
    }
    for (int descriptor : unused)
        ::close(descriptor);
}

} // namespace

bool WatchProcess(const std::shared_ptr<Process>& process) {
    return TheMonitor().Add(process);
}

void DropUnusedWatches() {
    TheMonitor().Wake();
}

} // namespace vkw32
