// Images that cannot be had: too large for the format of a buffer, or for the process.
#include <gtest/gtest.h>
#include <zqvissvc/errors.h>
#include <zqvissvc/image.h>

#include <cstdint>
#include <vector>

#include "support/host_image.h"
#include "support/picture.h"

namespace {

// The process is healthy: images can be made, and what was there is untouched.
void expect_healthy(const zqtest::HostImage& before) {
    EXPECT_TRUE(before.is_live());
    EXPECT_EQ(before.record().width, 6);
    const zqtest::Picture picture(ZQ_TYPE_RGB, 30, 20);
    EXPECT_EQ(picture.pixels().size(), 2400U);
}

TEST(AddressSpaceTest, BuffersAboveTheLimitAreRefusedEverywhere) {
    const zqtest::HostImage image("kept");
    struct Case {
        int32_t type, width, height, border;
    };
    const Case cases[] = {
        {ZQ_TYPE_U8, 46341, 46341, 0},              // 2147488281 bytes
        {ZQ_TYPE_COMPLEX, 16384, 16384, 0},         // 2 GiB
        {ZQ_TYPE_U8, INT32_MAX, 1, 0},              // the row itself, rounded up
        {ZQ_TYPE_RGBU64, INT32_MAX, INT32_MAX, 0},  // beyond 64 bits
        {ZQ_TYPE_U8, 1, 1, 1 << 30},                // by its border
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(testing::Message() << c.width << " x " << c.height);
        ZqImageHandle made = nullptr;
        EXPECT_EQ(NewImage(c.type, c.width, c.height, c.border, &made), ZQ_ERR_NOT_ENOUGH_MEMORY);
        EXPECT_EQ(made, nullptr);
        zqtest::HostImage refused;
        EXPECT_EQ(refused.create("huge", c.type, c.border, c.width, c.height),
                  ZQ_ERR_NOT_ENOUGH_MEMORY);
        if (c.border == 0) {
            EXPECT_EQ(ZqResizeImage(image.handle(), c.width, c.height, 1, c.type, 0),
                      ZQ_ERR_NOT_ENOUGH_MEMORY);
        }
        expect_healthy(image);
    }
}

#if UINTPTR_MAX == UINT32_MAX
// Allowed by the limit, but not to be had.
TEST(AddressSpaceTest, AFullProcessRefusesAndRecovers) {
    const zqtest::HostImage image("kept");
    zqtest::HostImage whole;
    EXPECT_EQ(whole.create("whole", ZQ_TYPE_U8, 0, 46340, 46340), ZQ_ERR_NOT_ENOUGH_MEMORY);
    std::vector<ZqImageHandle> images;
    ZqError code = 0;
    while (images.size() < 64) {
        ZqImageHandle next = nullptr;
        code = NewImage(ZQ_TYPE_U8, 8192, 8192, 0, &next);
        if (code != 0) break;
        images.push_back(next);
    }
    EXPECT_EQ(code, ZQ_ERR_NOT_ENOUGH_MEMORY) << "64 images of 64 MiB";
    EXPECT_GT(images.size(), 8U);
    expect_healthy(image);
    for (ZqImageHandle each : images) EXPECT_EQ(ZqDisposeImage(each), 0);
    zqtest::HostImage again;
    EXPECT_EQ(again.create("again", ZQ_TYPE_U8, 0, 8192, 8192), 0);
}
#endif

}  // namespace
