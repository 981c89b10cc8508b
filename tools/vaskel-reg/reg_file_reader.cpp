// Reading registry files. The system's editor skips lines it cannot read and
// applies the rest; here any such line fails the whole file, so that a damaged
// or mistyped file changes nothing.
#include "reg_file.h"

#include <cctype>
#include <utility>

namespace vaskel::regtool {
namespace {

constexpr std::string_view header5 = "Windows Registry Editor Version 5.00";
// The older header: the file's string data is in the system code page.
constexpr std::string_view header4 = "REGEDIT4";

// The longest value name, in UTF-16 units as the system counts it.
constexpr std::size_t maxValueNameLength = 16383;

bool IsBlank(char c) {
    return c == ' ' || c == '\t';
}

int HexDigit(char c) {
    if (c >= '0' && c <= '9')
        return c - '0';
    if (c >= 'a' && c <= 'f')
        return c - 'a' + 10;
    if (c >= 'A' && c <= 'F')
        return c - 'A' + 10;
    return -1;
}

std::string_view Trimmed(std::string_view text) {
    while (!text.empty() && IsBlank(text.front()))
        text.remove_prefix(1);
    while (!text.empty() && IsBlank(text.back()))
        text.remove_suffix(1);
    return text;
}

// One line being read, left to right.
class Cursor {
public:
    explicit Cursor(std::string_view text) : m_text(text) {}

    bool AtEnd() const { return m_position >= m_text.size(); }
    char Peek() const { return AtEnd() ? '\0' : m_text[m_position]; }
    void Skip(std::size_t count = 1) { m_position += count; }
    void SkipBlanks() {
        while (!AtEnd() && IsBlank(Peek()))
            ++m_position;
    }
    // After blanks, the end of the line or a comment.
    bool AtEndOrComment() {
        SkipBlanks();
        return AtEnd() || Peek() == ';';
    }
    bool TakeNoCase(std::string_view word) {
        if (m_text.size() - m_position < word.size())
            return false;
        for (std::size_t i = 0; i < word.size(); ++i)
            if (std::tolower(static_cast<unsigned char>(m_text[m_position + i])) != word[i])
                return false;
        m_position += word.size();
        return true;
    }
    // Up to maxDigits hex digits as a number; false when there is none.
    bool TakeHex(int maxDigits, DWORD& number) {
        int digits = 0;
        number = 0;
        while (digits < maxDigits && HexDigit(Peek()) >= 0) {
            number = number << 4 | static_cast<DWORD>(HexDigit(Peek()));
            ++m_position;
            ++digits;
        }
        return digits > 0;
    }

private:
    std::string_view m_text;
    std::size_t m_position = 0;
};

// The file's text as UTF-8, line by line, without line ends.
class Lines {
public:
    bool Decode(std::string_view bytes, RegFileError& error) {
        return bytes.substr(0, 2) == "\xFF\xFE" ? DecodeUtf16(bytes.substr(2), error)
                                                : DecodeUtf8(bytes, error);
    }
    std::size_t Count() const { return m_lines.size(); }
    std::string_view operator[](std::size_t index) const {
        return std::string_view(m_text).substr(m_lines[index].first, m_lines[index].second);
    }

private:
    bool Add(std::string_view line, RegFileError& error);
    bool DecodeUtf16(std::string_view bytes, RegFileError& error);
    bool DecodeUtf8(std::string_view bytes, RegFileError& error);
    int Next() const { return static_cast<int>(m_lines.size() + 1); }

