#include <vaskel/fs.h>

namespace vaskel {

DWORD Environment::GetLogicalProcessorCount() {
    SYSTEM_INFO info{};
    GetSystemInfo(&info);
    return info.dwNumberOfProcessors;
}

} // namespace vaskel
