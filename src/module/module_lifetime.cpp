// The library's process-wide state, set up when the library is loaded and
// released when it is unloaded. One object holds it so that the steps run in
// a fixed order, whatever the order of static initialisation across files.
#include "../diag/debug_conditions.h"

namespace vaskel {
namespace {

class ModuleLifetime {
public:
    ModuleLifetime() = default;
    ModuleLifetime(const ModuleLifetime&) = delete;
    ModuleLifetime& operator=(const ModuleLifetime&) = delete;
    ~ModuleLifetime() { ReleaseDebugConditions(); }
};

ModuleLifetime lifetime;

} // namespace
} // namespace vaskel
