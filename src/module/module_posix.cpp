// On POSIX systems a shared library has no entry point: one static object
// brackets the library's life.
#include "module_lifetime.h"

namespace vaskel {
namespace {

struct ModuleLifetime {
    ModuleLifetime() { ModuleStartup(); }
    ~ModuleLifetime() { ModuleShutdown(); }
    ModuleLifetime(const ModuleLifetime&) = delete;
    ModuleLifetime& operator=(const ModuleLifetime&) = delete;
};

ModuleLifetime lifetime;

} // namespace
} // namespace vaskel
