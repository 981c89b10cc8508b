// add KEY [/v NAME | /ve] [/t TYPE] [/s SEPARATOR] [/d DATA] [/f]: creates the
// key, and sets a value when one is named or typed or given data. Replacing a
// value asks first unless /f is given.
#include "command_line.h"
#include "commands.h"
#include "console.h"
#include "registry_access.h"
#include "value_text.h"

namespace vaskel::regtool {
namespace {

bool IsOneCharacter(const std::string& text) {
    Bytes utf16;
    return AnsiToUtf16Le(text, utf16) && utf16.size() == 2;
}

} // namespace

int RunAdd(const Args& args) {
    Arguments arguments;
    std::string error;
    if (!arguments.Parse(
            args, {{"v", true}, {"ve", false}, {"t", true}, {"s", true}, {"d", true}, {"f", false}},
            error) ||
        !arguments.HasPositionals(1, "add needs a key", error))
        return SyntaxError(error, "add");
    if (arguments.Has("v") && arguments.Has("ve"))
        return SyntaxError("/v and /ve exclude each other", "add");
    DWORD type = REG_SZ;
    if (arguments.Has("t") && !TypeFromName(arguments.Value("t"), type))
        return Fail("unknown type " + arguments.Value("t") +
                    "; use REG_SZ, REG_EXPAND_SZ, REG_MULTI_SZ, REG_DWORD, REG_QWORD, "
                    "REG_BINARY or REG_NONE");
    std::string separator = "\\0";
    if (arguments.Has("s")) {
        if (type != REG_MULTI_SZ)
            return SyntaxError("/s separates the strings of REG_MULTI_SZ data only", "add");
        separator = arguments.Value("s");
        if (!IsOneCharacter(separator))
            return Fail("the separator after /s is one character");
    }
    KeyPath path;
    if (!ParseKeyPath(arguments.Positionals()[0], RootNames::FullOrShort, path, error))
        return Fail(error);

    const bool setsValue =
        arguments.Has("v") || arguments.Has("ve") || arguments.Has("t") || arguments.Has("d");
    RegValue value{arguments.Value("v"), type, {}};
    if (setsValue && !DataFromText(type, arguments.Value("d"), separator, value.data, error))
        return Fail(error);

    RegistryKey key;
    LSTATUS status = key.Create(path, KEY_READ | KEY_WRITE);
    if (status == ERROR_SUCCESS && setsValue) {
        RegValue existing;
        if (!arguments.Has("f") && ReadValue(key.Handle(), value.name, existing) == ERROR_SUCCESS &&
            !Confirm("Value " + DisplayName(value.name) + " exists, overwrite"))
            return Cancelled();
        status = WriteValue(key.Handle(), value);
    }
    return status == ERROR_SUCCESS ? Succeeded() : Fail(ErrorText(status));
}

} // namespace vaskel::regtool
