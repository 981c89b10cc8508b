// What the delimited-list tests share: traits, a list from text, and its
// tokens as standard strings.
#pragma once

#include <vaskel/text.h>

#include <string>
#include <vector>

namespace delimited_test {

using vaskel::CDelimitedString;
using vaskel::CString;

const DWORD allOnes = static_cast<DWORD>(-1);
const CDelimitedString::FindTraits withCase{true, false, false};
const CDelimitedString::FindTraits noCase{false, false, false};

using Strings = std::vector<std::string>;

inline Strings Tokens(const CDelimitedString& list) {
    std::vector<CString> strings;
    list.GetStrings(strings);
    return Strings(strings.begin(), strings.end());
}

inline CDelimitedString List(const char* text, char delimiter = ',') {
    return CDelimitedString(CString(text), delimiter);
}

} // namespace delimited_test
