// Class names in the registry: a ProgID to its class and back, and the
// failures for names and classes that are not registered. Every name is
// unique to the run and removed afterwards, since under Windows the entries
// land in the machine's own registry.
#include "support/registry_sandbox.h"

#include <vaskel/win32.h>

#include <gtest/gtest.h>

#include <cctype>
#include <chrono>
#include <cstring>
#include <string>

namespace {

using OleString = std::basic_string<OLECHAR>;

OleString Ole(const std::string& ascii) {
    return OleString(ascii.begin(), ascii.end());
}

std::string Ascii(const OLECHAR* text) {
    std::string ascii;
    for (; *text; ++text)
        ascii += static_cast<char>(*text);
    return ascii;
}

// A class identifier no other run uses.
GUID UniqueClass() {
    static unsigned counter = 0;
    const auto stamp =
        static_cast<ULONGLONG>(std::chrono::steady_clock::now().time_since_epoch().count());
    GUID guid = {0x7A5E1000u + ++counter, 0x4B1D, 0x4E57, {}};
    std::memcpy(guid.Data4, &stamp, sizeof guid.Data4);
    return guid;
}

std::string GuidText(const GUID& guid) {
    OLECHAR text[39];
    StringFromGUID2(guid, text, 39);
    return Ascii(text);
}

void SetDefault(const std::string& path, const std::string& value) {
    HKEY key = nullptr;
    ASSERT_EQ(RegCreateKeyExA(HKEY_CLASSES_ROOT, path.c_str(), 0, nullptr, REG_OPTION_NON_VOLATILE,
                              KEY_ALL_ACCESS, nullptr, &key, nullptr),
              ERROR_SUCCESS)
        << path;
    ASSERT_EQ(RegSetValueExA(key, nullptr, 0, REG_SZ, reinterpret_cast<const BYTE*>(value.c_str()),
                             static_cast<DWORD>(value.size() + 1)),
              ERROR_SUCCESS);
    RegCloseKey(key);
}

void CreateKey(const std::string& path) {
    HKEY key = nullptr;
    ASSERT_EQ(RegCreateKeyExA(HKEY_CLASSES_ROOT, path.c_str(), 0, nullptr, REG_OPTION_NON_VOLATILE,
                              KEY_ALL_ACCESS, nullptr, &key, nullptr),
              ERROR_SUCCESS)
        << path;
    RegCloseKey(key);
}

// A ProgID and a class that name each other, removed with the fixture.
class ClassNames : public ::testing::Test {
protected:
    void SetUp() override {
        m_class = UniqueClass();
        m_progId = "Vaskel.Test" + std::to_string(m_class.Data1) + "." +
                   std::to_string(std::chrono::steady_clock::now().time_since_epoch().count());
        m_classKey = "CLSID\\" + GuidText(m_class);
        SetDefault(m_progId + "\\CLSID", GuidText(m_class));
        SetDefault(m_classKey + "\\ProgID", m_progId);
    }
    void TearDown() override {
        RegDeleteKeyA(HKEY_CLASSES_ROOT, (m_progId + "\\CLSID").c_str());
        RegDeleteKeyA(HKEY_CLASSES_ROOT, m_progId.c_str());
        RegDeleteKeyA(HKEY_CLASSES_ROOT, (m_classKey + "\\ProgID").c_str());
        RegDeleteKeyA(HKEY_CLASSES_ROOT, m_classKey.c_str());
    }

    GUID m_class{};
    std::string m_progId;
    std::string m_classKey;
};

const GUID kFilled = {0xCCCCCCCC, 0xCCCC, 0xCCCC, {0xCC, 0xCC, 0xCC, 0xCC, 0xCC, 0xCC, 0xCC, 0xCC}};

} // namespace

