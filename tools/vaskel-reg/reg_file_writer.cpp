// Writing registry files in the layout the system's editor writes, so that the
// two can be compared and either can read the other's files.
#include "reg_file.h"

#include <cstdio>

namespace vaskel::regtool {
namespace {

// A hex line breaks after the comma that brings it to this many characters;
// continuation lines are indented by two spaces.
constexpr std::size_t wrapLength = 77;

constexpr std::string_view unwritable("\r\n\0", 3);

std::string Escaped(std::string_view text) {
    std::string escaped;
    escaped.reserve(text.size());
    for (char c : text) {
        if (c == '\\' || c == '"')
            escaped.push_back('\\');
        escaped.push_back(c);
    }
    return escaped;
}

// The text of a REG_SZ that the quoted form carries exactly: one terminating
// NUL and no other, no line break, valid UTF-16.
bool QuotableText(const Bytes& data, std::string& text) {
    if (data.size() < 2 || data.size() % 2 != 0)
        return false;
    const std::size_t length = data.size() - 2;
    return data[length] == 0 && data[length + 1] == 0 && Utf16LeToUtf8(data.data(), length, text) &&
           text.find_first_of(unwritable) == std::string::npos;
}

void AppendHex(std::string& line, DWORD type, const Bytes& data) {
    char text[16];
    if (type == REG_BINARY)
        std::snprintf(text, sizeof text, "hex:");
    else
        std::snprintf(text, sizeof text, "hex(%x):", static_cast<unsigned>(type));
    line.append(text);
    std::size_t length = Utf16Length(line);
    for (std::size_t i = 0; i < data.size(); ++i) {
        std::snprintf(text, sizeof text, "%02x", data[i]);
        line.append(text);
        if (i + 1 == data.size())
            break;
        line.push_back(',');
        length += 3;
        if (length >= wrapLength) {
            line.append("\\\r\n  ");
            length = 2;
        }
    }
}

bool AppendValue(std::string& text, const RegValueEntry& entry, std::string& error) {
    const RegValue& value = entry.value;
    if (value.name.find_first_of(unwritable) != std::string::npos) {
        error = "the value name \"" + value.name +
                "\" holds a line break or NUL, which a registry file cannot carry";
        return false;
    }
    std::string line = value.name.empty() ? "@=" : "\"" + Escaped(value.name) + "\"=";
    std::string quoted;
    if (entry.remove) {
        line.push_back('-');
    } else if (value.type == REG_SZ && QuotableText(value.data, quoted)) {
        line.append("\"").append(Escaped(quoted)).append("\"");
    } else if (value.type == REG_DWORD && value.data.size() == 4) {
        char number[16];
        std::snprintf(number, sizeof number, "dword:%02x%02x%02x%02x", value.data[3], value.data[2],
                      value.data[1], value.data[0]);
        line.append(number);
    } else {
        AppendHex(line, value.type, value.data);
    }
    text.append(line).append("\r\n");
    return true;
}

} // namespace

bool WriteRegFile(const std::vector<RegKeyEntry>& entries, std::string& bytes, std::string& error) {
    std::string text = "Windows Registry Editor Version 5.00\r\n\r\n";
    for (const RegKeyEntry& entry : entries) {
        const std::string path = entry.key.Text();
        if (path.find_first_of(unwritable) != std::string::npos) {
            error = "the name of the key " + path +
                    " holds a line break or NUL, which a registry file cannot carry";
            return false;
        }
        if (entry.remove && !entry.values.empty()) {
            error = "the key " + path + " is deleted and cannot take values";
            return false;
        }
        text.append(entry.remove ? "[-" : "[").append(path).append("]\r\n");
        for (const RegValueEntry& value : entry.values)
            if (!AppendValue(text, value, error))
                return false;
        text.append("\r\n");
    }
    Bytes utf16;
    if (!Utf8ToUtf16Le(text, utf16)) {
        error = "a key or value name is not valid UTF-8 text";
        return false;
    }
    bytes.assign("\xFF\xFE");
    bytes.append(utf16.begin(), utf16.end());
    return true;
}

} // namespace vaskel::regtool
