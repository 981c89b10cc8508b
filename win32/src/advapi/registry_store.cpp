#include "registry_store.h"

#include "registry_files.h"

#include <vkwin32/winerror.h>

#include <pthread.h>
#include <sqlite3.h>

#include <atomic>
#include <chrono>
#include <cstring>
#include <memory>
#include <thread>

namespace vkw32 {

enum class RegistryStore::Statement : int {
    FindChild,
    AddChild,
    KeyExists,
    RemoveKey,
    ChildAt,
    FindValue,
    PutValue,
    RemoveValue,
    ValueAt,
    Begin,
    Commit,
    Rollback,
};

namespace {

const char* const statementText[] = {
    "SELECT id FROM keys WHERE parent = ?1 AND name = ?2",
    "INSERT INTO keys(parent, name) VALUES(?1, ?2)",
    "SELECT 1 FROM keys WHERE id = ?1",
    "DELETE FROM keys WHERE id = ?1",
    "SELECT name FROM keys WHERE parent = ?1 ORDER BY name LIMIT 1 OFFSET ?2",
    "SELECT type, data FROM vals WHERE key_id = ?1 AND name = ?2",
    ("INSERT INTO vals(key_id, name, type, data) VALUES(?1, ?2, ?3, ?4) "
     "ON CONFLICT(key_id, name) DO UPDATE SET type = excluded.type, data = excluded.data"),
    "DELETE FROM vals WHERE key_id = ?1 AND name = ?2",
    "SELECT name, type, data FROM vals WHERE key_id = ?1 ORDER BY name LIMIT 1 OFFSET ?2",
    "BEGIN IMMEDIATE",
    "COMMIT",
    "ROLLBACK",
};

// Ids come from AUTOINCREMENT so that a deleted key's id is never handed out
// again: a handle to a deleted key must not reach its successor. Deleting a
// key takes its values along; the parent reference keeps a key with subkeys.
const char schema[] = R"(
CREATE TABLE IF NOT EXISTS keys(
    id INTEGER PRIMARY KEY AUTOINCREMENT,
    parent INTEGER REFERENCES keys(id),
    name TEXT NOT NULL COLLATE NOCASE,
    UNIQUE(parent, name));
CREATE TABLE IF NOT EXISTS vals(
    key_id INTEGER NOT NULL REFERENCES keys(id) ON DELETE CASCADE,
    name TEXT NOT NULL COLLATE NOCASE,
    type INTEGER NOT NULL,
    data BLOB NOT NULL,
    PRIMARY KEY(key_id, name)) WITHOUT ROWID;
INSERT OR IGNORE INTO keys(id, parent, name) VALUES(1, NULL, '');
PRAGMA user_version = 1;
)";
const int schemaVersion = 1;
// How long an operation waits for other processes' locks before it fails.
const int busyTimeoutMs = 60000;

LONG ErrorFromSqlite(int result) {
    switch (result & 0xFF) {
    case SQLITE_OK:
    case SQLITE_ROW:
    case SQLITE_DONE:
        return ERROR_SUCCESS;
    case SQLITE_NOMEM:
    case SQLITE_TOOBIG:
        return ERROR_NOT_ENOUGH_MEMORY;
    case SQLITE_FULL:
        return ERROR_DISK_FULL;
    case SQLITE_CORRUPT:
    case SQLITE_NOTADB:
    case SQLITE_SCHEMA:
        return ERROR_BADDB;
    case SQLITE_READONLY:
    case SQLITE_PERM:
    case SQLITE_AUTH:
        return ERROR_ACCESS_DENIED;
    case SQLITE_CANTOPEN:
        return ERROR_CANTOPEN;
    default: // I/O errors, and locks still held by another process after the wait
        return ERROR_REGISTRY_IO_FAILED;
    }
}

StoredValue ValueAtColumn(sqlite3_stmt* statement, int column) {
    static const BYTE none = 0; // a zero-length blob comes back as a null pointer
    const void* data = sqlite3_column_blob(statement, column + 1);
    return {static_cast<DWORD>(sqlite3_column_int64(statement, column)),
            data != nullptr ? static_cast<const BYTE*>(data) : &none,
            static_cast<DWORD>(sqlite3_column_bytes(statement, column + 1))};
}

std::string_view TextAtColumn(sqlite3_stmt* statement, int column) {
    const unsigned char* text = sqlite3_column_text(statement, column);
    return text == nullptr ? std::string_view()
                           : std::string_view(
                                 reinterpret_cast<const char*>(text),
                                 static_cast<std::size_t>(sqlite3_column_bytes(statement, column)));
}

} // namespace

