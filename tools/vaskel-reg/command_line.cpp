#include "command_line.h"

#include <cctype>

namespace vaskel::regtool {
namespace {

std::string Lower(std::string text) {
    for (char& c : text)
        c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
    return text;
}

// The switch the argument names, or null.
const SwitchRule* FindSwitch(const std::string& arg, std::initializer_list<SwitchRule> switches) {
    if (arg.size() < 2 || (arg[0] != '/' && arg[0] != '-'))
        return nullptr;
    const std::string name = Lower(arg.substr(1));
    for (const SwitchRule& rule : switches)
        if (name == rule.name)
            return &rule;
    return nullptr;
}

} // namespace

bool Arguments::Parse(const std::vector<std::string>& args,
                      std::initializer_list<SwitchRule> switches, std::string& error) {
    m_positionals.clear();
    m_switches.clear();
    for (std::size_t i = 0; i < args.size(); ++i) {
        const SwitchRule* rule = FindSwitch(args[i], switches);
        if (rule == nullptr) {
            m_positionals.push_back(args[i]);
            continue;
        }
        const std::string name = std::string("/") + rule->name;
        if (Has(rule->name)) {
            error = "the switch " + name + " is given twice";
            return false;
        }
        std::string value;
        if (rule->takesValue) {
            if (i + 1 == args.size()) {
                error = "the switch " + name + " needs a value after it";
                return false;
            }
            value = args[++i];
        }
        m_switches.emplace(rule->name, std::move(value));
    }
    return true;
}

bool Arguments::HasPositionals(std::size_t count, const std::string& missing,
                               std::string& error) const {
    if (m_positionals.size() < count)
        error = missing;
    else if (m_positionals.size() > count)
        error = "unknown switch or extra argument " + m_positionals[count];
    return m_positionals.size() == count;
}

std::string Arguments::Value(const std::string& name) const {
    auto found = m_switches.find(name);
    return found == m_switches.end() ? std::string() : found->second;
}

bool IsHelp(const std::string& arg) {
    return arg == "/?" || arg == "-?" || Lower(arg) == "/h" || Lower(arg) == "-h";
}

} // namespace vaskel::regtool
