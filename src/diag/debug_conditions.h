// The debug-condition table's lifetime, for the library's shut-down.
#pragma once

namespace vaskel {

void ReleaseDebugConditions();

} // namespace vaskel
