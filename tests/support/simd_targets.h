// Runs code once for every set of vector instructions that the processor has and the program was
// compiled for, not only for the best one.
#pragma once

#include <gtest/gtest.h>
#include <hwy/targets.h>

namespace zqtest {

template <class Body>
void on_every_simd_target(Body&& body) {
    for (const std::int64_t target : hwy::SupportedAndGeneratedTargets()) {
        hwy::SetSupportedTargetsForTest(target);
        SCOPED_TRACE(hwy::TargetName(target));
        body();
        if (testing::Test::HasFatalFailure()) break;
    }
    hwy::SetSupportedTargetsForTest(0);
}

}  // namespace zqtest
