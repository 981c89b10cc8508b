// import FILE: applies a registry file. The whole file is read and every name
// and value converted before the first change, so that a file with a mistake
// anywhere changes nothing.
#include "command_line.h"
#include "commands.h"
#include "console.h"
#include "reg_file.h"
#include "registry_access.h"
#include "value_forms.h"

#include <fstream>
#include <iterator>

namespace vaskel::regtool {
namespace {

// The entries again, their names and text in the form the registry's ANSI
// functions take.
bool ConvertEntries(const std::vector<RegKeyEntry>& entries, std::vector<RegKeyEntry>& changes,
                    RegFileError& error) {
    for (const RegKeyEntry& entry : entries) {
        RegKeyEntry change{entry.line, entry.remove, {entry.key.root, {}}, {}};
        if (!Utf8ToAnsi(entry.key.subkey, change.key.subkey)) {
            error = {entry.line, "the system code page cannot hold the key's name"};
            return false;
        }
        for (const RegValueEntry& value : entry.values) {
            RegValueEntry converted{value.line, value.remove, {}};
            std::string reason;
            if (!ToRegistryForm(value.value, converted.value, reason)) {
                error = {value.line, "the value cannot be set: " + reason};
                return false;
            }
            change.values.push_back(std::move(converted));
        }
        changes.push_back(std::move(change));
    }
    return true;
}

// Deleting what is already gone succeeds, as the system's editor has it.
LSTATUS Apply(const RegKeyEntry& change, int& line) {
    line = change.line;
    if (change.remove) {
        LSTATUS status = DeleteTree(change.key);
        return status == ERROR_FILE_NOT_FOUND ? ERROR_SUCCESS : status;
    }
    RegistryKey key;
    LSTATUS status = key.Create(change.key, KEY_READ | KEY_WRITE);
    for (const RegValueEntry& value : change.values) {
        if (status != ERROR_SUCCESS)
            break;
        line = value.line;
        if (!value.remove) {
            status = WriteValue(key.Handle(), value.value);
        } else {
            status = RegDeleteValueA(key.Handle(), value.value.name.c_str());
            if (status == ERROR_FILE_NOT_FOUND)
                status = ERROR_SUCCESS;
        }
    }
    return status;
}

} // namespace

int RunImport(const Args& args) {
    Arguments arguments;
    std::string error;
    if (!arguments.Parse(args, {}, error) ||
        !arguments.HasPositionals(1, "import needs a file", error))
        return SyntaxError(error, "import");
    const std::string& file = arguments.Positionals()[0];
    std::ifstream in(file, std::ios::binary);
    std::string bytes((std::istreambuf_iterator<char>(in)), std::istreambuf_iterator<char>());
    if (!in.is_open() || in.bad())
        return Fail("cannot read the file " + file);

    std::vector<RegKeyEntry> entries;
    std::vector<RegKeyEntry> changes;
    RegFileError fileError;
    if (!ParseRegFile(bytes, entries, fileError) || !ConvertEntries(entries, changes, fileError))
        return Fail(file + ", line " + std::to_string(fileError.line) + ": " + fileError.message +
                    "; nothing was changed");
    for (const RegKeyEntry& change : changes) {
        int line = 0;
        LSTATUS status = Apply(change, line);
        if (status != ERROR_SUCCESS)
            return Fail(file + ", line " + std::to_string(line) + ": " + ErrorText(status) +
                        " The lines before it were applied.");
    }
    return Succeeded();
}

} // namespace vaskel::regtool
