// Text: value conversions (numbers, variants, GUIDs and ProgIDs, locale
// and error texts), bounded substring search, string-buffer helpers,
// delimited token lists, a tokenizer, string vectors, path names and byte
// dumps.
#pragma once

#include <vaskel/export.h>
#include <vaskel/framework/array.h>
#include <vaskel/framework/position.h>
#include <vaskel/framework/string.h>
#include <vaskel/win32.h>

#include <vector>

namespace vaskel {

class CArchive;

// The first occurrence of the pattern within the first textLength bytes of
// the text, or null. Bytes are compared as they are, NUL included.
VASKEL_API const char* VKFindString(const char* text, DWORD textLength, const char* pattern,
                                    DWORD patternLength);
// The same, comparing bytes after _mbctolower.
VASKEL_API const char* VKFindStringNoCase(const char* text, DWORD textLength, const char* pattern,
                                          DWORD patternLength);
// Advances the pointer over white space (isspace); stops at NUL or a null pointer.
VASKEL_API void VKSkipWhiteSpaces(const char*& text);
// Copies the string into a buffer of bufferSize bytes, always NUL-terminated
// and cut to bufferSize - 1 bytes when it does not fit; size 0 writes nothing.
VASKEL_API void VKCopyStringToBuffer(char* buffer, DWORD bufferSize, const CString& text);
// Gives the string room for at least length characters, keeping its text.
VASKEL_API void VKReserveStringBuffer(CString& text, DWORD length);

// Values to text. Every conversion has an in-place form that overwrites the
// caller's string and returns it, and a value form. Floating-point values are
// written in fixed point with the given fractional digits, trailing zeros
// trimmed (while the value is one or more), never with an exponent.
VASKEL_API CString AsString(char value);
VASKEL_API CString& AsString(CString& out, bool value, bool trueFalse = true);
VASKEL_API CString AsString(bool value, bool trueFalse = true);
VASKEL_API CString& AsString(CString& out, int value);
VASKEL_API CString AsString(int value);
VASKEL_API CString& AsString(CString& out, long value);
VASKEL_API CString AsString(long value);
VASKEL_API CString& AsString(CString& out, unsigned int value);
VASKEL_API CString AsString(unsigned int value);
VASKEL_API CString& AsString(CString& out, unsigned long value);
VASKEL_API CString AsString(unsigned long value);
VASKEL_API CString& AsString(CString& out, long long value);
VASKEL_API CString AsString(long long value);
VASKEL_API CString& AsString(CString& out, unsigned long long value);
VASKEL_API CString AsString(unsigned long long value);
// 16 fractional digits.
VASKEL_API CString& AsString(CString& out, double value);
VASKEL_API CString AsString(double value);
VASKEL_API CString& AsString(CString& out, double value, DWORD digits);
VASKEL_API CString AsString(double value, DWORD digits);
// A literal digit count such as 0 would otherwise be as close to a format.
VASKEL_API CString& AsString(CString& out, double value, int digits);
VASKEL_API CString AsString(double value, int digits);
// The value through a printf-style format that takes one double.
VASKEL_API CString& AsString(CString& out, double value, const char* format);
VASKEL_API CString AsString(double value, const char* format);
// Cleaned to about seven significant digits first; 7 fractional digits.
VASKEL_API CString& AsString(CString& out, float value);
VASKEL_API CString AsString(float value);
VASKEL_API CString& AsString(CString& out, float value, DWORD digits);
VASKEL_API CString AsString(float value, DWORD digits);
VASKEL_API CString& AsString(CString& out, float value, int digits);
VASKEL_API CString AsString(float value, int digits);
// Widened, not cleaned.
VASKEL_API CString& AsString(CString& out, float value, const char* format);
VASKEL_API CString AsString(float value, const char* format);
// Lower-case hexadecimal, every bit of the pointer, no prefix.
VASKEL_API CString& AsString(CString& out, void* value);
VASKEL_API CString AsString(void* value);

// A VT_BSTR variant's text in the ANSI code page; empty for any other type,
// a string held by reference included.
VASKEL_API CString& AsString(CString& out, const VARIANT& value);
VASKEL_API CString AsString(const VARIANT& value);
// "{XXXXXXXX-XXXX-XXXX-XXXX-XXXXXXXXXXXX}" in upper case.
VASKEL_API CString& AsString(CString& out, const GUID& value);
VASKEL_API CString AsString(const GUID& value);

// Text to values. AsInteger and AsULong read at most length characters
// (stopping at a NUL), as the runtime's atoi and atol do, saturating at the
// 32-bit limits; AsULong answers the signed result's bit pattern.
VASKEL_API bool AsBool(const char* text);
VASKEL_API int AsInteger(const char* text, DWORD length);
VASKEL_API DWORD AsULong(const char* text, DWORD length);
// A VT_UI4 variant's value, or the value converted to VT_UI4 by the system;
// false, with out untouched, when it cannot be converted.
VASKEL_API bool AsULong(const VARIANT& value, DWORD& out);
// The float rounded to about seven significant digits.
VASKEL_API double AsCleanDouble(float value);
VASKEL_API double AsDouble(float value);

// Rounding with halves away from zero; NaN gives 0.
VASKEL_API double VKRoundFloat(double value);
VASKEL_API double VKRoundFloat(double value, LONG places);

// -1, 0 or 1 comparing the code units of the whole lengths, embedded NULs
// included; a null string is empty.
VASKEL_API int VKCompareBSTR(BSTR left, BSTR right);

// Locale information (the system's GetLocaleInfoA through a buffer that
// grows as needed). False or empty text on failure, the output untouched.
VASKEL_API bool GetLocaleInfoA(DWORD locale, DWORD type, CString& out);
VASKEL_API CString GetLocaleInfoA(DWORD locale, DWORD type);
// The English name of the locale's currency.
VASKEL_API bool GetCurrencyName(DWORD locale, CString& out);
VASKEL_API CString GetCurrencyName(DWORD locale);
// The system's text for a Win32 error code, its line break included; empty
// for a code without one.
VASKEL_API CString KXFormatErrorMessage(DWORD code);

// --- GUIDs, their text and ProgIDs

// The checked forms answer the system's HRESULT and write their output only
// on success (the GUID forms hand the GUID to the system, which may write it
// on failure too). The throwing forms raise COleException with the failing
// HRESULT. 8-bit text is converted from the thread's ANSI code page; a null
// or unconvertible text reaches the system as a null pointer.
VASKEL_API HRESULT AsGUIDFromGuidString(const OLECHAR* text, GUID& out);
VASKEL_API HRESULT AsGUIDFromGuidString(const char* text, GUID& out);
VASKEL_API GUID AsGUIDFromGuidString(const OLECHAR* text);
VASKEL_API GUID AsGUIDFromGuidString(const char* text);
VASKEL_API HRESULT AsGUIDFromProgID(const OLECHAR* progId, GUID& out);
VASKEL_API HRESULT AsGUIDFromProgID(const char* progId, GUID& out);
VASKEL_API GUID AsGUIDFromProgID(const OLECHAR* progId);
VASKEL_API GUID AsGUIDFromProgID(const char* progId);
// A GUID string, or failing that a ProgID.
VASKEL_API HRESULT AsGUID(const OLECHAR* text, GUID& out);
VASKEL_API HRESULT AsGUID(const char* text, GUID& out);
VASKEL_API GUID AsGUID(const OLECHAR* text);
VASKEL_API GUID AsGUID(const char* text);
VASKEL_API HRESULT AsProgID(const GUID& clsid, CString& out);
VASKEL_API CString AsProgID(const GUID& clsid);
VASKEL_API HRESULT AsProgIDFromGuidString(const OLECHAR* text, CString& out);
VASKEL_API HRESULT AsProgIDFromGuidString(const char* text, CString& out);
VASKEL_API CString AsProgIDFromGuidString(const OLECHAR* text);
VASKEL_API CString AsProgIDFromGuidString(const char* text);
// The ProgID of a registered GUID string; any other text is taken to be a
// ProgID already and comes back as it is. Never fails.
VASKEL_API HRESULT AsProgID(const OLECHAR* text, CString& out);
VASKEL_API HRESULT AsProgID(const char* text, CString& out);
VASKEL_API CString AsProgID(const OLECHAR* text);
VASKEL_API CString AsProgID(const char* text);
// The GUID string of a ProgID's class; E_UNEXPECTED when it has no text.
VASKEL_API HRESULT AsGUIDStringFromProgID(const OLECHAR* progId, CString& out);
VASKEL_API HRESULT AsGUIDStringFromProgID(const char* progId, CString& out);
VASKEL_API CString AsGUIDStringFromProgID(const OLECHAR* progId);
VASKEL_API CString AsGUIDStringFromProgID(const char* progId);

// --- Delimited token lists

// A string that holds tokens separated by one delimiter character, such as
// "red, green ,blue". Reading is forgiving: white space around a token is
// ignored and empty or blank segments are skipped. There is no quoting, so a
// token never holds the delimiter. White space never counts as such where it
// is the delimiter itself.
//
// A length that comes with a text may be all ones, meaning up to its NUL; any
// length is cut at a NUL inside it. Offsets and indices that are not found
// are all ones. A list's reading ends at the first NUL of its text.
//
// Appending writes raw text. Inserting, replacing, sorted adding and sorting
// rebuild the list normalised: trimmed tokens joined by the bare delimiter.
class VASKEL_API CDelimitedString : public CString {
public:
    struct FindTraits {
        bool caseSensitive;
        // Without case, Includes need not lower a side already in lower case.
        bool selfLowerCase;
        bool otherLowerCase;
    };
    struct SortingTraits {
        bool ascending;
        bool caseSensitive;
        // Whether a token equal to one already listed is added again.
        bool allowDuplicates;
    };