TEST_F(ClassNames, AProgIdNamesItsClassWhateverItsCase) {
    GUID clsid = kFilled;
    EXPECT_EQ(CLSIDFromProgID(Ole(m_progId).c_str(), &clsid), S_OK);
    EXPECT_EQ(clsid, m_class);

    std::string upper = m_progId;
    for (char& c : upper)
        c = static_cast<char>(std::toupper(static_cast<unsigned char>(c)));
    clsid = kFilled;
    EXPECT_EQ(CLSIDFromProgID(Ole(upper).c_str(), &clsid), S_OK);
    EXPECT_EQ(clsid, m_class);

    // A text that is no GUID is taken for a ProgID.
    clsid = kFilled;
    EXPECT_EQ(CLSIDFromString(Ole(m_progId).c_str(), &clsid), S_OK);
    EXPECT_EQ(clsid, m_class);
}

TEST_F(ClassNames, AClassNamesItsProgIdInTaskMemory) {
    LPOLESTR progId = nullptr;
    ASSERT_EQ(ProgIDFromCLSID(m_class, &progId), S_OK);
    ASSERT_NE(progId, nullptr);
    EXPECT_EQ(Ascii(progId), m_progId);
    CoTaskMemFree(progId);
}

TEST_F(ClassNames, AnUnregisteredProgIdIsABadClassString) {
    GUID clsid = kFilled;
    EXPECT_EQ(CLSIDFromProgID(Ole(m_progId + ".Missing").c_str(), &clsid), CO_E_CLASSSTRING);
    EXPECT_EQ(clsid, GUID{});
    clsid = kFilled;
    EXPECT_EQ(CLSIDFromString(Ole(m_progId + ".Missing").c_str(), &clsid), CO_E_CLASSSTRING);
    clsid = kFilled;
    EXPECT_EQ(CLSIDFromProgID(Ole("").c_str(), &clsid), CO_E_CLASSSTRING);
}

TEST_F(ClassNames, AProgIdWithoutAValidClassIsABadClassString) {
    const std::string noClass = m_progId + ".NoClass";
    CreateKey(noClass);
    GUID clsid = kFilled;
    EXPECT_EQ(CLSIDFromProgID(Ole(noClass).c_str(), &clsid), CO_E_CLASSSTRING);
    RegDeleteKeyA(HKEY_CLASSES_ROOT, noClass.c_str());

    const std::string badClass = m_progId + ".BadClass";
    for (const char* value : {"garbage", "{0123ABCD-4567-89EF-FEDC-BA987654321}", ""}) {
        SetDefault(badClass + "\\CLSID", value);
        clsid = kFilled;
        EXPECT_EQ(CLSIDFromProgID(Ole(badClass).c_str(), &clsid), CO_E_CLASSSTRING) << value;
    }
    RegDeleteKeyA(HKEY_CLASSES_ROOT, (badClass + "\\CLSID").c_str());
    RegDeleteKeyA(HKEY_CLASSES_ROOT, badClass.c_str());
}

TEST_F(ClassNames, AClassThatIsNotRegisteredOrHasNoProgIdIsRefused) {
    LPOLESTR progId = reinterpret_cast<LPOLESTR>(&m_class); // must be reset
    EXPECT_EQ(ProgIDFromCLSID(UniqueClass(), &progId), REGDB_E_CLASSNOTREG);
    EXPECT_EQ(progId, nullptr);

    const GUID bare = UniqueClass();
    const std::string bareKey = "CLSID\\" + GuidText(bare);
    CreateKey(bareKey);
    progId = reinterpret_cast<LPOLESTR>(&m_class);
    EXPECT_EQ(ProgIDFromCLSID(bare, &progId), REGDB_E_CLASSNOTREG);
    EXPECT_EQ(progId, nullptr);
    RegDeleteKeyA(HKEY_CLASSES_ROOT, bareKey.c_str());
}

TEST_F(ClassNames, NullArgumentsAreRefused) {
    GUID clsid = kFilled;
    EXPECT_EQ(CLSIDFromProgID(nullptr, &clsid), E_INVALIDARG);
    EXPECT_EQ(clsid, kFilled);
    EXPECT_EQ(CLSIDFromProgID(Ole(m_progId).c_str(), nullptr), E_INVALIDARG);
    EXPECT_EQ(ProgIDFromCLSID(m_class, nullptr), E_INVALIDARG);
}
