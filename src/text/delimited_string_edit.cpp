// The editing side of CDelimitedString: removal in place, and the operations
// that rebuild the list normalised (inserting, replacing, sorted adding,
// sorting), merging and removing duplicates.
#include <vaskel/text.h>

#include <algorithm>
#include <cstddef>
#include <utility>
#include <vector>

namespace vaskel {
namespace {

const DWORD notFound = static_cast<DWORD>(-1);
const DWORD allOnes = static_cast<DWORD>(-1);

struct TokenView {
    const char* text;
    DWORD length;
    size_t index; // in the list
};

// Orders tokens over the shorter length; on equal characters the shorter
// token is the smaller one.
int CompareTokens(const char* a, DWORD aLength, const char* b, DWORD bLength, bool caseSensitive) {
    const auto* x = reinterpret_cast<const unsigned char*>(a);
    const auto* y = reinterpret_cast<const unsigned char*>(b);
    size_t count = std::min(aLength, bLength);
    int order = caseSensitive ? _mbsnbcmp(x, y, count) : _mbsnbicmp(x, y, count);
    if (order != 0)
        return order;
    return aLength < bLength ? -1 : (aLength > bLength ? 1 : 0);
}

// An empty list takes the other text as it is; otherwise each of its tokens
// that find does not locate is added. Whether anything was added.
template <class Find, class Add>
bool MergeTokens(CDelimitedString& list, const CString& other, Find find, Add add) {
    if (list.IsEmpty()) {
        // The other text is read with this list's delimiter, so it keeps it.
        static_cast<CString&>(list) = other;
        return !other.IsEmpty();
    }
    // A copy keeps the other text stable should it be this very list.
    const CString source(other);
    const char* cursor = source.GetString();
    const char* token = nullptr;
    DWORD length = 0;
    bool added = false;
    while (CDelimitedString::GetNextToken(cursor, token, length, list.GetDelimiter())) {
        if (find(token, length) == notFound && add(token, length))
            added = true;
    }
    return added;
}

} // namespace

bool CDelimitedString::RemoveTokenAtPosition(DWORD offset, DWORD length) {
    const char* text = GetString();
    size_t size = ListLength();
    if (offset >= size)
        return false;
    size_t start = offset;
    while (start > 0 && IsBlank(text[start - 1], m_delimiter))
        --start;
    if (start > 0 && text[start - 1] != m_delimiter)
        return false;
    size_t end;
    if (length == allOnes) {
        end = static_cast<size_t>(NextDelimiter(text + start, m_delimiter) - text);
    } else {
        // Counted from the offset, as the caller gave it, and cut to the text.
        end = offset + std::min<size_t>(length, size - offset);
        while (end < size && IsBlank(text[end], m_delimiter))
            ++end;
        if (end < size && text[end] != m_delimiter)
            return false;
    }
    if (end < size)
        ++end; // the delimiter behind the token
    else if (start > 0)
        --start; // the last token goes with the delimiter before it
    Delete(static_cast<int>(start), static_cast<int>(end - start));
    return true;
}

bool CDelimitedString::RemoveTokenAt(DWORD index) {
    const char* token = nullptr;
    DWORD length = 0;
    if (!GetTokenAt(index, token, length))
        return false;
    return RemoveTokenAtPosition(static_cast<DWORD>(token - GetString()), length);
}

bool CDelimitedString::RemoveToken(const FindTraits& traits, const char* token, DWORD length) {
    // The trimmed length: white space around the search text could otherwise
    // carry the removal into the next token.
    TrimToken(token, length);
    if (length == 0)
        return false;
    DWORD offset = FindTokenPosition(traits, token, length);
    return offset != notFound && RemoveTokenAtPosition(offset, length);
}

bool CDelimitedString::RemoveToken(const FindTraits& traits, const CString& token) {
    return RemoveToken(traits, token.GetString(), static_cast<DWORD>(token.GetLength()));
}

bool CDelimitedString::RemoveToken(const char* token, DWORD length) {
    return RemoveToken(FindTraits{true, true, false}, token, length);
}

bool CDelimitedString::RemoveToken(const CString& token) {
    return RemoveToken(token.GetString(), static_cast<DWORD>(token.GetLength()));
}

bool CDelimitedString::Rebuild(DWORD index, const char* token, DWORD length, bool replace) {
    TrimToken(token, length);
    CDelimitedString rebuilt(m_delimiter);
    const char* cursor = GetString();
    const char* listed = nullptr;
    DWORD listedLength = 0;
    DWORD i = 0;
    bool placed = false;
    while (*cursor != '\0') {
        // A step that starts inside the text must find a token.
        if (!GetNextToken(cursor, listed, listedLength, m_delimiter))
            return false;
        if (i == index) {
            rebuilt.AddToken(token, length);
            placed = true;
        }
        if (!(replace && i == index))
            rebuilt.AddToken(listed, listedLength);
        ++i;
    }
    if (!placed) {
        if (replace || i != index)
            return false;
        rebuilt.AddToken(token, length);
    }
    SetText(std::move(rebuilt));
    return true;
}

bool CDelimitedString::InsertTokenAt(DWORD index, const char* token, DWORD length) {
    return Rebuild(index, token, length, false);
}

bool CDelimitedString::InsertTokenAt(DWORD index, const CString& token) {
    return InsertTokenAt(index, token.GetString(), static_cast<DWORD>(token.GetLength()));
}

bool CDelimitedString::ReplaceTokenAt(DWORD index, const char* token, DWORD length) {
    return Rebuild(index, token, length, true);
}

bool CDelimitedString::ReplaceTokenAt(DWORD index, CString token) {
    return ReplaceTokenAt(index, token.GetString(), static_cast<DWORD>(token.GetLength()));
}

bool CDelimitedString::AddToken(const char* token, DWORD length, const SortingTraits& traits) {
    TrimToken(token, length);
    if (length == 0)
        return false;
    const char* cursor = GetString();
    const char* listed = nullptr;
    DWORD listedLength = 0;
    DWORD index = 0;
    while (GetNextToken(cursor, listed, listedLength, m_delimiter)) {
        int order = CompareTokens(token, length, listed, listedLength, traits.caseSensitive);
        if (order == 0) {
            if (!traits.allowDuplicates)
                return false;
            break; // before the equal token
        }
        if ((order < 0) == traits.ascending)
            break;
        ++index;
    }
    return InsertTokenAt(index, token, length);
}

bool CDelimitedString::AddToken(const CString& token, const SortingTraits& traits) {
    return AddToken(token.GetString(), static_cast<DWORD>(token.GetLength()), traits);
}

void CDelimitedString::SortTokens(const SortingTraits& traits) {
    // The order that adding every token in turn in sorted position gives,
    // where each token goes before its equals: equal tokens end up in reverse.
    std::vector<TokenView> tokens;
    const char* cursor = GetString();
    const char* token = nullptr;
    DWORD length = 0;
    while (GetNextToken(cursor, token, length, m_delimiter))
        tokens.push_back({token, length, tokens.size()});
    auto compare = [&traits](const TokenView& a, const TokenView& b) {
        return CompareTokens(a.text, a.length, b.text, b.length, traits.caseSensitive);
    };
    std::sort(tokens.begin(), tokens.end(), [&](const TokenView& a, const TokenView& b) {
        int order = compare(a, b);
        if (order != 0)
            return traits.ascending ? order < 0 : order > 0;
        return a.index > b.index;
    });
    CDelimitedString sorted(m_delimiter);
    sorted.Preallocate(GetLength());
    for (size_t i = 0; i < tokens.size(); ++i) {
        // Of equal tokens only the first listed, now the last of its run, stays.
        if (!traits.allowDuplicates && i + 1 < tokens.size() &&
            compare(tokens[i], tokens[i + 1]) == 0)
            continue;
        sorted.AddToken(tokens[i].text, tokens[i].length);
    }
    SetText(std::move(sorted));
}

bool CDelimitedString::Merge(const CString& other) {
    return MergeTokens(
        *this, other, [this](const char* token, DWORD length) { return FindToken(token, length); },
        [this](const char* token, DWORD length) {
            AddToken(token, length);
            return true;
        });
}

bool CDelimitedString::Merge(const CString& other, const SortingTraits& traits) {
    return MergeTokens(
        *this, other,
        [this, &traits](const char* token, DWORD length) {
            return traits.caseSensitive ? FindToken(token, length) : FindTokenNoCase(token, length);
        },
        [this, &traits](const char* token, DWORD length) {
            return AddToken(token, length, traits);
        });
}

bool CDelimitedString::RemoveDuplicateTokens(const FindTraits& traits) {
    int before = GetLength();
    size_t next = 0; // where the walk goes on, behind the current token
    for (;;) {
        const char* text = GetString();
        const char* cursor = text + next;
        const char* token = nullptr;
        DWORD length = 0;
        if (!GetNextToken(cursor, token, length, m_delimiter))
            break;
        next = static_cast<size_t>(cursor - text);
        size_t tokenOffset = static_cast<size_t>(token - text);
        // Every later occurrence goes, not just the first.
        for (;;) {
            text = GetString();
            size_t size = ListLength();
            if (next >= size)
                break;
            DWORD found =
                FindTokenPosition(text + next, static_cast<DWORD>(size - next), text + tokenOffset,
                                  length, m_delimiter, traits.caseSensitive);
            if (found == notFound ||
                !RemoveTokenAtPosition(static_cast<DWORD>(next + found), allOnes))
                break;
        }
        // Removing the last token also removes the delimiter before it.
        next = std::min(next, static_cast<size_t>(ListLength()));
    }
    return GetLength() < before;
}

} // namespace vaskel