// A prepared statement for one use: bound, stepped, and reset afterwards. A
// failed binding fails the step, so a statement never runs with the previous
// call's arguments.
class RegistryStore::Use {
public:
    Use(const RegistryStore& store, Statement statement) : m_statement(store.Prepared(statement)) {}
    ~Use() { sqlite3_reset(m_statement); }
    Use(const Use&) = delete;
    Use& operator=(const Use&) = delete;

    void Bind(int index, sqlite3_int64 number) {
        Check(sqlite3_bind_int64(m_statement, index, number));
    }
    void Bind(int index, std::string_view text) {
        // A null pointer would bind SQL NULL rather than empty text.
        Check(sqlite3_bind_text64(m_statement, index, text.empty() ? "" : text.data(), text.size(),
                                  SQLITE_STATIC, SQLITE_UTF8));
    }
    void BindBlob(int index, const BYTE* data, DWORD size) {
        Check(size == 0 ? sqlite3_bind_zeroblob(m_statement, index, 0)
                        : sqlite3_bind_blob64(m_statement, index, data, size, SQLITE_STATIC));
    }
    int Step() { return m_bindResult != SQLITE_OK ? m_bindResult : sqlite3_step(m_statement); }
    sqlite3_stmt* Get() const { return m_statement; }

private:
    void Check(int result) {
        if (m_bindResult == SQLITE_OK)
            m_bindResult = result;
    }

    sqlite3_stmt* m_statement;
    int m_bindResult = SQLITE_OK;
};

// BEGIN IMMEDIATE takes the write lock up front, waiting for it like any
// write: a read transaction that later wanted to write could be refused
// without waiting once another process had written meanwhile.
class RegistryStore::WriteTransaction {
public:
    explicit WriteTransaction(RegistryStore& store) : m_store(store) {}
    ~WriteTransaction() {
        // Some errors end the transaction by themselves.
        if (m_open && sqlite3_get_autocommit(m_store.m_db) == 0)
            m_store.Run(Statement::Rollback);
    }
    WriteTransaction(const WriteTransaction&) = delete;
    WriteTransaction& operator=(const WriteTransaction&) = delete;

    LONG Begin() {
        const LONG error = m_store.Run(Statement::Begin);
        m_open = error == ERROR_SUCCESS;
        return error;
    }
    LONG Commit() {
        const LONG error = m_store.Run(Statement::Commit);
        if (error == ERROR_SUCCESS)
            m_open = false;
        return error;
    }

private:
    RegistryStore& m_store;
    bool m_open = false;
};

namespace {

// The process's connections, one per hive. A child made by fork gets none of
// them: SQLite connections must not cross a fork, so the child opens its own
// and the handles it inherited, which name a hive and not a connection,
// follow.
struct Connections {
    std::mutex openMutex;
    std::atomic<RegistryStore*> stores[2] = {};
};

Connections& TheConnections() {
    static Connections* connections = [] {
        auto* created = new Connections; // outlives every static destructor
        pthread_atfork([] { TheConnections().openMutex.lock(); },
                       [] { TheConnections().openMutex.unlock(); },
                       [] {
                           // The parent's connections are left alone, never closed here.
                           for (std::atomic<RegistryStore*>& store : TheConnections().stores)
                               store.store(nullptr, std::memory_order_relaxed);
                           TheConnections().openMutex.unlock();
                       });
        return created;
    }();
    return *connections;
}

} // namespace

