#include <vaskel/value.h>

#include <gtest/gtest.h>

using vaskel::CRGBColor;

TEST(CRGBColor, DefaultsToBlack) {
    CRGBColor color;
    EXPECT_EQ(color.GetColor(), 0u);
    EXPECT_STREQ(color.ToString(), "{0,0,0}");
}

TEST(CRGBColor, ComponentsLayOutAsRedGreenBlueFromTheLowByte) {
    CRGBColor color;
    color.SetColor(1, 2, 3);
    EXPECT_EQ(color.GetColor(), 0x00030201u);
    EXPECT_EQ(color.GetRed(), 1);
    EXPECT_EQ(color.GetGreen(), 2);
    EXPECT_EQ(color.GetBlue(), 3);
    EXPECT_STREQ(color.ToString(), "{1,2,3}");
    EXPECT_EQ(static_cast<DWORD>(color), static_cast<DWORD>(RGB(1, 2, 3)));
}

TEST(CRGBColor, SettingOneComponentKeepsTheOthers) {
    CRGBColor color;
    color.SetColor(1, 2, 3);
    color.SetGreen(200);
    EXPECT_EQ(color.GetRed(), 1);
    EXPECT_EQ(color.GetGreen(), 200);
    EXPECT_EQ(color.GetBlue(), 3);
    color.SetRed(255);
    color.SetBlue(0);
    EXPECT_EQ(color.GetColor(), 0x0000C8FFu);
}

TEST(CRGBColor, KeepsTheHighByteUntilAComponentIsSet) {
    CRGBColor color(0xFF030201);
    EXPECT_EQ(color.GetColor(), 0xFF030201u);
    EXPECT_STREQ(color.ToString(), "{1,2,3}");
    color.SetRed(1);
    EXPECT_EQ(color.GetColor(), 0x00030201u);
}

TEST(CRGBColor, TextShowsComponentsInDecimal) {
    CRGBColor color;
    color.SetColor(255, 128, 0);
    EXPECT_STREQ(color.ToString(), "{255,128,0}");
    CRGBColor copy = color;
    copy.SetColor(0x00FFFFFF);
    EXPECT_STREQ(copy.ToString(), "{255,255,255}");
    EXPECT_STREQ(color.ToString(), "{255,128,0}");
}
