#include "key_path.h"

#include "code_page.h"

#include <cctype>

namespace vaskel::regtool {
namespace {

struct RootSpelling {
    RootKey root;
    const char* full;
    const char* shortName;
};

constexpr RootSpelling roots[] = {
    {RootKey::ClassesRoot, "HKEY_CLASSES_ROOT", "HKCR"},
    {RootKey::CurrentUser, "HKEY_CURRENT_USER", "HKCU"},
    {RootKey::LocalMachine, "HKEY_LOCAL_MACHINE", "HKLM"},
};

// The longest key name, in UTF-16 units as the system counts it.
constexpr std::size_t maxKeyNameLength = 255;

bool EqualNoCase(std::string_view a, std::string_view b) {
    if (a.size() != b.size())
        return false;
    for (std::size_t i = 0; i < a.size(); ++i)
        if (std::toupper(static_cast<unsigned char>(a[i])) !=
            std::toupper(static_cast<unsigned char>(b[i])))
            return false;
    return true;
}

bool FindRoot(std::string_view name, RootNames names, RootKey& root) {
    for (const RootSpelling& spelling : roots) {
        if (EqualNoCase(name, spelling.full) ||
            (names == RootNames::FullOrShort && EqualNoCase(name, spelling.shortName))) {
            root = spelling.root;
            return true;
        }
    }
    return false;
}

bool CheckNames(std::string_view subkey, std::string& error) {
    std::size_t start = 0;
    while (start <= subkey.size()) { // an empty path is one empty name
        std::size_t end = subkey.find('\\', start);
        if (end == std::string_view::npos)
            end = subkey.size();
        std::string_view name = subkey.substr(start, end - start);
        if (name.empty()) {
            error = "the key path has an empty name between backslashes";
            return false;
        }
        if (Utf16Length(name) > maxKeyNameLength) {
            error = "a key name is longer than 255 characters";
            return false;
        }
        start = end + 1;
    }
    return true;
}

} // namespace

std::string KeyPath::Text() const {
    std::string text = RootName(root);
    if (!subkey.empty())
        text.append("\\").append(subkey);
    return text;
}

KeyPath KeyPath::Parent(std::string& name) const {
    std::size_t split = subkey.rfind('\\');
    KeyPath parent{root, {}};
    if (split == std::string::npos) {
        name = subkey;
    } else {
        name = subkey.substr(split + 1);
        parent.subkey = subkey.substr(0, split);
    }
    return parent;
}

HKEY RootHandle(RootKey root) {
    switch (root) {
    case RootKey::ClassesRoot:
        return HKEY_CLASSES_ROOT;
    case RootKey::LocalMachine:
        return HKEY_LOCAL_MACHINE;
    case RootKey::CurrentUser:
        break;
    }
    return HKEY_CURRENT_USER;
}

const char* RootName(RootKey root) {
    for (const RootSpelling& spelling : roots)
        if (spelling.root == root)
            return spelling.full;
    return "";
}

bool ParseKeyPath(std::string_view text, RootNames names, KeyPath& path, std::string& error) {
    if (!text.empty() && text.back() == '\\')
        text.remove_suffix(1);
    const std::size_t split = text.find('\\');
    if (!FindRoot(text.substr(0, split), names, path.root)) {
        error = names == RootNames::FullOrShort
                    ? "a key path starts with HKCU, HKLM or HKCR (or their full names)"
                    : "a key path starts with HKEY_CURRENT_USER, HKEY_LOCAL_MACHINE or "
                      "HKEY_CLASSES_ROOT";
        return false;
    }
    path.subkey.clear();
    if (split == std::string_view::npos)
        return true;
    const std::string_view subkey = text.substr(split + 1);
    if (!CheckNames(subkey, error))
        return false;
    path.subkey = std::string(subkey);
    return true;
}

} // namespace vaskel::regtool
