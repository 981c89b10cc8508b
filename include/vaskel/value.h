// Values: the shared byte blob, the tagged generic value with its type tag,
// the owning variant, safe-array views, colours and rectangles.
#pragma once

#include <vaskel/calendar.h>
#include <vaskel/export.h>
#include <vaskel/framework/string.h>
#include <vaskel/win32.h>

namespace vaskel {

class CArchive;
class CFile;

// A run of bytes of any length. Copies share one reference-counted buffer; a
// blob about to be written through takes a buffer of its own first, so blobs
// pass by value at the cost of a pointer. Buffers may be shared between
// threads; a blob object is used by one thread at a time.
class VASKEL_API CBlob {
public:
    CBlob() noexcept : m_pBuffer(nullptr) {}
    CBlob(const CBlob& other) noexcept;
    CBlob(const void* data, DWORD size);
    // As SetData(medium).
    CBlob(const STGMEDIUM& medium);
    ~CBlob();
    const CBlob& operator=(const CBlob& other);

    void Empty() { Release(); }
    // This blob gets its own copy of the other's bytes.
    void Copy(const CBlob& other);
    CBlob Clone() const;

    // Null when empty.
    const unsigned char* GetData() const;
    DWORD GetSize() const;
    LONG GetLength() const { return static_cast<LONG>(GetSize()); }
    // True when the blob holds no buffer; a buffer of no bytes is not empty,
    // though it equals an empty blob.
    bool IsEmpty() const { return m_pBuffer == nullptr; }

    // Writable room for exactly size bytes, the first of them kept: shrinking
    // a buffer held alone keeps it, anything else moves to a new buffer of
    // exactly that size. Null only when an empty blob stays empty (size 0).
    unsigned char* GetBuffer(DWORD size);
    unsigned char* GetBuffer() { return GetBuffer(GetSize()); }
    // A copy of the bytes; size 0 empties the blob whatever data is, and a
    // null data with bytes to copy raises unexpected_error.
    void SetData(const void* data, DWORD size);
    // A global-memory medium with a handle: the whole block, as GlobalSize
    // gives it. Any other medium leaves the blob as it is.
    void SetData(const STGMEDIUM& medium);

    // Equal blobs hold the same bytes; an empty blob equals one of no bytes.
    bool operator==(const CBlob& other) const;
    bool operator!=(const CBlob& other) const { return !(*this == other); }
    // Orders by the identity of the buffer, not by content: for containers
    // of blobs. An empty blob comes first.
    bool operator<(const CBlob& other) const;

    // Base64 with "=" padding, in lines of 76 characters each ended by CR LF;
    // a last line shorter than 76 has no line end. A blob of 2^29 bytes or
    // more raises COleException(E_FAIL): its text would not fit an int.
    CString ToString() const;
    // Decodes up to length characters (all of them when negative) or the
    // first NUL, skipping every character outside the Base64 alphabet. A
    // final two or three characters give one or two bytes. Null or empty
    // text empties the blob.
    bool FromString(const char* text, int length);
    bool FromString(const char* text) { return FromString(text, -1); }
    bool FromString(const CString& text) { return FromString(text, text.GetLength()); }

    // The frame "BINBLOCK", a NUL, the byte count as a little-endian 32-bit
    // number and the bytes. Reading gives false, and changes nothing, on a
    // wrong marker or a frame shorter than its count says; room for the bytes
    // is made only once the file shows it holds them, or as they arrive.
    // Errors of the file itself propagate.
    bool WriteToFile(CFile& file) const;
    bool ReadFromFile(CFile& file);
    // The same frame for a global-memory medium; other media are not written.
    static bool WriteToFile(CFile& file, const STGMEDIUM& medium);
    // A frame of bytes gives the medium a new fixed block, freeing a global
    // block it held; an empty frame frees that block and leaves the type.
    static bool ReadFromFile(CFile& file, STGMEDIUM& medium);

    // A new fixed global-memory block with a copy of the bytes, owned by the
    // caller; the handle is null for a blob of no bytes or when memory is short.
    STGMEDIUM ToStgMedium() const;
    // Frees a global-memory medium's block and nulls its handle.
    static void FreeStgMedium(STGMEDIUM& medium);

protected:
    void AddRef();
    void Release();

private:
    struct Buffer;

    // Drops the held buffer for this one.
    void Adopt(Buffer* buffer);

