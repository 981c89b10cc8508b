// The registry store on this platform: one SQLite database per hive, shared by
// every process of the user. A key is a row naming its parent; a value belongs
// to a key. Names compare without ASCII case (the NOCASE collation) and keep
// the case they were created with.
#pragma once

#include <vkwin32/types.h>

#include <cstdint>
#include <mutex>
#include <string>
#include <string_view>
#include <vector>

struct sqlite3;
struct sqlite3_stmt;

namespace vkw32 {

using KeyId = std::int64_t;

enum class Hive { User, Machine };

struct StoredValue {
    DWORD type;
    const BYTE* data;
    DWORD size;
};

// Receives a value while the store holds it: the name and data are valid only
// during the call.
class ValueVisitor {
public:
    virtual void Visit(std::string_view name, const StoredValue& value) = 0;

protected:
    ~ValueVisitor() = default;
};

// Each operation is atomic and reports a system error code. A key id that no
// longer names a key gives ERROR_KEY_DELETED: ids are never reused.
class RegistryStore {
public:
    // The process's connection to a hive, opened on first use; null, with
    // the error, while the database cannot be opened.
    static RegistryStore* Open(Hive hive, LONG& error);

    RegistryStore(const RegistryStore&) = delete;
    RegistryStore& operator=(const RegistryStore&) = delete;
    ~RegistryStore();

    KeyId Root() const { return m_root; }
    // HKEY_LOCAL_MACHINE\Software\Classes in the machine hive.
    KeyId Classes() const { return m_classes; }

    LONG OpenKey(KeyId from, const std::vector<std::string_view>& path, KeyId& key);
    LONG CreateKey(KeyId from, const std::vector<std::string_view>& path, KeyId& key,
                   bool& created);
    // Deletes the key the path names (from itself for an empty path); a key
    // with subkeys and the roots give ERROR_ACCESS_DENIED.
    LONG DeleteKey(KeyId from, const std::vector<std::string_view>& path);
    // Subkeys and values come in name order.
    LONG EnumKey(KeyId key, DWORD index, std::string& name);

    LONG QueryValue(KeyId key, std::string_view name, ValueVisitor& visitor);
    LONG SetValue(KeyId key, std::string_view name, DWORD type, const BYTE* data, DWORD size);
    LONG DeleteValue(KeyId key, std::string_view name);
    LONG EnumValue(KeyId key, DWORD index, ValueVisitor& visitor);

private:
    enum class Statement : int;
    class Use;
    class WriteTransaction;

    RegistryStore() = default;
    LONG Connect(const std::string& file);
    LONG UseWriteAheadLog();
    LONG CreateSchema();
    LONG Prepare();
    sqlite3_stmt* Prepared(Statement statement) const;
    LONG Run(Statement statement);
    LONG CheckKey(KeyId key);
    LONG MissingKeyOr(KeyId key, LONG otherwise);
    LONG FindChild(KeyId parent, std::string_view name, KeyId& child);
    LONG Walk(KeyId from, const std::vector<std::string_view>& path, KeyId& key);

    std::mutex m_mutex;
    sqlite3* m_db = nullptr;
    std::vector<sqlite3_stmt*> m_statements;
    KeyId m_root = 1;
    KeyId m_classes = 0;
};

} // namespace vkw32
