// Runs every test in a strict host. At the end of a test the host tears the caller down, and what
// the test left behind in the host's memory, or did wrong with it, fails the test. A test that
// provokes such faults takes the account itself with refhost::finish().
#include <gtest/gtest.h>

#include "refhost/refhost.h"

namespace {

class HostWatch : public testing::EmptyTestEventListener {
    void OnTestStart(const testing::TestInfo& /*test*/) override {
        refhost::set_strict(true);
        refhost::finish();  // what a suite keeps for all of its tests is none of this test's leaks
    }

    void OnTestEnd(const testing::TestInfo& /*test*/) override {
        refhost::refuse_none();
        refhost::run_cleanup();
        const refhost::Report report = refhost::finish();
        EXPECT_TRUE(report.clean()) << report.details;
        EXPECT_EQ(refhost::open_dialogs(), 0) << "a dialog was begun and not ended";
    }
};

// Appending before main runs is enough for every program that links this file.
[[maybe_unused]] const bool kWatching = [] {
    testing::UnitTest::GetInstance()->listeners().Append(new HostWatch);
    return true;
}();

}  // namespace
