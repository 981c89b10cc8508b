// Tests of date-times: parts and fields, setters from calendar fields, the
// clock, arithmetic, the millisecond comparison and the archive form.
#include <vaskel/calendar.h>
#include <vaskel/diag.h>
#include <vaskel/framework/archive.h>
#include <vaskel/framework/exceptions.h>
#include <vaskel/framework/mem_file.h>
#include <vaskel/value.h>

#include <gtest/gtest.h>

#include <functional>
#include <vector>

using namespace vaskel;

namespace {

const double halfMillisecond = 5.787037037037037e-09;
const double oneMillisecond = 1.1574074074074074e-08;

TEST(CDateTimeTest, PartsOfTheValue) {
    CDateTime noon(2.5);
    EXPECT_EQ(noon.GetHour(), 12u);
    EXPECT_EQ(noon.GetDay(), 1u);
    EXPECT_EQ(noon.GetMonth(), 1u);
    EXPECT_EQ(noon.GetYear(), 1900u);
    EXPECT_EQ(noon.GetCalendarMonth(), January);
    EXPECT_EQ(noon.GetMilliseconds(), 0u);

    CDateTime value(45000.75);
    value.SetDateOnly();
    EXPECT_EQ(value.GetValue(), 45000.0);
    value = 45000.75;
    value.SetTimePortion(0.5);
    EXPECT_EQ(value.GetValue(), 45000.5);
    value = 45000.75;
    value.SetDatePortion(10);
    EXPECT_EQ(value.GetValue(), 10.75);
    value = 45000.75;
    value.ClearDatePortion();
    EXPECT_EQ(value.GetValue(), 0.75);
    EXPECT_EQ(CDateTime(-1.25).GetDatePortion(), -1);
    EXPECT_EQ(CDateTime(-1.25).GetTimePortion(), -0.25);
    EXPECT_EQ(CDateTime(1e300).GetDatePortion(), 2147483647) << "saturates";

    EXPECT_EQ(CDateTime(2.75).GetJulianDate(), 2u);
    EXPECT_EQ(CDateTime::GetJulianDate(-1.5), 0xFFFFFFFFu);
    EXPECT_EQ(CDateTime(0.9993055555555556).GetMinuteOfTheDay(), 1439);
    EXPECT_EQ(CDateTime(45000.5).GetMinuteOfTheDay(), 720);
    CDateTime fromDay;
    fromDay.SetJulianDate(45351);
    EXPECT_EQ(fromDay.GetValue(), 45351.0);
}

TEST(CDateTimeTest, FieldsOutsideTheCalendarThrow) {
    for (double value : {-657435.0, 2958466.0, 1e300}) {
        CDateTime outside(value);
        EXPECT_THROW(outside.ToSystemTime(), unexpected_error) << value;
        EXPECT_THROW(outside.GetYear(), unexpected_error);
        EXPECT_THROW(outside.GetCalendarMonth(), unexpected_error);
        EXPECT_THROW(outside.AddMonths(1), unexpected_error);
        EXPECT_THROW(outside.AddYears(1), unexpected_error);
        SYSTEMTIME record;
        EXPECT_FALSE(outside.ToSystemTime(record));
    }
    EXPECT_THROW(CDateTime(2.5).AddMonths(12 * 32767), unexpected_error);
}

TEST(CDateTimeTest, SettersFromFieldsKeepTheValueOnFailure) {
    CDateTime value(45000.75);
    EXPECT_TRUE(value.SetTime(6, 0, 0));
    EXPECT_EQ(value.GetValue(), 0.25);
    EXPECT_TRUE(value.SetTime(23, 59, 59));
    EXPECT_EQ(value.GetSecond(), 59u);

    value = 7.5;
    EXPECT_FALSE(value.SetDate(2024, 13, 1));
    EXPECT_FALSE(value.SetDateTime(2024, 1, 32, 0, 0, 0));
    EXPECT_FALSE(value.SetDateTime(10000, 1, 1, 0, 0, 0));
    EXPECT_FALSE(value.SetDateTime(-1, 1, 1, 0, 0, 0));
    EXPECT_EQ(value.GetValue(), 7.5);

    EXPECT_TRUE(value.SetDateTime(2024, 2, 29, 13, 45, 10));
    SYSTEMTIME record = value.ToSystemTime();
    EXPECT_EQ(record.wYear, 2024);
    EXPECT_EQ(record.wMonth, 2);
    EXPECT_EQ(record.wDay, 29);
    EXPECT_EQ(record.wDayOfWeek, Thursday);
    EXPECT_EQ(record.wHour, 13);
    EXPECT_EQ(record.wMinute, 45);
    EXPECT_EQ(record.wSecond, 10);
    EXPECT_EQ(CDateTime(record), value);
    EXPECT_EQ(CDateTime(2024, 2, 29, 13, 45, 10), value);
    EXPECT_TRUE(value.SetDate(2024, 2, 29));
    EXPECT_EQ(value.GetValue(), 45351.0);
}

TEST(CDateTimeTest, NowIsLocalTimeInWholeSeconds) {
    // The clock may tick between two reads; retry once across a second.
    CDateTime now = CDateTime::Now();
    CDateTime date = CDateTime::NowDateOnly();
    if (now.GetJulianDate() != date.GetJulianDate()) {
        now = CDateTime::Now();
        date = CDateTime::NowDateOnly();
    }
    EXPECT_GT(now.GetValue(), 45000.0);
    EXPECT_EQ(now.GetMilliseconds(), 0u);
    EXPECT_EQ(date.GetTimePortion(), 0.0);
    EXPECT_EQ(date.GetJulianDate(), now.GetJulianDate());
    const double time = CDateTime::NowTimeOnly().GetValue();
    EXPECT_GE(time, 0.0);
    EXPECT_LT(time, 1.0);
    // Whole seconds: the value converts back to itself.
    SYSTEMTIME record = now.ToSystemTime();
    EXPECT_EQ(CDateTime(record).GetValue(), now.GetValue());
}

TEST(CDateTimeTest, ArithmeticRoundsOnlyTheDifference) {
    // Half a millisecond apart rounds to a whole one.
    const CTimeSpan difference = CDateTime(0.0) - CDateTime(-halfMillisecond);
    EXPECT_EQ(difference, CTimeSpan().SetMillisecondsSpan(1));
    // Adding and subtracting spans keeps every bit of the date-time.
    const CTimeSpan millisecond = CTimeSpan().SetMillisecondsSpan(1);
    EXPECT_EQ((CDateTime(0.3) + millisecond).GetValue(), 0.3 + millisecond.GetSpan());
    EXPECT_EQ((CDateTime(0.3) - millisecond).GetValue(), 0.3 - millisecond.GetSpan());
    CDateTime shifted(0.0);
    shifted -= CTimeSpan(1.0);
    EXPECT_EQ(shifted.GetValue(), -1.0);
    shifted += millisecond;
    EXPECT_EQ(shifted.GetValue(), -1.0 + millisecond.GetSpan());

    CDateTime value(2.0);
    value.AddDays(3);
    EXPECT_EQ(value.GetValue(), 5.0);
    value.AddMinutes(-1);
    EXPECT_EQ(value.GetValue(), 5.0 - 0.0006944444444444445);
    value.AddSeconds(60);
    EXPECT_EQ(value.GetValue(), 5.0 - 0.0006944444444444445 + 60 * 1.1574074074074073e-05);

    CDateTime evening(2024, 1, 31, 18, 30, 0);
    evening.AddMonths(1);
    EXPECT_EQ(evening, CDateTime(2024, 2, 29, 18, 30, 0)) << "keeps the time of day";
    evening.AddYears(-1);
    EXPECT_EQ(evening, CDateTime(2023, 2, 28, 18, 30, 0));
}

TEST(CDateTimeTest, ComparisonsAndMillisecondResolution) {
    EXPECT_EQ(CDateTime::CompareToMilisecondResolution(0.0, halfMillisecond), 0);
    EXPECT_EQ(CDateTime::CompareToMilisecondResolution(0.0, oneMillisecond), -1);
    EXPECT_EQ(CDateTime::CompareToMilisecondResolution(halfMillisecond, 0.0), 0);
    EXPECT_EQ(CDateTime::CompareToMilisecondResolution(oneMillisecond, 0.0), 1);
    EXPECT_EQ(CDateTime::CompareToMilisecondResolution(5.0, 2.0), 1);
    EXPECT_EQ(CDateTime::CompareToMilisecondResolution(2.0, 5.0), -1);
    EXPECT_EQ(CDateTime(1.0).Compare(2.0), -1);
    EXPECT_EQ(CDateTime(2.0).Compare(1.0), 1);
    EXPECT_EQ(CDateTime(2.0).Compare(2.0), 0);
    EXPECT_TRUE(CDateTime(1.0) < CDateTime(2.0));
    EXPECT_TRUE(CDateTime(1.0) != 1.0 + halfMillisecond);
}

std::vector<BYTE> Stored(const std::function<void(CArchive&)>& write) {
    CMemFile file;
    CArchive ar(&file, CArchive::store);
    write(ar);
    ar.Close();
    std::vector<BYTE> bytes(static_cast<size_t>(file.GetLength()));
    file.SeekToBegin();
    file.Read(bytes.data(), static_cast<UINT>(bytes.size()));
    return bytes;
}

template <class T>
T Loaded(std::vector<BYTE> bytes, T value) {
    CMemFile file;
    file.Write(bytes.data(), static_cast<UINT>(bytes.size()));
    file.SeekToBegin();
    CArchive ar(&file, CArchive::load);
    ar >> value;
    return value;
}

TEST(CDateTimeTest, ArchiveFormIsOneLittleEndianDouble) {
    const std::vector<BYTE> bytes = Stored([](CArchive& ar) { ar << CDateTime(2.5); });
    EXPECT_EQ(bytes, (std::vector<BYTE>{0, 0, 0, 0, 0, 0, 4, 0x40}));
    EXPECT_EQ(Loaded(bytes, CDateTime()).GetValue(), 2.5);

    // A short archive raises the end-of-file exception.
    EXPECT_THROW(Loaded(std::vector<BYTE>{0, 0, 4, 0x40}, CDateTime()), CArchiveException);

    CMemFile file;
    CArchive loading(&file, CArchive::load);
    try {
        loading << CDateTime(1.0);
        FAIL() << "storing into a loading archive";
    } catch (const CArchiveException& e) {
        EXPECT_EQ(e.m_cause, CArchiveException::readOnly);
    }
    CArchive storing(&file, CArchive::store);
    CDateTime target;
    try {
        storing >> target;
        FAIL() << "loading from a storing archive";
    } catch (const CArchiveException& e) {
        EXPECT_EQ(e.m_cause, CArchiveException::writeOnly);
    }
    storing.Abort();
}

TEST(CVKRectFTest, ArchiveHoldsTopBottomLeftRight) {
    const CVKRectF rect = {1.0, 2.0, 3.0, 4.0};
    const std::vector<BYTE> bytes = Stored([&](CArchive& ar) { ar << rect; });
    ASSERT_EQ(bytes.size(), 32u);
    const std::vector<BYTE> expected = Stored([](CArchive& ar) { ar << 2.0 << 4.0 << 1.0 << 3.0; });
    EXPECT_EQ(bytes, expected);
    const CVKRectF loaded = Loaded(bytes, CVKRectF{});
    EXPECT_EQ(loaded.left, 1.0);
    EXPECT_EQ(loaded.top, 2.0);
    EXPECT_EQ(loaded.right, 3.0);
    EXPECT_EQ(loaded.bottom, 4.0);

    CVKRectF kept = {9.0, 9.0, 9.0, 9.0};
    EXPECT_THROW(kept = Loaded(std::vector<BYTE>(bytes.begin(), bytes.begin() + 24), kept),
                 CArchiveException);
    EXPECT_EQ(kept.left, 9.0) << "a short archive leaves the rectangle as it was";
}

} // namespace
