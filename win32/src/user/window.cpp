// Window classes and (invisible) windows.
#include "window_table.h"

#include "../kernel/hot_tls.h"

#include <algorithm>
#include <atomic>
#include <cstring>
#include <map>
#include <string>
#include <unistd.h>
#include <unordered_map>

namespace vkw32 {
namespace {

struct WindowClass {
    WNDCLASSEXA info;
    std::string name;
    ATOM atom;
};

// Everything below is guarded by the wait lock.
struct UserTables {
    std::unordered_map<ULONG_PTR, std::shared_ptr<Window>> windows;
    // Handles are never reused, so a stale handle never names a new window.
    ULONG_PTR nextWindow = 0x20000;
    std::map<std::string, WindowClass> classes; // by lower-case name
    ATOM nextAtom = 0xC000;
};

UserTables& Tables() {
    static auto* tables = new UserTables; // outlives every static destructor
    return *tables;
}

std::string Lower(const char* text) {
    std::string lower(text);
    std::transform(lower.begin(), lower.end(), lower.begin(),
                   [](char c) { return c >= 'A' && c <= 'Z' ? static_cast<char>(c + 32) : c; });
    return lower;
}

bool IsAtom(LPCSTR name) {
    return reinterpret_cast<ULONG_PTR>(name) <= 0xFFFF;
}

WindowClass* FindClass(LPCSTR name) {
    if (name == nullptr)
        return nullptr;
    auto& classes = Tables().classes;
    if (IsAtom(name)) {
        ATOM atom = static_cast<ATOM>(reinterpret_cast<ULONG_PTR>(name));
        for (auto& entry : classes)
            if (entry.second.atom == atom)
                return &entry.second;
        return nullptr;
    }
    auto it = classes.find(Lower(name));
    return it == classes.end() ? nullptr : &it->second;
}

// The window's slot for an index of Get/SetWindowLongPtr, or null.
LONG_PTR* SlotOf(Window& window, int index) {
    switch (index) {
    case GWLP_ID:
        return &window.id;
    case GWLP_USERDATA:
        return &window.userData;
    default:
        return nullptr;
    }
}

std::atomic<unsigned> generation{1};

} // namespace

unsigned WindowGeneration() {
    return generation.load(std::memory_order_acquire);
}

void WindowsChanged() {
    generation.fetch_add(1, std::memory_order_acq_rel);
}

namespace {
VKW32_HOT_TLS thread_local WindowCache windowCache;
}

const WindowCache* CachedWindow(HWND window) {
    return window == windowCache.window && windowCache.generation == WindowGeneration()
               ? &windowCache
               : nullptr;
}

void RememberWindow(const Window& window) {
    windowCache = {window.handle, window.procedure, window.id, WindowGeneration()};
}

HWND InsertWindow(const std::shared_ptr<Window>& window) {
    UserTables& tables = Tables();
    window->handle = reinterpret_cast<HWND>(tables.nextWindow);
    tables.nextWindow += 2;
    tables.windows.emplace(reinterpret_cast<ULONG_PTR>(window->handle), window);
    return window->handle;
}

void RemoveWindow(HWND handle) {
    auto& windows = Tables().windows;
    auto it = windows.find(reinterpret_cast<ULONG_PTR>(handle));
    if (it == windows.end())
        return;
    it->second->queue->DiscardMessagesOf(handle);
    windows.erase(it);
    WindowsChanged();
}

Window* FindWindow(HWND handle) {
    auto& windows = Tables().windows;
    auto it = windows.find(reinterpret_cast<ULONG_PTR>(handle));
    if (it == windows.end()) {
        SetLastError(ERROR_INVALID_WINDOW_HANDLE);
        return nullptr;
    }
    return it->second.get();
}

std::vector<HWND> WindowsOfThread(DWORD threadId) {
    std::vector<HWND> found;
    for (const auto& entry : Tables().windows)
        if (entry.second->threadId == threadId)
            found.push_back(entry.second->handle);
    return found;
}

std::vector<HWND> ChildrenOf(HWND parent) {
    std::vector<HWND> found;
    for (const auto& entry : Tables().windows)
        if (entry.second->parent == parent)
            found.push_back(entry.second->handle);
    return found;
}

} // namespace vkw32

using vkw32::KernelLock;
using vkw32::Window;