    std::string m_text;
    std::vector<std::pair<std::size_t, std::size_t>> m_lines; // offset and length
};

bool Lines::Add(std::string_view line, RegFileError& error) {
    if (!line.empty() && line.back() == '\r')
        line.remove_suffix(1);
    if (line.find('\0') != std::string_view::npos) {
        error = {Next(), "the line holds a NUL character"};
        return false;
    }
    m_lines.emplace_back(m_text.size(), line.size());
    m_text.append(line);
    return true;
}

bool Lines::DecodeUtf16(std::string_view bytes, RegFileError& error) {
    std::string line;
    std::size_t start = 0;
    for (std::size_t i = 0;; i += 2) {
        const bool end = i + 1 >= bytes.size();
        if (!end && (bytes[i] != '\n' || bytes[i + 1] != '\0'))
            continue;
        const std::size_t stop = end ? bytes.size() : i;
        const auto* data = reinterpret_cast<const unsigned char*>(bytes.data() + start);
        if (!Utf16LeToUtf8(data, stop - start, line)) {
            error = {Next(), (stop - start) % 2 != 0 ? "the file ends inside a UTF-16 character"
                                                     : "the line is not valid UTF-16 text"};
            return false;
        }
        if (!Add(line, error))
            return false;
        if (end)
            return true;
        start = i + 2;
    }
}

bool Lines::DecodeUtf8(std::string_view bytes, RegFileError& error) {
    if (bytes.substr(0, 3) == "\xEF\xBB\xBF")
        bytes.remove_prefix(3);
    Bytes ignored;
    for (std::size_t start = 0;;) {
        const std::size_t end = bytes.find('\n', start);
        const std::string_view line = bytes.substr(start, end - start);
        if (!Utf8ToUtf16Le(line, ignored)) {
            error = {Next(), "the line is not valid UTF-8 text (a file without a byte-order mark "
                             "is read as UTF-8)"};
            return false;
        }
        if (!Add(line, error))
            return false;
        if (end == std::string_view::npos)
            return true;
        start = end + 1;
    }
}

class Reader {
public:
    Reader(const Lines& lines, std::vector<RegKeyEntry>& entries, RegFileError& error)
        : m_lines(lines), m_entries(entries), m_error(error) {}

    bool Read();

private:
    int LineNumber() const { return static_cast<int>(m_index + 1); }
    bool Fail(std::string message) {
        m_error = {LineNumber(), std::move(message)};
        return false;
    }
    bool ReadHeader();
    bool ReadKey(std::string_view text);
    bool ReadValue(std::string_view text);
    bool ReadQuoted(Cursor& cursor, std::string& text);
    bool ReadData(Cursor& cursor, RegValueEntry& entry);
    bool ReadHexList(Cursor& cursor, Bytes& bytes);
    bool NextContinuation();
    bool EndOfValue(Cursor& cursor) {
        return cursor.AtEndOrComment() ||
               Fail("unexpected text after the value (a comment starts with ;)");
    }

