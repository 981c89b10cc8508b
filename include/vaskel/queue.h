// Commands and the ownership that carries them into and out of queues.
#pragma once

#include <vaskel/export.h>

namespace vaskel {

// One piece of work to run later, usually on another thread. A queued command
// is told either Execute() or Canceled(), never both.
struct VASKEL_API CVKAsyncCmd {
    CVKAsyncCmd() = default;
    CVKAsyncCmd(const CVKAsyncCmd&) = default;
    CVKAsyncCmd& operator=(const CVKAsyncCmd&) = default;
    virtual ~CVKAsyncCmd();

    virtual void Execute() = 0;
    // Called instead of Execute() when the command leaves a queue unrun.
    virtual void Canceled();
};

// An owning pointer with a separate ownership flag. Copying hands the flag
// over and leaves the source pointing at the object without owning it, so the
// queue can tell the commands it must delete from those that live elsewhere.
template <class T>
class old_auto_ptr {
public:
    explicit old_auto_ptr(T* object = nullptr) noexcept
        : m_owner(object != nullptr), m_ptr(object) {}
    old_auto_ptr(const old_auto_ptr& other) noexcept
        : m_owner(other.m_owner), m_ptr(other.release()) {}
    template <class U>
    old_auto_ptr(const old_auto_ptr<U>& other) noexcept
        : m_owner(other.owns()), m_ptr(other.release()) {}

    old_auto_ptr& operator=(const old_auto_ptr& other) {
        if (this != &other) {
            if (m_ptr != other.get()) {
                if (m_owner)
                    delete m_ptr;
                m_owner = other.m_owner;
            } else if (other.m_owner) {
                m_owner = true;
            }
            m_ptr = other.release();
        }
        return *this;
    }

    ~old_auto_ptr() {
        if (m_owner && m_ptr)
            delete m_ptr;
    }

    T& operator*() const noexcept { return *m_ptr; }
    T* operator->() const noexcept { return m_ptr; }
    T* get() const noexcept { return m_ptr; }
    bool owns() const noexcept { return m_owner; }
    // Gives up ownership and keeps pointing at the object.
    T* release() const noexcept {
        m_owner = false;
        return m_ptr;
    }

private:
    mutable bool m_owner;
    T* m_ptr;
};

} // namespace vaskel
