// The process's windows by handle. Everything here runs under the wait lock.
#pragma once

#include "message_queue.h"

#include <vector>

namespace vkw32 {

// Gives the window a handle that is never used again in this process.
HWND InsertWindow(const std::shared_ptr<Window>& window);
void RemoveWindow(HWND handle);
std::vector<HWND> WindowsOfThread(DWORD threadId);
std::vector<HWND> ChildrenOf(HWND parent);

} // namespace vkw32