extern "C" ATOM WINAPI RegisterClassExA(const WNDCLASSEXA* windowClass) {
    if (windowClass == nullptr || windowClass->cbSize != sizeof(WNDCLASSEXA) ||
        windowClass->lpszClassName == nullptr || vkw32::IsAtom(windowClass->lpszClassName) ||
        *windowClass->lpszClassName == '\0') {
        SetLastError(ERROR_INVALID_PARAMETER);
        return 0;
    }
    KernelLock lock;
    vkw32::UserTables& tables = vkw32::Tables();
    std::string key = vkw32::Lower(windowClass->lpszClassName);
    if (tables.classes.count(key)) {
        SetLastError(ERROR_CLASS_ALREADY_EXISTS);
        return 0;
    }
    if (tables.nextAtom == 0) { // the atom range is used up
        SetLastError(ERROR_NOT_ENOUGH_MEMORY);
        return 0;
    }
    vkw32::WindowClass& entry = tables.classes[key];
    entry.info = *windowClass;
    entry.name = windowClass->lpszClassName;
    entry.info.lpszClassName = entry.name.c_str();
    entry.info.lpszMenuName = nullptr;
    entry.atom = tables.nextAtom++;
    return entry.atom;
}

// Classes are process-wide here, whatever module registered them; Windows
// finds a class without naming its module only when it is CS_GLOBALCLASS.
extern "C" BOOL WINAPI GetClassInfoExA(HINSTANCE /*instance*/, LPCSTR className,
                                       LPWNDCLASSEXA windowClass) {
    if (windowClass == nullptr) {
        SetLastError(ERROR_INVALID_PARAMETER);
        return FALSE;
    }
    KernelLock lock;
    vkw32::WindowClass* entry = vkw32::FindClass(className);
    if (entry == nullptr) {
        SetLastError(ERROR_CLASS_DOES_NOT_EXIST);
        return FALSE;
    }
    *windowClass = entry->info;
    return entry->atom;
}

extern "C" BOOL WINAPI UnregisterClassA(LPCSTR className, HINSTANCE /*instance*/) {
    KernelLock lock;
    vkw32::WindowClass* entry = vkw32::FindClass(className);
    if (entry == nullptr) {
        SetLastError(ERROR_CLASS_DOES_NOT_EXIST);
        return FALSE;
    }
    for (const auto& window : vkw32::Tables().windows) {
        if (vkw32::Lower(window.second->className.c_str()) == vkw32::Lower(entry->name.c_str())) {
            SetLastError(ERROR_CLASS_HAS_WINDOWS);
            return FALSE;
        }
    }
    vkw32::Tables().classes.erase(vkw32::Lower(entry->name.c_str()));
    return TRUE;
}

extern "C" HWND WINAPI CreateWindowExA(DWORD exStyle, LPCSTR className, LPCSTR windowName,
                                       DWORD style, int x, int y, int width, int height,
                                       HWND parent, HMENU menu, HINSTANCE instance, LPVOID param) {
    auto window = std::make_shared<Window>();
    window->queue = vkw32::CurrentQueue();
    HWND handle;
    {
        KernelLock lock;
        vkw32::WindowClass* entry = vkw32::FindClass(className);
        if (entry == nullptr) {
            SetLastError(ERROR_CANNOT_FIND_WND_CLASS);
            return nullptr;
        }
        if (parent != nullptr && parent != HWND_MESSAGE && !vkw32::FindWindow(parent))
            return nullptr;
        window->threadId = GetCurrentThreadId();
        window->procedure = entry->info.lpfnWndProc;
        window->instance = instance;
        window->parent = parent == HWND_MESSAGE ? nullptr : parent;
        window->className = entry->name;
        // A child window's menu argument is its identifier.
        if (style & WS_CHILD)
            window->id = reinterpret_cast<LONG_PTR>(menu);
        handle = vkw32::InsertWindow(window);
    }
    CREATESTRUCTA create = {
        param,      instance,  menu,   parent, height, width, y, x, static_cast<LONG>(style),
        windowName, className, exStyle};
    LPARAM createParam = reinterpret_cast<LPARAM>(&create);
    if (!vkw32::CallCurrentProcedure(handle, WM_NCCREATE, 0, createParam)) {
        DestroyWindow(handle);
        return nullptr;
    }
    if (vkw32::CallCurrentProcedure(handle, WM_CREATE, 0, createParam) == -1) {
        DestroyWindow(handle);
        return nullptr;
    }
    return handle;
}

