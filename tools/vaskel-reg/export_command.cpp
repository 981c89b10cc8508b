// export KEY FILE [/y]: writes the key and everything below it to a registry
// file; an existing file is replaced only with /y.
#include "command_line.h"
#include "commands.h"
#include "console.h"
#include "reg_file.h"
#include "registry_access.h"
#include "value_forms.h"
#include "value_text.h"

#include <filesystem>
#include <fstream>

namespace vaskel::regtool {
namespace {

// The tree in file form; false with a message when a name or value cannot be
// written exactly.
bool ReadTree(const KeyPath& start, std::vector<RegKeyEntry>& entries, std::string& error) {
    LSTATUS status = VisitTree(start, [&](const KeyPath& path, HKEY key) -> LSTATUS {
        RegKeyEntry entry;
        entry.key.root = path.root;
        if (!AnsiToUtf8(path.subkey, entry.key.subkey)) {
            error =
                "the name of the key " + path.Text() + " is not valid text in the system code page";
            return ERROR_INVALID_DATA;
        }
        std::vector<RegValue> values;
        LSTATUS read = ReadValues(key, values);
        for (const RegValue& value : values) {
            RegValueEntry fileValue;
            if (!ToFileForm(value, fileValue.value, error)) {
                error =
                    "the value " + DisplayName(value.name) + " of " + path.Text() + ": " + error;
                return ERROR_INVALID_DATA;
            }
            entry.values.push_back(std::move(fileValue));
        }
        entries.push_back(std::move(entry));
        return read;
    });
    if (status != ERROR_SUCCESS && error.empty())
        error = ErrorText(status);
    return status == ERROR_SUCCESS;
}

} // namespace

int RunExport(const Args& args) {
    Arguments arguments;
    std::string error;
    if (!arguments.Parse(args, {{"y", false}}, error) ||
        !arguments.HasPositionals(2, "export needs a key and a file", error))
        return SyntaxError(error, "export");
    const Args& positionals = arguments.Positionals();
    KeyPath path;
    if (!ParseKeyPath(positionals[0], RootNames::FullOrShort, path, error))
        return Fail(error);
    const std::string& file = positionals[1];
    std::error_code ignored;
    if (!arguments.Has("y") && std::filesystem::exists(file, ignored))
        return Fail("the file " + file + " exists; add /y to replace it");

    std::vector<RegKeyEntry> entries;
    std::string bytes;
    if (!ReadTree(path, entries, error) || !WriteRegFile(entries, bytes, error))
        return Fail(error);
    std::ofstream out(file, std::ios::binary | std::ios::trunc);
    out.write(bytes.data(), static_cast<std::streamsize>(bytes.size()));
    out.close();
    if (!out)
        return Fail("cannot write the file " + file);
    return Succeeded();
}

} // namespace vaskel::regtool
