// Values as the command line writes them: type names, the data text of the
// add verb and the data as the query verb shows it. Data here is in the form
// the registry's ANSI functions take.
#pragma once

#include "reg_value.h"

#include <string>
#include <string_view>

namespace vaskel::regtool {

// REG_SZ, REG_EXPAND_SZ, REG_MULTI_SZ, REG_DWORD, REG_QWORD, REG_BINARY and
// REG_NONE, in any case.
bool TypeFromName(std::string_view name, DWORD& type);
// The name of any type; a type without one shows as its number.
std::string TypeName(DWORD type);

// The data that text gives a value of the type: strings get their NUL, a
// REG_MULTI_SZ splits at separator, numbers are decimal or 0x hex, binary
// data is hex digits (an odd one out is the high byte's low nibble), REG_NONE
// keeps the text as UTF-16 as the system's tool stores it. Fails with a
// message for text the type cannot take.
bool DataFromText(DWORD type, std::string_view text, std::string_view separator, Bytes& data,
                  std::string& error);

// The value's name as it is shown: (Default) for the default value.
std::string DisplayName(const std::string& name);

// The data on one line: strings as they are (a list joined by \0), numbers
// in hex after 0x, anything else as hex digits.
std::string DataText(DWORD type, const Bytes& data);

} // namespace vaskel::regtool
