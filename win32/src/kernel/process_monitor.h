// The process monitor: one thread that polls the descriptors of the processes
// that handles name, and ends their objects when the processes end. It reaps
// the children this process started, each by its own descriptor, so no child
// stays a zombie and no process that someone else started is ever reaped.
#pragma once

#include "process.h"

#include <memory>

namespace vkw32 {

// Watches a process until it ends: a child for as long as it runs, any other
// process only while its object lives. False with the last error set when
// the process cannot be watched.
bool WatchProcess(const std::shared_ptr<Process>& process);

// Called when an object of a process that is no child goes: the monitor
// stops watching processes whose objects are gone.
void DropUnusedWatches();

} // namespace vkw32
