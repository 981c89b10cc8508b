// Runs delimited-list operations on arbitrary text with tokens, indices and
// offsets taken from the input. The input is: a delimiter byte, a text
// length byte, the text (NUL bytes included), then operations, each an
// operation byte followed by its arguments. Token arguments are copied into
// buffers of exactly their length, without a NUL, so a read beyond a given
// length shows as an overflow. Positions must stay inside the text at every
// step of a walk, and results must agree with the walk.
#include <vaskel/text.h>

#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <vector>

using namespace vaskel;

namespace {

const DWORD allOnes = static_cast<DWORD>(-1);
// Operations that grow the list stop here, so that doubling stays bounded.
const int largest = 1 << 12;

void Check(bool condition) {
    if (!condition)
        std::abort();
}

class Input {
public:
    Input(const uint8_t* data, size_t size) : m_data(data), m_size(size) {}

    bool Empty() const { return m_position >= m_size; }
    uint8_t Byte() { return Empty() ? 0 : m_data[m_position++]; }
    std::vector<char> Bytes(size_t count) {
        count = count < m_size - m_position ? count : m_size - m_position;
        std::vector<char> bytes(m_data + m_position, m_data + m_position + count);
        m_position += count;
        return bytes;
    }
    // A small count, or all ones now and then.
    DWORD Length(size_t exact) {
        uint8_t choice = Byte();
        if (choice == 0xFF)
            return allOnes;
        return choice < 0xC0 ? static_cast<DWORD>(exact) : choice - 0xC0u;
    }

private:
    const uint8_t* m_data;
    size_t m_size;
    size_t m_position = 0;
};

// A token argument: an exact-size buffer and the length to pass with it. An
// all-ones length needs the NUL, so the buffer then gets one.
struct Token {
    std::vector<char> bytes;
    DWORD length;
    const char* Text() const { return bytes.empty() ? nullptr : bytes.data(); }
    // As a string, NUL bytes included.
    CString AsString() const {
        return bytes.empty() ? CString() : CString(bytes.data(), static_cast<int>(bytes.size()));
    }
};

Token ReadToken(Input& in) {
    Token token{in.Bytes(in.Byte() % 12), 0};
    token.length = in.Length(token.bytes.size());
    if (token.length == allOnes || token.length > token.bytes.size())
        token.bytes.push_back('\0');
    return token;
}

bool Inside(const CDelimitedString& list, const char* token, DWORD length) {
    const char* text = list.GetString();
    return token >= text && token + length <= text + list.GetLength();
}

bool IsSpace(char c) {
    return c == ' ' || (c >= '\t' && c <= '\r');
}

// Walks the list by position, checking every step; answers the tokens.
std::vector<CString> Walk(const CDelimitedString& list) {
    std::vector<CString> tokens;
    POSITION position = list.GetFirstTokenPosition();
    const char* token = nullptr;
    DWORD length = 0;
    while (list.GetNextToken(position, token, length)) {
        Check(position == nullptr || reinterpret_cast<std::uintptr_t>(position) <
                                         static_cast<std::uintptr_t>(list.GetLength()));
        Check(length > 0 && Inside(list, token, length));
        Check(!IsSpace(token[0]) && !IsSpace(token[length - 1]));
        tokens.emplace_back(token, static_cast<int>(length));
    }
    Check(position == nullptr);
    Check(tokens.size() == list.GetTokenCount());
    return tokens;
}

bool HoldsDelimiterOrHighByte(const CString& token, char delimiter) {
    for (int i = 0; i < token.GetLength(); ++i)
        if (token[i] == delimiter || static_cast<unsigned char>(token[i]) >= 0x80)
            return true;
    return false;
}

CString Trimmed(const Token& token) {
    const char* text = token.Text();
    DWORD length = token.length;
    CDelimitedString::TrimToken(text, length);
    return text ? CString(text, static_cast<int>(length)) : CString();
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    Input in(data, size);
    const char delimiter = static_cast<char>(in.Byte());
    std::vector<char> initial = in.Bytes(in.Byte());
    CDelimitedString list(CString(initial.data(), static_cast<int>(initial.size())), delimiter);
    const bool plainDelimiter = static_cast<unsigned char>(delimiter) < 0x80 && delimiter != '\0';

    while (!in.Empty()) {
        uint8_t operation = in.Byte();
        bool withCase = operation & 0x80;
        CDelimitedString::FindTraits find{withCase, (operation & 0x40) != 0, false};
        CDelimitedString::SortingTraits sorting{(operation & 0x40) != 0, withCase,
                                                (operation & 0x20) != 0};
        DWORD count = list.GetTokenCount();
        switch (operation % 20) {
        case 0:
            Walk(list);
            break;
        case 1: {
            // A position that did not come from a walk.
            uint8_t offset = in.Byte();
            POSITION position = reinterpret_cast<POSITION>(std::uintptr_t(offset));
            const char* token = nullptr;
            DWORD length = 0;
            if (list.GetNextToken(position, token, length))
                Check(Inside(list, token, length) &&
                      (position == nullptr || reinterpret_cast<std::uintptr_t>(position) <
                                                  std::uintptr_t(list.GetLength())));
            break;
        }
        case 2: {
            DWORD index = in.Byte() % (count + 2);
            const char* token = nullptr;
            DWORD length = 0;
            Check(list.GetTokenAt(index, token, length) == (index < count));
            Check(index >= count || Inside(list, token, length));
            break;
        }
        case 3: {
            Token token = ReadToken(in);
            DWORD index = list.FindToken(find, token.Text(), token.length);
            Check(index == allOnes || index < count);
            break;
        }
        case 4: {
            Token token = ReadToken(in);
            DWORD offset = list.FindTokenPosition(find, token.Text(), token.length);
            Check(offset == allOnes || offset < static_cast<DWORD>(list.GetLength()));
            Check(list.HasToken(find, token.Text(), token.length) == (offset != allOnes));
            break;
        }
        case 5: {
            Token other = ReadToken(in);
            CDelimitedString::Includes(list.GetString(), allOnes, other.Text(), other.length,
                                       delimiter);
            list.Includes(other.AsString(), find);
            Check(list.Includes(list));
            break;
        }
        case 6:
            list.HasDuplicateTokens(find);
            list.IsValid();
            break;
        case 7: {
            Token token = ReadToken(in);
            if (list.GetLength() < largest)
                list.AddToken(token.Text(), token.length);
            break;
        }
        case 8: {
            bool trimmed = list.Trimmed();
            CString before = list;
            list.Trim();
            Check(!trimmed || list == before);
            CString once = list;
            list.Trim();
            Check(list == once);
            break;
        }
        case 9: {
            Token token = ReadToken(in);
            DWORD index = in.Byte() % (count + 2);
            CString trimmed = Trimmed(token);
            bool valid = list.IsValid();
            CString before = list;
            if (list.InsertTokenAt(index, token.Text(), token.length)) {
                Check(index <= count && valid);
                if (plainDelimiter && !trimmed.IsEmpty() &&
                    !HoldsDelimiterOrHighByte(trimmed, delimiter)) {
                    Check(list.GetTokenCount() == count + 1);
                    Check(list.GetTokenAt(index) == trimmed);
                }
            } else {
                Check(list == before);
            }
            break;
        }
        case 10: {
            Token token = ReadToken(in);
            DWORD index = in.Byte() % (count + 2);
            CString before = list;
            if (!list.ReplaceTokenAt(index, token.Text(), token.length))
                Check(list == before);
            break;
        }
        case 11: {
            DWORD offset = in.Byte();
            DWORD length = in.Length(in.Byte() % 8);
            if (list.RemoveTokenAtPosition(offset, length))
                Check(list.GetTokenCount() <= count);
            break;
        }
        case 12: {
            DWORD index = in.Byte() % (count + 2);
            Check(list.RemoveTokenAt(index) == (index < count));
            if (index < count && plainDelimiter)
                Check(list.GetTokenCount() == count - 1);
            break;
        }
        case 13: {
            Token token = ReadToken(in);
            list.RemoveToken(find, token.Text(), token.length);
            break;
        }
        case 14:
            list.SortTokens(sorting);
            Check(list.Trimmed() && list.IsValid());
            if (!sorting.allowDuplicates && plainDelimiter)
                Check(!list.HasDuplicateTokens({sorting.caseSensitive, false, false}));
            break;
        case 15: {
            Token other = ReadToken(in);
            if (list.GetLength() >= largest)
                break;
            if (operation & 0x20)
                list.Merge(other.AsString(), sorting);
            else
                list.Merge(other.AsString());
            break;
        }
        case 16:
            list.RemoveDuplicateTokens(find);
            if (plainDelimiter)
                Check(!list.HasDuplicateTokens(find));
            break;
        case 17: {
            Token token = ReadToken(in);
            if (list.GetLength() < largest)
                list.AddToken(token.Text(), token.length, sorting);
            break;
        }
        case 18: {
            std::vector<CString> strings;
            list.GetStrings(strings);
            Check(strings == Walk(list));
            if (list.GetLength() < largest)
                list.AddStrings(strings);
            break;
        }
        default: {
            // A list of the same text read with another delimiter.
            list.SetDelimiter(static_cast<char>(in.Byte()));
            Walk(list);
            list.SetDelimiter(delimiter);
            break;
        }
        }
    }
    Walk(list);
    return 0;
}
