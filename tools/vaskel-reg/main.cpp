// vaskel-reg: looks at and changes the registry with the verbs and switches
// of the system's registry console tool.
#include "command_line.h"
#include "commands.h"
#include "console.h"

#include <cctype>
#include <cstdio>
#include <exception>
#include <string_view>

using namespace vaskel::regtool;

namespace {

constexpr const char* usage =
    "vaskel-reg: looks at and changes the registry.\n"
    "\n"
    "  vaskel-reg query  KEY [/v NAME | /ve] [/s]\n"
    "  vaskel-reg add    KEY [/v NAME | /ve] [/t TYPE] [/s SEPARATOR] [/d DATA] [/f]\n"
    "  vaskel-reg delete KEY [/v NAME | /ve | /va] [/f]\n"
    "  vaskel-reg export KEY FILE [/y]\n"
    "  vaskel-reg import FILE\n"
    "\n"
    "KEY is ROOT\\SUBKEY, where ROOT is HKCU, HKLM or HKCR, or HKEY_CURRENT_USER,\n"
    "HKEY_LOCAL_MACHINE or HKEY_CLASSES_ROOT. Switches are written /x or -x, in\n"
    "any case. \"vaskel-reg VERB /?\" describes a verb. The exit code is 0 on\n"
    "success and 1 on failure, with the reason on standard error.\n";

struct Verb {
    const char* name;
    int (*run)(const Args& args);
    const char* usage;
};

constexpr Verb verbs[] = {
    {"query", RunQuery,
     "vaskel-reg query KEY [/v NAME | /ve] [/s]\n"
     "\n"
     "Lists the key's values and the paths of its subkeys.\n"
     "  /v NAME  only the value NAME\n"
     "  /ve      only the default value, shown as (Default)\n"
     "  /s       the key and every key below it; with /v or /ve, that value\n"
     "           wherever it is below the key\n"
     "A missing key or value is an error.\n"},
    {"add", RunAdd,
     "vaskel-reg add KEY [/v NAME | /ve] [/t TYPE] [/s SEPARATOR] [/d DATA] [/f]\n"
     "\n"
     "Creates the key and the keys above it; with /v, /ve, /t or /d, also sets a value.\n"
     "  /v NAME       the value to set\n"
     "  /ve           the default value (also when /t or /d is given without /v)\n"
     "  /t TYPE       REG_SZ (the default), REG_EXPAND_SZ, REG_MULTI_SZ, REG_DWORD,\n"
     "                REG_QWORD, REG_BINARY or REG_NONE\n"
     "  /s SEPARATOR  the one character between the strings of REG_MULTI_SZ data;\n"
     "                without it they are separated by the two characters \\0\n"
     "  /d DATA       the data: text; a number, decimal or 0x hex, for REG_DWORD and\n"
     "                REG_QWORD; hex digits for REG_BINARY\n"
     "  /f            replace an existing value without asking\n"},
    {"delete", RunDelete,
     "vaskel-reg delete KEY [/v NAME | /ve | /va] [/f]\n"
     "\n"
     "Deletes the key with all its subkeys and values, or only values.\n"
     "  /v NAME  the value NAME\n"
     "  /ve      the default value\n"
     "  /va      all the key's values; its subkeys stay\n"
     "  /f       delete without asking\n"},
    {"export", RunExport,
     "vaskel-reg export KEY FILE [/y]\n"
     "\n"
     "Writes the key and everything below it to FILE as a registry file\n"
     "(\"Windows Registry Editor Version 5.00\", UTF-16 text).\n"
     "  /y  replace FILE if it exists\n"},
    {"import", RunImport,
     "vaskel-reg import FILE\n"
     "\n"
     "Applies a registry file: creates its [KEY]s and sets their values, deletes\n"
     "[-KEY]s with everything below them and \"NAME\"=- values. The file is read\n"
     "whole first; a mistake anywhere in it changes nothing. Files are UTF-16 after\n"
     "a byte-order mark, else UTF-8; both headers, version 5.00 and REGEDIT4, are\n"
     "read.\n"},
};

const Verb* FindVerb(std::string_view name) {
    for (const Verb& verb : verbs) {
        std::string_view known = verb.name;
        bool same = known.size() == name.size();
        for (std::size_t i = 0; same && i < name.size(); ++i)
            same = std::tolower(static_cast<unsigned char>(name[i])) == known[i];
        if (same)
            return &verb;
    }
    return nullptr;
}

int Run(const Args& args) {
    if (args.empty()) {
        std::fputs(usage, stderr);
        return 1;
    }
    if (IsHelp(args[0])) {
        Print(usage);
        return 0;
    }
    const Verb* verb = FindVerb(args[0]);
    if (verb == nullptr)
        return Fail("unknown verb " + args[0] + ". Type \"vaskel-reg /?\" for usage.");
    const Args rest(args.begin() + 1, args.end());
    if (!rest.empty() && IsHelp(rest[0])) {
        Print(verb->usage);
        return 0;
    }
    return verb->run(rest);
}

} // namespace

int main(int argc, char** argv) {
    try {
        return Run(Args(argv + 1, argv + argc));
    } catch (const std::exception& error) {
        return Fail(error.what());
    }
}
