// Length-prefixed strings: byte counts, embedded NULs, odd byte lengths and
// the terminator, and reallocation in place.
#include <vaskel/win32.h>

#include <gtest/gtest.h>

#include <cstring>
#include <string>

namespace {

std::u16string Text(BSTR text) {
    return std::u16string(reinterpret_cast<const char16_t*>(text), SysStringLen(text));
}

const OLECHAR kHello[] = {'h', 'e', 'l', 'l', 'o', 0};

TEST(BstrAllocation, CountsBytesAndCharactersAndTerminates) {
    BSTR text = SysAllocString(kHello);
    ASSERT_NE(text, nullptr);
    EXPECT_EQ(SysStringLen(text), 5u);
    EXPECT_EQ(SysStringByteLen(text), 10u);
    EXPECT_EQ(reinterpret_cast<const std::uint32_t*>(text)[-1], 10u);
    EXPECT_EQ(text[5], 0);
    EXPECT_EQ(Text(text), u"hello");
    SysFreeString(text);
}

TEST(BstrAllocation, KeepsEmbeddedNuls) {
    const OLECHAR source[] = {'a', 0, 'b', 0, 'c'};
    BSTR text = SysAllocStringLen(source, 5);
    ASSERT_NE(text, nullptr);
    EXPECT_EQ(SysStringLen(text), 5u);
    EXPECT_EQ(std::memcmp(text, source, sizeof source), 0);
    EXPECT_EQ(text[5], 0);
    SysFreeString(text);
}

TEST(BstrAllocation, NullTextGivesZeroedCharactersOfTheLength) {
    BSTR text = SysAllocStringLen(nullptr, 4);
    ASSERT_NE(text, nullptr);
    EXPECT_EQ(SysStringLen(text), 4u);
    EXPECT_EQ(text[4], 0);
    SysFreeString(text);
    EXPECT_EQ(SysAllocString(nullptr), nullptr);
}

TEST(BstrAllocation, ByteLengthsKeepOddCountsAndTerminate) {
    const char bytes[] = "abc\0e";
    BSTR text = SysAllocStringByteLen(bytes, 5);
    ASSERT_NE(text, nullptr);
    EXPECT_EQ(SysStringByteLen(text), 5u);
    EXPECT_EQ(SysStringLen(text), 2u);
    const auto* raw = reinterpret_cast<const unsigned char*>(text);
    EXPECT_EQ(std::memcmp(raw, bytes, 5), 0);
    // A NUL byte after the data, then a whole NUL character.
    EXPECT_EQ(raw[5], 0);
    EXPECT_EQ(text[3], 0);
    SysFreeString(text);

    BSTR empty = SysAllocStringByteLen("", 0);
    ASSERT_NE(empty, nullptr);
    EXPECT_EQ(SysStringByteLen(empty), 0u);
    EXPECT_EQ(empty[0], 0);
    SysFreeString(empty);
}

TEST(BstrAllocation, NullStringIsEmpty) {
    EXPECT_EQ(SysStringLen(nullptr), 0u);
    EXPECT_EQ(SysStringByteLen(nullptr), 0u);
    SysFreeString(nullptr);
}

TEST(BstrAllocation, LengthsBeyondThirtyTwoBitsFail) {
    EXPECT_EQ(SysAllocStringLen(nullptr, 0x80000000u), nullptr);
    EXPECT_EQ(SysAllocStringByteLen(nullptr, 0xFFFFFFFFu), nullptr);
}

TEST(BstrReallocation, ReplacesTheText) {
    BSTR text = SysAllocString(kHello);
    const OLECHAR longer[] = {'g', 'o', 'o', 'd', 'b', 'y', 'e', '!', 0};
    ASSERT_TRUE(SysReAllocString(&text, longer));
    EXPECT_EQ(Text(text), u"goodbye!");
    ASSERT_TRUE(SysReAllocStringLen(&text, longer, 2));
    EXPECT_EQ(Text(text), u"go");
    EXPECT_EQ(text[2], 0);
    SysFreeString(text);
}

TEST(BstrReallocation, AcceptsTextFromTheOldString) {
    BSTR text = SysAllocString(kHello);
    ASSERT_TRUE(SysReAllocString(&text, text + 2));
    EXPECT_EQ(Text(text), u"llo");
    ASSERT_TRUE(SysReAllocStringLen(&text, text + 1, 2));
    EXPECT_EQ(Text(text), u"lo");
    SysFreeString(text);
}

TEST(BstrReallocation, StartsFromANullString) {
    BSTR text = nullptr;
    ASSERT_TRUE(SysReAllocStringLen(&text, kHello, 3));
    EXPECT_EQ(Text(text), u"hel");
    SysFreeString(text);
}

TEST(BstrReallocation, NullTextGivesTheEmptyString) {
    BSTR text = SysAllocString(kHello);
    ASSERT_TRUE(SysReAllocString(&text, nullptr));
    EXPECT_EQ(SysStringLen(text), 0u);
    SysFreeString(text);
}

TEST(BstrReallocation, NullTextKeepsTheOldPrefix) {
    BSTR text = SysAllocString(kHello);
    ASSERT_TRUE(SysReAllocStringLen(&text, nullptr, 8));
    EXPECT_EQ(SysStringLen(text), 8u);
    EXPECT_EQ(Text(text).substr(0, 5), u"hello");
    EXPECT_EQ(text[8], 0);
    SysFreeString(text);
}

TEST(BstrReallocation, FailureLeavesTheStringAsItWas) {
    BSTR text = SysAllocString(kHello);
    BSTR before = text;
    EXPECT_FALSE(SysReAllocStringLen(&text, nullptr, 0x80000000u));
    EXPECT_EQ(text, before);
    EXPECT_EQ(Text(text), u"hello");
    SysFreeString(text);
}

} // namespace
