// Process objects: waitable, signalled when the process ends. A process is
// named by a process descriptor (pidfd), which keeps naming that process
// after its identifier has gone to another one.
#pragma once

#include "thread.h"
#include "wait.h"

#include <memory>
#include <string>

namespace vkw32 {

class Process : public Waitable {
public:
    // Takes the descriptor; -1 for the current process, which never ends.
    Process(DWORD id, int descriptor, bool child);
    ~Process() override;

    bool IsSignaled() const override { return m_ended; }

    // Under the wait lock: signals the process, and its main thread when it
    // has one. A code that is not known makes GetExitCodeProcess fail.
    void End(KernelLock& lock, bool codeKnown, DWORD code);

    const DWORD id;
    const int descriptor;
    // Started by this process: its parent, which reaps it and learns its status.
    const bool child;

    // Under the wait lock.
    bool exitCodeKnown = false;
    DWORD exitCode = STILL_ACTIVE;
    bool terminating = false; // TerminateProcess has sent SIGKILL
    DWORD terminateCode = 0;
    std::shared_ptr<Thread> mainThread; // a child's

private:
    bool m_ended = false;
};

// A new process descriptor for a process, close-on-exec; -1 with errno set
// when there is none.
int OpenProcessDescriptor(DWORD processId);

// The object GetCurrentProcess() names.
std::shared_ptr<Process> CurrentProcessObject();

// Lets OpenProcess find a child of this process by its identifier while any
// handle names it.
void RegisterChild(const std::shared_ptr<Process>& process);

// The program file of a process, as POSIX names it; false with the last
// error set when it is not known.
bool ProgramPath(DWORD processId, std::string& path);

} // namespace vkw32
