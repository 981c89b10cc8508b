#include "code_page.h"

#include <vaskel/win32.h>

#include <climits>

namespace vaskel::regtool {
namespace {

using Wide = std::basic_string<WCHAR>;

bool ToWide(UINT codePage, std::string_view text, Wide& wide) {
    wide.clear();
    if (text.empty())
        return true;
    if (text.size() > INT_MAX)
        return false;
    const int size = static_cast<int>(text.size());
    int length = MultiByteToWideChar(codePage, 0, text.data(), size, nullptr, 0);
    if (length <= 0)
        return false;
    wide.resize(static_cast<std::size_t>(length));
    return MultiByteToWideChar(codePage, 0, text.data(), size, wide.data(), length) == length;
}

bool ToNarrow(UINT codePage, const Wide& wide, std::string& text) {
    text.clear();
    if (wide.empty())
        return true;
    if (wide.size() > INT_MAX)
        return false;
    const int size = static_cast<int>(wide.size());
    int length = WideCharToMultiByte(codePage, 0, wide.data(), size, nullptr, 0, nullptr, nullptr);
    if (length <= 0)
        return false;
    text.resize(static_cast<std::size_t>(length));
    return WideCharToMultiByte(codePage, 0, wide.data(), size, text.data(), length, nullptr,
                               nullptr) == length;
}

// Replacement characters and best-fit mappings show as a difference on the
// way back.
bool ExactWide(UINT codePage, std::string_view text, Wide& wide) {
    std::string back;
    return ToWide(codePage, text, wide) && ToNarrow(codePage, wide, back) && back == text;
}

bool ExactNarrow(UINT codePage, const Wide& wide, std::string& text) {
    Wide back;
    return ToNarrow(codePage, wide, text) && ToWide(codePage, text, back) && back == wide;
}

Bytes LittleEndian(const Wide& wide) {
    Bytes bytes(wide.size() * 2);
    for (std::size_t i = 0; i < wide.size(); ++i) {
        const auto unit = static_cast<unsigned>(wide[i]);
        bytes[2 * i] = static_cast<unsigned char>(unit & 0xFF);
        bytes[2 * i + 1] = static_cast<unsigned char>(unit >> 8);
    }
    return bytes;
}

bool FromLittleEndian(const unsigned char* data, std::size_t size, Wide& wide) {
    if (size % 2 != 0)
        return false;
    wide.resize(size / 2);
    for (std::size_t i = 0; i < wide.size(); ++i)
        wide[i] = static_cast<WCHAR>(data[2 * i] | data[2 * i + 1] << 8);
    return true;
}

bool ToUtf16Le(UINT codePage, std::string_view text, Bytes& utf16) {
    Wide wide;
    if (!ExactWide(codePage, text, wide))
        return false;
    utf16 = LittleEndian(wide);
    return true;
}

bool FromUtf16Le(UINT codePage, const unsigned char* data, std::size_t size, std::string& text) {
    Wide wide;
    return FromLittleEndian(data, size, wide) && ExactNarrow(codePage, wide, text);
}

bool Recode(UINT from, UINT to, std::string_view text, std::string& result) {
    Wide wide;
    return ExactWide(from, text, wide) && ExactNarrow(to, wide, result);
}

} // namespace

bool Utf8ToUtf16Le(std::string_view utf8, Bytes& utf16) {
    return ToUtf16Le(CP_UTF8, utf8, utf16);
}

bool Utf16LeToUtf8(const unsigned char* data, std::size_t size, std::string& utf8) {
    return FromUtf16Le(CP_UTF8, data, size, utf8);
}

bool AnsiToUtf16Le(std::string_view ansi, Bytes& utf16) {
    return ToUtf16Le(CP_ACP, ansi, utf16);
}

bool Utf16LeToAnsi(const unsigned char* data, std::size_t size, std::string& ansi) {
    return FromUtf16Le(CP_ACP, data, size, ansi);
}

bool AnsiToUtf8(std::string_view ansi, std::string& utf8) {
    return Recode(CP_ACP, CP_UTF8, ansi, utf8);
}

bool Utf8ToAnsi(std::string_view utf8, std::string& ansi) {
    return Recode(CP_UTF8, CP_ACP, utf8, ansi);
}

std::size_t Utf16Length(std::string_view utf8) {
    std::size_t length = 0;
    for (char c : utf8) {
        const auto byte = static_cast<unsigned char>(c);
        if (byte < 0x80 || byte > 0xBF)
            ++length; // a character starts here
        if (byte >= 0xF0)
            ++length; // past U+FFFF: a surrogate pair
    }
    return length;
}

} // namespace vaskel::regtool
