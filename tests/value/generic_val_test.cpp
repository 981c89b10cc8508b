#include <vaskel/diag.h>
#include <vaskel/value.h>

#include <gtest/gtest.h>

#include <clocale>
#include <cstdint>
#include <cstring>
#include <limits>
#include <string>

using namespace vaskel;

namespace {

// Reaches the protected members, as the name-value grammar does.
class TestVal : public CGenericVal {
public:
    using CGenericVal::CGenericVal;
    using CGenericVal::ChangeType;
    using CGenericVal::GetStringRef;
};

CGenericVal Retyped(const CGenericVal& from, VARENUM type) {
    TestVal value;
    value.Copy(from);
    value.ChangeType(type);
    return value;
}

CGenericVal Error(long code) {
    CGenericVal value;
    value.SetError(code);
    return value;
}

CGenericVal Date(double value) {
    return CGenericVal(CDateTime(value));
}

CBlob Bytes(const char* text) {
    return CBlob(text, static_cast<DWORD>(std::strlen(text)));
}

const double kNaN = std::numeric_limits<double>::quiet_NaN();
const double kInfinity = std::numeric_limits<double>::infinity();
using UShort = unsigned short;
using Byte = unsigned char;

} // namespace

TEST(CGenericVal, EachArgumentGivesItsTagNumberAndText) {
    const struct {
        CGenericVal value;
        VARENUM tag;
        double number;
        const char* text;
    } cases[] = {
        {CGenericVal(), VT_EMPTY, 0.0, ""},
        {Retyped(CGenericVal(1.0), VT_NULL), VT_NULL, 0.0, ""},
        {Error(7), VT_ERROR, 0.0, ""},
        {CGenericVal(-1.5), VT_R8, -1.5, "-1.5"},
        {CGenericVal(0.25f), VT_R4, 0.25, "0.25"},
        {CGenericVal(true), VT_BOOL, 1.0, "True"},
        {CGenericVal(false), VT_BOOL, 0.0, "False"},
        {CGenericVal(4294967295ul), VT_UI4, 4294967295.0, "4294967295"},
        {CGenericVal(4000000000u), VT_UI4, 4000000000.0, "4000000000"},
        {CGenericVal(-2147483647 - 1), VT_I4, -2147483648.0, "-2147483648"},
        {CGenericVal(-8l), VT_I4, -8.0, "-8"},
        {CGenericVal(UShort(65535)), VT_UI2, 65535.0, "65535"},
        {CGenericVal(short(-32768)), VT_I2, -32768.0, "-32768"},
        {CGenericVal(Byte(255)), VT_UI1, 255.0, "255"},
        {CGenericVal('A'), VT_I1, 65.0, "65"},
        {CGenericVal(char(-1)), VT_I1, -1.0, "-1"},
        // A day number is unsigned, and becomes midnight of its day.
        {CGenericVal(CJulianDate(0xFFFFFFFF)), VT_DATE, 4294967295.0, nullptr},
        {Date(2.5), VT_DATE, 2.5, nullptr},
        {CGenericVal("12"), VT_LPSTR, 0.0, "12"},
        {CGenericVal(static_cast<const char*>(nullptr)), VT_LPSTR, 0.0, ""},
        {CGenericVal(Bytes("foo")), VT_BLOB, 0.0, "Zm9v"},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(VarTypeX::ToString(c.tag));
        EXPECT_TRUE(c.value.GetType() == c.tag && c.value.GetType() == static_cast<int>(c.tag));
        EXPECT_EQ(c.value.IsEmpty(), c.tag == VT_EMPTY);
        EXPECT_EQ(c.value.GetAsDouble(), c.number);
        const CString expected =
            c.text ? CString(c.text) : CDateTime(c.number).Format(0, LOCALE_USER_DEFAULT);
        CString out("previous");
        EXPECT_STREQ(c.value.GetAsString(out), expected);
        EXPECT_STREQ(c.value.ToString(), expected);
    }
}

