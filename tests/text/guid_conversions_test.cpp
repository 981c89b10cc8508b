// GUIDs, their text and ProgIDs, through a class registered for the test.
#include "support/ole_text.h"
#include "support/registry_sandbox.h"

#include <vaskel/framework/exceptions.h>
#include <vaskel/text.h>

#include <gtest/gtest.h>

#include <chrono>
#include <string>

using namespace vaskel;
using vaskel_test::Ole;

namespace {

const GUID kClass = {0x1A2B3C4D, 0x5E6F, 0x7081, {0x92, 0xA3, 0xB4, 0xC5, 0xD6, 0xE7, 0xF8, 0x09}};
const char kClassText[] = "{1A2B3C4D-5E6F-7081-92A3-B4C5D6E7F809}";
// A class with no ProgID.
const char kBareClassText[] = "{0F1E2D3C-4B5A-6978-8796-A5B4C3D2E1F0}";

// A ProgID for kClass under HKEY_CLASSES_ROOT, removed afterwards.
class RegisteredClass : public ::testing::Test {
protected:
    void SetUp() override {
        const auto stamp = std::chrono::steady_clock::now().time_since_epoch().count();
        m_progId = "VaskelTest.Class" + std::to_string(stamp % 1000000000);
        m_registered = Write(m_progId + "\\CLSID", kClassText) &&
                       Write(std::string("CLSID\\") + kClassText + "\\ProgID", m_progId) &&
                       Write(std::string("CLSID\\") + kBareClassText, "no ProgID");
    }
    void TearDown() override {
        RegDeleteKeyA(HKEY_CLASSES_ROOT, (m_progId + "\\CLSID").c_str());
        RegDeleteKeyA(HKEY_CLASSES_ROOT, m_progId.c_str());
        RegDeleteKeyA(HKEY_CLASSES_ROOT, (std::string("CLSID\\") + kClassText + "\\ProgID").c_str());
        RegDeleteKeyA(HKEY_CLASSES_ROOT, (std::string("CLSID\\") + kClassText).c_str());
        RegDeleteKeyA(HKEY_CLASSES_ROOT, (std::string("CLSID\\") + kBareClassText).c_str());
    }

    static bool Write(const std::string& path, const std::string& value) {
        HKEY key = nullptr;
        if (RegCreateKeyExA(HKEY_CLASSES_ROOT, path.c_str(), 0, nullptr, REG_OPTION_NON_VOLATILE,
                            KEY_ALL_ACCESS, nullptr, &key, nullptr) != ERROR_SUCCESS)
            return false;
        const LONG result = RegSetValueExA(key, nullptr, 0, REG_SZ,
                                           reinterpret_cast<const BYTE*>(value.c_str()),
                                           static_cast<DWORD>(value.size() + 1));
        RegCloseKey(key);
        return result == ERROR_SUCCESS;
    }

    std::string m_progId;
    bool m_registered = false;
};

HRESULT ThrownCode(void (*action)()) {
    try {
        action();
    } catch (const COleException& error) {
        return error.m_sc;
    }
    return S_OK;
}

TEST(GuidText, WritesTheBracedUpperCaseForm) {
    EXPECT_STREQ(AsString(kClass), kClassText);
    CString out;
    EXPECT_EQ(&AsString(out, kClass), &out);
    EXPECT_EQ(out.GetLength(), 38);
}

TEST(GuidText, ReadsGuidStringsInBothWidths) {
    GUID parsed{};
    EXPECT_EQ(AsGUIDFromGuidString(kClassText, parsed), S_OK);
    EXPECT_TRUE(parsed == kClass);
    EXPECT_TRUE(AsGUIDFromGuidString(Ole(kClassText).c_str()) == kClass);
    EXPECT_TRUE(AsGUID(kClassText) == kClass);
    EXPECT_TRUE(FAILED(AsGUIDFromGuidString("not a guid", parsed)));
}

TEST(GuidText, HandsNullTextToTheSystemAlike) {
    GUID wide{};
    GUID narrow{};
    EXPECT_EQ(AsGUIDFromProgID(static_cast<const char*>(nullptr), narrow),
              AsGUIDFromProgID(static_cast<const OLECHAR*>(nullptr), wide));
    EXPECT_TRUE(FAILED(AsGUIDFromProgID(static_cast<const char*>(nullptr), narrow)));
}

TEST_F(RegisteredClass, ResolvesProgIdsBothWays) {
    ASSERT_TRUE(m_registered);
    GUID found{};
    EXPECT_EQ(AsGUIDFromProgID(m_progId.c_str(), found), S_OK);
    EXPECT_TRUE(found == kClass);
    EXPECT_TRUE(AsGUID(m_progId.c_str()) == kClass) << "a ProgID where no GUID text is";
    EXPECT_STREQ(AsProgID(kClass), m_progId.c_str());
    EXPECT_STREQ(AsProgIDFromGuidString(kClassText), m_progId.c_str());
    EXPECT_STREQ(AsGUIDStringFromProgID(m_progId.c_str()), kClassText);
    EXPECT_STREQ(AsGUIDStringFromProgID(Ole(m_progId.c_str()).c_str()), kClassText);
}

TEST_F(RegisteredClass, NamesAnythingAsAProgId) {
    ASSERT_TRUE(m_registered);
    CString out;
    EXPECT_EQ(AsProgID(kClassText, out), S_OK);
    EXPECT_STREQ(out, m_progId.c_str());
    EXPECT_EQ(AsProgID("Some.Name", out), S_OK);
    EXPECT_STREQ(out, "Some.Name");
    EXPECT_EQ(AsProgID(kBareClassText, out), S_OK);
    EXPECT_STREQ(out, kBareClassText);
    EXPECT_STREQ(AsProgID(Ole("Wide.Name").c_str()), "Wide.Name");
}

TEST_F(RegisteredClass, ReportsAndThrowsTheSystemsFailures) {
    ASSERT_TRUE(m_registered);
    GUID found{};
    const HRESULT missing = AsGUID("VaskelTest.NoSuchClass", found);
    EXPECT_TRUE(FAILED(missing));
    EXPECT_EQ(ThrownCode([] { AsGUID("VaskelTest.NoSuchClass"); }), missing);
    CString out("untouched");
    EXPECT_TRUE(FAILED(AsProgIDFromGuidString(kBareClassText, out)));
    EXPECT_STREQ(out, "untouched");
    EXPECT_TRUE(FAILED(AsGUIDStringFromProgID("VaskelTest.NoSuchClass", out)));
    EXPECT_STREQ(out, "untouched");
    EXPECT_TRUE(FAILED(ThrownCode([] { AsProgIDFromGuidString("{bad}"); })));
    EXPECT_TRUE(FAILED(ThrownCode([] { AsGUIDStringFromProgID("VaskelTest.NoSuchClass"); })));
}

} // namespace