    Buffer* m_pBuffer;
};

// An automation type tag with its name and its class (numeric, integral,
// text...). A tag with a flag bit (array, by reference) is none of them.
struct VASKEL_API VarTypeX : public CVKEnumHelper<VARENUM> {
    using CVKEnumHelper::CVKEnumHelper;
    using CVKEnumHelper::operator=;

    bool IsEmpty() const { return Is(VT_EMPTY); }
    bool IsNull() const { return Is(VT_NULL); }
    bool IsBool() const { return Is(VT_BOOL); }
    bool IsChar() const { return Is(VT_I1); }
    bool IsByte() const { return Is(VT_UI1); }
    bool IsShort() const { return Is(VT_I2); }
    bool IsUShort() const { return Is(VT_UI2); }
    bool IsLong() const { return Is(VT_I4); }
    bool IsULong() const { return Is(VT_UI4); }
    bool IsInt() const { return Is(VT_INT); }
    bool IsUInt() const { return Is(VT_UINT); }
    bool IsLong64() const { return Is(VT_I8); }
    bool IsULong64() const { return Is(VT_UI8); }
    bool IsFloat() const { return Is(VT_R4); }
    bool IsDouble() const { return Is(VT_R8); }
    bool IsDate() const { return Is(VT_DATE); }
    bool IsString() const { return Is(VT_LPSTR); }
    bool IsComString() const { return Is(VT_BSTR); }
    bool IsError() const { return Is(VT_ERROR); }
    bool IsBlob() const { return Is(VT_BLOB); }

    void SetAsEmpty() { SetValue(VT_EMPTY); }
    void SetAsNull() { SetValue(VT_NULL); }
    void SetAsBool() { SetValue(VT_BOOL); }
    void SetAsChar() { SetValue(VT_I1); }
    void SetAsByte() { SetValue(VT_UI1); }
    void SetAsShort() { SetValue(VT_I2); }
    void SetAsUShort() { SetValue(VT_UI2); }
    void SetAsLong() { SetValue(VT_I4); }
    void SetAsULong() { SetValue(VT_UI4); }
    void SetAsInt() { SetValue(VT_INT); }
    void SetAsUInt() { SetValue(VT_UINT); }
    void SetAsLong64() { SetValue(VT_I8); }
    void SetAsULong64() { SetValue(VT_UI8); }
    void SetAsFloat() { SetValue(VT_R4); }
    void SetAsDouble() { SetValue(VT_R8); }
    void SetAsDate() { SetValue(VT_DATE); }
    void SetAsString() { SetValue(VT_LPSTR); }
    void SetAsComString() { SetValue(VT_BSTR); }
    void SetAsError() { SetValue(VT_ERROR); }
    void SetAsBlob() { SetValue(VT_BLOB); }

    // Bool counts as unsigned and Date as floating point; Empty, Null, Error
    // and BLOB belong to no class.
    bool IsNumeric() const;
    bool IsIntegral() const;
    bool IsSignedIntegral() const;
    bool IsUnsignedIntegral() const;
    bool IsFloatingPoint() const;
    bool IsText() const;

    // "Long", "String", "BLOB"...; "Unknown" for a tag without a name.
    const char* ToString() const { return ToString(GetValue()); }
    static const char* ToString(VARENUM type);
    static const char* ToString(unsigned short type);

    // The tag whose name is the whole text, ignoring case. Any other text
    // ("Unknown" too) gives false and leaves the tag as it was.
    static bool Parse(const char* text, VARENUM& type);
    bool Parse(const char* text);
};

// One value of a small set of automation types, tagged with its VARENUM:
// Empty, Null (only through ChangeType), Bool, Char, Byte, Short, UShort,
// Long, ULong, Float, Double, Date, Error, String (a CString) and BLOB (a
// shared CBlob). Numbers take no heap. The 8-byte payload is zero whenever
// the value holds nothing, and a member narrower than the payload leaves the
// rest of it zero.
class VASKEL_API CGenericVal {
public:
    CGenericVal() : m_vt(VT_EMPTY) {}
    CGenericVal(const CGenericVal& other);
    CGenericVal(const CString& text);
    // A null pointer gives empty text.
    CGenericVal(const char* text);
    CGenericVal(double value);
    CGenericVal(float value);
    CGenericVal(bool value);
    // A long or unsigned long past 32 bits raises unexpected_error, as the
    // setters do.
    CGenericVal(unsigned long value);
    CGenericVal(unsigned int value);
    CGenericVal(int value);
    CGenericVal(long value);
    CGenericVal(unsigned short value);
    CGenericVal(short value);
    CGenericVal(unsigned char value);
    CGenericVal(char value);
    // Midnight of the day.
    CGenericVal(const CJulianDate& date);
    CGenericVal(const CDateTime& dateTime);
    CGenericVal(const CBlob& blob);
    ~CGenericVal();

