#include <vaskel/diag.h>
#include <vaskel/text.h>
#include <vaskel/value.h>

#include <charconv>
#include <climits>
#include <cstring>
#include <limits>
#include <new>
#include <utility>

namespace vaskel {
namespace {

static_assert(sizeof(CString) <= sizeof(double) && sizeof(CBlob) <= sizeof(double),
              "text and blobs must fit the 8-byte payload");

// Up to the text's NUL.
const DWORD wholeText = 0xFFFFFFFF;

// A 64-bit long that does not fit the 32-bit payload is refused, not cut.
LONG ToLong(long value) {
    if (static_cast<LONG>(value) != value)
        throw unexpected_error();
    return static_cast<LONG>(value);
}

ULONG ToULong(unsigned long value) {
    if (static_cast<ULONG>(value) != value)
        throw unexpected_error();
    return static_cast<ULONG>(value);
}

bool IsDigit(char c) {
    return c >= '0' && c <= '9';
}

// The signed 32-bit reading, except that the numbers from 2^31 to 2^32 - 1,
// which a ULong prints, read as themselves, so that a ULong's text reads back.
DWORD ReadULong(const char* text) {
    const int value = AsInteger(text, wholeText);
    if (value != INT_MAX)
        return static_cast<DWORD>(value);
    // Only blanks and a plus sign come before the digits that saturated.
    while (!IsDigit(*text))
        ++text;
    const char* end = text;
    while (IsDigit(*end))
        ++end;
    DWORD wide = 0xFFFFFFFF; // from_chars leaves it so when the number is larger
    std::from_chars(text, end, wide);
    return wide;
}

// The p for which the number in [first, last), an atof-style number without
// its sign, lies in [10^(p-1), 10^p): above zero for a number of 1 or more.
// A saturated exponent still tells which side of 1 a number is on.
long long LeadingPower(const char* first, const char* last) {
    long long power = 0;
    while (first < last && *first == '0')
        ++first;
    if (first < last && IsDigit(*first)) {
        for (; first < last && IsDigit(*first); ++first)
            ++power;
    } else if (first < last && *first == '.') {
        for (++first; first < last && *first == '0'; ++first)
            --power;
    }
    while (first < last && *first != 'e' && *first != 'E')
        ++first;
    if (first < last)
        power += AsInteger(first + 1, static_cast<DWORD>(last - first - 1));
    return power;
}

// As atof, whatever the locale's decimal point: white space, a sign, digits
// with a point and an exponent; no number reads 0, and neither do the names
// of infinity and NaN. A number past the type's range reads as infinity, one
// too small for it as zero.
template <class T>
T ReadFloating(const char* text) {
    VKSkipWhiteSpaces(text);
    const bool negative = *text == '-';
    if (*text == '-' || *text == '+')
        ++text;
    // from_chars would take a second sign and the names itself.
    if (!IsDigit(*text) && !(*text == '.' && IsDigit(text[1])))
        return T(0);
    T value = 0;
    const std::from_chars_result read = std::from_chars(text, text + std::strlen(text), value);
    if (read.ec == std::errc::result_out_of_range)
        value = LeadingPower(text, read.ptr) > 0 ? std::numeric_limits<T>::infinity() : T(0);
    return negative ? -value : value;
}

// Stores the member when the tag is the one of its type.
template <class T, class Member>
bool Extract(bool tagMatches, const Member& member, T& out) {
    if (!tagMatches)
        return false;
    out = member;
    return true;
}

} // namespace

CGenericVal::CGenericVal(const CGenericVal& other) : CGenericVal() {
    Copy(other);
}

CGenericVal::CGenericVal(const CString& text) : CGenericVal() {
    SetString(text);
}

CGenericVal::CGenericVal(const char* text) : CGenericVal() {
    SetString(CString(text ? text : ""));
}

CGenericVal::CGenericVal(double value) : CGenericVal() {
    SetDouble(value);
}

CGenericVal::CGenericVal(float value) : CGenericVal() {
    SetFloat(value);
}

CGenericVal::CGenericVal(bool value) : CGenericVal() {
    SetBool(value);
}

CGenericVal::CGenericVal(unsigned long value) : CGenericVal() {
    SetULong(value);
}

CGenericVal::CGenericVal(unsigned int value) : CGenericVal() {
    SetULong(value);
}

CGenericVal::CGenericVal(int value) : CGenericVal() {
    SetLong(value);
}

CGenericVal::CGenericVal(long value) : CGenericVal() {
    SetLong(value);
}

CGenericVal::CGenericVal(unsigned short value) : CGenericVal() {
    SetUShort(value);
}

CGenericVal::CGenericVal(short value) : CGenericVal() {
    SetShort(value);
}

CGenericVal::CGenericVal(unsigned char value) : CGenericVal() {
    SetByte(value);
}

CGenericVal::CGenericVal(char value) : CGenericVal() {
    SetChar(value);
}

CGenericVal::CGenericVal(const CJulianDate& date) : CGenericVal() {
    SetDate(static_cast<double>(date.GetValue()));
}

CGenericVal::CGenericVal(const CDateTime& dateTime) : CGenericVal() {
    SetDate(dateTime.GetValue());
}

CGenericVal::CGenericVal(const CBlob& blob) : CGenericVal() {
    SetBlob(blob);
}

CGenericVal::~CGenericVal() {
    Empty();
}

// --- Setters

void CGenericVal::SetShort(short value) {
    ChangeType(VT_I2);
    m_iVal = value;
}

void CGenericVal::SetUShort(unsigned short value) {
    ChangeType(VT_UI2);
    m_uiVal = value;
}

void CGenericVal::SetLong(long value) {
    const LONG stored = ToLong(value);
    ChangeType(VT_I4);
    m_lVal = stored;
}

void CGenericVal::SetULong(unsigned long value) {
    const ULONG stored = ToULong(value);
    ChangeType(VT_UI4);
    m_ulVal = stored;
}

void CGenericVal::SetByte(unsigned char value) {
    ChangeType(VT_UI1);
    m_bVal = value;
}

void CGenericVal::SetChar(char value) {
    ChangeType(VT_I1);
    m_cVal = value;
}

void CGenericVal::SetBool(bool value) {
    ChangeType(VT_BOOL);
    m_boolVal = value;
}

void CGenericVal::SetFloat(float value) {
    ChangeType(VT_R4);
    m_fltVal = value;
}

void CGenericVal::SetDouble(double value) {
    ChangeType(VT_R8);
    m_dblVal = value;
}

void CGenericVal::SetDate(double value) {
    ChangeType(VT_DATE);
    m_dblVal = value;
}

void CGenericVal::SetError(long value) {
    const LONG stored = ToLong(value);
    ChangeType(VT_ERROR);
    m_scode = stored;
}

void CGenericVal::SetString(const CString& text) {
    // The copy comes first: should it fail, the value is as it was. It may
    // also be this value's own text.
    CString copy(text);
    ChangeType(VT_LPSTR);
    m_strVal = std::move(copy);
}

void CGenericVal::SetBlob(const CBlob& blob) {
    ChangeType(VT_BLOB);
    m_blobVal = blob;
}

// --- Checked references

const CString& CGenericVal::GetStringRef() const {
    if (m_vt != VT_LPSTR)
        throw unexpected_error();
    return m_strVal;
}

CString& CGenericVal::GetStringRef() {
    return const_cast<CString&>(std::as_const(*this).GetStringRef());
}

const CBlob& CGenericVal::GetBlobRef() const {
    if (m_vt != VT_BLOB)
        throw unexpected_error();
    return m_blobVal;
}

CBlob& CGenericVal::GetBlobRef() {
    return const_cast<CBlob&>(std::as_const(*this).GetBlobRef());
}

// --- Typed extraction

bool CGenericVal::GetValue(bool& out) const {
    return Extract(m_vt == VT_BOOL, m_boolVal, out);
}

bool CGenericVal::GetValue(char& out) const {
    return Extract(m_vt == VT_I1, m_cVal, out);
}

bool CGenericVal::GetValue(unsigned char& out) const {
    return Extract(m_vt == VT_UI1, m_bVal, out);
}

bool CGenericVal::GetValue(short& out) const {
    return Extract(m_vt == VT_I2, m_iVal, out);
}

bool CGenericVal::GetValue(unsigned short& out) const {
    return Extract(m_vt == VT_UI2, m_uiVal, out);
}

bool CGenericVal::GetValue(int& out) const {
    return Extract(m_vt == VT_I4, m_lVal, out);
}

bool CGenericVal::GetValue(long& out) const {
    return Extract(m_vt == VT_I4, m_lVal, out);
}

bool CGenericVal::GetValue(unsigned int& out) const {
    return Extract(m_vt == VT_UI4, m_ulVal, out);
}

bool CGenericVal::GetValue(unsigned long& out) const {
    return Extract(m_vt == VT_UI4, m_ulVal, out);
}

bool CGenericVal::GetValue(float& out) const {
    return Extract(m_vt == VT_R4, m_fltVal, out);
}

bool CGenericVal::GetValue(double& out) const {
    return Extract(m_vt == VT_R8, m_dblVal, out);
}

bool CGenericVal::GetValue(CDateTime& out) const {
    return Extract(m_vt == VT_DATE, m_dblVal, out);
}

bool CGenericVal::GetValue(CString& out) const {
    return Extract(m_vt == VT_LPSTR, m_strVal, out);
}

bool CGenericVal::GetValue(const char*& out) const {
    if (m_vt != VT_LPSTR)
        return false;
    out = m_strVal.GetString();
    return true;
}

bool CGenericVal::GetValue(CBlob& out) const {
    return Extract(m_vt == VT_BLOB, m_blobVal, out);
}

bool CGenericVal::GetValue(CGenericVal& out) const {
    out.Copy(*this);
    return true;
}

// --- Copying and emptying

void CGenericVal::Copy(const CGenericVal& other) {
    if (other.m_vt == VT_LPSTR) {
        SetString(other.m_strVal);
    } else if (other.m_vt == VT_BLOB) {
        SetBlob(other.m_blobVal);
    } else if (this != &other) {
        Empty();
        m_vt = other.m_vt;
        // Bytes, not a double: a double copied through the floating-point
        // unit may come out with other bits.
        std::memcpy(static_cast<void*>(&m_dblVal), &other.m_dblVal, sizeof m_dblVal);
    }
}

const CGenericVal& CGenericVal::operator=(const CGenericVal& other) {
    Copy(other);
    return *this;
}

void CGenericVal::Empty() {
    if (m_vt == VT_LPSTR)
        m_strVal.~CString();
    else if (m_vt == VT_BLOB)
        m_blobVal.~CBlob();
    m_vt = VT_EMPTY;
    std::memset(static_cast<void*>(&m_dblVal), 0, sizeof m_dblVal);
}

void CGenericVal::ChangeType(VARENUM type) {
    if (m_vt == type)
        return;
    Empty();
    if (type == VT_LPSTR)
        new (&m_strVal) CString();
    else if (type == VT_BLOB)
        new (&m_blobVal) CBlob();
    m_vt = type;
}

// --- Conversions

double CGenericVal::GetAsDouble() const {
    switch (m_vt) {
    case VT_I2:
        return m_iVal;
    case VT_I1:
        return static_cast<signed char>(m_cVal);
    case VT_UI1:
    case VT_BOOL:
        return m_bVal;
    case VT_UI2:
        return m_uiVal;
    case VT_I4:
        return m_lVal;
    case VT_UI4:
        return m_ulVal;
    case VT_R4:
        return m_fltVal;
    case VT_R8:
    case VT_DATE:
        return m_dblVal;
    default:
        return 0.0;
    }
}

CString& CGenericVal::GetAsString(CString& out) const {
    switch (m_vt) {
    case VT_I2:
        return AsString(out, static_cast<int>(m_iVal));
    case VT_I1:
        return AsString(out, static_cast<int>(static_cast<signed char>(m_cVal)));
    case VT_UI1:
        return AsString(out, static_cast<int>(m_bVal));
    case VT_UI2:
        return AsString(out, static_cast<int>(m_uiVal));
    case VT_I4:
        return AsString(out, static_cast<long>(m_lVal));
    case VT_UI4:
        return AsString(out, static_cast<unsigned long>(m_ulVal));
    case VT_R4:
        return AsString(out, m_fltVal);
    case VT_R8:
        return AsString(out, m_dblVal);
    case VT_BOOL:
        return AsString(out, m_boolVal, true);
    case VT_DATE:
        out = CDateTime(m_dblVal).Format(0, LOCALE_USER_DEFAULT);
        return out;
    case VT_LPSTR:
        out = m_strVal;
        return out;
    case VT_BLOB:
        out = m_blobVal.ToString();
        return out;
    default:
        out.Empty();
        return out;
    }
}

CString CGenericVal::GetAsString() const {
    CString out;
    GetAsString(out);
    return out;
}

bool CGenericVal::Parse(const char* text, VARENUM type) {
    if (text == nullptr || *text == '\0') {
        if (type != VT_LPSTR)
            return false;
        SetString(CString());
        return true;
    }
    switch (type) {
    case VT_I2:
        SetShort(static_cast<short>(AsInteger(text, wholeText)));
        return true;
    case VT_I4:
        SetLong(AsInteger(text, wholeText));
        return true;
    case VT_UI1:
        SetByte(static_cast<unsigned char>(AsInteger(text, wholeText)));
        return true;
    case VT_UI2:
        SetUShort(static_cast<unsigned short>(AsInteger(text, wholeText)));
        return true;
    case VT_UI4:
        SetULong(ReadULong(text));
        return true;
    case VT_R4:
        SetFloat(ReadFloating<float>(text));
        return true;
    case VT_R8:
        SetDouble(ReadFloating<double>(text));
        return true;
    case VT_DATE: {
        CDateTime date(0.0);
        if (!date.ParseDateTime(text, 0, LOCALE_USER_DEFAULT))
            return false;
        SetDate(date.GetValue());
        return true;
    }
    case VT_BOOL:
        SetBool(AsBool(text));
        return true;
    case VT_I1:
        SetChar(*text);
        return true;
    case VT_LPSTR:
        SetString(CString(text));
        return true;
    default:
        return false;
    }
}

// --- Comparisons

bool CGenericVal::operator==(const CGenericVal& other) const {
    if (m_vt != other.m_vt)
        return false;
    switch (m_vt) {
    case VT_I2:
    case VT_UI2:
        return m_uiVal == other.m_uiVal;
    case VT_I4:
    case VT_UI4:
        return m_ulVal == other.m_ulVal;
    case VT_R4:
        return m_fltVal == other.m_fltVal;
    case VT_BOOL:
    case VT_I1:
    case VT_UI1:
        return m_bVal == other.m_bVal;
    case VT_LPSTR:
        return m_strVal.Compare(other.m_strVal) == 0;
    case VT_BLOB:
        return m_blobVal == other.m_blobVal;
    default:
        // Empty, Null, Double, Date, Error and the tags held as nothing.
        return m_dblVal == other.m_dblVal;
    }
}

bool CGenericVal::operator<(const CGenericVal& other) const {
    if (m_vt != other.m_vt)
        return m_vt < other.m_vt;
    switch (m_vt) {
    case VT_I2:
        return m_iVal < other.m_iVal;
    case VT_I4:
        return m_lVal < other.m_lVal;
    case VT_I1:
        return static_cast<signed char>(m_cVal) < static_cast<signed char>(other.m_cVal);
    case VT_BOOL:
    case VT_UI1:
        return m_bVal < other.m_bVal;
    case VT_UI2:
        return m_uiVal < other.m_uiVal;
    case VT_UI4:
        return m_ulVal < other.m_ulVal;
    case VT_R4:
        return m_fltVal < other.m_fltVal;
    case VT_LPSTR:
        return m_strVal.Compare(other.m_strVal) < 0;
    case VT_BLOB:
        return m_blobVal < other.m_blobVal;
    default:
        return m_dblVal < other.m_dblVal;
    }
}

} // namespace vaskel