TEST(CGenericVal, A64BitLongPast32BitsIsRefusedNotCut) {
    if (sizeof(long) == 4)
        GTEST_SKIP() << "long has 32 bits here: every long fits";
    // One past each end of 32 bits; the step is 0 where long has 32 bits, so
    // that the skipped test still compiles without overflow.
    const long step = sizeof(long) > 4 ? 1 : 0;
    const long tooBig = static_cast<long>(std::numeric_limits<std::int32_t>::max()) + step;
    const long tooSmall = static_cast<long>(std::numeric_limits<std::int32_t>::min()) - step;
    EXPECT_THROW(CGenericVal{tooBig}, unexpected_error);
    EXPECT_THROW(CGenericVal{static_cast<unsigned long>(tooBig) * 2}, unexpected_error);
    CGenericVal value("kept");
    EXPECT_THROW(value.SetLong(tooSmall), unexpected_error);
    EXPECT_THROW(value.SetError(tooBig), unexpected_error);
    EXPECT_THROW(value.SetULong(static_cast<unsigned long>(tooBig) * 2), unexpected_error);
    EXPECT_STREQ(value.GetString(), "kept");
    value.SetLong(tooSmall + 1);
    EXPECT_EQ(value.GetLong(), std::numeric_limits<std::int32_t>::min());
    value.SetULong(static_cast<unsigned long>(tooBig) * 2 - 1);
    EXPECT_EQ(value.GetULong(), 0xFFFFFFFFu);
}

TEST(CGenericVal, GetValueTakesOnlyItsOwnTagAndLeavesOutAloneOtherwise) {
    double number = -1.0;
    CDateTime date(-1.0);
    unsigned long ulong = 1;
    char character = 'z';
    EXPECT_FALSE(Date(2.0).GetValue(number) || CGenericVal(2.0).GetValue(date) ||
                 CGenericVal(5).GetValue(ulong) || CGenericVal(Byte(65)).GetValue(character));
    EXPECT_TRUE(number == -1.0 && date == -1.0 && ulong == 1 && character == 'z');
    long slong = 0;
    int sint = 0;
    unsigned int uint = 0;
    EXPECT_TRUE(CGenericVal(-5).GetValue(slong) && CGenericVal(-6l).GetValue(sint) &&
                CGenericVal(4294967295ul).GetValue(uint) && Date(2.0).GetValue(date));
    EXPECT_TRUE(slong == -5 && sint == -6 && uint == 4294967295u && date == 2.0);

    const CGenericVal text("abc");
    const char* chars = nullptr;
    EXPECT_TRUE(text.GetValue(chars));
    EXPECT_EQ(chars, text.GetString().GetString()) << "the value's own text";
    const CGenericVal bytes(Bytes("xyz"));
    CBlob blob;
    EXPECT_TRUE(bytes.GetValue(blob));
    EXPECT_EQ(blob.GetData(), bytes.GetBlob().GetData()) << "one shared buffer";
    CGenericVal whole(7);
    EXPECT_TRUE(CGenericVal().GetValue(whole) && whole.IsEmpty());
}

TEST(CGenericVal, TextAndBlobReferencesAreCheckedAndEditInPlace) {
    TestVal value(5);
    const CGenericVal& constant = value;
    EXPECT_THROW(value.GetString(), unexpected_error);
    EXPECT_THROW(constant.GetBlob(), unexpected_error);
    EXPECT_THROW(value.GetStringRef(), unexpected_error);
    EXPECT_EQ(value, CGenericVal(5));
    value.SetString("ab");
    value.GetString() += "c";
    EXPECT_STREQ(constant.GetString(), "abc");
    EXPECT_THROW(value.GetBlob(), unexpected_error);
    value.SetBlob(Bytes("ab"));
    value.GetBlob().GetBuffer(1)[0] = 'z';
    EXPECT_EQ(constant.GetBlob(), Bytes("z"));
}

// A blob or string holding its buffer alone writes through it in place; a
// shared one moves to a copy first. An unchanged pointer so shows that every
// value has let go of the buffer.
TEST(CGenericValCopy, TextAndBlobsAreSharedThenReleased) {
    CBlob blob = Bytes("shared");
    unsigned char* bytes = blob.GetBuffer();
    CString text("text");
    const char* chars = text.GetBuffer();
    text.ReleaseBuffer();
    {
        CGenericVal value(blob);
        CGenericVal copy(value);
        CGenericVal other(text);
        EXPECT_EQ(copy.GetBlob().GetData(), bytes);
        value = other; // BLOB under text
        copy = CGenericVal(7);
        EXPECT_EQ(value.GetString().GetString(), chars);
        other.SetBlob(blob); // text under a blob
        value.Empty();
        EXPECT_EQ(text.GetBuffer(), chars);
        text.ReleaseBuffer();
    }
    EXPECT_EQ(blob.GetBuffer(), bytes);
}

TEST(CGenericValCopy, SelfAssignmentAndTheSameBufferKeepTheContent) {
    CGenericVal value("text");
    const CGenericVal& alias = value;
    value = alias;
    value.SetString(value.GetString());
    EXPECT_STREQ(value.GetString(), "text");
    value = CGenericVal(Bytes("bytes"));
    const unsigned char* bytes = value.GetBlob().GetData();
    value = alias;
    value.SetBlob(value.GetBlob());
    EXPECT_EQ(value.GetBlob().GetData(), bytes);
    value = CGenericVal(-3);
    value = alias;
    EXPECT_EQ(value.GetLong(), -3);
}

