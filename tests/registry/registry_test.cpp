// Tests of registry keys: attaching, navigating, typed values and their
// stored bytes, enumeration, deletion of values, keys and subtrees, COM
// server lookup and the developer switches.
#include "support/registry_sandbox.h"

#include <vaskel/diag.h>
#include <vaskel/framework/mem_file.h>
#include <vaskel/registry.h>

#include <gtest/gtest.h>

#include <cstring>
#include <string>
#include <vector>

using namespace vaskel;

namespace {

using Bytes = std::vector<BYTE>;

class RegistryTest : public ::testing::Test {
protected:
    // The scratch key's stored bytes and type of a value.
    Bytes Stored(const char* value, DWORD* type = nullptr) {
        CRegistry key(scratch.Path(), false);
        DWORD size = 0;
        DWORD storedType = REG_NONE;
        if (RegQueryValueExA(key, value, nullptr, &storedType, nullptr, &size) != ERROR_SUCCESS)
            return Bytes{0xEE};
        Bytes bytes(size);
        RegQueryValueExA(key, value, nullptr, nullptr, bytes.data(), &size);
        if (type)
            *type = storedType;
        return bytes;
    }

    std::string Sub(const char* name) const { return std::string(scratch.Path()) + "\\" + name; }

    vaskel_test::ScratchKey scratch;
};

TEST_F(RegistryTest, BaseKeyPathsAndValidity) {
    CRegistry user;
    EXPECT_TRUE(user.IsValid());
    EXPECT_EQ(static_cast<HKEY>(user), HKEY_CURRENT_USER);
    CString first;
    EXPECT_TRUE(user.EnumKey(0, first));
    EXPECT_FALSE(first.IsEmpty());

    CRegistry missing(Sub("missing").c_str(), false);
    EXPECT_FALSE(missing.IsValid());
    // Nothing falls through to the base key.
    EXPECT_FALSE(missing.SetValue("stray", 1));
    EXPECT_EQ(CRegistry().GetInteger("stray", -1), -1);
    EXPECT_FALSE(CRegistry(missing).IsValid());
    CRegistry created(Sub("A\\B\\C").c_str(), true);
    EXPECT_TRUE(created.IsValid());
    EXPECT_TRUE(CRegistry(Sub("A\\B").c_str(), false).IsValid());

    EXPECT_TRUE(created.SetSubKey(nullptr, false));
    EXPECT_EQ(static_cast<HKEY>(created), HKEY_CURRENT_USER);
    EXPECT_TRUE(created.IsValid());
    EXPECT_FALSE(created.SetSubKey(Sub("nowhere").c_str(), false));
    EXPECT_EQ(static_cast<HKEY>(created), HKEY_CURRENT_USER) << "no subkey after a failure";
}

TEST_F(RegistryTest, UpDownRootAndKeyExist) {
    CRegistry key(Sub("A\\B\\C").c_str(), true);
    ASSERT_EQ(key.Up(), &key);
    EXPECT_TRUE(key.KeyExist("C"));
    EXPECT_FALSE(key.KeyExist("D"));
    ASSERT_EQ(key.Down("D", true), &key);
    EXPECT_TRUE(key.SetValue("where", "D"));
    key.Up();
    EXPECT_TRUE(key.KeyExist("D"));
    EXPECT_EQ(key.Down("E", false), nullptr);

    CRegistry top(HKEY_CURRENT_USER, "Software", false, false);
    EXPECT_EQ(top.Up(), nullptr);
    EXPECT_TRUE(top.IsValid()) << "a single-level path stays open";
    top.Root();
    EXPECT_EQ(static_cast<HKEY>(top), HKEY_CURRENT_USER);
    // From the base key a step down opens the name itself.
    ASSERT_EQ(top.Down("Software", false), &top);
    EXPECT_TRUE(top.KeyExist(std::string(scratch.Path()).substr(9).c_str()));
}

TEST_F(RegistryTest, CopiesOpenTheirOwnHandles) {
    CRegistry original(Sub("copy").c_str(), true);
    ASSERT_TRUE(original.SetValue("n", 7));
    CRegistry copy(original);
    EXPECT_NE(static_cast<HKEY>(copy), static_cast<HKEY>(original));
    original.Root();
    EXPECT_EQ(copy.GetInteger("n", 0), 7);
    CRegistry assigned;
    assigned = copy;
    copy.Detach();
    EXPECT_EQ(assigned.GetInteger("n", 0), 7);

    CRegistry attached;
    HKEY raw = nullptr;
    ASSERT_EQ(RegOpenKeyExA(HKEY_CURRENT_USER, Sub("copy").c_str(), 0, KEY_ALL_ACCESS, &raw),
              ERROR_SUCCESS);
    EXPECT_TRUE(attached.Attach(raw, false));
    EXPECT_EQ(attached.GetInteger("n", 0), 7);
    EXPECT_EQ(attached.Detach(), raw);
    EXPECT_EQ(RegCloseKey(raw), ERROR_SUCCESS) << "a key not owned is left open";
}

TEST_F(RegistryTest, NumbersAndTheirDefaults) {
    CRegistry key(scratch.Path(), false);
    ASSERT_TRUE(key.IsValid());
    EXPECT_TRUE(key.SetValue("int", -5));
    EXPECT_TRUE(key.SetValue("uint", 4000000000u));
    EXPECT_TRUE(key.SetValue("long", -7L));
    EXPECT_TRUE(key.SetValue("ulong", 9UL));
    EXPECT_TRUE(key.SetValue("flag", true));
    DWORD type = 0;
    EXPECT_EQ(Stored("int", &type), (Bytes{0xFB, 0xFF, 0xFF, 0xFF}));
    EXPECT_EQ(type, static_cast<DWORD>(REG_DWORD));
    EXPECT_EQ(Stored("flag"), (Bytes{1, 0, 0, 0}));

    EXPECT_EQ(key.GetInteger("int", 0), -5);
    EXPECT_EQ(key.GetUInteger("uint", 0), 4000000000u);
    EXPECT_EQ(key.GetLong("long", 0), -7L);
    EXPECT_EQ(key.GetULong("int", 0), 0xFFFFFFFBul);
    EXPECT_TRUE(key.GetBool("flag", false));
    EXPECT_EQ(key.GetInteger("absent", 42), 42);
    EXPECT_TRUE(key.GetBool("absent", true));

    EXPECT_TRUE(key.SetValue("pi", 3.5));
    EXPECT_TRUE(key.SetValue("half", 0.5f));
    EXPECT_EQ(Stored("pi", &type).size(), 8u);
    EXPECT_EQ(type, static_cast<DWORD>(REG_BINARY));
    EXPECT_EQ(key.GetDouble("pi", 0.0), 3.5);
    EXPECT_EQ(key.GetFloat("half", 0.0f), 0.5f);
    // Four bytes of any type read as a number; eight do not.
    EXPECT_EQ(key.GetInteger("half", 1), 0x3F000000);
    EXPECT_EQ(key.GetInteger("pi", 1), 1);
    if (sizeof(long) > 4) {
        EXPECT_FALSE(key.SetValue("wide", static_cast<long>(0x100000000LL)));
        EXPECT_FALSE(key.SetValue("wide", static_cast<unsigned long>(0x100000000ULL)));
        EXPECT_EQ(Stored("wide"), Bytes{0xEE});
    }
}

TEST_F(RegistryTest, RawDataAndStructures) {
    CRegistry key(scratch.Path(), false);
    const BYTE six[] = {1, 2, 3, 4, 5, 6};
    ASSERT_TRUE(key.SetValue("six", six, sizeof six));
    BYTE buffer[8] = {};
    DWORD size = sizeof buffer;
    EXPECT_TRUE(key.GetValue("six", buffer, size));
    EXPECT_EQ(size, 6u);
    EXPECT_EQ(std::memcmp(buffer, six, 6), 0);
    size = 2;
    EXPECT_FALSE(key.GetValue("six", buffer, size));
    EXPECT_EQ(size, 6u) << "the stored size comes back";
    EXPECT_FALSE(key.GetStructure("six", buffer, 8));
    EXPECT_TRUE(key.GetStructure("six", buffer, 6));
}

TEST_F(RegistryTest, TextValues) {
    CRegistry key(scratch.Path(), false);
    ASSERT_TRUE(key.SetValue("name", "vaskel"));
    EXPECT_EQ(Stored("name"), (Bytes{'v', 'a', 's', 'k', 'e', 'l', 0}));
    EXPECT_EQ(key.GetString("name", "x"), "vaskel");
    const std::string longText(1000, 'q');
    ASSERT_TRUE(key.SetValue("long", longText.c_str()));
    EXPECT_EQ(std::string(key.GetString("long", "").GetString()), longText);
    EXPECT_TRUE(key.SetValue(nullptr, "default"));
    EXPECT_EQ(key.GetString(nullptr, ""), "default");
    EXPECT_TRUE(key.SetValue("empty", ""));
    EXPECT_EQ(key.GetString("empty", "x"), "");

    const char expandable[] = "%TEMP%";
    ASSERT_EQ(RegSetValueExA(key, "expand", 0, REG_EXPAND_SZ,
                             reinterpret_cast<const BYTE*>(expandable), sizeof expandable),
              ERROR_SUCCESS);
    EXPECT_EQ(key.GetString("expand", "fallback"), "fallback");
    EXPECT_TRUE(key.SetValue("number", 5));
    EXPECT_EQ(key.GetString("number", "fallback"), "fallback");
}

TEST_F(RegistryTest, MultiStringsAppendAndUseTheirDefaults) {
    CRegistry key(scratch.Path(), false);
    CStringArray strings;
    strings.Add("x");
    strings.Add("yz");
    ASSERT_TRUE(key.SetValue("list", strings));
    DWORD type = 0;
    EXPECT_EQ(Stored("list", &type), (Bytes{'x', 0, 'y', 'z', 0, 0}));
    EXPECT_EQ(type, static_cast<DWORD>(REG_MULTI_SZ));

    CStringList list;
    list.AddTail("kept");
    EXPECT_TRUE(key.GetValue("list", list));
    ASSERT_EQ(list.GetCount(), 3);
    EXPECT_EQ(list.GetTail(), "yz");
    CArray<CString, const CString&> array;
    key.GetStringArray("list", array, "default");
    ASSERT_EQ(array.GetSize(), 2);
    EXPECT_EQ(array[0], "x");
    CList<CString, const CString&> fallback;
    key.GetStringList("absent", fallback, "default");
    ASSERT_EQ(fallback.GetCount(), 1);
    EXPECT_EQ(fallback.GetHead(), "default");
    CStringArray untouched;
    EXPECT_FALSE(key.GetValue("absent", untouched));
    EXPECT_EQ(untouched.GetSize(), 0);

    ASSERT_TRUE(key.SetValue("none", CStringList()));
    EXPECT_EQ(Stored("none"), Bytes{0});
    CStringArray nothing;
    EXPECT_TRUE(key.GetValue("none", nothing));
    EXPECT_EQ(nothing.GetSize(), 0);
}

TEST_F(RegistryTest, FilesThroughTheirOwnBuffer) {
    CRegistry key(scratch.Path(), false);
    CMemFile source;
    const char content[] = "file content";
    source.Write(content, sizeof content);
    source.SeekToBegin();
    ASSERT_TRUE(key.SetValue("file", source));
    EXPECT_EQ(Stored("file").size(), sizeof content);

    CMemFile target;
    ASSERT_TRUE(key.GetValue("file", target));
    ASSERT_EQ(target.GetLength(), sizeof content);
    char read[sizeof content] = {};
    target.SeekToBegin();
    target.Read(read, sizeof read);
    EXPECT_STREQ(read, content);
    CMemFile other;
    EXPECT_FALSE(key.GetValue("absent", other));
    key.SetValue("text", "not binary");
    EXPECT_FALSE(key.GetValue("text", other));
}

TEST_F(RegistryTest, EnumerationAndDeletion) {
    CRegistry key(scratch.Path(), false);
    ASSERT_TRUE(CRegistry(Sub("tree\\leaf\\deeper").c_str(), true).IsValid());
    ASSERT_TRUE(CRegistry(Sub("other").c_str(), true).IsValid());
    key.SetValue("a", 1);
    key.SetValue("b", 2);
    CString name;
    std::vector<std::string> values;
    for (DWORD i = 0; key.EnumValue(i, name); ++i)
        values.push_back(name.GetString());
    EXPECT_EQ(values.size(), 2u);
    std::vector<std::string> keys;
    for (DWORD i = 0; key.EnumKey(i, name); ++i)
        keys.push_back(name.GetString());
    EXPECT_EQ(keys.size(), 2u);

    EXPECT_TRUE(key.DeleteValue("a"));
    EXPECT_FALSE(key.DeleteValue("a"));
    EXPECT_FALSE(key.DeleteKey("tree", false)) << "a key with subkeys stays";
    EXPECT_TRUE(key.KeyExist("tree\\leaf\\deeper"));
    EXPECT_TRUE(key.DeleteKey("tree", true));
    EXPECT_FALSE(key.KeyExist("tree"));
    EXPECT_TRUE(key.DeleteKey("other", false));
    EXPECT_EQ(CRegistry::RegDeleteKeyAndSubKeyes(key, "gone"), ERROR_FILE_NOT_FOUND);
}

TEST_F(RegistryTest, LocalServerOfAComClass) {
    const char clsid[] = "{6B1C0D52-7E1A-4C1B-9B3F-2A5D8E0C4F71}";
    EXPECT_TRUE(COMRegistry::GetLocalServer32Value(clsid).IsEmpty());
    const std::string path = std::string("CLSID\\") + clsid + "\\LocalServer32";
    {
        CRegistry server(HKEY_CLASSES_ROOT, path.c_str(), false, true);
        ASSERT_TRUE(server.IsValid());
        ASSERT_TRUE(server.SetValue(nullptr, "server.exe /automation"));
    }
    EXPECT_EQ(COMRegistry::GetLocalServer32Value(clsid), "server.exe /automation");
    CRegistry classes(HKEY_CLASSES_ROOT, "CLSID", false, false);
    EXPECT_TRUE(classes.DeleteKey(clsid, true));
    EXPECT_TRUE(COMRegistry::GetLocalServer32Value(clsid).IsEmpty());
    EXPECT_TRUE(COMRegistry::GetLocalServer32Value(std::string(400, 'x').c_str()).IsEmpty());
}

const char switchesKey[] = "Software\\Orvalen\\Zephrane\\Common\\DeveloperMode";

TEST(DeveloperSwitchesTest, ReadOncePerProcess) {
    // The switches are read at the first question; a later change waits for
    // the next start.
    const bool before = IsDeveloperMode();
    {
        CRegistry key(switchesKey, true);
        ASSERT_TRUE(key.SetValue("DeveloperMode", !before));
    }
    EXPECT_EQ(IsDeveloperMode(), before);
    CRegistry(HKEY_CURRENT_USER, "Software\\Orvalen", false, false).DeleteKey("Zephrane", true);
}

TEST(DeveloperSwitchesDeathTest, ReadFromTheUsersRegistry) {
    GTEST_FLAG_SET(death_test_style, "threadsafe");
    // In a fresh process, so that the switches are read for the first time.
    EXPECT_EXIT(
        {
            CRegistry key(switchesKey, true);
            key.SetValue("DeveloperMode", 1);
            key.DeleteValue("IgnoreAssert");
            std::exit(IsDeveloperMode() && !VKIgnoreAssert() ? 0 : 1);
        },
        ::testing::ExitedWithCode(0), "");
    CRegistry(HKEY_CURRENT_USER, "Software\\Orvalen", false, false).DeleteKey("Zephrane", true);
}

} // namespace
