// Conversions between the system code page (the text the registry's ANSI
// functions take and give), UTF-8 and UTF-16 little-endian bytes. Each is
// exact or fails: text that would not come back unchanged is refused rather
// than altered.
#pragma once

#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

namespace vaskel::regtool {

using Bytes = std::vector<unsigned char>;

bool Utf8ToUtf16Le(std::string_view utf8, Bytes& utf16);
// Fails for an odd byte count as well.
bool Utf16LeToUtf8(const unsigned char* data, std::size_t size, std::string& utf8);
bool AnsiToUtf16Le(std::string_view ansi, Bytes& utf16);
bool Utf16LeToAnsi(const unsigned char* data, std::size_t size, std::string& ansi);
bool AnsiToUtf8(std::string_view ansi, std::string& utf8);
bool Utf8ToAnsi(std::string_view utf8, std::string& ansi);

// The length of well-formed UTF-8 text in UTF-16 units, as the system counts
// name lengths and a file's line lengths.
std::size_t Utf16Length(std::string_view utf8);

} // namespace vaskel::regtool