TEST(CGenericValCopy, ChangingACopysBlobLeavesTheOriginalsBytes) {
    const CGenericVal original(Bytes("abc"));
    CGenericVal copy = original;
    copy.GetBlob().GetBuffer()[0] = 'X';
    EXPECT_EQ(original.GetBlob(), Bytes("abc"));
    EXPECT_EQ(copy.GetBlob(), Bytes("Xbc"));
}

TEST(CGenericValPayload, ValuesWithoutANumberCarryZeroBytes) {
    // The Error codes compare as doubles: stale bytes of the Double or of the
    // text pointer would tell them apart.
    CGenericVal overDouble(-1.0e300), overText("text");
    overDouble.SetError(5);
    overText.SetError(5);
    EXPECT_EQ(overDouble, Error(5));
    EXPECT_EQ(overText, Error(5));
    CGenericVal copied(kNaN);
    copied = Error(5);
    EXPECT_EQ(copied, Error(5));
    CGenericVal emptied(3.5);
    emptied.Empty();
    EXPECT_EQ(emptied, CGenericVal());
    EXPECT_EQ(Retyped(CGenericVal(-1.0), VT_NULL), Retyped(CGenericVal("x"), VT_NULL));
}

TEST(CGenericValPayload, ChangeTypeEmptiesIntoTheTagsEmptyForm) {
    TestVal value(42);
    value.ChangeType(VT_I4);
    EXPECT_EQ(value.GetLong(), 42) << "the same tag keeps the value";
    value.ChangeType(VT_LPSTR);
    EXPECT_STREQ(value.GetString(), "");
    value.ChangeType(VT_BLOB);
    EXPECT_TRUE(value.GetBlob().IsEmpty());
    // A tag that is a name only holds nothing, as Empty does.
    const CGenericVal int64 = Retyped(CGenericVal(1.0e10), VT_I8);
    EXPECT_EQ(int64, Retyped(CGenericVal(Bytes("b")), VT_I8));
    EXPECT_TRUE(int64.GetAsDouble() == 0.0 && int64.GetAsString().IsEmpty());
}

TEST(CGenericValCompare, TheTagComesFirstThenTheValue) {
    const CBlob bytes = Bytes("same");
    const struct {
        const char* what;
        CGenericVal a, b;
        bool equal, less, greater;
    } cases[] = {
        {"two empty values", CGenericVal(), CGenericVal(), true, false, false},
        {"Long 5, ULong 5", CGenericVal(5), CGenericVal(5ul), false, true, false},
        {"Long 5, ULong 1", CGenericVal(5), CGenericVal(1ul), false, true, false},
        {"Float 9, Double 1", CGenericVal(9.0f), CGenericVal(1.0), false, true, false},
        {"Double 1, Date 1", CGenericVal(1.0), Date(1.0), false, true, false},
        {"Error 3, Long 3", Error(3), CGenericVal(3), false, false, true},
        {"String, BLOB", CGenericVal("z"), CGenericVal(Bytes("a")), false, true, false},
        {"by character code", CGenericVal("B"), CGenericVal("a"), false, true, false},
        {"same text", CGenericVal("a"), CGenericVal(CString("a")), true, false, false},
        {"signed Short", CGenericVal(short(-1)), CGenericVal(short(1)), false, true, false},
        {"unsigned UShort", CGenericVal(UShort(65535)), CGenericVal(UShort(1)), false, false, true},
        {"signed Long", CGenericVal(-1), CGenericVal(1), false, true, false},
        {"unsigned ULong", CGenericVal(0xFFFFFFFFul), CGenericVal(1ul), false, false, true},
        {"signed Char", CGenericVal(char(-1)), CGenericVal(char(1)), false, true, false},
        {"unsigned Byte", CGenericVal(Byte(255)), CGenericVal(Byte(1)), false, false, true},
        {"Bool", CGenericVal(false), CGenericVal(true), false, true, false},
        {"Double NaN", CGenericVal(kNaN), CGenericVal(kNaN), false, false, false},
        {"Float NaN", CGenericVal(float(kNaN)), CGenericVal(1.0f), false, false, false},
        {"Date", Date(-2.5), Date(1.0), false, true, false},
        {"Error codes as unsigned", Error(1), Error(-2147467259), false, true, false},
        {"same Error", Error(-1), Error(-1), true, false, false},
        {"one blob buffer", CGenericVal(bytes), CGenericVal(bytes), true, false, false},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.what);
        EXPECT_EQ(c.a == c.b, c.equal);
        EXPECT_EQ(c.a != c.b, !c.equal);
        EXPECT_EQ(c.a < c.b, c.less);
        EXPECT_EQ(c.b < c.a, c.greater);
    }
    // Blobs equal by content order by buffer, yet strictly.
    const CGenericVal first(Bytes("same")), second(Bytes("same"));
    EXPECT_EQ(first, second);
    EXPECT_NE(first < second, second < first);
}