    const Lines& m_lines;
    std::vector<RegKeyEntry>& m_entries;
    RegFileError& m_error;
    std::size_t m_index = 0;
    bool m_version4 = false;
};

bool Reader::Read() {
    if (!ReadHeader())
        return false;
    for (m_index = 1; m_index < m_lines.Count(); ++m_index) {
        std::string_view text = m_lines[m_index];
        while (!text.empty() && IsBlank(text.front()))
            text.remove_prefix(1);
        if (text.empty() || text.front() == ';' || text.front() == '#')
            continue;
        bool read = false;
        if (text.front() == '[')
            read = ReadKey(text);
        else if (text.front() == '"' || text.front() == '@')
            read = ReadValue(text);
        else
            read = Fail("expected a [key] line, a \"name\"=data or @=data line, or a ; comment");
        if (!read)
            return false;
    }
    return true;
}

bool Reader::ReadHeader() {
    std::string_view header = Trimmed(m_lines[0]);
    if (header == header5)
        return true;
    if (header == header4) {
        m_version4 = true;
        return true;
    }
    return Fail("a registry file starts with the line \"Windows Registry Editor Version 5.00\" "
                "(or REGEDIT4)");
}

bool Reader::ReadKey(std::string_view text) {
    text = Trimmed(text);
    if (text.size() < 2 || text.back() != ']')
        return Fail("a key line ends with ]");
    RegKeyEntry entry;
    entry.line = LineNumber();
    std::string_view path = text.substr(1, text.size() - 2);
    if (!path.empty() && path.front() == '-') {
        entry.remove = true;
        path.remove_prefix(1);
    }
    std::string error;
    if (!ParseKeyPath(path, RootNames::FullOnly, entry.key, error))
        return Fail(error);
    if (entry.remove && entry.key.IsRoot())
        return Fail("a root key cannot be deleted");
    m_entries.push_back(std::move(entry));
    return true;
}

bool Reader::ReadValue(std::string_view text) {
    if (m_entries.empty())
        return Fail("a value line must follow a [key] line");
    if (m_entries.back().remove)
        return Fail("a key that is being deleted ([-...]) cannot take values");
    RegValueEntry entry;
    entry.line = LineNumber();
    Cursor cursor(text);
    if (cursor.Peek() == '@')
        cursor.Skip();
    else if (!ReadQuoted(cursor, entry.value.name))
        return false;
    if (Utf16Length(entry.value.name) > maxValueNameLength)
        return Fail("a value name is longer than 16383 characters");
    cursor.SkipBlanks();
    if (cursor.Peek() != '=')
        return Fail("expected = after the value name");
    cursor.Skip();
    cursor.SkipBlanks();
    if (!ReadData(cursor, entry))
        return false;
    m_entries.back().values.push_back(std::move(entry));
    return true;
}

bool Reader::ReadQuoted(Cursor& cursor, std::string& text) {
    cursor.Skip(); // the opening quote
    text.clear();
    for (;;) {
        if (cursor.AtEnd())
            return Fail("the closing quote is missing");
        char c = cursor.Peek();
        cursor.Skip();
        if (c == '"')
            return true;
        if (c == '\\') {
            c = cursor.Peek();
            if (c != '\\' && c != '"')
                return Fail("a backslash in quotes escapes \\ or \" only: write \\\\ for a "
                            "backslash");
            cursor.Skip();
        }
        text.push_back(c);
    }
}

bool Reader::ReadData(Cursor& cursor, RegValueEntry& entry) {
    RegValue& value = entry.value;
    if (cursor.Peek() == '-') {
        cursor.Skip();
        entry.remove = true;
        return EndOfValue(cursor);
    }
    if (cursor.Peek() == '"') {
        std::string text;
        if (!ReadQuoted(cursor, text))
            return false;
        value.type = REG_SZ;
        if (!Utf8ToUtf16Le(text, value.data))
            return Fail("the text is not valid UTF-8");
        value.data.insert(value.data.end(), {0, 0});
        return EndOfValue(cursor);
    }
    if (cursor.TakeNoCase("dword:")) {
        DWORD number = 0;
        if (!cursor.TakeHex(8, number))
            return Fail("dword: takes one to eight hex digits");
        value.type = REG_DWORD;
        value.data = {static_cast<unsigned char>(number), static_cast<unsigned char>(number >> 8),
                      static_cast<unsigned char>(number >> 16),
                      static_cast<unsigned char>(number >> 24)};
        return EndOfValue(cursor);
    }
    if (cursor.TakeNoCase("hex:")) {
        value.type = REG_BINARY;
    } else if (cursor.TakeNoCase("hex(")) {
        if (!cursor.TakeHex(8, value.type) || !cursor.TakeNoCase("):"))
            return Fail("hex(n): names the type by one to eight hex digits");
    } else {
        return Fail("the data is \"text\", dword:, hex:, hex(n): or - (to delete the value)");
    }
    if (!ReadHexList(cursor, value.data))
        return false;
    if (m_version4 && IsStringType(value.type)) {
        std::string ansi(value.data.begin(), value.data.end());
        if (!AnsiToUtf16Le(ansi, value.data)) {
            m_error = {entry.line, "the text is not valid in the system code page"};
            return false;
        }
    }
    return true;
}

// Bytes of one or two hex digits separated by commas; a backslash after a
// comma continues the list on the next line that is not blank or a comment.
bool Reader::ReadHexList(Cursor& cursor, Bytes& bytes) {
    bytes.clear();
    if (cursor.AtEndOrComment())
        return true;
    for (;;) {
        DWORD byte = 0;
        if (!cursor.TakeHex(2, byte))
            return Fail("expected a byte of one or two hex digits");
        bytes.push_back(static_cast<unsigned char>(byte));
        if (cursor.AtEndOrComment())
            return true;
        if (cursor.Peek() != ',')
            return Fail("hex bytes are separated by commas");
        cursor.Skip();
        if (cursor.AtEndOrComment())
            return Fail("the hex data ends with a comma: continue it with \\ at the end of "
                        "the line");
        if (cursor.Peek() == '\\') {
            cursor.Skip();
            if (!cursor.AtEndOrComment())
                return Fail("unexpected text after the \\ that continues the line");
            if (!NextContinuation())
                return false;
            cursor = Cursor(m_lines[m_index]);
            cursor.SkipBlanks();
        }
    }
}

bool Reader::NextContinuation() {
    const int start = LineNumber();
    while (++m_index < m_lines.Count()) {
        std::string_view text = Trimmed(m_lines[m_index]);
        if (!text.empty() && text.front() != ';')
            return true;
    }
    m_index = static_cast<std::size_t>(start - 1);
    return Fail("the hex data continues past the end of the file");
}

} // namespace

bool ParseRegFile(std::string_view bytes, std::vector<RegKeyEntry>& entries, RegFileError& error) {
    entries.clear();
    Lines lines;
    if (lines.Decode(bytes, error) && Reader(lines, entries, error).Read())
        return true;
    entries.clear();
    return false;
}

} // namespace vaskel::regtool