RegistryStore* RegistryStore::Open(Hive hive, LONG& error) {
    Connections& connections = TheConnections();
    std::atomic<RegistryStore*>& slot = connections.stores[hive == Hive::User ? 0 : 1];
    if (RegistryStore* store = slot.load(std::memory_order_acquire))
        return store;
    std::lock_guard<std::mutex> lock(connections.openMutex);
    if (RegistryStore* store = slot.load(std::memory_order_relaxed))
        return store;
    std::unique_ptr<RegistryStore> store(new RegistryStore);
    const std::string& directory = RegistryDirectory();
    const std::string file = directory + (hive == Hive::User ? "/user.db" : "/machine.db");
    error = PrepareDatabaseFile(directory, file);
    if (error == ERROR_SUCCESS)
        error = store->Connect(file);
    if (error == ERROR_SUCCESS && hive == Hive::Machine) {
        bool created;
        error = store->CreateKey(store->m_root, {"Software", "Classes"}, store->m_classes, created);
    }
    if (error != ERROR_SUCCESS)
        return nullptr; // tried again on the next call
    // The connection stays open for the life of the process: handles may name
    // the store until the very end, and SQLite recovers a log left behind.
    slot.store(store.get(), std::memory_order_release);
    return store.release();
}

RegistryStore::~RegistryStore() {
    for (sqlite3_stmt* statement : m_statements)
        sqlite3_finalize(statement);
    sqlite3_close(m_db);
}

LONG RegistryStore::Connect(const std::string& file) {
    // Our own lock guards the connection and its statements.
    int result =
        sqlite3_open_v2(file.c_str(), &m_db, SQLITE_OPEN_READWRITE | SQLITE_OPEN_NOMUTEX, nullptr);
    if (result != SQLITE_OK)
        return ErrorFromSqlite(result);
    sqlite3_extended_result_codes(m_db, 1);
    // Other processes hold the write lock for one short transaction at a time.
    sqlite3_busy_timeout(m_db, busyTimeoutMs);
    if (const LONG error = UseWriteAheadLog())
        return error;
    result = sqlite3_exec(m_db, "PRAGMA synchronous = NORMAL; PRAGMA foreign_keys = ON", nullptr,
                          nullptr, nullptr);
    if (result != SQLITE_OK)
        return ErrorFromSqlite(result);
    if (const LONG error = CreateSchema())
        return error;
    return Prepare();
}

// The write-ahead log lets readers go on beside a writer. With
// synchronous=NORMAL a commit is in the log, in the system's cache, when it
// returns: it survives the crash of the process, though not of the machine,
// without a flush to disk per write.
LONG RegistryStore::UseWriteAheadLog() {
    // Turning a new database to the log needs it alone for a moment; another
    // process opening it at once gets SQLITE_BUSY straight away, without the
    // wait, and tries again until one of them has turned it.
    for (int waited = 0;; ++waited) {
        sqlite3_stmt* journal = nullptr;
        int result = sqlite3_prepare_v2(m_db, "PRAGMA journal_mode = WAL", -1, &journal, nullptr);
        if (result == SQLITE_OK)
            result = sqlite3_step(journal);
        const bool wal =
            result == SQLITE_ROW &&
            std::strcmp(reinterpret_cast<const char*>(sqlite3_column_text(journal, 0)), "wal") == 0;
        sqlite3_finalize(journal);
        if (wal)
            return ERROR_SUCCESS;
        if (result != SQLITE_BUSY || waited == busyTimeoutMs)
            return result == SQLITE_ROW ? ERROR_REGISTRY_IO_FAILED : ErrorFromSqlite(result);
        std::this_thread::sleep_for(std::chrono::milliseconds(1));
    }
}

LONG RegistryStore::CreateSchema() {
    int result = sqlite3_exec(m_db, "BEGIN IMMEDIATE", nullptr, nullptr, nullptr);
    if (result != SQLITE_OK)
        return ErrorFromSqlite(result);
    sqlite3_stmt* version = nullptr;
    result = sqlite3_prepare_v2(m_db, "PRAGMA user_version", -1, &version, nullptr);
    if (result == SQLITE_OK)
        result = sqlite3_step(version);
    // A store written by a later version is left alone.
    const bool known = result == SQLITE_ROW && sqlite3_column_int(version, 0) <= schemaVersion;
    sqlite3_finalize(version);
    if (known)
        result = sqlite3_exec(m_db, schema, nullptr, nullptr, nullptr);
    if (known && result == SQLITE_OK)
        result = sqlite3_exec(m_db, "COMMIT", nullptr, nullptr, nullptr);
    if (known && result == SQLITE_OK)
        return ERROR_SUCCESS;
    sqlite3_exec(m_db, "ROLLBACK", nullptr, nullptr, nullptr);
    return known ? ErrorFromSqlite(result) : ERROR_BADDB;
}

