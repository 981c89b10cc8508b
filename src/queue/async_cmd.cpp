#include <vaskel/queue.h>

namespace vaskel {

// Defined here so that the virtual table and type information live in the
// library once.
CVKAsyncCmd::~CVKAsyncCmd() = default;

void CVKAsyncCmd::Canceled() {}

} // namespace vaskel
