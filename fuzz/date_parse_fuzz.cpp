// Reads arbitrary bytes as date text, once as one character per byte and
// once as UTF-16 code units, in every known locale and with each flag. The
// text lies in a buffer that ends at its NUL, so reading past the NUL shows
// as an overflow. A date that reads must lie in the variant-time range and
// print, and its text must read back to the same value. The bytes also go
// through the date-time parser as narrow text.
#include <vaskel/calendar.h>
#include <vaskel/win32.h>

#include <cmath>
#include <cstdint>
#include <cstdlib>
#include <string>
#include <vector>

namespace {

const LCID kLocales[] = {LOCALE_NEUTRAL, LOCALE_INVARIANT, LOCALE_USER_DEFAULT,
                         LOCALE_SYSTEM_DEFAULT, 0x409};
const ULONG kFlags[] = {0, VAR_TIMEVALUEONLY, VAR_DATEVALUEONLY, LOCALE_NOUSEROVERRIDE};

void CheckPrintsAndReadsBack(DATE value, LCID lcid) {
    BSTR text = nullptr;
    if (FAILED(VarBstrFromDate(value, lcid, 0, &text)))
        std::abort();
    DATE again = 0.0;
    const HRESULT hr = VarDateFromStr(text, lcid, 0, &again);
    SysFreeString(text);
    if (FAILED(hr) || again != value)
        std::abort();
}

void Check(const std::vector<OLECHAR>& text) {
    for (LCID lcid : kLocales) {
        DATE value = 0.0;
        if (VarDateFromStr(text.data(), lcid, VAR_TIMEVALUEONLY | VAR_DATEVALUEONLY, &value) !=
            E_INVALIDARG)
            std::abort();
        for (ULONG flags : kFlags) {
            if (FAILED(VarDateFromStr(text.data(), lcid, flags, &value)))
                continue;
            if (!(value >= -657434.0 && value < 2958466.0))
                std::abort();
            if ((flags & VAR_TIMEVALUEONLY) && !(value >= 0.0 && value < 1.0))
                std::abort();
            if ((flags & VAR_DATEVALUEONLY) && value != std::trunc(value))
                std::abort();
            CheckPrintsAndReadsBack(value, lcid);
        }
    }
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    std::vector<OLECHAR> bytes(data, data + size);
    bytes.push_back(0);
    Check(bytes);

    const std::string narrow(reinterpret_cast<const char*>(data), size);
    vaskel::CDateTime parsed(7.5);
    if (parsed.ParseDateTime(narrow.c_str(), 0, LOCALE_USER_DEFAULT)) {
        if (!(parsed.GetValue() >= -657434.0 && parsed.GetValue() < 2958466.0))
            std::abort();
    } else if (parsed.GetValue() != 7.5) {
        std::abort();
    }

    std::vector<OLECHAR> units;
    for (size_t i = 0; i + 1 < size; i += 2)
        units.push_back(static_cast<OLECHAR>(data[i] | data[i + 1] << 8));
    units.push_back(0);
    Check(units);
    return 0;
}