LONG RegistryStore::Prepare() {
    static_assert(sizeof statementText / sizeof statementText[0] ==
                  static_cast<std::size_t>(Statement::Rollback) + 1);
    for (const char* text : statementText) {
        sqlite3_stmt* statement = nullptr;
        const int result =
            sqlite3_prepare_v3(m_db, text, -1, SQLITE_PREPARE_PERSISTENT, &statement, nullptr);
        if (result != SQLITE_OK)
            return ErrorFromSqlite(result);
        m_statements.push_back(statement);
    }
    return ERROR_SUCCESS;
}

sqlite3_stmt* RegistryStore::Prepared(Statement statement) const {
    return m_statements[static_cast<std::size_t>(statement)];
}

LONG RegistryStore::Run(Statement statement) {
    Use use(*this, statement);
    return ErrorFromSqlite(use.Step());
}

LONG RegistryStore::CheckKey(KeyId key) {
    Use use(*this, Statement::KeyExists);
    use.Bind(1, key);
    const int result = use.Step();
    return result == SQLITE_DONE ? ERROR_KEY_DELETED : ErrorFromSqlite(result);
}

LONG RegistryStore::MissingKeyOr(KeyId key, LONG otherwise) {
    const LONG error = CheckKey(key);
    return error == ERROR_SUCCESS ? otherwise : error;
}

LONG RegistryStore::FindChild(KeyId parent, std::string_view name, KeyId& child) {
    Use use(*this, Statement::FindChild);
    use.Bind(1, parent);
    use.Bind(2, name);
    const int result = use.Step();
    if (result == SQLITE_ROW)
        child = sqlite3_column_int64(use.Get(), 0);
    return result == SQLITE_DONE ? ERROR_FILE_NOT_FOUND : ErrorFromSqlite(result);
}

LONG RegistryStore::Walk(KeyId from, const std::vector<std::string_view>& path, KeyId& key) {
    KeyId current = from;
    for (const std::string_view name : path) {
        KeyId child = 0;
        const LONG error = FindChild(current, name, child);
        // A deleted key has no subkeys: the first step tells.
        if (error == ERROR_FILE_NOT_FOUND && current == from)
            return MissingKeyOr(from, error);
        if (error != ERROR_SUCCESS)
            return error;
        current = child;
    }
    if (path.empty()) {
        if (const LONG error = CheckKey(from))
            return error;
    }
    key = current;
    return ERROR_SUCCESS;
}

LONG RegistryStore::OpenKey(KeyId from, const std::vector<std::string_view>& path, KeyId& key) {
    std::lock_guard<std::mutex> lock(m_mutex);
    return Walk(from, path, key);
}

LONG RegistryStore::CreateKey(KeyId from, const std::vector<std::string_view>& path, KeyId& key,
                              bool& created) {
    std::lock_guard<std::mutex> lock(m_mutex);
    created = false;
    if (path.empty())
        return Walk(from, path, key);
    WriteTransaction transaction(*this);
    if (const LONG error = transaction.Begin())
        return error;
    KeyId current = from;
    for (const std::string_view name : path) {
        KeyId child = 0;
        LONG error = created ? ERROR_FILE_NOT_FOUND : FindChild(current, name, child);
        if (error == ERROR_FILE_NOT_FOUND) {
            Use use(*this, Statement::AddChild);
            use.Bind(1, current);
            use.Bind(2, name);
            const int result = use.Step();
            if (result == SQLITE_CONSTRAINT_FOREIGNKEY)
                return ERROR_KEY_DELETED;
            error = ErrorFromSqlite(result);
            child = sqlite3_last_insert_rowid(m_db);
            created = true;
        }
        if (error != ERROR_SUCCESS)
            return error;
        current = child;
    }
    if (const LONG error = transaction.Commit())
        return error;
    key = current;
    return ERROR_SUCCESS;
}