    // Each gives the value the setter's tag, emptying a value of another tag
    // first; SetLong, SetULong and SetError raise unexpected_error, and
    // change nothing, for a number past 32 bits.
    void SetShort(short value);
    void SetUShort(unsigned short value);
    void SetLong(long value);
    void SetULong(unsigned long value);
    void SetByte(unsigned char value);
    void SetChar(char value);
    void SetBool(bool value);
    void SetFloat(float value);
    void SetDouble(double value);
    void SetDate(double value);
    void SetError(long value);
    void SetString(const CString& text);
    // Shares the blob's buffer.
    void SetBlob(const CBlob& blob);

    // The payload as that type whatever the tag: callers check the tag first.
    short GetShort() const { return m_iVal; }
    unsigned short GetUShort() const { return m_uiVal; }
    LONG GetLong() const { return m_lVal; }
    ULONG GetULong() const { return m_ulVal; }
    LONG GetError() const { return m_scode; }
    // Through the byte, so that another tag's payload never reads as an
    // invalid bool.
    bool GetBool() const { return m_bVal != 0; }
    char GetChar() const { return m_cVal; }
    unsigned char GetByte() const { return m_bVal; }
    float GetFloat() const { return m_fltVal; }
    double GetDouble() const { return m_dblVal; }
    double GetDate() const { return m_dblVal; }

    // The held text or blob, to read or to change in place; unexpected_error
    // under any other tag.
    const CString& GetString() const { return GetStringRef(); }
    CString& GetString() { return GetStringRef(); }
    const CBlob& GetBlob() const { return GetBlobRef(); }
    CBlob& GetBlob() { return GetBlobRef(); }

    // Only under the tag of out's type, without conversion: a Date is no
    // double and a Double no CDateTime. False leaves out as it was.
    bool GetValue(bool& out) const;
    bool GetValue(char& out) const;
    bool GetValue(unsigned char& out) const;
    bool GetValue(short& out) const;
    bool GetValue(unsigned short& out) const;
    bool GetValue(int& out) const;
    bool GetValue(long& out) const;
    bool GetValue(unsigned int& out) const;
    bool GetValue(unsigned long& out) const;
    bool GetValue(float& out) const;
    bool GetValue(double& out) const;
    bool GetValue(CDateTime& out) const;
    bool GetValue(CString& out) const;
    // The value's own text, valid until the value next changes.
    bool GetValue(const char*& out) const;
    // Shares the blob's buffer.
    bool GetValue(CBlob& out) const;
    // A copy of the whole value; always true.
    bool GetValue(CGenericVal& out) const;

    // Text and blobs go through SetString and SetBlob, so they are shared;
    // anything else is the tag and the whole payload.
    void Copy(const CGenericVal& other);
    const CGenericVal& operator=(const CGenericVal& other);
    void Empty();
    // A Null value is not empty.
    bool IsEmpty() const { return m_vt == VT_EMPTY; }
    CVKEnumHelperWrapper<VarTypeX> GetType() const { return VarTypeX(m_vt); }

    // Numbers as they are (a ULong stays positive, a Bool is 0 or 1); 0.0
    // for every other tag, text included.
    double GetAsDouble() const;
    // Numbers by AsString, a Bool as "True" or "False", a Date by
    // CDateTime::Format in the user's default locale, text as it is, a blob
    // as Base64; empty text for every other tag.
    CString& GetAsString(CString& out) const;
    CString GetAsString() const;
    CString ToString() const { return GetAsString(); }

