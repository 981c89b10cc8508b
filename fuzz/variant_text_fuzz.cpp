// Reads arbitrary bytes as variant text (UTF-16 code units, in a BSTR of
// exactly their length, so reading past the end shows as an overflow) and
// changes it to every scalar type with each flag. A value that reads must
// print; for the exact types (integers, booleans, currency, decimals) its
// text must read back to a value that prints the same.
#include <vaskel/win32.h>

#include <cstdint>
#include <cstdlib>
#include <cstring>

namespace {

const VARTYPE kExact[] = {VT_I1, VT_UI1, VT_I2,  VT_UI2, VT_I4, VT_UI4,     VT_INT,
                          VT_UINT, VT_I8, VT_UI8, VT_BOOL, VT_CY, VT_DECIMAL};
const VARTYPE kInexact[] = {VT_R4, VT_R8, VT_DATE};
const USHORT kFlags[] = {0, VARIANT_ALPHABOOL, VARIANT_NOUSEROVERRIDE};

bool SameText(const VARIANT& a, const VARIANT& b) {
    const UINT bytes = SysStringByteLen(a.bstrVal);
    return bytes == SysStringByteLen(b.bstrVal) &&
           (bytes == 0 || std::memcmp(a.bstrVal, b.bstrVal, bytes) == 0);
}

// Converts source to type; on success prints it, and for an exact type reads
// the print back and prints that again.
void Check(const VARIANT& source, VARTYPE type, USHORT flags, bool exact) {
    VARIANT value, text, back, again;
    VariantInit(&value);
    VariantInit(&text);
    VariantInit(&back);
    VariantInit(&again);
    if (SUCCEEDED(VariantChangeType(&value, &source, flags, type))) {
        if (value.vt != type || FAILED(VariantChangeType(&text, &value, flags, VT_BSTR)))
            std::abort();
        if (exact && (FAILED(VariantChangeType(&back, &text, flags, type)) ||
                      FAILED(VariantChangeType(&again, &back, flags, VT_BSTR)) ||
                      !SameText(text, again)))
            std::abort();
    }
    VariantClear(&value);
    VariantClear(&text);
    VariantClear(&back);
    VariantClear(&again);
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    if (size > 4096)
        return 0;
    VARIANT source;
    VariantInit(&source);
    source.vt = VT_BSTR;
    source.bstrVal = SysAllocStringByteLen(reinterpret_cast<const char*>(data),
                                           static_cast<UINT>(size & ~std::size_t{1}));
    for (USHORT flags : kFlags) {
        for (VARTYPE type : kExact)
            Check(source, type, flags, true);
        for (VARTYPE type : kInexact)
            Check(source, type, flags, false);
    }
    VariantClear(&source);
    return 0;
}
