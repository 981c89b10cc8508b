// Both message-window classes: they differ only in how they name their class,
// whether dispatch checks the window against the object, and whether a
// cross-thread destroy waits for its answer.
#include <vaskel/queue.h>

namespace vaskel {

namespace {

const char kMsgWndClassName[] = "KXMSGWNDCLASS";
// Long enough for a thread that pumps its messages; the window is left
// behind on a thread that does not answer in time.
const UINT kDestroyRequestTimeout = 3000;

// An existing class is used unchanged, whoever registered it. Without a
// module instance Windows looks up only system classes, so a class that the
// application (or, meanwhile, another thread) registered shows up as the
// refusal to register it again.
bool EnsureClassRegistered(const char* name) {
    WNDCLASSEXA info = {};
    info.cbSize = sizeof info;
    if (GetClassInfoExA(nullptr, name, &info))
        return true;
    info = {};
    info.cbSize = sizeof info;
    info.lpfnWndProc = DefWindowProcA;
    info.lpszClassName = name;
    return RegisterClassExA(&info) != 0 || GetLastError() == ERROR_CLASS_ALREADY_EXISTS;
}

// The class procedure handles the creation messages; only afterwards does
// the window switch to the procedure that reaches the object.
HWND CreateMessageWindow(const char* className, void* object, WNDPROC procedure) {
    if (className == nullptr)
        return nullptr;
    HWND window = CreateWindowExA(0, className, nullptr, WS_CHILD, 0, 0, 0, 0, HWND_MESSAGE,
                                  static_cast<HMENU>(object), nullptr, nullptr);
    if (window != nullptr)
        SetWindowLongPtrA(window, GWLP_WNDPROC, reinterpret_cast<LONG_PTR>(procedure));
    return window;
}

template <class Wnd>
Wnd* ObjectOf(HWND window) {
    return reinterpret_cast<Wnd*>(GetWindowLongPtrA(window, GWLP_ID));
}

bool OnOwnThread(HWND window) {
    return GetWindowThreadProcessId(window, nullptr) == GetCurrentThreadId();
}

// The platform lets only the owning thread destroy a window. On that thread
// the window goes now (WM_DESTROY clears the handle). From another thread
// the window is cut loose from the object and returned, so that the caller
// asks its thread to destroy it; from then on no message reaches the object.
HWND DestroyOrRelease(std::atomic<HWND>& handle, WNDPROC destroyProcedure) {
    HWND window = handle.load();
    if (window == nullptr)
        return nullptr;
    if (OnOwnThread(window)) {
        DestroyWindow(window);
        return nullptr;
    }
    SetWindowLongPtrA(window, GWLP_WNDPROC, reinterpret_cast<LONG_PTR>(destroyProcedure));
    handle = nullptr;
    return window;
}

template <class Wnd>
bool DefaultHandling(Wnd& object, std::atomic<HWND>& handle, UINT message, LRESULT* result) {
    switch (message) {
    case WM_DESTROY:
        // The rest of the window's life needs nothing from the object.
        SetWindowLongPtrA(handle.load(), GWLP_WNDPROC, reinterpret_cast<LONG_PTR>(DefWindowProcA));
        handle = nullptr;
        return false; // the default processing still runs
    case WM_APP:
        object.Destroy();
        *result = 0;
        return true;
    default:
        return false;
    }
}

LRESULT AnswerDestroyRequest(HWND window, UINT message, WPARAM wParam, LPARAM lParam) {
    if (message == WM_APP) {
        DestroyWindow(window);
        return 0;
    }
    return DefWindowProcA(window, message, wParam, lParam);
}

} // namespace

std::atomic<const char*> CVKMsgWnd::m_lpszWndClassName{nullptr};

CVKMsgWnd::~CVKMsgWnd() {
    if (Created())
        Destroy();
}

const char* CVKMsgWnd::GetMsgWndClassName() {
    if (const char* name = m_lpszWndClassName.load())
        return name;
    if (!EnsureClassRegistered(kMsgWndClassName))
        return nullptr;
    m_lpszWndClassName = kMsgWndClassName;
    return kMsgWndClassName;
}

bool CVKMsgWnd::Create() {
    if (!Created())
        m_hWnd = CreateMessageWindow(GetMsgWndClassName(), this, WindowProc);
    return Created();
}

void CVKMsgWnd::Destroy() {
    if (HWND window = DestroyOrRelease(m_hWnd, WindowProcDestroy)) {
        DWORD_PTR ignored = 0;
        SendMessageTimeoutA(window, WM_APP, 0, 0, SMTO_NORMAL, kDestroyRequestTimeout, &ignored);
    }
}

bool CVKMsgWnd::IsInThreadCtx() const {
    return OnOwnThread(m_hWnd.load());
}

bool CVKMsgWnd::PostMessageA(UINT message, WPARAM wParam, LPARAM lParam) {
    return ::PostMessageA(m_hWnd.load(), message, wParam, lParam) != FALSE;
}

bool CVKMsgWnd::PostMessageDebug(UINT message, WPARAM wParam, LPARAM lParam) {
    return PostMessageA(message, wParam, lParam);
}

bool CVKMsgWnd::SendMessageA(UINT message, WPARAM wParam, LPARAM lParam) {
    return ::SendMessageA(m_hWnd.load(), message, wParam, lParam) != 0;
}

bool CVKMsgWnd::OnWndMsg(UINT message, WPARAM /*wParam*/, LPARAM /*lParam*/, LRESULT* result) {
    return DefaultHandling(*this, m_hWnd, message, result);
}

LRESULT CALLBACK CVKMsgWnd::WindowProc(HWND window, UINT message, WPARAM wParam, LPARAM lParam) {
    CVKMsgWnd* object = ObjectOf<CVKMsgWnd>(window);
    // A window the object no longer knows as its own gets no say.
    if (object->m_hWnd.load() == window) {
        LRESULT result = 0;
        if (object->OnWndMsg(message, wParam, lParam, &result))
            return result;
    }
    return DefWindowProcA(window, message, wParam, lParam);
}

LRESULT CALLBACK CVKMsgWnd::WindowProcDestroy(HWND window, UINT message, WPARAM wParam,
                                              LPARAM lParam) {
    return AnswerDestroyRequest(window, message, wParam, lParam);
}

CVKNamedClassWnd::CVKNamedClassWnd(const CString& className) : m_strClassName(className) {}

CVKNamedClassWnd::~CVKNamedClassWnd() {
    if (Created())
        Destroy();
}

const char* CVKNamedClassWnd::GetMsgWndClassName() const {
    const char* name = m_strClassName.GetString();
    return EnsureClassRegistered(name) ? name : nullptr;
}

bool CVKNamedClassWnd::Create() {
    if (!Created())
        m_hWnd = CreateMessageWindow(GetMsgWndClassName(), this, WindowProc);
    return Created();
}

void CVKNamedClassWnd::Destroy() {
    if (HWND window = DestroyOrRelease(m_hWnd, WindowProcDestroy))
        ::PostMessageA(window, WM_APP, 0, 0);
}

bool CVKNamedClassWnd::IsInThreadCtx() const {
    return OnOwnThread(m_hWnd.load());
}

bool CVKNamedClassWnd::OnWndMsg(UINT message, WPARAM /*wParam*/, LPARAM /*lParam*/,
                                LRESULT* result) {
    return DefaultHandling(*this, m_hWnd, message, result);
}

LRESULT CALLBACK CVKNamedClassWnd::WindowProc(HWND window, UINT message, WPARAM wParam,
                                              LPARAM lParam) {
    LRESULT result = 0;
    if (ObjectOf<CVKNamedClassWnd>(window)->OnWndMsg(message, wParam, lParam, &result))
        return result;
    return DefWindowProcA(window, message, wParam, lParam);
}

LRESULT CALLBACK CVKNamedClassWnd::WindowProcDestroy(HWND window, UINT message, WPARAM wParam,
                                                     LPARAM lParam) {
    return AnswerDestroyRequest(window, message, wParam, lParam);
}

} // namespace vaskel
