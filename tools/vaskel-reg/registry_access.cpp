#include "registry_access.h"

#include <utility>

namespace vaskel::regtool {
namespace {

// Name buffers grow to this at most: a value name has at most 16383 UTF-16
// units, three bytes each in UTF-8.
constexpr std::size_t maxNameBuffer = 1 << 17;
// A value another process keeps growing is given up after this many reads.
constexpr int maxReadAttempts = 8;

const char* SubkeyText(const std::string& subkey) {
    return subkey.empty() ? nullptr : subkey.c_str();
}

// Lists names through an enumeration function, growing the buffer as needed.
template <typename Enumerate>
LSTATUS ReadNames(std::vector<std::string>& names, Enumerate enumerate) {
    names.clear();
    std::string name(1024, '\0');
    for (DWORD index = 0;;) {
        DWORD length = static_cast<DWORD>(name.size());
        LSTATUS status = enumerate(index, name.data(), &length);
        if (status == ERROR_NO_MORE_ITEMS)
            return ERROR_SUCCESS;
        if (status == ERROR_MORE_DATA && name.size() < maxNameBuffer) {
            name.resize(name.size() * 2);
            continue;
        }
        if (status != ERROR_SUCCESS)
            return status;
        names.emplace_back(name.data(), length);
        ++index;
    }
}

} // namespace

RegistryKey& RegistryKey::operator=(RegistryKey&& other) noexcept {
    if (this != &other) {
        Close();
        m_key = std::exchange(other.m_key, nullptr);
    }
    return *this;
}

LSTATUS RegistryKey::Open(const KeyPath& path, REGSAM access) {
    Close();
    return RegOpenKeyExA(RootHandle(path.root), SubkeyText(path.subkey), 0, access, &m_key);
}

LSTATUS RegistryKey::Open(HKEY parent, const std::string& name, REGSAM access) {
    Close();
    return RegOpenKeyExA(parent, name.c_str(), 0, access, &m_key);
}

LSTATUS RegistryKey::Create(const KeyPath& path, REGSAM access) {
    Close();
    return RegCreateKeyExA(RootHandle(path.root), path.subkey.c_str(), 0, nullptr,
                           REG_OPTION_NON_VOLATILE, access, nullptr, &m_key, nullptr);
}

void RegistryKey::Close() {
    if (m_key != nullptr)
        RegCloseKey(m_key);
    m_key = nullptr;
}

LSTATUS ReadValue(HKEY key, const std::string& name, RegValue& value) {
    value.name = name;
    DWORD type = 0;
    DWORD size = 0;
    LSTATUS status = RegQueryValueExA(key, name.c_str(), nullptr, &type, nullptr, &size);
    for (int attempt = 0; status == ERROR_SUCCESS && attempt < maxReadAttempts; ++attempt) {
        value.data.resize(size);
        DWORD read = size;
        status = RegQueryValueExA(key, name.c_str(), nullptr, &type,
                                  value.data.empty() ? nullptr : value.data.data(), &read);
        if (status == ERROR_SUCCESS) {
            value.type = type;
            value.data.resize(read);
            return status;
        }
        if (status == ERROR_MORE_DATA) {
            size = read; // it grew since the size was asked
            status = ERROR_SUCCESS;
        }
    }
    return status == ERROR_SUCCESS ? ERROR_MORE_DATA : status;
}

LSTATUS ReadValues(HKEY key, std::vector<RegValue>& values) {
    values.clear();
    std::vector<std::string> names;
    LSTATUS status = ReadNames(names, [key](DWORD index, char* name, DWORD* length) {
        return RegEnumValueA(key, index, name, length, nullptr, nullptr, nullptr, nullptr);
    });
    for (const std::string& name : names) {
        if (status != ERROR_SUCCESS)
            break;
        values.emplace_back();
        status = ReadValue(key, name, values.back());
    }
    return status;
}

LSTATUS ReadSubkeyNames(HKEY key, std::vector<std::string>& names) {
    return ReadNames(names, [key](DWORD index, char* name, DWORD* length) {
        return RegEnumKeyExA(key, index, name, length, nullptr, nullptr, nullptr, nullptr);
    });
}

LSTATUS WriteValue(HKEY key, const RegValue& value) {
    return RegSetValueExA(key, value.name.c_str(), 0, value.type,
                          value.data.empty() ? nullptr : value.data.data(),
                          static_cast<DWORD>(value.data.size()));
}

LSTATUS VisitTree(const KeyPath& start, const KeyVisitor& visit) {
    // An explicit stack: a chain of keys as deep as the store allows must not
    // exhaust the call stack.
    struct Frame {
        KeyPath path;
        RegistryKey key;
        std::vector<std::string> subkeys;
        std::size_t next = 0;
    };
    std::vector<Frame> stack;
    auto enter = [&](KeyPath path, RegistryKey key) {
        LSTATUS status = visit(path, key.Handle());
        std::vector<std::string> subkeys;
        if (status == ERROR_SUCCESS)
            status = ReadSubkeyNames(key.Handle(), subkeys);
        if (status == ERROR_SUCCESS)
            stack.push_back({std::move(path), std::move(key), std::move(subkeys)});
        return status;
    };
    RegistryKey key;
    LSTATUS status = key.Open(start, KEY_READ);
    if (status == ERROR_SUCCESS)
        status = enter(start, std::move(key));
    while (status == ERROR_SUCCESS && !stack.empty()) {
        Frame& top = stack.back();
        if (top.next == top.subkeys.size()) {
            stack.pop_back();
            continue;
        }
        const std::string& name = top.subkeys[top.next++];
        KeyPath path{top.path.root, top.path.IsRoot() ? name : top.path.subkey + "\\" + name};
        status = key.Open(top.key.Handle(), name, KEY_READ);
        if (status == ERROR_SUCCESS)
            status = enter(std::move(path), std::move(key));
    }
    return status;
}

LSTATUS DeleteTree(const KeyPath& path) {
    // Depth first with an explicit stack; each key goes once its subkeys have.
    struct Frame {
        std::string name;
        RegistryKey key;
        std::vector<std::string> subkeys;
        std::size_t next = 0;
    };
    if (path.IsRoot())
        return ERROR_ACCESS_DENIED; // as the system refuses it, before anything below goes
    std::vector<Frame> stack;
    auto enter = [&stack](HKEY parent, const std::string& name) {
        Frame frame{name, {}, {}};
        LSTATUS status = frame.key.Open(parent, name, KEY_READ | KEY_WRITE);
        if (status == ERROR_SUCCESS)
            status = ReadSubkeyNames(frame.key.Handle(), frame.subkeys);
        if (status == ERROR_SUCCESS)
            stack.push_back(std::move(frame));
        return status;
    };
    std::string name;
    RegistryKey parent;
    LSTATUS status = parent.Open(path.Parent(name), KEY_READ | KEY_WRITE);
    if (status == ERROR_SUCCESS)
        status = enter(parent.Handle(), name);
    while (status == ERROR_SUCCESS && !stack.empty()) {
        Frame& top = stack.back();
        if (top.next < top.subkeys.size()) {
            const std::string child = top.subkeys[top.next++];
            status = enter(top.key.Handle(), child);
            continue;
        }
        top.key.Close();
        HKEY above = stack.size() > 1 ? stack[stack.size() - 2].key.Handle() : parent.Handle();
        status = RegDeleteKeyA(above, top.name.c_str());
        stack.pop_back();
    }
    return status;
}

std::string ErrorText(LSTATUS status) {
    switch (status) {
    case ERROR_FILE_NOT_FOUND:
    case ERROR_PATH_NOT_FOUND:
        return "The system was unable to find the specified registry key or value.";
    case ERROR_ACCESS_DENIED:
        return "Access is denied.";
    case ERROR_KEY_DELETED:
        return "The registry key was deleted while the operation ran.";
    case ERROR_INVALID_PARAMETER:
    case ERROR_BAD_PATHNAME:
        return "The registry refused the key or value name.";
    case ERROR_CALL_NOT_IMPLEMENTED:
        return "The registry is not available on this system.";
    default:
        return "The registry reported error " + std::to_string(status) + ".";
    }
}

} // namespace vaskel::regtool
