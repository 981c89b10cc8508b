// Registry files: the "Windows Registry Editor Version 5.00" text that lists
// keys in brackets and their values below them, read into entries and written
// back from them.
//
// In the entries, names are UTF-8 and the data of the string types (REG_SZ,
// REG_EXPAND_SZ, REG_MULTI_SZ) is UTF-16LE, as the file stores it; the
// command layer converts to and from what the registry's ANSI functions take.
#pragma once

#include "key_path.h"
#include "reg_value.h"

#include <string>
#include <string_view>
#include <vector>

namespace vaskel::regtool {

struct RegValueEntry {
    int line = 0;        // where the entry starts in the file it was read from
    bool remove = false; // "name"=- : delete the value
    RegValue value;
};

struct RegKeyEntry {
    int line = 0;
    bool remove = false; // [-KEY] : delete the key with everything below it
    KeyPath key;
    std::vector<RegValueEntry> values; // never for a removed key
};

struct RegFileError {
    int line = 0;
    std::string message;
};

// Reads a file's bytes: UTF-16LE after its byte-order mark, else UTF-8 (with
// or without a mark). Both headers are read, version 5.00 and REGEDIT4, whose
// string data is in the system code page. The whole file is read before
// anything is returned: on any error the entries are empty and the error
// names the line.
bool ParseRegFile(std::string_view bytes, std::vector<RegKeyEntry>& entries, RegFileError& error);

// Writes entries in the version 5.00 layout: UTF-16LE with a byte-order mark,
// CR LF line ends, hex data wrapped as the system's editor wraps it. Values the
// quoted and dword forms would not carry exactly (a string without its
// terminating NUL, a DWORD of another size) are written as hex. Fails only for
// names a line cannot hold (line breaks), names that are not UTF-8 and a
// deleted key given values.
bool WriteRegFile(const std::vector<RegKeyEntry>& entries, std::string& bytes, std::string& error);

} // namespace vaskel::regtool