    // Reads text as the type and stores it with the type's setter. Integers
    // read as atol does: white space, a sign, digits up to anything else, no
    // digits being 0, saturating at the 32-bit limits, except that a ULong
    // reads up to 4294967295; Short, Byte and UShort keep the low bits, so
    // "-1" is 255 as a Byte. Float and Double read as atof does, in any
    // locale; a Char is the first character, a Bool AsBool's answer, a Date
    // CDateTime::ParseDateTime's in the user's default locale, a String the
    // text. Null or empty text is false except for a String (empty text).
    // False, changing nothing, for a date that does not parse and any type
    // not named here.
    bool Parse(const char* text, VARENUM type);

    // A different tag is never equal, and orders by the tag number alone.
    // Within a tag: numbers by value (Bool, Byte, UShort and ULong unsigned;
    // a NaN equals nothing and orders nowhere), text as CString::Compare
    // does, blobs as CBlob does (equal by content, ordered by buffer); Empty,
    // Null, Double, Date and Error by the payload read as a double, so Error
    // codes compare as unsigned numbers.
    bool operator==(const CGenericVal& other) const;
    bool operator!=(const CGenericVal& other) const { return !(*this == other); }
    bool operator<(const CGenericVal& other) const;

protected:
    // Empties a value of another tag and gives it this one: empty text for a
    // String, no buffer for a BLOB, a zero payload for anything else.
    void ChangeType(VARENUM type);
    CString& GetStringRef();
    const CString& GetStringRef() const;
    CBlob& GetBlobRef();
    const CBlob& GetBlobRef() const;

private:
    VARENUM m_vt;
    // The live member is the one of the tag; CString and CBlob are one
    // pointer each, built and destroyed in place. The double starts out
    // zero, and with it the whole payload.
    union {
        double m_dblVal = 0.0;
        bool m_boolVal;
        char m_cVal;
        unsigned char m_bVal;
        short m_iVal;
        unsigned short m_uiVal;
        LONG m_lVal;
        ULONG m_ulVal;
        LONG m_scode;
        float m_fltVal;
        CString m_strVal;
        CBlob m_blobVal;
    };
};

// An automation VARIANT that owns what it holds: cleared on destruction,
// deep-copied on copy, built from and assigned every scalar, string, date,
// decimal and interface type. Failures throw _com_error with the HRESULT.
//
// The integer overloads follow the native types: int gives VT_INT and long
// VT_I4, so where LONG is an int (POSIX) a LONG gives VT_INT and a DWORD
// VT_UINT; a long or unsigned long beyond 32 bits throws DISP_E_OVERFLOW.
class VASKEL_API orvariant_t : public VARIANT {
public:
    orvariant_t() noexcept { VariantInit(this); }
    orvariant_t(const orvariant_t& source);
    orvariant_t(const VARIANT& source);
    orvariant_t(const _variant_t& source);
    // A null pointer throws E_POINTER.
    orvariant_t(const VARIANT* source);
    // Without copy the wrapper takes source over and leaves it VT_EMPTY.
    orvariant_t(VARIANT& source, bool copy);
    // VT_I2, or VT_BOOL (-1 for any non-zero value); any other type E_INVALIDARG.
    orvariant_t(short value, VARTYPE type = VT_I2);
    // VT_I4, VT_ERROR or VT_BOOL; any other type E_INVALIDARG.
    orvariant_t(long value, VARTYPE type = VT_I4);
    orvariant_t(float value) noexcept;
    // VT_R8 or VT_DATE; any other type E_INVALIDARG.
    orvariant_t(double value, VARTYPE type = VT_R8);
    orvariant_t(const CDateTime& value) noexcept;
    orvariant_t(const CY& value) noexcept;
    // A null text gives a null string.
    orvariant_t(const OLECHAR* value);
    orvariant_t(const char* value);
    orvariant_t(const _bstr_t& value);
    orvariant_t(IDispatch* value, bool addRef = true) noexcept;
    orvariant_t(IUnknown* value, bool addRef = true) noexcept;
    orvariant_t(bool value) noexcept;
    orvariant_t(const DECIMAL& value) noexcept;
    orvariant_t(unsigned char value) noexcept;
    orvariant_t(char value) noexcept;
    orvariant_t(unsigned short value) noexcept;
    orvariant_t(unsigned long value);
    orvariant_t(int value) noexcept;
    orvariant_t(unsigned int value) noexcept;
    orvariant_t(long long value) noexcept;
    orvariant_t(unsigned long long value) noexcept;
    ~orvariant_t() { VariantClear(this); }

