// RegQueryValueExA and RegSetValueExA of a DWORD, in operations per second,
// below a temporary key of HKEY_CURRENT_USER. Timed without a benchmark
// framework so that the same program runs on Windows builds, where the
// system's registry does the work (under Wine, its server's memory): the two
// runs side by side give the ratio. Here every write is durable against a
// crash of the process.
#include <vaskel/win32.h>

#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <string>

#ifndef _WIN32
#include <filesystem>
#include <unistd.h>
#endif

namespace {

using Clock = std::chrono::steady_clock;

// Runs batches of an operation for about a second; operations per second, or
// 0 when one failed.
template <class Operation>
double Rate(Operation operation) {
    const auto start = Clock::now();
    long long count = 0;
    std::chrono::duration<double> elapsed{0};
    do {
        for (int i = 0; i < 1000; ++i, ++count) {
            if (!operation(static_cast<DWORD>(count)))
                return 0;
        }
        elapsed = Clock::now() - start;
    } while (elapsed.count() < 1.0);
    return static_cast<double>(count) / elapsed.count();
}

} // namespace

int main() {
#ifndef _WIN32
    // A private store, removed afterwards; read once, so set before any call.
    std::string store = (std::filesystem::temp_directory_path() / "vaskel-registry-timing-XXXXXX");
    if (mkdtemp(store.data()) == nullptr)
        return 1;
    setenv("VASKEL_REGISTRY", store.c_str(), 1);
#endif
    const std::string path =
        "Software\\vaskel-registry-timing-" + std::to_string(GetCurrentProcessId());
    HKEY key = nullptr;
    if (RegCreateKeyExA(HKEY_CURRENT_USER, path.c_str(), 0, nullptr, REG_OPTION_NON_VOLATILE,
                        KEY_ALL_ACCESS, nullptr, &key, nullptr) != ERROR_SUCCESS)
        return 1;

    const auto write = [key](DWORD value) {
        return RegSetValueExA(key, "Value", 0, REG_DWORD, reinterpret_cast<const BYTE*>(&value),
                              sizeof value) == ERROR_SUCCESS;
    };
    const auto read = [key](DWORD) {
        DWORD value = 0;
        DWORD size = sizeof value;
        DWORD type = 0;
        return RegQueryValueExA(key, "Value", nullptr, &type, reinterpret_cast<BYTE*>(&value),
                                &size) == ERROR_SUCCESS &&
               type == REG_DWORD;
    };
    const double writes = write(0) ? Rate(write) : 0;
    const double reads = Rate(read);
    std::printf("RegQueryValueExA of a DWORD: %.0f reads/s\n", reads);
    std::printf("RegSetValueExA of a DWORD:   %.0f writes/s\n", writes);

    RegCloseKey(key);
    RegDeleteKeyA(HKEY_CURRENT_USER, path.c_str());
#ifndef _WIN32
    std::error_code ignored;
    std::filesystem::remove_all(store, ignored);
#endif
    return reads > 0 && writes > 0 ? 0 : 1;
}
