#include <vaskel/namevalue.h>
#include <vaskel/text.h>

// GCC 12 takes the grammar's self-releasing definition helpers in Spirit for
// a use after free; the warning names no code of ours.
#if defined(__GNUC__) && !defined(__clang__) && __GNUC__ >= 12
#pragma GCC diagnostic ignored "-Wuse-after-free"
#endif
#include <boost/spirit/include/classic_core.hpp>

#include <vector>

namespace vaskel {

namespace {

namespace spirit = boost::spirit::classic;

// What a read collects; the actions fill it in text order.
struct ReadState {
    explicit ReadState(const CString& separator) : separator(separator) {}
    CString separator;
    CVKNameValueVector pairs;
    CVKNameValue current;
};

struct name_assign_actor {
    ReadState& state;
    void operator()(const char* first, const char* last) const {
        state.current.SetName(CString(first, static_cast<int>(last - first)));
    }
};

struct value_assign_actor {
    ReadState& state;
    void operator()(const char* first, const char* last) const {
        state.current.GetValue().SetString(CString(first, static_cast<int>(last - first)));
    }
};

struct item_push_back_actor {
    ReadState& state;
    void operator()(const char*, const char*) const { state.pairs.push_back(state.current); }
};

// list:  item (separator item)*
// item:  name '=' value
// name:  letters and digits, no white space between them
// value: '"' characters other than '"' '"'; the skipper drops the white space
//        at either end, the action's range keeps the white space inside.
// The separator's template is the one place where the two grammars differ.
template <class Derived>
struct NameValueGrammarBase : spirit::grammar<Derived> {
    explicit NameValueGrammarBase(ReadState& state) : state(state) {}
    ReadState& state;

    template <class Scanner>
    struct definition {
        explicit definition(const Derived& self) {
            using namespace spirit;
            name = lexeme_d[+alnum_p][name_assign_actor{self.state}];
            value = ch_p('"') >> (*(anychar_p - ch_p('"')))[value_assign_actor{self.state}] >>
                    ch_p('"');
            item = (name >> ch_p('=') >> value)[item_push_back_actor{self.state}];
            list = item >> *(self.Separator() >> item);
        }
        spirit::rule<Scanner> list, item, name, value;
        const spirit::rule<Scanner>& start() const { return list; }
    };

    spirit::strlit<const char*> SeparatorText() const {
        const char* text = state.separator.GetString();
        return spirit::strlit<const char*>(text, text + state.separator.GetLength());
    }
};

struct NameValueGrammar : NameValueGrammarBase<NameValueGrammar> {
    using NameValueGrammarBase::NameValueGrammarBase;
    spirit::strlit<const char*> Separator() const { return SeparatorText(); }
};

// The input is lower-cased before it meets the separator, which is stored
// in lower case.
struct NameValueGrammarNoCase : NameValueGrammarBase<NameValueGrammarNoCase> {
    using NameValueGrammarBase::NameValueGrammarBase;
    spirit::inhibit_case<spirit::strlit<const char*>> Separator() const {
        return spirit::as_lower_d[SeparatorText()];
    }
};

template <class Grammar>
bool ReadWith(const char* text, ReadState& state) {
    Grammar grammar(state);
    // A phrase parse skips white space before each element but not after the
    // last: text after the final quote, white space included, fails the read.
    const spirit::parse_info<const char*> result = spirit::parse(text, grammar, spirit::space_p);
    return result.full;
}

} // namespace

void CVKNameValueGrammar::SetSeparator(const CString& separator, bool caseSensitive) {
    m_strSeparator = separator;
    m_bCaseSensitive = caseSensitive;
    if (!caseSensitive)
        m_strSeparator.MakeLower();
}

CString CVKNameValueGrammar::Write(const CVKNameValueVector& pairs) const {
    std::vector<CString> values;
    values.reserve(pairs.size());
    DWORD length = 0;
    for (const CVKNameValue& pair : pairs) {
        values.push_back(pair.GetValue().ToString());
        if (values.size() > 1)
            length += static_cast<DWORD>(m_strSeparator.GetLength());
        length += static_cast<DWORD>(pair.GetName().GetLength() + values.back().GetLength() + 3);
    }
    CString result;
    VKReserveStringBuffer(result, length);
    for (std::size_t i = 0; i < pairs.size(); ++i) {
        if (!result.IsEmpty())
            result += m_strSeparator;
        result += pairs[i].GetName();
        result += "=\"";
        result += values[i];
        result += '"';
    }
    return result;
}

bool CVKNameValueGrammar::Read(const char* text, CVKNameValueVector& pairs) const {
    if (text == nullptr)
        return false;
    ReadState state(m_strSeparator);
    const bool read = m_bCaseSensitive ? ReadWith<NameValueGrammar>(text, state)
                                       : ReadWith<NameValueGrammarNoCase>(text, state);
    if (!read)
        return false;
    pairs.swap(state.pairs);
    return true;
}

} // namespace vaskel
