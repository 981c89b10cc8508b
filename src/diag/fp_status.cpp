#include <vaskel/diag.h>

namespace vaskel {

DWORD GetStatus87() {
    return _statusfp();
}

DWORD ClearStatus87() {
    return _clearfp();
}

} // namespace vaskel
