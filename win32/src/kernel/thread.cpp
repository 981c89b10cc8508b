#include "thread.h"

#include <vkwin32/kernel.h>

#include <algorithm>
#include <climits>
#include <pthread.h>
#include <sched.h>
#include <unistd.h>
#include <vector>

namespace vkw32 {
namespace {

std::vector<std::function<void()>>& ExitHooks() {
    static auto* hooks = new std::vector<std::function<void()>>; // outlives static destructors
    return *hooks;
}

// Ends the thread's life as a kernel object when the thread itself ends.
struct ThreadRecord {
    std::shared_ptr<Thread> object;
    ~ThreadRecord() {
        if (!object)
            return;
        for (const auto& hook : ExitHooks())
            hook();
        KernelLock lock;
        if (!object->IsSignaled())
            object->Finish(lock, 0);
    }
};

thread_local ThreadRecord currentThread;

struct StartInfo {
    std::shared_ptr<Thread> thread;
    LPTHREAD_START_ROUTINE start;
    LPVOID parameter;
};

void* ThreadMain(void* argument) {
    std::unique_ptr<StartInfo> info(static_cast<StartInfo*>(argument));
    std::shared_ptr<Thread> thread = info->thread;
    currentThread.object = thread;
    {
        KernelLock lock;
        thread->id = GetCurrentThreadId();
        thread->started = true;
        thread->stateChanged.notify_all();
        thread->stateChanged.wait(lock.Lock(), [&] { return thread->suspendCount == 0; });
    }
    DWORD exitCode = info->start(info->parameter);
    for (const auto& hook : ExitHooks())
        hook();
    {
        KernelLock lock;
        thread->Finish(lock, exitCode);
    }
    currentThread.object.reset();
    return nullptr;
}

size_t StackSizeFor(SIZE_T requested) {
    if (requested == 0)
        return 0;
    long page = ::sysconf(_SC_PAGESIZE);
    size_t size = std::max<size_t>(requested, PTHREAD_STACK_MIN);
    return (size + page - 1) / page * page;
}

} // namespace

void Thread::Finish(KernelLock& lock, DWORD code) {
    exitCode = code;
    m_finished = true;
    Signaled(lock);
}

std::shared_ptr<Thread> CurrentThreadObject() {
    if (!currentThread.object) {
        auto thread = std::make_shared<Thread>();
        thread->id = GetCurrentThreadId();
        thread->started = true;
        currentThread.object = thread;
    }
    return currentThread.object;
}

void AddThreadExitHook(std::function<void()> hook) {
    ExitHooks().push_back(std::move(hook));
}

} // namespace vkw32

using vkw32::Thread;

extern "C" HANDLE WINAPI GetCurrentThread(void) {
    return reinterpret_cast<HANDLE>(static_cast<LONG_PTR>(-2));
}

extern "C" HANDLE WINAPI CreateThread(LPSECURITY_ATTRIBUTES /*attributes*/, SIZE_T stackSize,
                                      LPTHREAD_START_ROUTINE startAddress, LPVOID parameter,
                                      DWORD creationFlags, LPDWORD threadId) {
    if (startAddress == nullptr) {
        SetLastError(ERROR_INVALID_PARAMETER);
        return nullptr;
    }
    auto thread = std::make_shared<Thread>();
    thread->suspendCount = (creationFlags & CREATE_SUSPENDED) ? 1 : 0;
    auto* info = new vkw32::StartInfo{thread, startAddress, parameter};

    pthread_attr_t attributes;
    pthread_attr_init(&attributes);
    pthread_attr_setdetachstate(&attributes, PTHREAD_CREATE_DETACHED);
    if (size_t size = vkw32::StackSizeFor(stackSize))
        pthread_attr_setstacksize(&attributes, size);
    pthread_t posixThread;
    int error = pthread_create(&posixThread, &attributes, vkw32::ThreadMain, info);
    pthread_attr_destroy(&attributes);
    if (error != 0) {
        delete info;
        SetLastError(error == EAGAIN ? ERROR_NOT_ENOUGH_MEMORY : ERROR_INVALID_PARAMETER);
        return nullptr;
    }
    // The identifier is the new thread's own: wait until it has told it.
    {
        vkw32::KernelLock lock;
        thread->stateChanged.wait(lock.Lock(), [&] { return thread->started; });
    }
    if (threadId)
        *threadId = thread->id;
    return vkw32::InsertHandle(thread);
}

extern "C" DWORD WINAPI ResumeThread(HANDLE handle) {
    std::shared_ptr<Thread> thread = vkw32::LookupHandleAs<Thread>(handle);
    if (!thread)
        return static_cast<DWORD>(-1);
    vkw32::KernelLock lock;
    DWORD previous = thread->suspendCount;
    if (previous > 0 && --thread->suspendCount == 0)
        thread->stateChanged.notify_all();
    return previous;
}

extern "C" BOOL WINAPI GetExitCodeThread(HANDLE handle, LPDWORD exitCode) {
    std::shared_ptr<Thread> thread = vkw32::LookupHandleAs<Thread>(handle);
    if (!thread)
        return FALSE;
    if (exitCode == nullptr) {
        SetLastError(ERROR_INVALID_PARAMETER);
        return FALSE;
    }
    vkw32::KernelLock lock;
    *exitCode = thread->exitCode;
    return TRUE;
}

extern "C" DWORD WINAPI GetThreadId(HANDLE handle) {
    std::shared_ptr<Thread> thread = vkw32::LookupHandleAs<Thread>(handle);
    if (!thread)
        return 0;
    vkw32::KernelLock lock;
    return thread->id;
}
