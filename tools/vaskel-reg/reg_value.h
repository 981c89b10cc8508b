// A named, typed registry value.
#pragma once

#include "code_page.h"

#include <vaskel/win32.h>

#include <string>

namespace vaskel::regtool {

struct RegValue {
    std::string name; // empty for the key's default value
    DWORD type = REG_SZ;
    Bytes data;
};

// The types whose data is text, converted by the registry's ANSI functions.
inline bool IsStringType(DWORD type) {
    return type == REG_SZ || type == REG_EXPAND_SZ || type == REG_MULTI_SZ;
}

} // namespace vaskel::regtool