    explicit CDelimitedString(char delimiter = ',');
    // The text as it is, not normalised.
    CDelimitedString(const CString& text, char delimiter = ',');
    CDelimitedString(const CDelimitedString& other) = default;
    CDelimitedString(CDelimitedString&& other) noexcept = default;
    virtual ~CDelimitedString();

    CDelimitedString& operator=(const CDelimitedString& other) = default;
    CDelimitedString& operator=(CDelimitedString&& other) noexcept = default;
    // A plain string has no delimiter of its own: the delimiter becomes ",".
    CDelimitedString& operator=(const CString& text);
    CDelimitedString& operator+=(const CString& token);

    char GetDelimiter() const { return m_delimiter; }
    void SetDelimiter(char delimiter) { m_delimiter = delimiter; }

    // The next token from the cursor in a NUL-terminated text: its start and
    // length. The cursor moves behind the token's delimiter, or onto the NUL.
    static bool GetNextToken(const char*& cursor, const char*& token, DWORD& length,
                             char delimiter);
    // Null for an empty text. A position is an offset into the text; it
    // becomes null when no token is left.
    POSITION GetFirstTokenPosition() const;
    bool GetNextToken(POSITION& position, const char*& token, DWORD& length) const;
    const char* GetNextToken(POSITION& position, DWORD& length) const;
    CString GetNextToken(POSITION& position) const;
    // Leaves the string as it was when no token is left.
    CString& GetNextToken(POSITION& position, CString& token) const;
    DWORD GetTokenCount() const;
    bool GetTokenAt(DWORD index, const char*& token, DWORD& length) const;
    CString GetTokenAt(DWORD index) const;
    // Whether a walk over the tokens ends exactly at the end of the text:
    // "a,b" and "a,b," are valid, "a, " and "a,," are not.
    bool IsValid() const;