LONG RegistryStore::DeleteKey(KeyId from, const std::vector<std::string_view>& path) {
    std::lock_guard<std::mutex> lock(m_mutex);
    WriteTransaction transaction(*this);
    if (const LONG error = transaction.Begin())
        return error;
    KeyId key = 0;
    if (const LONG error = Walk(from, path, key))
        return error;
    if (key == m_root || key == m_classes)
        return ERROR_ACCESS_DENIED;
    Use use(*this, Statement::RemoveKey);
    use.Bind(1, key);
    const int result = use.Step();
    // Subkeys still name the key as their parent.
    if (result == SQLITE_CONSTRAINT_FOREIGNKEY)
        return ERROR_ACCESS_DENIED;
    if (const LONG error = ErrorFromSqlite(result))
        return error;
    return transaction.Commit();
}

LONG RegistryStore::EnumKey(KeyId key, DWORD index, std::string& name) {
    std::lock_guard<std::mutex> lock(m_mutex);
    Use use(*this, Statement::ChildAt);
    use.Bind(1, key);
    use.Bind(2, static_cast<sqlite3_int64>(index));
    const int result = use.Step();
    if (result == SQLITE_ROW) {
        name = TextAtColumn(use.Get(), 0);
        return ERROR_SUCCESS;
    }
    return result == SQLITE_DONE ? MissingKeyOr(key, ERROR_NO_MORE_ITEMS) : ErrorFromSqlite(result);
}

LONG RegistryStore::QueryValue(KeyId key, std::string_view name, ValueVisitor& visitor) {
    std::lock_guard<std::mutex> lock(m_mutex);
    Use use(*this, Statement::FindValue);
    use.Bind(1, key);
    use.Bind(2, name);
    const int result = use.Step();
    if (result == SQLITE_ROW) {
        visitor.Visit(name, ValueAtColumn(use.Get(), 0));
        return ERROR_SUCCESS;
    }
    return result == SQLITE_DONE ? MissingKeyOr(key, ERROR_FILE_NOT_FOUND)
                                 : ErrorFromSqlite(result);
}

LONG RegistryStore::SetValue(KeyId key, std::string_view name, DWORD type, const BYTE* data,
                             DWORD size) {
    std::lock_guard<std::mutex> lock(m_mutex);
    Use use(*this, Statement::PutValue);
    use.Bind(1, key);
    use.Bind(2, name);
    use.Bind(3, static_cast<sqlite3_int64>(type));
    use.BindBlob(4, data, size);
    const int result = use.Step();
    return result == SQLITE_CONSTRAINT_FOREIGNKEY ? ERROR_KEY_DELETED : ErrorFromSqlite(result);
}

LONG RegistryStore::DeleteValue(KeyId key, std::string_view name) {
    std::lock_guard<std::mutex> lock(m_mutex);
    Use use(*this, Statement::RemoveValue);
    use.Bind(1, key);
    use.Bind(2, name);
    if (const LONG error = ErrorFromSqlite(use.Step()))
        return error;
    return sqlite3_changes(m_db) == 0 ? MissingKeyOr(key, ERROR_FILE_NOT_FOUND) : ERROR_SUCCESS;
}

LONG RegistryStore::EnumValue(KeyId key, DWORD index, ValueVisitor& visitor) {
    std::lock_guard<std::mutex> lock(m_mutex);
    Use use(*this, Statement::ValueAt);
    use.Bind(1, key);
    use.Bind(2, static_cast<sqlite3_int64>(index));
    const int result = use.Step();
    if (result == SQLITE_ROW) {
        visitor.Visit(TextAtColumn(use.Get(), 0), ValueAtColumn(use.Get(), 1));
        return ERROR_SUCCESS;
    }
    return result == SQLITE_DONE ? MissingKeyOr(key, ERROR_NO_MORE_ITEMS) : ErrorFromSqlite(result);
}

} // namespace vkw32
