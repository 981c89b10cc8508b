// The registry functions as Windows documents them, below a scratch key of
// HKEY_CURRENT_USER; the same tests run against the system registry on Windows.
#include "support/registry_sandbox.h"
#include "support/wine.h"

#include <vaskel/win32.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <atomic>
#include <cstring>
#include <memory>
#include <set>
#include <string>
#include <thread>
#include <type_traits>
#include <vector>

namespace {

struct KeyCloser {
    void operator()(HKEY key) const { RegCloseKey(key); }
};
using Key = std::unique_ptr<std::remove_pointer_t<HKEY>, KeyCloser>;

using Bytes = std::vector<BYTE>;

const BYTE* AsBytes(const void* data) {
    return static_cast<const BYTE*>(data);
}

LONG SetDword(HKEY key, const char* name, DWORD value) {
    return RegSetValueExA(key, name, 0, REG_DWORD, AsBytes(&value), sizeof value);
}

LONG SetText(HKEY key, const char* name, const std::string& text) {
    return RegSetValueExA(key, name, 0, REG_SZ, AsBytes(text.c_str()),
                          static_cast<DWORD>(text.size() + 1));
}

// The stored type and bytes, read with a size query first.
LONG Query(HKEY key, const char* name, DWORD& type, Bytes& data) {
    DWORD size = 0;
    if (const LONG error = RegQueryValueExA(key, name, nullptr, &type, nullptr, &size))
        return error;
    data.assign(size, 0);
    return RegQueryValueExA(key, name, nullptr, &type, data.data(), &size);
}

// Subkey or value names by index up to ERROR_NO_MORE_ITEMS.
std::vector<std::string> Names(HKEY key, bool values) {
    std::vector<std::string> names;
    for (DWORD index = 0;; ++index) {
        char name[300];
        DWORD length = sizeof name;
        const LONG error =
            values ? RegEnumValueA(key, index, name, &length, nullptr, nullptr, nullptr, nullptr)
                   : RegEnumKeyExA(key, index, name, &length, nullptr, nullptr, nullptr, nullptr);
        if (error != ERROR_SUCCESS) {
            EXPECT_EQ(error, ERROR_NO_MORE_ITEMS);
            return names;
        }
        EXPECT_EQ(length, std::strlen(name));
        names.push_back(name);
    }
}

class RegistryApiTest : public ::testing::Test {
protected:
    void SetUp() override {
        HKEY key = nullptr;
        ASSERT_EQ(RegOpenKeyExA(HKEY_CURRENT_USER, m_scratch.Path(), 0, KEY_ALL_ACCESS, &key),
                  ERROR_SUCCESS);
        m_key.reset(key);
    }
    HKEY Scratch() const { return m_key.get(); }

    // Opens (or creates) a path below the scratch key; null on failure, with
    // the error in m_error.
    Key Open(const char* path, REGSAM access = KEY_ALL_ACCESS) {
        HKEY key = nullptr;
        m_error = RegOpenKeyExA(Scratch(), path, 0, access, &key);
        return Key(m_error == ERROR_SUCCESS ? key : nullptr);
    }
    Key Create(const char* path, DWORD* disposition = nullptr, REGSAM access = KEY_ALL_ACCESS) {
        HKEY key = nullptr;
        m_error = RegCreateKeyExA(Scratch(), path, 0, nullptr, REG_OPTION_NON_VOLATILE, access,
                                  nullptr, &key, disposition);
        return Key(m_error == ERROR_SUCCESS ? key : nullptr);
    }