    orvariant_t& operator=(const orvariant_t& source);
    orvariant_t& operator=(const VARIANT& source);
    orvariant_t& operator=(const _variant_t& source);
    orvariant_t& operator=(const VARIANT* source);
    // Into VT_BOOL a short stays a VT_BOOL; a long does too, and into
    // VT_ERROR a long stays an error code.
    orvariant_t& operator=(short value);
    orvariant_t& operator=(long value);
    // Into VT_DATE a double stays a date.
    orvariant_t& operator=(double value);
    orvariant_t& operator=(float value);
    orvariant_t& operator=(const CDateTime& value);
    orvariant_t& operator=(const CY& value);
    orvariant_t& operator=(bool value);
    orvariant_t& operator=(const DECIMAL& value);
    orvariant_t& operator=(unsigned char value);
    orvariant_t& operator=(char value);
    orvariant_t& operator=(unsigned short value);
    orvariant_t& operator=(unsigned long value);
    orvariant_t& operator=(int value);
    orvariant_t& operator=(unsigned int value);
    orvariant_t& operator=(long long value);
    orvariant_t& operator=(unsigned long long value);
    orvariant_t& operator=(const OLECHAR* value);
    orvariant_t& operator=(const char* value);
    orvariant_t& operator=(const _bstr_t& value);
    orvariant_t& operator=(IDispatch* value);
    orvariant_t& operator=(IUnknown* value);

    operator VARIANT*() noexcept { return this; }
    operator const VARIANT*() const noexcept { return this; }

    // Releases the content and takes source over, leaving it VT_EMPTY.
    void TransferOwnership(VARIANT& source);

    // The held string or interface, without a new reference; null for any
    // other type, or DISP_E_TYPEMISMATCH when mustMatch is set. GetIUnknown
    // also gives a dispatch interface.
    BSTR GetBSTR(bool mustMatch = false) const;
    IDispatch* GetIDispatch(bool mustMatch = false) const;
    IUnknown* GetIUnknown(bool mustMatch = false) const;

    // The numeric value (a Bool as -1 or 0); 0 for text, currency, decimals,
    // interfaces, arrays and references. The integral forms truncate toward
    // zero and keep the low 32 bits.
    double GetAsDouble() const;
    LONG GetAsIntegral() const;
    LONG GetAsSignedIntegral() const { return GetAsIntegral(); }
    DWORD GetAsUnsignedIntegral() const;

    // A string's ANSI text; empty for every other type.
    CString GetAsString() const;
    // A string's ANSI text, or the value converted to text by the system.
    CString ToString() const;

    bool IsNumeric() const { return Type().IsNumeric(); }
    bool IsIntegral() const { return Type().IsIntegral(); }
    bool IsSignedIntegral() const { return Type().IsSignedIntegral(); }
    bool IsUnsignedIntegral() const { return Type().IsUnsignedIntegral(); }
    bool IsFloatingPoint() const { return Type().IsFloatingPoint(); }
    bool IsString() const { return Type().IsText(); }

    // True only when the system's comparison says less than; equal, greater,
    // a null operand and errors give false.
    bool operator<(const orvariant_t& other) const;

private:
    VarTypeX Type() const { return VarTypeX(static_cast<VARENUM>(vt)); }
    // Clears unless the type is already this one, then sets it.
    void Retype(VARTYPE type);
    void SetString(BSTR owned);
    // Holds the interface under the type (VT_DISPATCH's pointer overlays
    // VT_UNKNOWN's), with a reference of its own.
    void SetInterface(VARTYPE type, IUnknown* value);
};

// A one-byte true, false or unknown; false < true < unknown.
class tristate_bool {
public:
    tristate_bool() noexcept : m_value(kUnknown) {}
    tristate_bool(bool value) noexcept : m_value(value ? kTrue : kFalse) {}
    tristate_bool& operator=(bool value) noexcept {
        m_value = value ? kTrue : kFalse;
        return *this;
    }

    static tristate_bool True() noexcept { return tristate_bool(true); }
    static tristate_bool False() noexcept { return tristate_bool(false); }
    static tristate_bool Unknown() noexcept { return tristate_bool(); }

    void SetAsTrue() noexcept { m_value = kTrue; }
    void SetAsFalse() noexcept { m_value = kFalse; }
    void SetAsUnknown() noexcept { m_value = kUnknown; }

