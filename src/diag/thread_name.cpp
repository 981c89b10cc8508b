#include <vaskel/diag.h>

namespace vaskel {

void VKSetThreadName(const char* /*name*/, DWORD /*threadId*/) {}

} // namespace vaskel