    vaskel_test::ScratchKey m_scratch;
    Key m_key;
    LONG m_error = ERROR_SUCCESS;
};

TEST_F(RegistryApiTest, CreateAndOpenPaths) {
    DWORD disposition = 0;
    EXPECT_TRUE(Create("Alpha\\Beta\\Gamma", &disposition));
    EXPECT_EQ(disposition, static_cast<DWORD>(REG_CREATED_NEW_KEY));
    EXPECT_TRUE(Create("alpha\\BETA", &disposition));
    EXPECT_EQ(disposition, static_cast<DWORD>(REG_OPENED_EXISTING_KEY));
    // Names compare without case, keep their case, and trailing backslashes name nothing more.
    EXPECT_TRUE(Open("ALPHA\\beta\\gamma"));
    EXPECT_TRUE(Open("Alpha\\Beta\\Gamma\\\\"));
    EXPECT_EQ(Names(Open("alpha").get(), false), std::vector<std::string>{"Beta"});

    HKEY key = Scratch();
    EXPECT_EQ(RegOpenKeyExA(Scratch(), "Alpha\\Missing", 0, KEY_READ, &key), ERROR_FILE_NOT_FOUND);
    EXPECT_EQ(key, nullptr);
    EXPECT_EQ(RegOpenKeyA(Scratch(), "Missing", &key), ERROR_FILE_NOT_FOUND);
    EXPECT_FALSE(Open("Missing")); // opening created nothing
    EXPECT_EQ(m_error, ERROR_FILE_NOT_FOUND);

    // A leading backslash is refused below every key but HKEY_CLASSES_ROOT.
    EXPECT_FALSE(Open("\\Alpha"));
    EXPECT_EQ(m_error, ERROR_BAD_PATHNAME);
    EXPECT_FALSE(Create("\\Delta"));
    EXPECT_EQ(m_error, ERROR_BAD_PATHNAME);
    ASSERT_EQ(RegOpenKeyExA(HKEY_CLASSES_ROOT, "\\", 0, KEY_READ, &key), ERROR_SUCCESS);
    EXPECT_NE(key, HKEY_CLASSES_ROOT);
    EXPECT_EQ(RegCloseKey(key), ERROR_SUCCESS);

    // Key names of up to 255 characters.
    const std::string longest(255, 'k');
    EXPECT_TRUE(Create(longest.c_str()));
    EXPECT_TRUE(Open(longest.c_str()));
    EXPECT_EQ(Names(Open(longest.c_str()).get(), false).size(), 0u);
    EXPECT_FALSE(Create(std::string(257, 'k').c_str()));
    EXPECT_EQ(m_error, ERROR_INVALID_PARAMETER);
}

TEST_F(RegistryApiTest, ClassesRootIsTheMachineClassesKey) {
    const std::string name = std::string("vaskel-test-") + std::to_string(GetCurrentProcessId());
    const std::string machinePath = "Software\\Classes\\" + name;
    HKEY key = nullptr;
    const LONG error = RegCreateKeyExA(HKEY_LOCAL_MACHINE, machinePath.c_str(), 0, nullptr, 0,
                                       KEY_ALL_ACCESS, nullptr, &key, nullptr);
    if (error == ERROR_ACCESS_DENIED)
        GTEST_SKIP() << "writing HKEY_LOCAL_MACHINE needs administrator rights";
    ASSERT_EQ(error, ERROR_SUCCESS);
    EXPECT_EQ(SetDword(key, "Marker", 42), ERROR_SUCCESS);
    EXPECT_EQ(RegCloseKey(key), ERROR_SUCCESS);

    ASSERT_EQ(RegOpenKeyExA(HKEY_CLASSES_ROOT, name.c_str(), 0, KEY_READ, &key), ERROR_SUCCESS);
    DWORD value = 0;
    DWORD size = sizeof value;
    EXPECT_EQ(
        RegQueryValueExA(key, "Marker", nullptr, nullptr, reinterpret_cast<BYTE*>(&value), &size),
        ERROR_SUCCESS);
    EXPECT_EQ(value, 42u);
    EXPECT_EQ(RegCloseKey(key), ERROR_SUCCESS);
    // The leading backslash is for opening only.
    EXPECT_EQ(RegDeleteKeyA(HKEY_CLASSES_ROOT, ("\\" + name).c_str()), ERROR_BAD_PATHNAME);
    EXPECT_EQ(RegDeleteKeyA(HKEY_CLASSES_ROOT, name.c_str()), ERROR_SUCCESS);
    EXPECT_EQ(RegOpenKeyExA(HKEY_LOCAL_MACHINE, machinePath.c_str(), 0, KEY_READ, &key),
              ERROR_FILE_NOT_FOUND);
}

TEST_F(RegistryApiTest, HandlesAndTheirLifetime) {
    HKEY first = nullptr;
    HKEY second = nullptr;
    ASSERT_EQ(RegOpenKeyExA(Scratch(), nullptr, 0, KEY_ALL_ACCESS, &first), ERROR_SUCCESS);
    ASSERT_EQ(RegOpenKeyExA(Scratch(), "", 0, KEY_ALL_ACCESS, &second), ERROR_SUCCESS);
    // New handles to the same key, each closed on its own.
    EXPECT_NE(first, Scratch());
    EXPECT_NE(first, second);
    EXPECT_EQ(SetDword(first, "Shared", 7), ERROR_SUCCESS);
    EXPECT_EQ(RegCloseKey(first), ERROR_SUCCESS);
    DWORD type = 0;
    Bytes data;
    EXPECT_EQ(Query(second, "Shared", type, data), ERROR_SUCCESS);
    EXPECT_EQ(RegCloseKey(second), ERROR_SUCCESS);
    EXPECT_EQ(RegCloseKey(second), ERROR_INVALID_HANDLE);
    EXPECT_EQ(RegCloseKey(nullptr), ERROR_INVALID_HANDLE);

    // A closed handle is refused everywhere, through the result alone.
    SetLastError(1234);
    const BYTE byte = 0;
    char name[8];
    DWORD length = sizeof name;
    HKEY key = nullptr;
    EXPECT_EQ(RegQueryValueExA(first, "Shared", nullptr, &type, nullptr, nullptr),
              ERROR_INVALID_HANDLE);
    EXPECT_EQ(RegSetValueExA(first, "Shared", 0, REG_BINARY, &byte, 1), ERROR_INVALID_HANDLE);
    EXPECT_EQ(RegDeleteValueA(first, "Shared"), ERROR_INVALID_HANDLE);
    EXPECT_EQ(RegEnumKeyExA(first, 0, name, &length, nullptr, nullptr, nullptr, nullptr),
              ERROR_INVALID_HANDLE);
    EXPECT_EQ(RegEnumValueA(first, 0, name, &length, nullptr, nullptr, nullptr, nullptr),
              ERROR_INVALID_HANDLE);
    EXPECT_EQ(RegOpenKeyExA(first, "x", 0, KEY_READ, &key), ERROR_INVALID_HANDLE);
    EXPECT_EQ(RegCreateKeyExA(first, "x", 0, nullptr, 0, KEY_READ, nullptr, &key, nullptr),
              ERROR_INVALID_HANDLE);
    EXPECT_EQ(RegDeleteKeyA(first, "x"), ERROR_INVALID_HANDLE);
    EXPECT_EQ(GetLastError(), 1234u);
    HANDLE event = CreateEventA(nullptr, TRUE, FALSE, nullptr);
    EXPECT_EQ(
        RegQueryValueExA(reinterpret_cast<HKEY>(event), "x", nullptr, &type, nullptr, nullptr),
        ERROR_INVALID_HANDLE);
    CloseHandle(event);

    // Predefined keys come back as themselves and stay usable after closing.
    EXPECT_EQ(RegOpenKeyExA(HKEY_CURRENT_USER, nullptr, 0, KEY_READ, &key), ERROR_SUCCESS);
    EXPECT_EQ(key, HKEY_CURRENT_USER);
    EXPECT_EQ(RegCloseKey(HKEY_CURRENT_USER), ERROR_SUCCESS);
    EXPECT_TRUE(Names(HKEY_CURRENT_USER, false).size() > 0);
    // RegOpenKeyA gives back the very handle for an empty path.
    EXPECT_EQ(RegOpenKeyA(Scratch(), nullptr, &key), ERROR_SUCCESS);
    EXPECT_EQ(key, Scratch());
    EXPECT_EQ(RegOpenKeyA(Scratch(), "", &key), ERROR_SUCCESS);
    EXPECT_EQ(key, Scratch());

    EXPECT_EQ(RegOpenKeyA(Scratch(), "x", nullptr), ERROR_INVALID_PARAMETER);
    if (vaskel_test::RunningOnWine())
        GTEST_SKIP() << "Wine's RegOpenKeyExA and RegCreateKeyExA write through a null result";
    EXPECT_EQ(RegOpenKeyExA(Scratch(), "x", 0, KEY_READ, nullptr), ERROR_INVALID_PARAMETER);
    EXPECT_EQ(RegCreateKeyExA(Scratch(), "x", 0, nullptr, 0, KEY_READ, nullptr, nullptr, nullptr),
              ERROR_BADKEY);
}

TEST_F(RegistryApiTest, ValueTypesSizesAndBuffers) {
    const DWORD dword = 0x12345678;
    const ULONGLONG qword = 0x0102030405060708ull;
    const char multi[] = "x\0yz\0"; // with the implicit NUL: two strings and the final NUL
    Bytes big(1 << 20);
    for (std::size_t i = 0; i < big.size(); ++i)
        big[i] = static_cast<BYTE>(i * 7);
    const struct {
        const char* name;
        DWORD type;
        Bytes data;
    } values[] = {
        {"Dword", REG_DWORD, Bytes(AsBytes(&dword), AsBytes(&dword) + 4)},
        {"Qword", REG_QWORD, Bytes(AsBytes(&qword), AsBytes(&qword) + 8)},
        {"Text", REG_SZ, Bytes(AsBytes("text"), AsBytes("text") + 5)},
        {"Multi", REG_MULTI_SZ, Bytes(AsBytes(multi), AsBytes(multi) + sizeof multi)},
        {"Empty", REG_BINARY, Bytes()},
        {"Big", REG_BINARY, big},
        {"Own type", 0x4000, Bytes{1, 2, 3}},
    };
    for (const auto& value : values) {
        SCOPED_TRACE(value.name);
        ASSERT_EQ(RegSetValueExA(Scratch(), value.name, 0, value.type, value.data.data(),
                                 static_cast<DWORD>(value.data.size())),
                  ERROR_SUCCESS);
        DWORD type = 0;
        Bytes data;
        EXPECT_EQ(Query(Scratch(), value.name, type, data), ERROR_SUCCESS);
        EXPECT_EQ(type, value.type);
        EXPECT_EQ(data, value.data);
    }

    // Too small a buffer: ERROR_MORE_DATA with the size needed; the exact size fits.
    BYTE buffer[8] = {};
    DWORD type = 0;
    DWORD size = 4;
    EXPECT_EQ(RegQueryValueExA(Scratch(), "Qword", nullptr, &type, buffer, &size), ERROR_MORE_DATA);
    EXPECT_EQ(size, 8u);
    EXPECT_EQ(type, static_cast<DWORD>(REG_QWORD));
    EXPECT_EQ(RegQueryValueExA(Scratch(), "Qword", nullptr, nullptr, buffer, &size), ERROR_SUCCESS);
    EXPECT_EQ(std::memcmp(buffer, &qword, 8), 0);
    // One variable may take both the type and the size.
    size = 4;
    EXPECT_EQ(RegQueryValueExA(Scratch(), "Dword", nullptr, &size, buffer, &size), ERROR_SUCCESS);
    EXPECT_EQ(RegQueryValueExA(Scratch(), "Dword", nullptr, nullptr, nullptr, nullptr),
              ERROR_SUCCESS);

    // Overwriting replaces type and data; names compare without case and keep theirs.
    EXPECT_EQ(SetText(Scratch(), "DWORD", "now text"), ERROR_SUCCESS);
    Bytes data;
    EXPECT_EQ(Query(Scratch(), "dword", type, data), ERROR_SUCCESS);
    EXPECT_EQ(type, static_cast<DWORD>(REG_SZ));
    EXPECT_EQ(std::string(data.begin(), data.end()), std::string("now text", 9));
    const std::vector<std::string> names = Names(Scratch(), true);
    EXPECT_EQ(std::count(names.begin(), names.end(), "Dword"), 1);

    // A missing value; a size query of one answers 0.
    size = 99;
    EXPECT_EQ(RegQueryValueExA(Scratch(), "Missing", nullptr, &type, nullptr, &size),
              ERROR_FILE_NOT_FOUND);
    EXPECT_EQ(size, 0u);
    EXPECT_EQ(RegDeleteValueA(Scratch(), "Missing"), ERROR_FILE_NOT_FOUND);

    // Bad parameters.
    EXPECT_EQ(RegQueryValueExA(Scratch(), "Dword", &size, &type, nullptr, &size),
              ERROR_INVALID_PARAMETER);
    EXPECT_EQ(RegQueryValueExA(Scratch(), "Dword", nullptr, &type, buffer, nullptr),
              ERROR_INVALID_PARAMETER);
    EXPECT_EQ(RegSetValueExA(Scratch(), "Null", 0, REG_BINARY, nullptr, 4), ERROR_NOACCESS);
    EXPECT_EQ(RegSetValueExA(Scratch(), "Null", 0, REG_SZ, nullptr, 0), ERROR_SUCCESS);
}

TEST_F(RegistryApiTest, DefaultValueAndValueNames) {
    // A null and an empty name both address the key's default value.
    EXPECT_EQ(SetText(Scratch(), nullptr, "default"), ERROR_SUCCESS);
    DWORD type = 0;
    Bytes data;
    EXPECT_EQ(Query(Scratch(), "", type, data), ERROR_SUCCESS);
    EXPECT_EQ(std::string(data.begin(), data.end()), std::string("default", 8));
    EXPECT_EQ(Names(Scratch(), true), std::vector<std::string>{""});
    EXPECT_EQ(RegDeleteValueA(Scratch(), ""), ERROR_SUCCESS);
    EXPECT_EQ(RegQueryValueExA(Scratch(), nullptr, nullptr, &type, nullptr, nullptr),
              ERROR_FILE_NOT_FOUND);

    // Value names of up to 16383 characters.
    const std::string longest(16383, 'v');
    EXPECT_EQ(SetDword(Scratch(), longest.c_str(), 1), ERROR_SUCCESS);
    std::vector<char> name(16384);
    DWORD length = static_cast<DWORD>(name.size());
    EXPECT_EQ(RegEnumValueA(Scratch(), 0, name.data(), &length, nullptr, nullptr, nullptr, nullptr),
              ERROR_SUCCESS);
    EXPECT_EQ(length, 16383u);
    EXPECT_EQ(RegDeleteValueA(Scratch(), longest.c_str()), ERROR_SUCCESS);
    EXPECT_EQ(SetDword(Scratch(), (longest + "v").c_str(), 1), ERROR_INVALID_PARAMETER);
}

TEST_F(RegistryApiTest, StringsStoredWithoutTheirNul) {
    // Stored as given; a query adds the NUL when there is room and does not count it.
    ASSERT_EQ(RegSetValueExA(Scratch(), "Bare", 0, REG_SZ, AsBytes("abcd"), 3), ERROR_SUCCESS);
    BYTE buffer[5] = {'#', '#', '#', '#', '#'};
    DWORD size = 3;
    EXPECT_EQ(RegQueryValueExA(Scratch(), "Bare", nullptr, nullptr, buffer, &size), ERROR_SUCCESS);
    EXPECT_EQ(std::string(buffer, buffer + 5), "abc##");
    size = 5;
    EXPECT_EQ(RegQueryValueExA(Scratch(), "Bare", nullptr, nullptr, buffer, &size), ERROR_SUCCESS);
    EXPECT_EQ(size, 3u);
    EXPECT_EQ(std::string(buffer, buffer + 5), std::string("abc\0#", 5));
    char name[8];
    DWORD length = sizeof name;
    size = 5;
    std::memset(buffer, '#', sizeof buffer);
    EXPECT_EQ(RegEnumValueA(Scratch(), 0, name, &length, nullptr, nullptr, buffer, &size),
              ERROR_SUCCESS);
    EXPECT_EQ(std::string(buffer, buffer + 5), std::string("abc\0#", 5));
    // Binary data gets nothing added.
    ASSERT_EQ(RegSetValueExA(Scratch(), "Bare", 0, REG_BINARY, AsBytes("abcd"), 3), ERROR_SUCCESS);
    std::memset(buffer, '#', sizeof buffer);
    size = 5;
    EXPECT_EQ(RegQueryValueExA(Scratch(), "Bare", nullptr, nullptr, buffer, &size), ERROR_SUCCESS);
    EXPECT_EQ(std::string(buffer, buffer + 5), "abc##");
}

TEST_F(RegistryApiTest, EnumerationOfKeysAndValues) {
    for (const char* name : {"b", "A", "c"}) {
        EXPECT_TRUE(Create(name));
        EXPECT_EQ(SetText(Scratch(), name, name), ERROR_SUCCESS);
    }
    // Every name once, in the same order each time.
    for (const bool values : {false, true}) {
        const std::vector<std::string> names = Names(Scratch(), values);
        EXPECT_EQ(std::set<std::string>(names.begin(), names.end()),
                  (std::set<std::string>{"A", "b", "c"}));
        EXPECT_EQ(names.size(), 3u);
        EXPECT_EQ(Names(Scratch(), values), names);
    }

    // A name needs room for its NUL.
    char name[4] = "###";
    DWORD length = 1;
    EXPECT_EQ(RegEnumKeyExA(Scratch(), 0, name, &length, nullptr, nullptr, nullptr, nullptr),
              ERROR_MORE_DATA);
    length = 2;
    FILETIME written;
    EXPECT_EQ(RegEnumKeyExA(Scratch(), 0, name, &length, nullptr, nullptr, nullptr, &written),
              ERROR_SUCCESS);
    EXPECT_EQ(length, 1u);
    EXPECT_EQ(std::strlen(name), 1u);
    EXPECT_EQ(RegEnumKeyExA(Scratch(), 3, name, &length, nullptr, nullptr, nullptr, nullptr),
              ERROR_NO_MORE_ITEMS);

    // Values report type and data; too small a buffer for either gives
    // ERROR_MORE_DATA with the data's size.
    BYTE data[4] = {};
    DWORD type = 0;
    DWORD size = 1;
    length = sizeof name;
    EXPECT_EQ(RegEnumValueA(Scratch(), 0, name, &length, nullptr, &type, data, &size),
              ERROR_MORE_DATA);
    EXPECT_EQ(size, 2u);
    EXPECT_EQ(type, static_cast<DWORD>(REG_SZ));
    length = 1;
    size = sizeof data;
    EXPECT_EQ(RegEnumValueA(Scratch(), 0, name, &length, nullptr, &type, data, &size),
              ERROR_MORE_DATA);
    length = sizeof name;
    size = sizeof data;
    EXPECT_EQ(RegEnumValueA(Scratch(), 0, name, &length, nullptr, &type, data, &size),
              ERROR_SUCCESS);
    EXPECT_EQ(size, 2u);
    EXPECT_EQ(std::string(reinterpret_cast<char*>(data)), name);
    EXPECT_EQ(RegEnumValueA(Scratch(), 3, name, &length, nullptr, nullptr, nullptr, nullptr),
              ERROR_NO_MORE_ITEMS);
    EXPECT_EQ(RegEnumValueA(Scratch(), 0, nullptr, &length, nullptr, nullptr, nullptr, nullptr),
              ERROR_INVALID_PARAMETER);
    EXPECT_EQ(RegEnumValueA(Scratch(), 0, name, nullptr, nullptr, nullptr, nullptr, nullptr),
              ERROR_INVALID_PARAMETER);

    // Deleting at index 0 until nothing is left reaches every subkey.
    length = sizeof name;
    int deleted = 0;
    while (RegEnumKeyExA(Scratch(), 0, name, &length, nullptr, nullptr, nullptr, nullptr) ==
               ERROR_SUCCESS &&
           RegDeleteKeyA(Scratch(), name) == ERROR_SUCCESS) {
        ++deleted;
        length = sizeof name;
    }
    EXPECT_EQ(deleted, 3);
}

TEST_F(RegistryApiTest, AccessRights) {
    ASSERT_EQ(SetDword(Scratch(), "Value", 1), ERROR_SUCCESS);
    ASSERT_TRUE(Create("Sub"));
    Key reader = Open(nullptr, KEY_READ);
    ASSERT_TRUE(reader);
    DWORD type = 0;
    Bytes data;
    EXPECT_EQ(Query(reader.get(), "Value", type, data), ERROR_SUCCESS);
    EXPECT_EQ(Names(reader.get(), false), std::vector<std::string>{"Sub"});
    EXPECT_EQ(SetDword(reader.get(), "Value", 2), ERROR_ACCESS_DENIED);
    EXPECT_EQ(RegDeleteValueA(reader.get(), "Value"), ERROR_ACCESS_DENIED);
    // Creating and deleting subkeys do not depend on the handle's rights.
    HKEY key = nullptr;
    EXPECT_EQ(
        RegCreateKeyExA(reader.get(), "Made", 0, nullptr, 0, KEY_READ, nullptr, &key, nullptr),
        ERROR_SUCCESS);
    EXPECT_EQ(RegCloseKey(key), ERROR_SUCCESS);
    EXPECT_EQ(RegDeleteKeyA(reader.get(), "Made"), ERROR_SUCCESS);

    Key writer = Open(nullptr, KEY_SET_VALUE);
    ASSERT_TRUE(writer);
    EXPECT_EQ(SetDword(writer.get(), "Value", 3), ERROR_SUCCESS);
    EXPECT_EQ(RegQueryValueExA(writer.get(), "Value", nullptr, &type, nullptr, nullptr),
              ERROR_ACCESS_DENIED);
    char name[8];
    DWORD length = sizeof name;
    EXPECT_EQ(RegEnumKeyExA(writer.get(), 0, name, &length, nullptr, nullptr, nullptr, nullptr),
              ERROR_ACCESS_DENIED);
    EXPECT_EQ(RegEnumValueA(writer.get(), 0, name, &length, nullptr, nullptr, nullptr, nullptr),
              ERROR_ACCESS_DENIED);
    EXPECT_EQ(RegDeleteValueA(writer.get(), "Value"), ERROR_SUCCESS);
}

TEST_F(RegistryApiTest, DeletingKeys) {
    ASSERT_TRUE(Create("Parent\\Child"));
    // A key with subkeys stays, and so does everything in it.
    EXPECT_EQ(RegDeleteKeyA(Scratch(), "Parent"), ERROR_ACCESS_DENIED);
    EXPECT_TRUE(Open("Parent\\Child"));
    EXPECT_EQ(RegDeleteKeyA(Scratch(), "Parent\\Child"), ERROR_SUCCESS);
    EXPECT_FALSE(Open("Parent\\Child"));
    EXPECT_EQ(RegDeleteKeyA(Scratch(), "Parent\\Child"), ERROR_FILE_NOT_FOUND);
    EXPECT_EQ(RegDeleteKeyA(Scratch(), nullptr), ERROR_INVALID_PARAMETER);

    // An empty path deletes the key the handle names, values and all.
    Key parent = Open("Parent");
    ASSERT_TRUE(parent);
    ASSERT_EQ(SetDword(parent.get(), "Value", 1), ERROR_SUCCESS);
    EXPECT_EQ(RegDeleteKeyA(parent.get(), ""), ERROR_SUCCESS);
    Key again = Create("Parent");
    EXPECT_EQ(Names(again.get(), true).size(), 0u);

    // The lookup callers use where the extended form may be missing.
    using DeleteKeyEx = LONG(WINAPI*)(HKEY, LPCSTR, REGSAM, DWORD);
    const auto deleteKeyEx = reinterpret_cast<DeleteKeyEx>(reinterpret_cast<void (*)()>(
        GetProcAddress(GetModuleHandleA("Advapi32.dll"), "RegDeleteKeyExA")));
    ASSERT_NE(deleteKeyEx, nullptr);
    ASSERT_TRUE(Create("Ex\\Inner"));
    EXPECT_EQ(deleteKeyEx(Scratch(), "Ex", 0, 0), ERROR_ACCESS_DENIED);
    EXPECT_EQ(deleteKeyEx(Scratch(), "Ex\\Inner", 0, 0), ERROR_SUCCESS);
    EXPECT_EQ(deleteKeyEx(Scratch(), "ex", 0, 0), ERROR_SUCCESS);
    EXPECT_EQ(deleteKeyEx(Scratch(), "Ex", 0, 0), ERROR_FILE_NOT_FOUND);
}

TEST_F(RegistryApiTest, HandlesToDeletedKeys) {
    Key doomed = Create("Doomed");
    ASSERT_TRUE(doomed);
    ASSERT_EQ(SetDword(doomed.get(), "Value", 1), ERROR_SUCCESS);
    ASSERT_EQ(RegDeleteKeyA(Scratch(), "Doomed"), ERROR_SUCCESS);
    // A key of the same name made afterwards is another key.
    ASSERT_TRUE(Create("Doomed"));

    DWORD type = 0;
    char name[8];
    DWORD length = sizeof name;
    HKEY key = nullptr;
    EXPECT_EQ(RegQueryValueExA(doomed.get(), "Value", nullptr, &type, nullptr, nullptr),
              ERROR_KEY_DELETED);
    EXPECT_EQ(SetDword(doomed.get(), "Value", 2), ERROR_KEY_DELETED);
    EXPECT_EQ(RegEnumKeyExA(doomed.get(), 0, name, &length, nullptr, nullptr, nullptr, nullptr),
              ERROR_KEY_DELETED);
    EXPECT_EQ(RegEnumValueA(doomed.get(), 0, name, &length, nullptr, nullptr, nullptr, nullptr),
              ERROR_KEY_DELETED);
    EXPECT_EQ(RegOpenKeyExA(doomed.get(), "Sub", 0, KEY_READ, &key), ERROR_KEY_DELETED);
    EXPECT_EQ(RegCreateKeyExA(doomed.get(), "Sub", 0, nullptr, 0, KEY_READ, nullptr, &key, nullptr),
              ERROR_KEY_DELETED);
    EXPECT_EQ(Names(Open("Doomed").get(), true).size(), 0u);
    EXPECT_EQ(RegCloseKey(doomed.release()), ERROR_SUCCESS);
}

TEST_F(RegistryApiTest, ThreadsWritingAtOnce) {
    const int threads = 4;
    const int perThread = 100;
    std::atomic<int> failures{0};
    std::vector<std::thread> writers;
    for (int t = 0; t < threads; ++t) {
        writers.emplace_back([&, t] {
            // One shared handle and one of the thread's own.
            HKEY key = nullptr;
            if (RegOpenKeyExA(Scratch(), nullptr, 0, KEY_ALL_ACCESS, &key) != ERROR_SUCCESS)
                ++failures;
            Key own(key);
            for (int i = 0; i < perThread; ++i) {
                const std::string name = std::to_string(t) + "-" + std::to_string(i);
                const DWORD value = static_cast<DWORD>(t * 1000 + i);
                DWORD back = 0;
                DWORD size = sizeof back;
                if (SetDword(i % 2 ? own.get() : Scratch(), name.c_str(), value) != ERROR_SUCCESS ||
                    RegQueryValueExA(i % 2 ? Scratch() : own.get(), name.c_str(), nullptr, nullptr,
                                     reinterpret_cast<BYTE*>(&back), &size) != ERROR_SUCCESS ||
                    back != value)
                    ++failures;
            }
        });
    }
    for (std::thread& writer : writers)
        writer.join();
    EXPECT_EQ(failures.load(), 0);
    EXPECT_EQ(Names(Scratch(), true).size(), static_cast<std::size_t>(threads * perThread));
}

} // namespace