    bool IsTrue() const noexcept { return m_value == kTrue; }
    bool IsFalse() const noexcept { return m_value == kFalse; }
    bool IsUnknown() const noexcept { return m_value == kUnknown; }
    operator bool() const noexcept { return IsTrue(); }

    bool operator==(const tristate_bool& other) const noexcept { return m_value == other.m_value; }
    bool operator!=(const tristate_bool& other) const noexcept { return m_value != other.m_value; }
    // An unknown value equals false here.
    bool operator==(bool value) const noexcept { return IsTrue() == value; }
    bool operator!=(bool value) const noexcept { return IsTrue() != value; }
    bool operator<(const tristate_bool& other) const noexcept { return m_value < other.m_value; }

private:
    static constexpr unsigned char kFalse = 0;
    static constexpr unsigned char kTrue = 1;
    static constexpr unsigned char kUnknown = 255;

    unsigned char m_value;
};

// A VARIANT that releases nothing: a view of a value owned elsewhere.
struct tmpvariant_t : public VARIANT {
    tmpvariant_t() noexcept { VariantInit(this); }
};

// How a safearrayvector holds the VARIANT it shows.
enum EVariantOwnershipOptions {
    // A bitwise copy of the caller's VARIANT, never released: the caller
    // keeps it alive and unchanged while the vector shows it.
    OwnershipBorrow = 1,
    // A deep copy, released by the vector.
    OwnershipCopy = 2,
    // The caller's VARIANT is taken over and reset to empty; refused for a
    // VARIANT passed as const.
    OwnershipTake = 3,
    // As OwnershipTake, accepted for a VARIANT passed as const as well.
    OwnershipTakeConst = 4
};

class safearrayvector;

// A bidirectional walk over a safearrayvector; its element is a view valid
// while the vector holds the same VARIANT. Moves stop at the first element
// and at the end.
class VASKEL_API const_safearrayiterator {
public:
    explicit const_safearrayiterator(const safearrayvector* vector);

    const tmpvariant_t& operator*() const { return m_current; }
    const tmpvariant_t* operator->() const { return &m_current; }
    const_safearrayiterator& operator++() { return Move(1); }
    const_safearrayiterator& operator--() { return Move(-1); }
    const_safearrayiterator operator++(int);
    const_safearrayiterator operator--(int);
    // These move the iterator itself.
    const_safearrayiterator& operator+(int n) { return Move(n); }
    const_safearrayiterator& operator-(int n) { return Move(-static_cast<long long>(n)); }

    bool operator==(const const_safearrayiterator& other) const {
        return m_vector == other.m_vector && m_index == other.m_index;
    }
    bool operator!=(const const_safearrayiterator& other) const { return !(*this == other); }
    DWORD GetIndex() const { return m_index; }

private:
    friend class safearrayvector;
    const_safearrayiterator& Move(long long n);
    // Throws _com_error for an element type the vector cannot show.
    void Refresh();

    const safearrayvector* m_vector;
    DWORD m_index;
    tmpvariant_t m_current;
};

// A read-only vector view of a VARIANT holding a one-dimensional SAFEARRAY
// (of a multi-dimensional one, its first column); a single value shows as a
// vector of one. The array's data stays locked while the vector holds it.
//
// Elements of VT_VARIANT arrays are shown as the element VARIANT itself.
// Arrays held by reference are refused (E_INVALIDARG), as are arrays whose
// element size does not match their type. Interfaces and strings take a
// pointer each, so those elements are pointer-sized.
class VASKEL_API safearrayvector {
public:
    safearrayvector() noexcept;
    safearrayvector(VARIANT& value, EVariantOwnershipOptions ownership);
    // Holds nothing for OwnershipTake.
    safearrayvector(const VARIANT& value, EVariantOwnershipOptions ownership);
    // A copy borrows what a borrowing vector borrows and deep-copies what an
    // owning vector owns, so every VARIANT is released once; a copy that
    // fails throws _com_error.
    safearrayvector(const safearrayvector& other);
    safearrayvector& operator=(const safearrayvector& other);
    ~safearrayvector() { Reset(); }

    // Unlocks the array, releases an owned VARIANT and holds nothing.
    void Reset();
    // E_INVALIDARG for an empty VARIANT or an unknown option; any failure
    // keeps what the vector held.
    HRESULT Set(VARIANT& value, EVariantOwnershipOptions ownership);
    // E_INVALIDARG for OwnershipTake.
    HRESULT Set(const VARIANT& value, EVariantOwnershipOptions ownership);

