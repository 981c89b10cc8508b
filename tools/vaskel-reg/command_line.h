// A verb's arguments: positional ones and switches, written /x or -x in any
// case. A switch that takes a value takes the next argument, whatever it is;
// an argument that names no switch of the verb is positional, so that paths
// such as /tmp/settings.reg are files.
#pragma once

#include <initializer_list>
#include <map>
#include <string>
#include <vector>

namespace vaskel::regtool {

struct SwitchRule {
    const char* name; // lower case, without the / or -
    bool takesValue;
};

class Arguments {
public:
    // Fails with a message for a switch given twice or missing its value.
    bool Parse(const std::vector<std::string>& args, std::initializer_list<SwitchRule> switches,
               std::string& error);

    const std::vector<std::string>& Positionals() const { return m_positionals; }
    // Whether there are count positional arguments; the message says what is
    // missing, or names the first argument too many.
    bool HasPositionals(std::size_t count, const std::string& missing, std::string& error) const;
    bool Has(const std::string& name) const { return m_switches.count(name) != 0; }
    // The switch's value; empty when it was not given.
    std::string Value(const std::string& name) const;

private:
    std::vector<std::string> m_positionals;
    std::map<std::string, std::string> m_switches;
};

// Whether the argument asks for help: /?, -?, /h or -h.
bool IsHelp(const std::string& arg);

} // namespace vaskel::regtool
