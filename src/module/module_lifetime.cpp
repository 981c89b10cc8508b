#include "module_lifetime.h"

#include "../diag/debug_conditions.h"

namespace vaskel {

void ModuleStartup() {}

void ModuleShutdown() { ReleaseDebugConditions(); }

} // namespace vaskel
