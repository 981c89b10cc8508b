#include "command_line.h"

#include <cstddef>

namespace vkw32 {
namespace {

bool IsBlank(char c) {
    return c == ' ' || c == '\t';
}

// The program's name must be a valid path, so quotes only group and
// backslashes stay as they are.
const char* ReadProgramName(const char* p, std::string& name) {
    bool quoted = false;
    for (; *p != '\0'; ++p) {
        if (*p == '"')
            quoted = !quoted;
        else if (!quoted && IsBlank(*p))
            break;
        else
            name += *p;
    }
    return p;
}

const char* ReadArgument(const char* p, std::string& argument) {
    bool quoted = false;
    while (*p != '\0' && (quoted || !IsBlank(*p))) {
        if (*p == '\\') {
            std::size_t count = 0;
            while (p[count] == '\\')
                ++count;
            if (p[count] != '"') {
                argument.append(count, '\\');
                p += count;
                continue;
            }
            // 2n backslashes and a quote: n backslashes, and the quote groups;
            // 2n + 1: n backslashes and a literal quote.
            argument.append(count / 2, '\\');
            p += count;
            if (count % 2 == 1) {
                argument += '"';
                ++p;
            }
        } else if (*p == '"') {
            // "" inside quotes is a literal quote, and the quoted part ends.
            if (quoted && p[1] == '"') {
                argument += '"';
                p += 2;
                quoted = false;
            } else {
                quoted = !quoted;
                ++p;
            }
        } else {
            argument += *p++;
        }
    }
    return p;
}

} // namespace

std::vector<std::string> SplitCommandLine(const char* commandLine) {
    std::vector<std::string> arguments;
    const char* p = commandLine;
    while (IsBlank(*p))
        ++p;
    if (*p == '\0')
        return arguments;
    arguments.emplace_back();
    p = ReadProgramName(p, arguments.back());
    for (;;) {
        while (IsBlank(*p))
            ++p;
        if (*p == '\0')
            return arguments;
        arguments.emplace_back();
        p = ReadArgument(p, arguments.back());
    }
}

} // namespace vkw32