    // The offset of the first whole-token occurrence of the token, trimmed,
    // in the text. The search text may span several tokens ("a,b").
    static DWORD FindTokenPosition(const char* text, DWORD textLength, const char* token,
                                   DWORD tokenLength, char delimiter, bool caseSensitive);
    DWORD FindTokenPosition(const FindTraits& traits, const char* token, DWORD length) const;
    // The index of the first token equal to the text, which is not trimmed.
    DWORD FindToken(const char* token, DWORD length) const;
    DWORD FindToken(const CString& token) const;
    DWORD FindTokenNoCase(const char* token, DWORD length) const;
    DWORD FindTokenNoCase(const CString& token) const;
    DWORD FindToken(const FindTraits& traits, const char* token, DWORD length) const;
    DWORD FindToken(const FindTraits& traits, const CString& token) const;
    static bool HasToken(const char* text, DWORD textLength, const char* token, DWORD tokenLength,
                         char delimiter, bool caseSensitive);
    bool HasToken(const char* token, DWORD length) const;
    bool HasToken(const CString& token) const;
    bool HasToken(const FindTraits& traits, const char* token, DWORD length) const;
    bool HasToken(const FindTraits& traits, const CString& token) const;
    // Whether every token of the second text is a token of the first.
    static bool Includes(const char* text, DWORD textLength, const char* other, DWORD otherLength,
                         char delimiter);
    bool Includes(const CString& other) const;
    bool Includes(const CString& other, const FindTraits& traits) const;
    bool HasDuplicateTokens(const FindTraits& traits) const;

