// Events. Named events are shared within the process: creating one whose name
// exists opens the existing event.
#include "wait.h"

#include <cstring>
#include <map>
#include <string>

namespace vkw32 {
namespace {

class Event : public Waitable {
public:
    Event(bool manualReset, bool initialState, std::string name)
        : m_manualReset(manualReset), m_signaled(initialState), m_name(std::move(name)) {}
    ~Event() override;

    bool IsSignaled() const override { return m_signaled; }
    void Acquire() override {
        if (!m_manualReset)
            m_signaled = false;
    }

    void Set(KernelLock& lock) {
        m_signaled = true;
        Signaled(lock);
    }
    void Reset() { m_signaled = false; }
    void Pulse(KernelLock& lock) {
        m_signaled = true;
        Signaled(lock);
        m_signaled = false;
    }

private:
    const bool m_manualReset;
    bool m_signaled;
    const std::string m_name;
};

struct NameTable {
    std::mutex mutex;
    std::map<std::string, std::weak_ptr<Event>> events; // object names are case-sensitive
};

NameTable& Names() {
    static NameTable* names = new NameTable; // outlives every static destructor
    return *names;
}

Event::~Event() {
    if (m_name.empty())
        return;
    NameTable& names = Names();
    std::lock_guard<std::mutex> lock(names.mutex);
    auto it = names.events.find(m_name);
    if (it != names.events.end() && it->second.expired())
        names.events.erase(it);
}

std::shared_ptr<Event> EventOf(HANDLE handle) {
    return LookupHandleAs<Event>(handle);
}

} // namespace
} // namespace vkw32

using vkw32::Event;

extern "C" HANDLE WINAPI CreateEventA(LPSECURITY_ATTRIBUTES /*attributes*/, BOOL manualReset,
                                      BOOL initialState, LPCSTR name) {
    if (name == nullptr || *name == '\0') {
        HANDLE handle = vkw32::InsertHandle(
            std::make_shared<Event>(manualReset != FALSE, initialState != FALSE, std::string()));
        SetLastError(ERROR_SUCCESS);
        return handle;
    }
    if (std::strlen(name) >= MAX_PATH) {
        SetLastError(ERROR_FILENAME_EXCED_RANGE);
        return nullptr;
    }
    // A backslash may only follow a namespace prefix; the session's own
    // namespace is the default one.
    std::string key = name;
    if (key.compare(0, 6, "Local\\") == 0)
        key.erase(0, 6);
    std::string::size_type rest = key.compare(0, 7, "Global\\") == 0 ? 7 : 0;
    if (key.find('\\', rest) != std::string::npos) {
        SetLastError(ERROR_PATH_NOT_FOUND);
        return nullptr;
    }
    vkw32::NameTable& names = vkw32::Names();
    std::unique_lock<std::mutex> lock(names.mutex);
    std::shared_ptr<Event> event = names.events[key].lock();
    bool existed = event != nullptr;
    if (!existed) {
        event = std::make_shared<Event>(manualReset != FALSE, initialState != FALSE, key);
        names.events[key] = event;
    }
    lock.unlock();
    HANDLE handle = vkw32::InsertHandle(event);
    SetLastError(existed ? ERROR_ALREADY_EXISTS : ERROR_SUCCESS);
    return handle;
}

extern "C" BOOL WINAPI SetEvent(HANDLE event) {
    std::shared_ptr<Event> object = vkw32::EventOf(event);
    if (!object)
        return FALSE;
    vkw32::KernelLock lock;
    object->Set(lock);
    return TRUE;
}

extern "C" BOOL WINAPI ResetEvent(HANDLE event) {
    std::shared_ptr<Event> object = vkw32::EventOf(event);
    if (!object)
        return FALSE;
    vkw32::KernelLock lock;
    object->Reset();
    return TRUE;
}

extern "C" BOOL WINAPI PulseEvent(HANDLE event) {
    std::shared_ptr<Event> object = vkw32::EventOf(event);
    if (!object)
        return FALSE;
    vkw32::KernelLock lock;
    object->Pulse(lock);
    return TRUE;
}
