// GUIDs as text, written in the one braced upper-case form and read back in
// either case, with the refusals for every other shape; and task memory, in
// which the text comes back.
#include <vaskel/win32.h>

#include <gtest/gtest.h>

#include <cstring>
#include <memory>
#include <string>

namespace {

using OleString = std::basic_string<OLECHAR>;

OleString Ole(const char* ascii) {
    OleString text;
    for (; *ascii; ++ascii)
        text += static_cast<OLECHAR>(*ascii);
    return text;
}

std::string Ascii(const OLECHAR* text) {
    std::string ascii;
    for (; *text; ++text)
        ascii += static_cast<char>(*text);
    return ascii;
}

const GUID kSample = {0x0123ABCD, 0x4567, 0x89EF, {0xFE, 0xDC, 0xBA, 0x98, 0x76, 0x54, 0x32, 0x10}};
const char kSampleText[] = "{0123ABCD-4567-89EF-FEDC-BA9876543210}";
const GUID kFilled = {0xCCCCCCCC, 0xCCCC, 0xCCCC, {0xCC, 0xCC, 0xCC, 0xCC, 0xCC, 0xCC, 0xCC, 0xCC}};

} // namespace

TEST(GuidText, IsWrittenBracedInUpperCaseWithItsNul) {
    OLECHAR text[39];
    EXPECT_EQ(StringFromGUID2(kSample, text, 39), 39);
    EXPECT_EQ(text[38], 0);
    EXPECT_EQ(Ascii(text), kSampleText);

    // The fields are numbers: their bytes come most significant first.
    const GUID small = {0x1, 0x2, 0x3, {0, 0, 0, 0, 0, 0, 0, 0xA}};
    ASSERT_EQ(StringFromGUID2(small, text, 39), 39);
    EXPECT_EQ(Ascii(text), "{00000001-0002-0003-0000-00000000000A}");
}

TEST(GuidText, NeedsRoomForAllOfItsCharacters) {
    OLECHAR text[64];
    std::fill(std::begin(text), std::end(text), OLECHAR('x'));
    EXPECT_EQ(StringFromGUID2(kSample, text, 38), 0);
    EXPECT_EQ(StringFromGUID2(kSample, text, 0), 0);
    EXPECT_EQ(StringFromGUID2(kSample, text, 64), 39);
    EXPECT_EQ(text[39], OLECHAR('x')); // nothing written past the NUL
}

TEST(GuidText, ComesBackInTaskMemory) {
    LPOLESTR text = nullptr;
    ASSERT_EQ(StringFromCLSID(kSample, &text), S_OK);
    ASSERT_NE(text, nullptr);
    EXPECT_EQ(Ascii(text), kSampleText);
    GUID back = kFilled;
    EXPECT_EQ(CLSIDFromString(text, &back), S_OK);
    EXPECT_EQ(back, kSample);
    CoTaskMemFree(text);
}

TEST(GuidText, IsReadInEitherCase) {
    for (const char* text :
         {"{0123ABCD-4567-89EF-FEDC-BA9876543210}", "{0123abcd-4567-89ef-fedc-ba9876543210}",
          "{0123aBcD-4567-89eF-FeDc-bA9876543210}"}) {
        GUID guid = kFilled;
        EXPECT_EQ(CLSIDFromString(Ole(text).c_str(), &guid), S_OK) << text;
        EXPECT_EQ(guid, kSample) << text;
    }
}

TEST(GuidText, NullTextIsTheNullClassAndANullResultIsRefused) {
    GUID guid = kFilled;
    EXPECT_EQ(CLSIDFromString(nullptr, &guid), S_OK);
    EXPECT_EQ(guid, GUID{});
    EXPECT_EQ(CLSIDFromString(Ole(kSampleText).c_str(), nullptr), E_INVALIDARG);
}

TEST(GuidText, RefusesEveryOtherShape) {
    // Texts that are not braced are taken for ProgIDs, and none of these is one.
    for (const char* text :
         {"", "{}", "0123ABCD-4567-89EF-FEDC-BA9876543210", "{0123ABCD-4567-89EF-FEDC-BA9876543210",
          "{0123ABCD-4567-89EF-FEDC-BA9876543210}x", "{0123ABCD-4567-89EF-FEDC-BA987654321}",
          "{0123ABCD-4567-89EF-FEDC-BA98765432100}", "{0123ABCD-4567-89EF-FEDC-BA987654321G}",
          "{0123ABC-D4567-89EF-FEDC-BA9876543210}", "{0123ABCD 4567-89EF-FEDC-BA9876543210}",
          "{ 123ABCD-4567-89EF-FEDC-BA9876543210}", "{+123ABCD-4567-89EF-FEDC-BA9876543210}",
          "(0123ABCD-4567-89EF-FEDC-BA9876543210)"}) {
        GUID guid = kFilled;
        EXPECT_EQ(CLSIDFromString(Ole(text).c_str(), &guid), CO_E_CLASSSTRING) << text;
    }
}

TEST(GuidText, StopsReadingAtTheNul) {
    // Each prefix in a heap block of exactly its size, so that a read past
    // the NUL lands outside the block.
    const OleString whole = Ole(kSampleText);
    for (std::size_t length = 1; length < whole.size(); ++length) {
        std::unique_ptr<OLECHAR[]> text(new OLECHAR[length + 1]);
        std::memcpy(text.get(), whole.data(), length * sizeof(OLECHAR));
        text[length] = 0;
        GUID guid = kFilled;
        EXPECT_EQ(CLSIDFromString(text.get(), &guid), CO_E_CLASSSTRING) << length;
    }
}

TEST(TaskMemory, BlocksOfNoBytesAreDistinctAndUsable) {
    void* first = CoTaskMemAlloc(0);
    void* second = CoTaskMemAlloc(0);
    ASSERT_NE(first, nullptr);
    ASSERT_NE(second, nullptr);
    EXPECT_NE(first, second);
    CoTaskMemFree(first);
    CoTaskMemFree(second);
    CoTaskMemFree(nullptr); // does nothing
}

TEST(TaskMemory, ReallocationKeepsTheContentsAndToNoBytesFrees) {
    auto* block = static_cast<char*>(CoTaskMemRealloc(nullptr, 8));
    ASSERT_NE(block, nullptr);
    std::memcpy(block, "1234567", 8);
    block = static_cast<char*>(CoTaskMemRealloc(block, 4096));
    ASSERT_NE(block, nullptr);
    EXPECT_STREQ(block, "1234567");
    block[4095] = 'x';
    block = static_cast<char*>(CoTaskMemRealloc(block, 4));
    ASSERT_NE(block, nullptr);
    EXPECT_EQ(std::memcmp(block, "1234", 4), 0);
    EXPECT_EQ(CoTaskMemRealloc(block, 0), nullptr); // freed

    void* empty = CoTaskMemRealloc(nullptr, 0);
    EXPECT_NE(empty, nullptr);
    CoTaskMemFree(empty);
}

TEST(TaskMemory, ARequestNoHeapCanServeFails) {
    EXPECT_EQ(CoTaskMemAlloc(~SIZE_T{0}), nullptr);
    void* block = CoTaskMemAlloc(16);
    ASSERT_NE(block, nullptr);
    // A failed reallocation leaves the block as it was.
    EXPECT_EQ(CoTaskMemRealloc(block, ~SIZE_T{0}), nullptr);
    CoTaskMemFree(block);
}