    // Appends the delimiter (unless the text is empty) and the characters as
    // they are; an empty token adds nothing.
    void AddToken(const char* token, DWORD length);
    void AddToken(const CString& token);
    void AddToken(char token);
    // Whether no white space surrounds a delimiter or the text, and the text
    // neither starts nor ends with the delimiter.
    bool Trimmed() const;
    // Drops white space around the text and around every delimiter; the
    // delimiters themselves stay.
    void Trim();
    // Narrows the range to exclude leading and trailing white space.
    static void TrimToken(const char*& text, DWORD& length);
    void AddStrings(const CStringArray& strings);
    void AddStrings(const std::vector<CString>& strings);
    // Appends every token; the existing elements stay.
    void GetStrings(CStringArray& strings) const;
    void GetStrings(std::vector<CString>& strings) const;

    // Inserts the token, trimmed, in sorted position: false when it is empty,
    // or equal to a listed token and duplicates are not allowed.
    bool AddToken(const char* token, DWORD length, const SortingTraits& traits);
    bool AddToken(const CString& token, const SortingTraits& traits);
    // Inserts the token, trimmed, before the token with that index; the token
    // count appends. False, leaving the list as it was, when the index is past
    // the count or the list is not valid.
    bool InsertTokenAt(DWORD index, const char* token, DWORD length);
    bool InsertTokenAt(DWORD index, const CString& token);
    // All or nothing, under the same conditions as InsertTokenAt.
    bool ReplaceTokenAt(DWORD index, const char* token, DWORD length);
    bool ReplaceTokenAt(DWORD index, CString token);
    // Removes the token at that offset, its surrounding white space and one
    // delimiter; an all-ones length runs to the next delimiter. False when
    // the range does not cover whole tokens.
    bool RemoveTokenAtPosition(DWORD offset, DWORD length);
    bool RemoveTokenAt(DWORD index);
    // Removes the first whole-token occurrence of the token, trimmed.
    bool RemoveToken(const FindTraits& traits, const char* token, DWORD length);
    bool RemoveToken(const FindTraits& traits, const CString& token);
    bool RemoveToken(const char* token, DWORD length);
    bool RemoveToken(const CString& token);
    // Keeps the first of equal tokens; whether the text became shorter.
    bool RemoveDuplicateTokens(const FindTraits& traits);
    void SortTokens(const SortingTraits& traits);
    // Appends the other list's tokens that this one lacks; an empty list takes
    // the other text as it is. Whether anything was added.
    bool Merge(const CString& other);
    bool Merge(const CString& other, const SortingTraits& traits);

private:
    // White space that does not delimit tokens.
    static bool IsBlank(char c, char delimiter);
    // The first delimiter from a character boundary on, or the NUL.
    static const char* NextDelimiter(const char* from, char delimiter);
    // The length of the text up to its first NUL.
    DWORD ListLength() const;
    // Sets the text, keeping the delimiter.
    void SetText(CString&& text);
    bool Rebuild(DWORD index, const char* token, DWORD length, bool replace);

    char m_delimiter;
};

// --- Tokenizer and string vectors

// Walks a text token by token; each step names its own delimiter. Leading
// white space of a token is skipped, trailing white space kept. A delimiter
// right at the position gives an empty token (false) and is stepped over.
class VASKEL_API CSimpleTokenizer {
public:
    explicit CSimpleTokenizer(const CString& text);

    void SetString(const CString& text);
    void SetCaseSensitive(bool caseSensitive) { m_caseSensitive = caseSensitive; }
    bool GetCaseSensitive() const { return m_caseSensitive; }

