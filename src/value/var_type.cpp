#include <vaskel/value.h>

namespace vaskel {
namespace {

struct TypeName {
    VARENUM type;
    const char* name;
};

// In the order Parse tries them.
const TypeName kTypeNames[] = {
    {VT_EMPTY, "Empty"},  {VT_NULL, "Null"},      {VT_BOOL, "Bool"},   {VT_I1, "Char"},
    {VT_UI1, "Byte"},     {VT_I2, "Short"},       {VT_UI2, "UShort"},  {VT_I4, "Long"},
    {VT_UI4, "ULong"},    {VT_INT, "Int"},        {VT_UINT, "UInt"},   {VT_I8, "Long64"},
    {VT_UI8, "ULong64"},  {VT_R4, "Float"},       {VT_R8, "Double"},   {VT_DATE, "Date"},
    {VT_LPSTR, "String"}, {VT_BSTR, "ComString"}, {VT_ERROR, "Error"}, {VT_BLOB, "BLOB"},
};

// ASCII only: the names are fixed English words, whatever the locale.
char LowerAscii(char c) {
    return c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c;
}

// The whole text against the whole name; the text is read no further than
// the name's length plus its NUL.
bool EqualsNoCase(const char* text, const char* name) {
    for (;; ++text, ++name) {
        if (LowerAscii(*text) != LowerAscii(*name))
            return false;
        if (*name == '\0')
            return true;
    }
}

} // namespace

bool VarTypeX::IsNumeric() const {
    return IsIntegral() || IsFloatingPoint();
}

bool VarTypeX::IsIntegral() const {
    return IsSignedIntegral() || IsUnsignedIntegral();
}

bool VarTypeX::IsSignedIntegral() const {
    return IsShort() || IsLong() || IsChar() || IsLong64() || IsInt();
}

bool VarTypeX::IsUnsignedIntegral() const {
    return IsBool() || IsByte() || IsUShort() || IsULong() || IsULong64() || IsUInt();
}

bool VarTypeX::IsFloatingPoint() const {
    return IsFloat() || IsDouble() || IsDate();
}

bool VarTypeX::IsText() const {
    return IsString() || IsComString();
}

const char* VarTypeX::ToString(VARENUM type) {
    for (const TypeName& entry : kTypeNames) {
        if (entry.type == type)
            return entry.name;
    }
    return "Unknown";
}

const char* VarTypeX::ToString(unsigned short type) {
    return ToString(static_cast<VARENUM>(type));
}

bool VarTypeX::Parse(const char* text, VARENUM& type) {
    if (text == nullptr)
        return false;
    for (const TypeName& entry : kTypeNames) {
        if (EqualsNoCase(text, entry.name)) {
            type = entry.type;
            return true;
        }
    }
    return false;
}

bool VarTypeX::Parse(const char* text) {
    VARENUM type = VT_EMPTY;
    if (!Parse(text, type))
        return false;
    SetValue(type);
    return true;
}

} // namespace vaskel
