// delete KEY [/v NAME | /ve | /va] [/f]: deletes one value, the default value,
// all of the key's values, or the key with everything below it. Each asks
// first unless /f is given.
#include "command_line.h"
#include "commands.h"
#include "console.h"
#include "registry_access.h"
#include "value_text.h"

namespace vaskel::regtool {
namespace {

int DeleteValue(HKEY key, const std::string& name, bool force) {
    RegValue value;
    LSTATUS status = ReadValue(key, name, value);
    if (status != ERROR_SUCCESS)
        return Fail(ErrorText(status));
    if (!force && !Confirm("Delete the registry value " + DisplayName(name)))
        return Cancelled();
    status = RegDeleteValueA(key, name.c_str());
    return status == ERROR_SUCCESS ? Succeeded() : Fail(ErrorText(status));
}

int DeleteAllValues(const KeyPath& path, HKEY key, bool force) {
    std::vector<RegValue> values;
    LSTATUS status = ReadValues(key, values);
    if (status != ERROR_SUCCESS)
        return Fail(ErrorText(status));
    if (!force && !Confirm("Delete all values under the registry key " + path.Text()))
        return Cancelled();
    for (const RegValue& value : values) {
        status = RegDeleteValueA(key, value.name.c_str());
        if (status != ERROR_SUCCESS && status != ERROR_FILE_NOT_FOUND)
            return Fail(ErrorText(status));
    }
    return Succeeded();
}

int DeleteKey(const KeyPath& path, bool force) {
    if (path.IsRoot())
        return Fail("a root key cannot be deleted");
    if (!force && !Confirm("Permanently delete the registry key " + path.Text()))
        return Cancelled();
    LSTATUS status = DeleteTree(path);
    return status == ERROR_SUCCESS ? Succeeded() : Fail(ErrorText(status));
}

} // namespace

int RunDelete(const Args& args) {
    Arguments arguments;
    std::string error;
    if (!arguments.Parse(args, {{"v", true}, {"ve", false}, {"va", false}, {"f", false}}, error) ||
        !arguments.HasPositionals(1, "delete needs a key", error))
        return SyntaxError(error, "delete");
    if (arguments.Has("v") + arguments.Has("ve") + arguments.Has("va") > 1)
        return SyntaxError("/v, /ve and /va exclude each other", "delete");
    KeyPath path;
    if (!ParseKeyPath(arguments.Positionals()[0], RootNames::FullOrShort, path, error))
        return Fail(error);
    RegistryKey key;
    LSTATUS status = key.Open(path, KEY_READ | KEY_WRITE);
    if (status != ERROR_SUCCESS)
        return Fail(ErrorText(status));
    const bool force = arguments.Has("f");
    if (arguments.Has("v") || arguments.Has("ve"))
        return DeleteValue(key.Handle(), arguments.Value("v"), force);
    if (arguments.Has("va"))
        return DeleteAllValues(path, key.Handle(), force);
    key.Close();
    return DeleteKey(path, force);
}

} // namespace vaskel::regtool
