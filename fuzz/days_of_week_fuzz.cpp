// Reads arbitrary bytes as weekday names and as a list of weekdays. The
// length-bounded reader gets a copy without a terminating NUL, so reading past
// the given length shows as an overflow. A day set read from text must print
// a text that reads back to the same set.
#include <vaskel/calendar.h>

#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <vector>

using namespace vaskel;

namespace {

void CheckDay(EDayOfWeek day) {
    if (day != InvalidDay && (day < Sunday || day > Saturday))
        std::abort();
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    std::vector<char> bounded(data, data + size);
    CheckDay(DayOfWeekX::FromString(bounded.data(), static_cast<DWORD>(size)));

    std::vector<char> terminated(data, data + size);
    terminated.push_back('\0');
    CheckDay(DayOfWeekX::FromString(terminated.data()));

    DaysOfWeek days;
    days.FromString(terminated.data());
    CString text = days.ToString();
    DaysOfWeek again;
    again.FromString(text);
    if (again.ToString() != text)
        std::abort();
    return 0;
}
