#include <vaskel/timer.h>

#include <gtest/gtest.h>

#include <cmath>
#include <limits>

using namespace vaskel;

namespace {

const LONGLONG maxTicks = std::numeric_limits<LONGLONG>::max();

// Raw readings taken around an interval bound it from above exactly.
double TicksSince(LONGLONG start) {
    return static_cast<double>(
        CVKStopWatch::GetRawElapsedTime(start, CVKStopWatch::GetRawReading()));
}

} // namespace

TEST(CVKStopWatch, ResumesAccumulatesAndRestartsFromZero) {
    CVKStopWatch watch;
    EXPECT_EQ(watch.GetReading(tuMilliseconds), 0.0);
    EXPECT_EQ(watch.GetSampleReading(tuMilliseconds), -1.0);
    EXPECT_FALSE(watch.Stop());
    LONGLONG before = CVKStopWatch::GetRawReading();
    ASSERT_TRUE(watch.Start(false));
    EXPECT_EQ(watch.GetFinalReading(tuSeconds), -1.0);
    Sleep(10);
    ASSERT_TRUE(watch.Stop());
    double bound = TicksSince(before);
    const double first = watch.GetReading(tuMilliseconds);
    EXPECT_GE(first, 9.0);

    before = CVKStopWatch::GetRawReading();
    ASSERT_TRUE(watch.Start(false));
    Sleep(5);
    ASSERT_TRUE(watch.Stop());
    bound += TicksSince(before);
    EXPECT_GE(watch.GetReading(tuMilliseconds), first + 4.0);
    EXPECT_LE(watch.GetReading(tuTicks), bound);

    before = CVKStopWatch::GetRawReading();
    ASSERT_TRUE(watch.Start(true));
    ASSERT_TRUE(watch.Stop());
    EXPECT_LE(watch.GetReading(tuTicks), TicksSince(before));
    watch.Reset();
    EXPECT_EQ(watch.GetReading(tuTicks), 0.0);
}

TEST(CVKStopWatch, ReadingsNeverGoBackwards) {
    CVKStopWatch watch(true);
    CVKQuickStopWatch quick;
    double last = 0.0, lastQuick = 0.0;
    for (int i = 0; i < 20000; ++i) {
        double reading = watch.GetSampleReading(tuMicroseconds);
        double quickReading = quick.GetReading(tuTicks);
        ASSERT_GE(reading, last);
        ASSERT_GE(quickReading, lastQuick);
        last = reading;
        lastQuick = quickReading;
    }
}

TEST(CVKStopWatch, StartWithoutResetLeavesARunningWatchAlone) {
    CVKStopWatch watch(true);
    Sleep(10);
    EXPECT_FALSE(watch.Start(false));
    EXPECT_TRUE(watch.IsRunning());
    EXPECT_GE(watch.GetSampleReading(tuMilliseconds), 9.0);

    CVKStopWatch copy = watch;
    const LONGLONG before = CVKStopWatch::GetRawReading();
    EXPECT_TRUE(watch.ReStart());
    const double sample = watch.GetSampleReading(tuTicks); // read before the bound
    EXPECT_LE(sample, TicksSince(before));
    EXPECT_GE(copy.GetSampleReading(tuMilliseconds), 9.0) << "the copy keeps its start";

    double previous = 0.0;
    for (int i = 0; i < 2000; ++i) {
        const double reading = watch.GetSampleReading(tuNanoseconds);
        ASSERT_GE(reading, previous) << "reading " << i;
        previous = reading;
    }
}

