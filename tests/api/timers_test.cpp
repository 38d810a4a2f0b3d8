// The interval timers as a host calls them.
#include <gtest/gtest.h>
#include <zqvissvc/errors.h>
#include <zqvissvc/timers.h>

TEST(Timers, MeasureAndPassErrorsThrough) {
    ZqErrorCluster pending{1, -7, nullptr};
    EXPECT_EQ(DF_InitTimer(1, 2, nullptr), 0);
    EXPECT_EQ(DF_StartTimer(nullptr), 0);
    double first = -1;
    EXPECT_EQ(DF_StopTimer(&first, nullptr), 0);
    EXPECT_GE(first, 0);
    EXPECT_LT(first, 60e6) << "microseconds since the start";
    EXPECT_EQ(DF_StartTimer(&pending), -7) << "does not start again";
    double second = -1;
    EXPECT_EQ(DF_StopTimer(&second, &pending), -7);
    EXPECT_GE(second, first) << "written despite the error";
    EXPECT_EQ(DF_CheckTimer(&pending), -7);
    EXPECT_EQ(DF_DeleteTimer(&pending), -7);
    EXPECT_EQ(ZqError{pending.code}, -7);  // the field lies unaligned
    EXPECT_EQ(DF_CheckTimer(nullptr), 0);
    EXPECT_EQ(DF_DeleteTimer(nullptr), 0);
    EXPECT_EQ(DF_StopTimer(nullptr, nullptr), ZQ_ERR_NULL_POINTER);
}