    // False for an empty text, which changes nothing.
    bool MoveFirstToken(const char* delimiter);
    bool MoveFirstToken(char delimiter);
    // A null or empty delimiter is never found: the token runs to the end.
    bool MoveNextToken(const char* delimiter);
    bool MoveNextToken(char delimiter);
    bool GetFirstToken(const char* delimiter, const char*& token, DWORD& length);
    bool GetFirstToken(char delimiter, const char*& token, DWORD& length);
    bool GetNextToken(const char* delimiter, const char*& token, DWORD& length);
    bool GetNextToken(char delimiter, const char*& token, DWORD& length);

    bool GetCurToken(const char*& token, DWORD& length) const;
    // Null before the first step.
    const char* GetCurToken(DWORD& length) const;
    CString GetCurToken();

    const char* GetFirstPosition() const { return m_text; }
    // Null, and all ones as an index, before the first step.
    const char* GetCurPosition() const;
    DWORD GetCurPositionIndex() const { return m_position; }
    bool eof() const;

private:
    static constexpr DWORD noPosition = 0xFFFFFFFF;

    // Offsets rather than pointers, so that copies walk their own text.
    CString m_text;
    DWORD m_position;
    DWORD m_tokenStart;
    DWORD m_tokenLength;
    bool m_caseSensitive;
};

// A vector of strings with a comma-joined text and an archived form.
class VASKEL_API CStringVector : public std::vector<CString> {
public:
    CStringVector() = default;
    CStringVector(const std::vector<CString>& other) : std::vector<CString>(other) {}
    CStringVector(DWORD count, const CString& value) : std::vector<CString>(count, value) {}
    CStringVector(const_iterator first, const_iterator last) : std::vector<CString>(first, last) {}

    // The elements as they are, joined with ","; empty elements are left out.
    CString ToString() const;
    // Version 1, the count, then each string. Loading appends; an unknown
    // version raises the bad-schema archive exception, and a short archive
    // leaves the vector as it was.
    void Serialize(CArchive& archive);
};

// --- Path names and byte dumps

// The drive ("C:" or empty), the directory with its trailing separator, the
// file name and the extension with its leading '.', by the runtime's
// _splitpath_s; a null output skips its part. A null path has empty parts, and
// a part longer than the runtime's part buffers (_MAX_DRIVE, _MAX_DIR,
// _MAX_FNAME, _MAX_EXT less the NUL) empties every part asked for.
VASKEL_API void VKSplitPath(const char* path, CString* drive, CString* directory, CString* fileName,
                            CString* extension);
VASKEL_API CString VKGetDrive(const char* path);
VASKEL_API CString VKGetDirectory(const char* path);
VASKEL_API CString VKGetFileName(const char* path);
VASKEL_API CString VKGetFileExt(const char* path);
// The drive letter and ':', the directory with a '\' added when it ends in no
// separator, the file name, and the extension with a '.' added when it has
// none, by the runtime's _makepath_s; null or empty parts add nothing. A path
// longer than _MAX_PATH - 1 characters gives empty text.
VASKEL_API CString VKMakePath(const char* drive, const char* directory, const char* fileName,
                              const char* extension);

// The byte's upper-case hexadecimal digits, high nibble first.
VASKEL_API void VKByteToString(unsigned char value, char& high, char& low);
// The length of a dump of count bytes: two digits a byte, a space between
// groups of groupSize bytes (0: no groups) and CR LF in place of the space
// after groupsPerLine groups (or bytes when groupSize is 0; 0: one line).
// A length past 0xFFFFFFFF raises unexpected_error.
VASKEL_API DWORD VKCalcBytesToStringBufferSize(DWORD count, DWORD groupSize, DWORD groupsPerLine);
// Writes the dump, without a NUL, into a buffer of bufferSize characters.
// Nothing is written for no bytes (count 0 or null bytes); a buffer too small
// or null raises unexpected_error before anything is written.
VASKEL_API void VKBytesToString(const unsigned char* bytes, DWORD count, char* buffer,
                                DWORD bufferSize, DWORD groupSize, DWORD groupsPerLine);
// The dump as a string, empty for no bytes; a dump longer than a string can
// hold raises the memory exception.
VASKEL_API CString VKBytesToString(const unsigned char* bytes, DWORD count, DWORD groupSize,
                                   DWORD groupsPerLine);

} // namespace vaskel
