// Reads arbitrary bytes as a registry file. A file either fails with a
// message naming one of its lines and yields no entries, or yields entries
// whose data is bounded by the input. Entries that were read are written
// and read again and must come back the same.
#include "reg_file.h"

#include <algorithm>
#include <cstdint>
#include <cstdlib>
#include <string>
#include <vector>

using namespace vaskel::regtool;

namespace {

void Check(bool condition) {
    if (!condition)
        std::abort();
}

bool HoldsCarriageReturn(const std::vector<RegKeyEntry>& entries) {
    for (const RegKeyEntry& entry : entries) {
        if (entry.key.subkey.find('\r') != std::string::npos)
            return true;
        for (const RegValueEntry& value : entry.values)
            if (value.value.name.find('\r') != std::string::npos)
                return true;
    }
    return false;
}

bool SameValue(const RegValueEntry& a, const RegValueEntry& b) {
    return a.remove == b.remove && a.value.name == b.value.name &&
           (a.remove || (a.value.type == b.value.type && a.value.data == b.value.data));
}

bool SameEntries(const std::vector<RegKeyEntry>& a, const std::vector<RegKeyEntry>& b) {
    if (a.size() != b.size())
        return false;
    for (std::size_t k = 0; k < a.size(); ++k) {
        if (a[k].remove != b[k].remove || a[k].key.Text() != b[k].key.Text() ||
            !std::equal(a[k].values.begin(), a[k].values.end(), b[k].values.begin(),
                        b[k].values.end(), SameValue))
            return false;
    }
    return true;
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    const std::string bytes(reinterpret_cast<const char*>(data), size);
    std::vector<RegKeyEntry> entries;
    RegFileError error;
    if (!ParseRegFile(bytes, entries, error)) {
        const auto lines = static_cast<std::size_t>(std::count(bytes.begin(), bytes.end(), '\n'));
        Check(entries.empty() && !error.message.empty());
        Check(error.line >= 1 && static_cast<std::size_t>(error.line) <= lines + 1);
        return 0;
    }
    // Two bytes of data at most for each byte read, and a terminator per value.
    std::size_t total = 0;
    for (const RegKeyEntry& entry : entries) {
        Check(!entry.remove || entry.values.empty());
        for (const RegValueEntry& value : entry.values)
            total += value.value.data.size() + value.value.name.size();
    }
    Check(total <= 4 * size);

    std::string written;
    std::string writeError;
    if (!WriteRegFile(entries, written, writeError)) {
        // Only a carriage return inside a name keeps a read file from being written.
        Check(!writeError.empty() && HoldsCarriageReturn(entries));
        return 0;
    }
    std::vector<RegKeyEntry> reread;
    Check(ParseRegFile(written, reread, error));
    Check(SameEntries(entries, reread));
    return 0;
}
