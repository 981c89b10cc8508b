#include <vaskel/diag.h>

#include <gtest/gtest.h>

using vaskel::CVKDebugConditions;

// The table is process-wide, so one test walks its whole life in order.
TEST(CVKDebugConditions, GrowsWithZerosAndAnswersZeroBeyondItsEnd) {
    EXPECT_EQ(CVKDebugConditions::GetConditionCount(), 0u);
    EXPECT_EQ(CVKDebugConditions::GetCondition(100), 0u);
    EXPECT_EQ(CVKDebugConditions::GetConditionCount(), 0u) << "a read must not grow the table";

    CVKDebugConditions::SetCondition(3, 7);
    ASSERT_EQ(CVKDebugConditions::GetConditionCount(), 4u);
    EXPECT_EQ(CVKDebugConditions::GetCondition(0), 0u);
    EXPECT_EQ(CVKDebugConditions::GetCondition(1), 0u);
    EXPECT_EQ(CVKDebugConditions::GetCondition(2), 0u);
    EXPECT_EQ(CVKDebugConditions::GetCondition(3), 7u);
    EXPECT_TRUE(CVKDebugConditions::IsConditionSet(3));
    EXPECT_FALSE(CVKDebugConditions::IsConditionSet(2));

    CVKDebugConditions::SetCondition(1, 0xFFFFFFFF);
    EXPECT_EQ(CVKDebugConditions::GetConditionCount(), 4u) << "storing inside must not grow";
    EXPECT_EQ(CVKDebugConditions::GetCondition(1), 0xFFFFFFFFu);
    EXPECT_EQ(CVKDebugConditions::GetCondition(3), 7u);

    CVKDebugConditions::SetCondition(5, 1);
    EXPECT_EQ(CVKDebugConditions::GetConditionCount(), 6u);
    EXPECT_EQ(CVKDebugConditions::GetCondition(3), 7u) << "growing keeps the old values";
    EXPECT_EQ(CVKDebugConditions::GetCondition(4), 0u);
}
