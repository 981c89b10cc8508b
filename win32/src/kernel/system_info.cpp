// The processors, the memory page and the version of Windows reported.
#include <vkwin32/kernel.h>
#include <vkwin32/sysinfo.h>

#include <algorithm>
#include <cstring>
#include <thread>
#include <unistd.h>

static_assert(sizeof(OSVERSIONINFOA) == 148, "the size callers set in dwOSVersionInfoSize");
static_assert(sizeof(OSVERSIONINFOEXA) == 156, "the size callers set in dwOSVersionInfoSize");

namespace {

WORD ProcessorArchitecture() {
#if defined(__x86_64__)
    return PROCESSOR_ARCHITECTURE_AMD64;
#elif defined(__i386__)
    return PROCESSOR_ARCHITECTURE_INTEL;
#elif defined(__aarch64__)
    return PROCESSOR_ARCHITECTURE_ARM64;
#elif defined(__arm__)
    return PROCESSOR_ARCHITECTURE_ARM;
#else
    return PROCESSOR_ARCHITECTURE_UNKNOWN;
#endif
}

// Documented only for the Intel architectures.
DWORD ProcessorType() {
#if defined(__x86_64__)
    return PROCESSOR_AMD_X8664;
#elif defined(__i386__)
    return PROCESSOR_INTEL_PENTIUM;
#else
    return 0;
#endif
}

} // namespace

extern "C" void WINAPI GetSystemInfo(LPSYSTEM_INFO systemInfo) {
    if (systemInfo == nullptr)
        return;
    const DWORD maskBits = sizeof(DWORD_PTR) * 8;
    const DWORD processors = std::clamp<DWORD>(std::thread::hardware_concurrency(), 1, maskBits);
    std::memset(systemInfo, 0, sizeof *systemInfo);
    systemInfo->wProcessorArchitecture = ProcessorArchitecture();
    systemInfo->dwPageSize = static_cast<DWORD>(::sysconf(_SC_PAGESIZE));
    // The bounds of a Windows process's user address space.
    systemInfo->lpMinimumApplicationAddress = reinterpret_cast<LPVOID>(0x10000);
    systemInfo->lpMaximumApplicationAddress =
        reinterpret_cast<LPVOID>(sizeof(void*) == 8 ? 0x7FFFFFFEFFFFull : 0x7FFEFFFFull);
    systemInfo->dwActiveProcessorMask =
        processors == maskBits ? ~DWORD_PTR{0} : (DWORD_PTR{1} << processors) - 1;
    systemInfo->dwNumberOfProcessors = processors;
    systemInfo->dwProcessorType = ProcessorType();
    systemInfo->dwAllocationGranularity = 0x10000;
}

extern "C" BOOL WINAPI GetVersionExA(LPOSVERSIONINFOA versionInformation) {
    if (versionInformation == nullptr) {
        SetLastError(ERROR_INVALID_PARAMETER);
        return FALSE;
    }
    const DWORD size = versionInformation->dwOSVersionInfoSize;
    if (size != sizeof(OSVERSIONINFOA) && size != sizeof(OSVERSIONINFOEXA)) {
        SetLastError(ERROR_INSUFFICIENT_BUFFER);
        return FALSE;
    }
    std::memset(versionInformation, 0, size);
    versionInformation->dwOSVersionInfoSize = size;
    versionInformation->dwMajorVersion = 6;
    versionInformation->dwMinorVersion = 1;
    versionInformation->dwBuildNumber = 7601;
    versionInformation->dwPlatformId = VER_PLATFORM_WIN32_NT;
    std::strcpy(versionInformation->szCSDVersion, "Service Pack 1");
    if (size == sizeof(OSVERSIONINFOEXA)) {
        auto* extended = reinterpret_cast<LPOSVERSIONINFOEXA>(versionInformation);
        extended->wServicePackMajor = 1;
        extended->wSuiteMask = VER_SUITE_SINGLEUSERTS;
        extended->wProductType = VER_NT_WORKSTATION;
    }
    return TRUE;
}