extern "C" BOOL WINAPI DestroyWindow(HWND handle) {
    std::vector<HWND> children;
    {
        KernelLock lock;
        Window* window = vkw32::FindWindow(handle);
        if (!window)
            return FALSE;
        if (window->threadId != GetCurrentThreadId()) {
            SetLastError(ERROR_ACCESS_DENIED);
            return FALSE;
        }
        if (window->destroying)
            return TRUE;
        window->destroying = true;
        children = vkw32::ChildrenOf(handle);
    }
    vkw32::CallCurrentProcedure(handle, WM_DESTROY, 0, 0);
    for (HWND child : children)
        DestroyWindow(child);
    vkw32::CallCurrentProcedure(handle, WM_NCDESTROY, 0, 0);
    KernelLock lock;
    vkw32::RemoveWindow(handle);
    return TRUE;
}

extern "C" BOOL WINAPI IsWindow(HWND handle) {
    KernelLock lock;
    DWORD error = GetLastError(); // a plain question leaves the last error alone
    bool alive = vkw32::FindWindow(handle) != nullptr;
    SetLastError(error);
    return alive;
}

extern "C" DWORD WINAPI GetWindowThreadProcessId(HWND handle, LPDWORD processId) {
    KernelLock lock;
    Window* window = vkw32::FindWindow(handle);
    if (!window)
        return 0;
    if (processId)
        *processId = static_cast<DWORD>(::getpid());
    return window->threadId;
}

extern "C" LONG_PTR WINAPI GetWindowLongPtrA(HWND handle, int index) {
    if (const vkw32::WindowCache* cached = vkw32::CachedWindow(handle)) {
        if (index == GWLP_ID)
            return cached->id;
        if (index == GWLP_WNDPROC)
            return reinterpret_cast<LONG_PTR>(cached->procedure);
    }
    KernelLock lock;
    Window* window = vkw32::FindWindow(handle);
    if (!window)
        return 0;
    switch (index) {
    case GWLP_WNDPROC:
        return reinterpret_cast<LONG_PTR>(window->procedure);
    case GWLP_HINSTANCE:
        return reinterpret_cast<LONG_PTR>(window->instance);
    case GWLP_HWNDPARENT:
        return reinterpret_cast<LONG_PTR>(window->parent);
    default:
        if (LONG_PTR* slot = vkw32::SlotOf(*window, index))
            return *slot;
        SetLastError(ERROR_INVALID_INDEX);
        return 0;
    }
}

extern "C" LONG_PTR WINAPI SetWindowLongPtrA(HWND handle, int index, LONG_PTR newLong) {
    KernelLock lock;
    Window* window = vkw32::FindWindow(handle);
    if (!window)
        return 0;
    LONG_PTR previous;
    if (index == GWLP_WNDPROC) {
        if (newLong == 0) {
            SetLastError(ERROR_INVALID_PARAMETER);
            return 0;
        }
        previous = reinterpret_cast<LONG_PTR>(window->procedure);
        window->procedure = reinterpret_cast<WNDPROC>(newLong);
        vkw32::WindowsChanged();
        return previous;
    }
    LONG_PTR* slot = vkw32::SlotOf(*window, index);
    if (!slot) {
        SetLastError(ERROR_INVALID_INDEX);
        return 0;
    }
    previous = *slot;
    *slot = newLong;
    if (index == GWLP_ID)
        vkw32::WindowsChanged();
    return previous;
}

extern "C" int WINAPI GetDlgCtrlID(HWND handle) {
    return static_cast<int>(GetWindowLongPtrA(handle, GWLP_ID));
}

extern "C" LRESULT WINAPI DefWindowProcA(HWND window, UINT message, WPARAM /*wParam*/,
                                         LPARAM /*lParam*/) {
    switch (message) {
    case WM_NCCREATE:
        return TRUE;
    case WM_CLOSE:
        DestroyWindow(window);
        return 0;
    default:
        return 0;
    }
}

extern "C" LRESULT WINAPI CallWindowProcA(WNDPROC procedure, HWND window, UINT message,
                                          WPARAM wParam, LPARAM lParam) {
    return procedure ? procedure(window, message, wParam, lParam) : 0;
}
