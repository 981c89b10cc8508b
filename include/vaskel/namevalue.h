// Name-value lists: pairs of a name and a generic value, ordered lists of
// them with lookup by name, and their one-line text form name="value".
#pragma once

#include <vaskel/export.h>
#include <vaskel/framework/string.h>
#include <vaskel/value.h>

#include <vector>

namespace vaskel {

class VASKEL_API CVKNameValue {
public:
    CVKNameValue() = default;
    CVKNameValue(const CString& name, const CGenericVal& value) : m_strName(name), m_value(value) {}
    CVKNameValue(const CVKNameValue& other) = default;
    const CVKNameValue& operator=(const CVKNameValue& other) {
        m_strName = other.m_strName;
        m_value = other.m_value;
        return *this;
    }

    const CString& GetName() const { return m_strName; }
    void SetName(const CString& name) { m_strName = name; }
    CGenericVal& GetValue() { return m_value; }
    const CGenericVal& GetValue() const { return m_value; }
    void SetValue(const CGenericVal& value) { m_value = value; }
    void Set(const CString& name, const CGenericVal& value) {
        m_strName = name;
        m_value = value;
    }

    // Names compare with case; equal names leave the decision to the values.
    bool operator==(const CVKNameValue& other) const {
        return m_strName.Compare(other.m_strName) == 0 && m_value == other.m_value;
    }
    bool operator!=(const CVKNameValue& other) const { return !(*this == other); }
    bool operator<(const CVKNameValue& other) const {
        const int names = m_strName.Compare(other.m_strName);
        return names != 0 ? names < 0 : m_value < other.m_value;
    }

private:
    CString m_strName;
    CGenericVal m_value;
};

// Pairs in the order they were added; names may repeat. Lookups walk from
// the first pair, so the earliest of equal names is found.
class VASKEL_API CVKNameValueVector : public std::vector<CVKNameValue> {
public:
    // The index checks and the growth limit report with these texts on
    // every platform.
    reference at(size_type index);
    const_reference at(size_type index) const;
    void reserve(size_type count);
    void resize(size_type count);
    void resize(size_type count, const CVKNameValue& value);

    const_iterator Find(const CString& name) const { return Find(name.GetString()); }
    const_iterator Find(const char* name) const;
    const CVKNameValue* Get(const CString& name) const { return Get(name.GetString()); }
    const CVKNameValue* Get(const char* name) const;
    // The first pair whose name equals the text without regard to case.
    const_iterator FindNoCase(const CString& name) const { return FindNoCase(name.GetString()); }
    const_iterator FindNoCase(const char* name) const;
    const CVKNameValue* GetNoCase(const CString& name) const { return GetNoCase(name.GetString()); }
    const CVKNameValue* GetNoCase(const char* name) const;
};

// Writes a list as name="value" items joined by a separator, and reads such a
// text back. White space is skipped around the items' parts and before the
// separator; nothing may follow the last item. Every value reads back as
// text. Names are letters and digits; values cannot hold a double quote.
class VASKEL_API CVKNameValueGrammar {
public:
    CVKNameValueGrammar() : m_strSeparator(","), m_bCaseSensitive(true) {}

    // Without case the separator is kept, and matched, in lower case.
    void SetSeparator(const CString& separator, bool caseSensitive);
    const CString& GetSeparator() const { return m_strSeparator; }
    bool IsCaseSensitive() const { return m_bCaseSensitive; }

    // Nothing is escaped: names and values outside the text format do not
    // read back.
    CString Write(const CVKNameValueVector& pairs) const;
    // On success the vector holds exactly the pairs read; on failure it is
    // left as it was.
    bool Read(const char* text, CVKNameValueVector& pairs) const;

private:
    CString m_strSeparator;
    bool m_bCaseSensitive;
};

} // namespace vaskel
