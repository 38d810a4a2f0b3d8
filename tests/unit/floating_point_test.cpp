// Every target computes alike to the last bit: one rounding per operation, in the format of its
// operands. The x87 unit and a fused multiply-add give something else for each of these.
#include <gtest/gtest.h>

namespace {

// Volatile, or the compiler would compute the results itself.
template <class Real>
Real multiply_subtract(Real a, Real b, Real c) {
    const volatile Real x = a, y = b, z = c;
    return x * y - z;
}

template <class Real>
Real sum(Real a, Real b, Real c) {
    const volatile Real x = a, y = b, z = c;
    return x + y + z;
}

TEST(FloatingPointTest, EachOperationIsRoundedOnce) {
    struct Case {
        const char* what;
        double result, expected;
    };
    const Case cases[] = {
        {"double product", multiply_subtract(1 + 0x1p-27, 1 + 0x1p-27, 1 + 0x1p-26), 0},
        {"float product", multiply_subtract(1 + 0x1p-12F, 1 + 0x1p-12F, 1 + 0x1p-11F), 0},
        {"double sum", sum(0x1p53, 1.0, 1.0), 0x1p53},
        {"float sum", sum(0x1p24F, 1.0F, 1.0F), 0x1p24},
        {"float below the normal range", multiply_subtract(0x1p-100F, 0x1.8p-49F, 0.0F), 0x1p-148},
    };
    for (const Case& c : cases) EXPECT_EQ(c.result, c.expected) << c.what;
}

}  // namespace
