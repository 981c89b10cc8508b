#include "value_text.h"

#include <cctype>
#include <cstdint>
#include <cstdio>

namespace vaskel::regtool {
namespace {

struct TypeSpelling {
    DWORD type;
    const char* name;
    bool settable; // by the add verb
};

constexpr TypeSpelling types[] = {
    {REG_NONE, "REG_NONE", true},
    {REG_SZ, "REG_SZ", true},
    {REG_EXPAND_SZ, "REG_EXPAND_SZ", true},
    {REG_BINARY, "REG_BINARY", true},
    {REG_DWORD, "REG_DWORD", true},
    {REG_DWORD_BIG_ENDIAN, "REG_DWORD_BIG_ENDIAN", false},
    {REG_LINK, "REG_LINK", false},
    {REG_MULTI_SZ, "REG_MULTI_SZ", true},
    {8, "REG_RESOURCE_LIST", false},
    {9, "REG_FULL_RESOURCE_DESCRIPTOR", false},
    {10, "REG_RESOURCE_REQUIREMENTS_LIST", false},
    {REG_QWORD, "REG_QWORD", true},
};

int HexDigit(char c) {
    if (c >= '0' && c <= '9')
        return c - '0';
    c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
    return c >= 'a' && c <= 'f' ? c - 'a' + 10 : -1;
}

// Decimal, or hex after 0x; no sign, nothing after the digits.
bool ParseNumber(std::string_view text, std::uint64_t largest, std::uint64_t& number) {
    unsigned base = 10;
    if (text.size() > 2 && text[0] == '0' && (text[1] == 'x' || text[1] == 'X')) {
        base = 16;
        text.remove_prefix(2);
    }
    if (text.empty())
        return false;
    number = 0;
    for (char c : text) {
        const int digit = base == 16 ? HexDigit(c) : (c >= '0' && c <= '9' ? c - '0' : -1);
        if (digit < 0 || number > (largest - static_cast<unsigned>(digit)) / base)
            return false;
        number = number * base + static_cast<unsigned>(digit);
    }
    return true;
}

Bytes LittleEndian(std::uint64_t number, int size) {
    Bytes bytes(static_cast<std::size_t>(size));
    for (int i = 0; i < size; ++i)
        bytes[static_cast<std::size_t>(i)] = static_cast<unsigned char>(number >> (8 * i));
    return bytes;
}

bool BinaryFromText(std::string_view text, Bytes& data) {
    data.clear();
    data.reserve(text.size() / 2 + 1);
    std::size_t i = 0;
    if (text.size() % 2 != 0) {
        const int digit = HexDigit(text[0]);
        if (digit < 0)
            return false;
        data.push_back(static_cast<unsigned char>(digit));
        i = 1;
    }
    for (; i < text.size(); i += 2) {
        const int high = HexDigit(text[i]);
        const int low = HexDigit(text[i + 1]);
        if (high < 0 || low < 0)
            return false;
        data.push_back(static_cast<unsigned char>(high << 4 | low));
    }
    return true;
}

// Strings between separators; one separator at the end closes the list. An
// empty string may stand alone but not between others, where it would end
// the list early.
bool MultiFromText(std::string_view text, std::string_view separator, Bytes& data) {
    data.clear();
    if (!text.empty()) {
        if (text.size() >= separator.size() &&
            text.substr(text.size() - separator.size()) == separator)
            text.remove_suffix(separator.size());
        const bool alone = text.find(separator) == std::string_view::npos;
        for (;;) {
            const std::size_t end = text.find(separator);
            const std::string_view part = text.substr(0, end);
            if (part.empty() && !alone)
                return false;
            data.insert(data.end(), part.begin(), part.end());
            data.push_back(0);
            if (end == std::string_view::npos)
                break;
            text.remove_prefix(end + separator.size());
        }
    }
    data.push_back(0);
    return true;
}

std::string HexText(const Bytes& data) {
    static const char digits[] = "0123456789ABCDEF";
    std::string text;
    text.reserve(data.size() * 2);
    for (unsigned char byte : data) {
        text.push_back(digits[byte >> 4]);
        text.push_back(digits[byte & 15]);
    }
    return text;
}

std::string NumberText(std::uint64_t number) {
    char text[24];
    std::snprintf(text, sizeof text, "0x%llx", static_cast<unsigned long long>(number));
    return text;
}

std::uint64_t FromBytes(const Bytes& data, bool bigEndian) {
    std::uint64_t number = 0;
    for (std::size_t i = 0; i < data.size(); ++i)
        number |= std::uint64_t{data[i]} << (8 * (bigEndian ? data.size() - 1 - i : i));
    return number;
}

} // namespace

bool TypeFromName(std::string_view name, DWORD& type) {
    for (const TypeSpelling& spelling : types) {
        std::string_view known = spelling.name;
        if (!spelling.settable || known.size() != name.size())
            continue;
        bool same = true;
        for (std::size_t i = 0; i < name.size() && same; ++i)
            same = std::toupper(static_cast<unsigned char>(name[i])) == known[i];
        if (same) {
            type = spelling.type;
            return true;
        }
    }
    return false;
}

std::string TypeName(DWORD type) {
    for (const TypeSpelling& spelling : types)
        if (spelling.type == type)
            return spelling.name;
    char number[16];
    std::snprintf(number, sizeof number, "0x%x", static_cast<unsigned>(type));
    return number;
}

bool DataFromText(DWORD type, std::string_view text, std::string_view separator, Bytes& data,
                  std::string& error) {
    std::uint64_t number = 0;
    switch (type) {
    case REG_SZ:
    case REG_EXPAND_SZ:
        data.assign(text.begin(), text.end());
        data.push_back(0);
        return true;
    case REG_MULTI_SZ:
        if (MultiFromText(text, separator, data))
            return true;
        error = "REG_MULTI_SZ data cannot hold an empty string between separators";
        return false;
    case REG_DWORD:
    case REG_QWORD: {
        const bool dword = type == REG_DWORD;
        if (ParseNumber(text, dword ? 0xFFFFFFFFu : UINT64_MAX, number)) {
            data = LittleEndian(number, dword ? 4 : 8);
            return true;
        }
        error = std::string(dword ? "REG_DWORD" : "REG_QWORD") +
                " data is a decimal number or 0x and hex digits, up to " +
                (dword ? "0xffffffff" : "0xffffffffffffffff");
        return false;
    }
    case REG_BINARY:
        if (BinaryFromText(text, data))
            return true;
        error = "REG_BINARY data is hex digits only, such as 0102fe";
        return false;
    case REG_NONE:
        if (AnsiToUtf16Le(text, data)) {
            data.insert(data.end(), {0, 0});
            return true;
        }
        error = "the data is not valid text in the system code page";
        return false;
    default:
        error = "values of type " + TypeName(type) + " cannot be set here";
        return false;
    }
}

std::string DisplayName(const std::string& name) {
    return name.empty() ? "(Default)" : name;
}

std::string DataText(DWORD type, const Bytes& data) {
    const std::string text(data.begin(), data.end());
    switch (type) {
    case REG_SZ:
    case REG_EXPAND_SZ:
        return text.substr(0, text.find('\0'));
    case REG_MULTI_SZ: {
        // Without the last string's NUL and the list's closing one.
        std::string_view list = text;
        for (int i = 0; i < 2 && !list.empty() && list.back() == '\0'; ++i)
            list.remove_suffix(1);
        std::string joined;
        for (char c : list) {
            if (c == '\0')
                joined.append("\\0");
            else
                joined.push_back(c);
        }
        return joined;
    }
    case REG_DWORD:
    case REG_DWORD_BIG_ENDIAN:
        if (data.size() == 4)
            return NumberText(FromBytes(data, type == REG_DWORD_BIG_ENDIAN));
        break;
    case REG_QWORD:
        if (data.size() == 8)
            return NumberText(FromBytes(data, false));
        break;
    default:
        break;
    }
    return HexText(data);
}

} // namespace vaskel::regtool
