// Reads arbitrary text as a generic value of the type the first byte picks.
// The text lies in a buffer that ends at its NUL, so reading past the NUL
// shows as an overflow. A failed reading leaves the value as it was; a
// successful one gives the value that type, and an integer or flag prints
// a text that reads back to the same value. The text also goes through the
// type-name lookup.
#include <vaskel/value.h>

#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <vector>

namespace {

const VARENUM kTypes[] = {VT_EMPTY, VT_NULL, VT_BOOL,  VT_I1,   VT_UI1,   VT_I2,   VT_UI2,
                          VT_I4,    VT_UI4,  VT_INT,   VT_UINT, VT_I8,    VT_UI8,  VT_R4,
                          VT_R8,    VT_DATE, VT_LPSTR, VT_BSTR, VT_ERROR, VT_BLOB, VT_CY};

bool ReadsBack(VARENUM type) {
    return type == VT_BOOL || type == VT_UI1 || type == VT_I2 || type == VT_UI2 || type == VT_I4 ||
           type == VT_UI4;
}

void Check(const char* text, VARENUM type) {
    const vaskel::CGenericVal previous(vaskel::CBlob("previous", 8));
    vaskel::CGenericVal value(previous);
    if (!value.Parse(text, type)) {
        if (!(value == previous) || (type == VT_LPSTR))
            std::abort();
        return;
    }
    if (value.GetType() != type)
        std::abort();
    // No reading gives a NaN, which would equal nothing.
    if (!(value == value))
        std::abort();
    const vaskel::CString printed = value.GetAsString();
    value.GetAsDouble();
    if (type == VT_LPSTR && std::strcmp(value.GetString(), text) != 0)
        std::abort();
    if (type == VT_I1 && value.GetChar() != text[0])
        std::abort();
    if (ReadsBack(type)) {
        vaskel::CGenericVal again;
        if (!again.Parse(printed, type) || !(again == value))
            std::abort();
    }
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    if (size == 0)
        return 0;
    const VARENUM type = kTypes[data[0] % (sizeof kTypes / sizeof kTypes[0])];
    std::vector<char> text(data + 1, data + size);
    text.push_back('\0');
    Check(text.data(), type);

    VARENUM named = VT_CY;
    if (vaskel::VarTypeX::Parse(text.data(), named) &&
        vaskel::CString(vaskel::VarTypeX::ToString(named)).CompareNoCase(text.data()) != 0)
        std::abort();
    return 0;
}
