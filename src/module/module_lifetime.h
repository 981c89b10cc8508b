// The library's process-wide state: set up when the library is loaded,
// released when it is unloaded. The platform's entry point calls these once
// each, so that the steps run in a fixed order whatever the order of static
// initialisation across files.
#pragma once

namespace vaskel {

void ModuleStartup();
void ModuleShutdown();

} // namespace vaskel
