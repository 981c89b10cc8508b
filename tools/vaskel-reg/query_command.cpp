// query KEY [/v NAME | /ve] [/s]: the layout of the system's tool, a blank
// line, then each key's path followed by its values indented, one per line.
#include "command_line.h"
#include "commands.h"
#include "console.h"
#include "registry_access.h"
#include "value_text.h"

namespace vaskel::regtool {
namespace {

std::string ValueLine(const RegValue& value) {
    return "    " + DisplayName(value.name) + "    " + TypeName(value.type) + "    " +
           DataText(value.type, value.data) + "\n";
}

// One key's values after its path, then a blank line.
void PrintKey(const KeyPath& path, const std::vector<RegValue>& values) {
    std::string text = path.Text() + "\n";
    for (const RegValue& value : values)
        text += ValueLine(value);
    Print(text + "\n");
}

// The key's values, then the paths of its subkeys.
int ListKey(const KeyPath& path, HKEY key) {
    std::vector<RegValue> values;
    std::vector<std::string> subkeys;
    LSTATUS status = ReadValues(key, values);
    if (status == ERROR_SUCCESS)
        status = ReadSubkeyNames(key, subkeys);
    if (status != ERROR_SUCCESS)
        return Fail(ErrorText(status));
    Print("\n");
    if (!values.empty())
        PrintKey(path, values);
    for (const std::string& subkey : subkeys)
        Print(path.Text() + "\\" + subkey + "\n");
    return 0;
}

// The key and every key below it; the key itself only when it has values.
int ListTree(const KeyPath& path) {
    Print("\n");
    bool start = true;
    LSTATUS status = VisitTree(path, [&start](const KeyPath& current, HKEY key) -> LSTATUS {
        std::vector<RegValue> values;
        LSTATUS read = ReadValues(key, values);
        if (read == ERROR_SUCCESS && !(start && values.empty()))
            PrintKey(current, values);
        start = false;
        return read;
    });
    return status == ERROR_SUCCESS ? 0 : Fail(ErrorText(status));
}

int ShowValue(const KeyPath& path, HKEY key, const std::string& name, bool defaultValue) {
    RegValue value;
    LSTATUS status = ReadValue(key, name, value);
    if (status == ERROR_FILE_NOT_FOUND && defaultValue) {
        Print("\n" + path.Text() + "\n    (Default)    REG_SZ    (value not set)\n\n");
        return 0;
    }
    if (status != ERROR_SUCCESS)
        return Fail(ErrorText(status));
    Print("\n");
    PrintKey(path, {value});
    return 0;
}

// The value wherever it is below the key, then the number of matches.
int FindValue(const KeyPath& path, const std::string& name) {
    int matches = 0;
    Print("\n");
    LSTATUS status = VisitTree(path, [&](const KeyPath& current, HKEY key) -> LSTATUS {
        RegValue value;
        LSTATUS read = ReadValue(key, name, value);
        if (read == ERROR_SUCCESS) {
            PrintKey(current, {value});
            ++matches;
        }
        return read == ERROR_FILE_NOT_FOUND ? ERROR_SUCCESS : read;
    });
    if (status != ERROR_SUCCESS)
        return Fail(ErrorText(status));
    if (matches == 0)
        return Fail(ErrorText(ERROR_FILE_NOT_FOUND));
    Print("End of search: " + std::to_string(matches) + " match(es) found.\n");
    return 0;
}

} // namespace

int RunQuery(const Args& args) {
    Arguments arguments;
    std::string error;
    if (!arguments.Parse(args, {{"v", true}, {"ve", false}, {"s", false}}, error) ||
        !arguments.HasPositionals(1, "query needs a key", error))
        return SyntaxError(error, "query");
    const bool named = arguments.Has("v");
    const bool defaultValue = arguments.Has("ve");
    if (named && defaultValue)
        return SyntaxError("/v and /ve exclude each other", "query");
    KeyPath path;
    if (!ParseKeyPath(arguments.Positionals()[0], RootNames::FullOrShort, path, error))
        return Fail(error);
    RegistryKey key;
    LSTATUS status = key.Open(path, KEY_READ);
    if (status != ERROR_SUCCESS)
        return Fail(ErrorText(status));
    const std::string name = arguments.Value("v");
    if (named || defaultValue)
        return arguments.Has("s") ? FindValue(path, name)
                                  : ShowValue(path, key.Handle(), name, defaultValue);
    return arguments.Has("s") ? ListTree(path) : ListKey(path, key.Handle());
}

} // namespace vaskel::regtool