TEST(CVKStopWatch, ConvertsTicksAndUnits) {
    ASSERT_TRUE(CVKStopWatch::IsHighResolution());
    const LONGLONG f = CVKStopWatch::Frequency();
    const struct {
        LONGLONG ticks;
        ETimeUnit unit;
        double value;
    } cases[] = {
        {f, tuSeconds, 1.0},
        {f, tuMilliseconds, 1000.0},
        {-f, tuMicroseconds, -1e6},
        {3 * f, tuNanoseconds, 3e9},
        {12345, tuTicks, 12345.0},
        {12345, static_cast<ETimeUnit>(2), 12345.0}, // not a unit: raw ticks
    };
    for (const auto& c : cases) {
        EXPECT_DOUBLE_EQ(CVKStopWatch::ConvertTime(c.ticks, c.unit), c.value) << c.unit;
        EXPECT_EQ(CVKStopWatch::ConvertTimeToTicks(c.value, c.unit), c.ticks) << c.unit;
    }
    EXPECT_EQ(CVKStopWatch::ConvertTimeToTicks(-2.9, tuTicks), -2) << "toward zero";
    EXPECT_EQ(CVKStopWatch::ConvertTimeToTicks(2.9, static_cast<ETimeUnit>(2)), 2);
    EXPECT_DOUBLE_EQ(CVKStopWatch::ConvertTimeToSeconds(3 * f), 3.0);
    EXPECT_DOUBLE_EQ(CVKStopWatch::GetElapsedTime(f, 3 * f, tuMilliseconds), 2000.0);

    const double tickInMs = 1000.0 / f;
    EXPECT_NEAR(CVKStopWatch::ConvertTime(1.5, tuSeconds, tuMilliseconds), 1500.0,
                f % 1000 == 0 ? 0.0 : tickInMs);
    EXPECT_EQ(CVKStopWatch::ConvertTime(1.23456789, tuMilliseconds, tuMilliseconds), 1.23456789);
    EXPECT_EQ(CVKStopWatch::ConvertTime(tickInMs / 2, tuMilliseconds, tuSeconds), 0.0)
        << "less than a tick is lost on the way";

    // Beyond the range of ticks: saturated, never undefined.
    EXPECT_EQ(CVKStopWatch::ConvertTimeToTicks(1e300, tuSeconds), maxTicks);
    EXPECT_EQ(CVKStopWatch::ConvertTimeToTicks(-1e300, tuTicks), -maxTicks - 1);
    EXPECT_EQ(CVKStopWatch::ConvertTimeToTicks(std::nan(""), tuMilliseconds), 0);
}

TEST(CVKStopWatch, ConvertsLongIntervalsWithoutOverflow) {
    const LONGLONG f = CVKStopWatch::Frequency();
    const LONGLONG century = f * 86400 * 365 * 100; // times 10^9, beyond 64 bits
    EXPECT_NEAR(CVKStopWatch::ConvertTime(century, tuNanoseconds), 3.1536e18, 3.1536e6);
    EXPECT_NEAR(CVKStopWatch::ConvertTime(-century, tuMicroseconds), -3.1536e15, 3.1536e3);
    EXPECT_EQ(CVKStopWatch::GetRawElapsedTime(10, 5), 5 + (maxTicks - 10));
    const double wrapped = CVKStopWatch::GetElapsedTime(10, 5, tuNanoseconds);
    EXPECT_NEAR(wrapped, static_cast<double>(maxTicks) / f * 1e9, wrapped * 1e-12);

    // Where ticks times 10^9 leaves 64 bits the result stays continuous and increasing.
    const LONGLONG edge = maxTicks / 1000000000;
    double previous = 0.0;
    for (LONGLONG ticks = edge - 100; ticks <= edge + 100; ++ticks) {
        const double reading = CVKStopWatch::ConvertTime(ticks, tuNanoseconds);
        ASSERT_GE(reading, previous) << ticks;
        ASSERT_NEAR(reading, static_cast<double>(ticks) * 1e9 / f, reading * 1e-15);
        previous = reading;
    }
}

TEST(CVKQuickStopWatch, ReadsTheTimeSinceItsStart) {
    CVKQuickStopWatch watch;
    Sleep(10);
    EXPECT_GE(watch.GetReading(tuMilliseconds), 9.0);
    EXPECT_GE(watch.GetReadingInSeconds(), 0.009);
    const LONGLONG before = CVKStopWatch::GetRawReading();
    watch.ReStart();
    const double reading = watch.GetReading(tuTicks); // read before the bound
    EXPECT_LE(reading, TicksSince(before));
}

TEST(COperationStatistic, KeepsCountExtremesAndRunningMean) {
    COperationStatistic stat("parse", tuMicroseconds);
    EXPECT_EQ(stat.m_nCount, 0u);
    EXPECT_EQ(stat.m_dMinimum, 1.7976931348623157e+308);
    EXPECT_EQ(stat.m_dMaximum, 0.0);
    stat.LogExecution(4.0);
    stat.LogExecution(2.0);
    EXPECT_EQ(stat.m_nCount, 2u);
    EXPECT_EQ(stat.m_dMinimum, 2.0);
    EXPECT_EQ(stat.m_dMaximum, 4.0);
    EXPECT_EQ(stat.m_dAverage, 3.0);
    stat.LogExecution(-9.0); // accepted like any other value
    EXPECT_EQ(stat.m_dMinimum, -9.0);
    EXPECT_EQ(stat.m_dAverage, -1.0);
}
