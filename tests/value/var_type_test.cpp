#include <vaskel/value.h>

#include <gtest/gtest.h>

#include <cstring>

using namespace vaskel;

TEST(VarTypeX, EveryNamedTagReadsBackFromItsNameInAnyCase) {
    const struct {
        VARENUM tag;
        const char* name;
    } cases[] = {
        {VT_EMPTY, "Empty"}, {VT_NULL, "Null"}, {VT_I2, "Short"},     {VT_I4, "Long"},
        {VT_R4, "Float"},    {VT_R8, "Double"}, {VT_DATE, "Date"},    {VT_BSTR, "ComString"},
        {VT_ERROR, "Error"}, {VT_BOOL, "Bool"}, {VT_I1, "Char"},      {VT_UI1, "Byte"},
        {VT_UI2, "UShort"},  {VT_UI4, "ULong"}, {VT_I8, "Long64"},    {VT_UI8, "ULong64"},
        {VT_INT, "Int"},     {VT_UINT, "UInt"}, {VT_LPSTR, "String"}, {VT_BLOB, "BLOB"},
    };
    for (const auto& c : cases) {
        EXPECT_STREQ(VarTypeX(c.tag).ToString(), c.name);
        EXPECT_STREQ(VarTypeX::ToString(static_cast<unsigned short>(c.tag)), c.name);
        CString upper(c.name);
        upper.MakeUpper();
        VarTypeX type(VT_CY);
        EXPECT_TRUE(type.Parse(upper) && type == c.tag) << c.name;
    }
    VARENUM parsed = VT_CY;
    EXPECT_TRUE(VarTypeX::Parse("blob", parsed) && parsed == 65);
    EXPECT_STREQ(VarTypeX::ToString(6), "Unknown");
    EXPECT_STREQ(VarTypeX::ToString(22), "Int");
    EXPECT_STREQ(VarTypeX::ToString(VT_LPWSTR), "Unknown");
    EXPECT_STREQ(VarTypeX::ToString(static_cast<unsigned short>(VT_ARRAY | VT_I4)), "Unknown");
}

TEST(VarTypeX, ParsingAnythingButAWholeNameChangesNothing) {
    for (const char* text :
         {"Unknown", " Long", "Long ", "Lon", "Longer", "", static_cast<const char*>(nullptr)}) {
        VARENUM parsed = VT_CY;
        EXPECT_FALSE(VarTypeX::Parse(text, parsed));
        EXPECT_EQ(parsed, VT_CY);
        VarTypeX type(VT_BLOB);
        EXPECT_FALSE(type.Parse(text));
        EXPECT_TRUE(type.IsBlob());
    }
}

TEST(VarTypeX, ClassesFollowTheTable) {
    // N numeric, I integral, S signed, U unsigned, F floating point, T text.
    const struct {
        VARENUM tag;
        const char* classes;
    } cases[] = {
        {VT_EMPTY, ""},   {VT_NULL, ""},
        {VT_ERROR, ""},   {VT_BLOB, ""},
        {VT_CY, ""},      {VT_I2, "NIS"},
        {VT_I4, "NIS"},   {VT_I1, "NIS"},
        {VT_I8, "NIS"},   {VT_INT, "NIS"},
        {VT_BOOL, "NIU"}, {VT_UI1, "NIU"},
        {VT_UI2, "NIU"},  {VT_UI4, "NIU"},
        {VT_UI8, "NIU"},  {VT_UINT, "NIU"},
        {VT_R4, "NF"},    {VT_R8, "NF"},
        {VT_DATE, "NF"},  {VT_LPSTR, "T"},
        {VT_BSTR, "T"},   {static_cast<VARENUM>(VT_ARRAY | VT_I4), ""},
    };
    for (const auto& c : cases) {
        const VarTypeX type(c.tag);
        const auto has = [&](char letter) { return std::strchr(c.classes, letter) != nullptr; };
        SCOPED_TRACE(static_cast<int>(c.tag));
        EXPECT_EQ(type.IsNumeric(), has('N'));
        EXPECT_EQ(type.IsIntegral(), has('I'));
        EXPECT_EQ(type.IsSignedIntegral(), has('S'));
        EXPECT_EQ(type.IsUnsignedIntegral(), has('U'));
        EXPECT_EQ(type.IsFloatingPoint(), has('F'));
        EXPECT_EQ(type.IsText(), has('T'));
    }
}

TEST(VarTypeX, TheValueOfGetTypeIsOneTagWithTheHelpersComparisons) {
    static_assert(sizeof(CVKEnumHelperWrapper<VarTypeX>) == 4, "a 32-bit value");
    const CVKEnumHelperWrapper<VarTypeX> type = CGenericVal(7ul).GetType();
    EXPECT_TRUE(type.IsULong() && type.IsUnsignedIntegral() && !type.IsLong());
    EXPECT_TRUE(type == VT_UI4 && type == 19 && type.Is(19) &&
                type == CVKEnumHelper<VARENUM>(VT_UI4));
    EXPECT_TRUE(type != VT_I4 && type > VT_I4 && type < VT_LPSTR && type < 20 && type > 18);
    VarTypeX setter;
    EXPECT_TRUE(setter.IsEmpty());
    setter.SetAsULong();
    EXPECT_EQ(setter, type);
}