TEST(CGenericValParse, EachTypeReadsItsTextOrChangesNothing) {
    const CGenericVal kept(Bytes("kept"));
    const struct {
        const char* text;
        VARENUM type;
        CGenericVal expected; // kept: the reading fails
    } cases[] = {
        {"12abc", VT_I4, CGenericVal(12)},
        {" \t-7", VT_I4, CGenericVal(-7)},
        {"abc", VT_I4, CGenericVal(0)},
        {"- 5", VT_I4, CGenericVal(0)},
        {"99999999999", VT_I4, CGenericVal(2147483647)},
        {"-99999999999", VT_I4, CGenericVal(-2147483647 - 1)},
        {"-1", VT_UI1, CGenericVal(Byte(255))},
        {"-1", VT_UI2, CGenericVal(UShort(65535))},
        {"-1", VT_UI4, CGenericVal(4294967295ul)},
        {"70000", VT_I2, CGenericVal(short(4464))},
        // ULong's own text reads back, beyond the signed 32-bit range too.
        {"2147483647", VT_UI4, CGenericVal(2147483647ul)},
        {"2147483648", VT_UI4, CGenericVal(2147483648ul)},
        {"4294967295", VT_UI4, CGenericVal(4294967295ul)},
        {" +3000000000", VT_UI4, CGenericVal(3000000000ul)},
        {"99999999999", VT_UI4, CGenericVal(4294967295ul)},
        {"xyz", VT_I1, CGenericVal('x')},
        {"1.5e3xyz", VT_R8, CGenericVal(1500.0)},
        {" -.5", VT_R8, CGenericVal(-0.5)},
        {"1e", VT_R8, CGenericVal(1.0)},
        {"nan", VT_R8, CGenericVal(0.0)},
        {"-inf", VT_R8, CGenericVal(0.0)},
        {"+-1", VT_R8, CGenericVal(0.0)},
        {"-0.00001e400", VT_R8, CGenericVal(-kInfinity)},
        {"1000e306", VT_R8, CGenericVal(kInfinity)},
        {"10000e-330", VT_R8, CGenericVal(0.0)},
        {"0.1", VT_R4, CGenericVal(0.1f)},
        {"1e39", VT_R4, CGenericVal(std::numeric_limits<float>::infinity())},
        {"No", VT_BOOL, CGenericVal(false)},
        {"12", VT_BOOL, CGenericVal(true)},
        {"1900-01-02", VT_DATE, Date(3.0)},
        {" text ", VT_LPSTR, CGenericVal(" text ")},
        {nullptr, VT_LPSTR, CGenericVal("")},
        {"", VT_LPSTR, CGenericVal("")},
        {"", VT_I4, kept},
        {nullptr, VT_R8, kept},
        {"not a date", VT_DATE, kept},
        {"1", VT_ERROR, kept},
        {"AAAA", VT_BLOB, kept},
        {"1", VT_NULL, kept},
        {"1", VT_I8, kept},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(std::string(c.text ? c.text : "(null)") + " as " + VarTypeX::ToString(c.type));
        CGenericVal value(kept);
        EXPECT_EQ(value.Parse(c.text, c.type), c.expected != kept);
        EXPECT_EQ(value, c.expected) << value.GetAsString().GetString();
    }
}

TEST(CGenericValParse, FloatingPointReadsAPointWhateverTheLocaleSays) {
    const std::string saved = std::setlocale(LC_NUMERIC, nullptr);
    const char* comma = nullptr;
    for (const char* name : {"de_DE.UTF-8", "de_DE", "German_Germany.1252"}) {
        if (std::setlocale(LC_NUMERIC, name)) {
            comma = name;
            break;
        }
    }
    if (!comma)
        GTEST_SKIP() << "no locale with a decimal comma is installed";
    CGenericVal number, single;
    const bool parsed = number.Parse("1.5", VT_R8) && single.Parse("2.25", VT_R4);
    std::setlocale(LC_NUMERIC, saved.c_str());
    EXPECT_TRUE(parsed);
    EXPECT_EQ(number, CGenericVal(1.5)) << comma;
    EXPECT_EQ(single, CGenericVal(2.25f)) << comma;
}
