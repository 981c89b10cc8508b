#include "value_text.h"

#include <gtest/gtest.h>

#include <string>

using namespace vaskel::regtool;

namespace {

Bytes Data(DWORD type, std::string_view text, std::string_view separator = "\\0") {
    Bytes data;
    std::string error;
    EXPECT_TRUE(DataFromText(type, text, separator, data, error)) << text << ": " << error;
    return data;
}

bool Refused(DWORD type, std::string_view text, std::string_view separator = "\\0") {
    Bytes data;
    std::string error;
    const bool refused = !DataFromText(type, text, separator, data, error);
    return refused && !error.empty();
}

Bytes Text(std::string_view text) {
    return Bytes(text.begin(), text.end());
}

TEST(ValueTextTest, NamesTheSettableTypesInAnyCase) {
    DWORD type = 0;
    EXPECT_TRUE(TypeFromName("reg_expand_sz", type));
    EXPECT_EQ(type, static_cast<DWORD>(REG_EXPAND_SZ));
    EXPECT_TRUE(TypeFromName("REG_QWORD", type));
    EXPECT_EQ(type, static_cast<DWORD>(REG_QWORD));
    EXPECT_FALSE(TypeFromName("REG_LINK", type));
    EXPECT_FALSE(TypeFromName("REG_SZX", type));
    EXPECT_FALSE(TypeFromName("", type));
    EXPECT_EQ(TypeName(REG_MULTI_SZ), "REG_MULTI_SZ");
    EXPECT_EQ(TypeName(0x100), "0x100");
}

TEST(ValueTextTest, ReadsNumbersInDecimalOrHexWithinTheirSize) {
    EXPECT_EQ(Data(REG_DWORD, "42"), (Bytes{42, 0, 0, 0}));
    EXPECT_EQ(Data(REG_DWORD, "0123"), (Bytes{123, 0, 0, 0}));
    EXPECT_EQ(Data(REG_DWORD, "0XdeadBEEF"), (Bytes{0xef, 0xbe, 0xad, 0xde}));
    EXPECT_EQ(Data(REG_DWORD, "4294967295"), (Bytes{0xff, 0xff, 0xff, 0xff}));
    EXPECT_EQ(Data(REG_QWORD, "18446744073709551615"), Bytes(8, 0xff));
    EXPECT_EQ(Data(REG_QWORD, "0x100000000"), (Bytes{0, 0, 0, 0, 1, 0, 0, 0}));
    for (const char* text : {"", "4294967296", "0x100000000", "-1", "0x", "00x1", "1 ", "zzz",
                             "deadbeef", "0xabcdefg"})
        EXPECT_TRUE(Refused(REG_DWORD, text)) << text;
    EXPECT_TRUE(Refused(REG_QWORD, "18446744073709551616"));
    EXPECT_TRUE(Refused(REG_QWORD, "0x10000000000000000"));
}

TEST(ValueTextTest, ReadsBinaryAsHexDigits) {
    EXPECT_EQ(Data(REG_BINARY, "fe340EAD"), (Bytes{0xfe, 0x34, 0x0e, 0xad}));
    EXPECT_EQ(Data(REG_BINARY, "DeAdBeEf0DD"), (Bytes{0x0d, 0xea, 0xdb, 0xee, 0xf0, 0xdd}));
    EXPECT_EQ(Data(REG_BINARY, ""), Bytes{});
    EXPECT_TRUE(Refused(REG_BINARY, "0x01"));
    EXPECT_TRUE(Refused(REG_BINARY, "01 02"));
}

TEST(ValueTextTest, SplitsMultipleStringsAtTheSeparator) {
    EXPECT_EQ(Data(REG_MULTI_SZ, "three\\0little\\0strings"),
              Text(std::string_view("three\0little\0strings\0\0", 22)));
    EXPECT_EQ(Data(REG_MULTI_SZ, "a#b", "#"), Text(std::string_view("a\0b\0\0", 5)));
    EXPECT_EQ(Data(REG_MULTI_SZ, "a\\0#b", "#"), Text(std::string_view("a\\0\0b\0\0", 7)));
    EXPECT_EQ(Data(REG_MULTI_SZ, ""), (Bytes{0}));
    EXPECT_EQ(Data(REG_MULTI_SZ, "a\\0"), Text(std::string_view("a\0\0", 3)));
    EXPECT_EQ(Data(REG_MULTI_SZ, "#", "#"), (Bytes{0, 0}));
    EXPECT_EQ(Data(REG_MULTI_SZ, "\\0"), (Bytes{0, 0}));
    for (const char* text : {"##", "#a", "a##b", "a###"})
        EXPECT_TRUE(Refused(REG_MULTI_SZ, text, "#")) << text;
}

TEST(ValueTextTest, TerminatesStrings) {
    EXPECT_EQ(Data(REG_SZ, "x y"), Text(std::string_view("x y\0", 4)));
    EXPECT_EQ(Data(REG_EXPAND_SZ, ""), (Bytes{0}));
    // The system's tool stores REG_NONE text as UTF-16.
    EXPECT_EQ(Data(REG_NONE, "ab"), (Bytes{'a', 0, 'b', 0, 0, 0}));
    EXPECT_EQ(Data(REG_NONE, ""), (Bytes{0, 0}));
}

TEST(ValueTextTest, ShowsDataOnOneLine) {
    EXPECT_EQ(DataText(REG_SZ, Text(std::string_view("ab\0cd\0", 6))), "ab");
    EXPECT_EQ(DataText(REG_SZ, Text("no terminator")), "no terminator");
    EXPECT_EQ(DataText(REG_MULTI_SZ, Text(std::string_view("a\0b\0\0", 5))), "a\\0b");
    EXPECT_EQ(DataText(REG_MULTI_SZ, Text(std::string_view("\0\0", 2))), "");
    EXPECT_EQ(DataText(REG_DWORD, {0x2a, 0, 0, 0}), "0x2a");
    EXPECT_EQ(DataText(REG_DWORD_BIG_ENDIAN, {0, 0, 1, 0}), "0x100");
    EXPECT_EQ(DataText(REG_QWORD, Bytes(8, 0xff)), "0xffffffffffffffff");
    EXPECT_EQ(DataText(REG_DWORD, {1, 2}), "0102");
    EXPECT_EQ(DataText(REG_BINARY, {0x0a, 0xbc}), "0ABC");
    EXPECT_EQ(DataText(REG_NONE, {}), "");
}

} // namespace