    DWORD size() const { return m_size; }
    bool empty() const { return m_size == 0; }
    // The element type of an array, or the type of a single value.
    VARTYPE GetArrayType() const { return static_cast<VARTYPE>(m_variant.vt & ~VT_ARRAY); }

    // An index at or past the end gives an empty VARIANT.
    tmpvariant_t at(DWORD index) const;
    tmpvariant_t operator[](DWORD index) const { return at(index); }
    tmpvariant_t front() const { return at(0); }
    tmpvariant_t back() const { return at(m_size ? m_size - 1 : 0); }
    const_safearrayiterator begin() const { return const_safearrayiterator(this); }
    const_safearrayiterator end() const;

    // Whether the vector owns what it holds (copied or taken).
    bool CanTransferElementOwnership() const;
    // Moves element index into out (cleared first) and empties its slot;
    // E_UNEXPECTED (thrown) past the end or when the vector only borrows.
    void TransferElementOwnership(DWORD index, VARIANT& out);

    // Raw elements by element type: 1, 2, 4 or 8 bytes, pointer-sized
    // strings and interfaces, 16-byte decimals, VARIANTs. Other types are
    // unsupported: size 0, false, E_NOTIMPL.
    //
    // Makes out a VARIANT of type holding the element: a copy (out cleared
    // first), or a bitwise view that overwrites out without clearing it.
    static HRESULT SetVariantValue(VARIANT& out, VARTYPE type, void* element, bool copy);
    // Stores in's value into the element without releasing what the element
    // held: a copy, or in's content itself, after which in is empty.
    static HRESULT GetVariantValue(void* element, VARIANT& in, bool copy);
    static HRESULT GetVariantValue(void* element, const VARIANT& in);
    static DWORD GetDataSize(VARTYPE type);
    // Zeroes the element (an empty VARIANT for VT_VARIANT); E_NOTIMPL for
    // decimals and unsupported types.
    static HRESULT ResetDataValue(VARTYPE type, void* element);
    static bool MoveDataPointer(VARTYPE type, void*& element, LONG n);

private:
    friend class const_safearrayiterator;
    void* ElementAt(DWORD index) const;

    EVariantOwnershipOptions m_ownership;
    VARIANT m_variant;
    DWORD m_size;
    void* m_data;
};

// A colour as 0x00BBGGRR: red in bits 0-7, green 8-15, blue 16-23.
class VASKEL_API CRGBColor {
public:
    CRGBColor(DWORD color = 0) : m_color(color) {}

    void SetColor(DWORD color) { m_color = color; }
    void SetColor(unsigned char red, unsigned char green, unsigned char blue) {
        m_color = static_cast<DWORD>(red) | static_cast<DWORD>(green) << 8 |
                  static_cast<DWORD>(blue) << 16;
    }
    DWORD GetColor() const { return m_color; }
    operator DWORD() const { return m_color; }

    int GetRed() const { return static_cast<int>(m_color & 0xFF); }
    int GetGreen() const { return static_cast<int>((m_color >> 8) & 0xFF); }
    int GetBlue() const { return static_cast<int>((m_color >> 16) & 0xFF); }
    // Each rebuilds the value from the three components; bits 24-31 become 0.
    void SetRed(unsigned char red) {
        SetColor(red, static_cast<unsigned char>(GetGreen()),
                 static_cast<unsigned char>(GetBlue()));
    }
    void SetGreen(unsigned char green) {
        SetColor(static_cast<unsigned char>(GetRed()), green,
                 static_cast<unsigned char>(GetBlue()));
    }
    void SetBlue(unsigned char blue) {
        SetColor(static_cast<unsigned char>(GetRed()), static_cast<unsigned char>(GetGreen()),
                 blue);
    }

    // "{red,green,blue}" in decimal.
    CString ToString() const;

private:
    DWORD m_color;
};

// A rectangle in floating-point coordinates.
struct CVKRectF {
    double left;
    double top;
    double right;
    double bottom;
};

// The archive holds top, bottom, left, right, each a little-endian double.
VASKEL_API CArchive& operator<<(CArchive& archive, const CVKRectF& rect);
VASKEL_API CArchive& operator>>(CArchive& archive, CVKRectF& rect);

} // namespace vaskel
