// Image values under a host that lacks the session services. Behind the exported functions, because
// another host module is put in the place of the program.
#include <gtest/gtest.h>
#include <zqvissvc/image.h>
#include <zqvissvc/values.h>

#include "host/module.h"
#include "image/registry.h"
#include "other_host.h"
#include "platform/module.h"

namespace zq {
namespace {

constexpr ZqError kNoServices = -1074396155;

class OtherHost {
  public:
    OtherHost() { host::set_host_module(platform::loaded_module("other_host.dll")); }
    ~OtherHost() { host::set_host_module(nullptr); }
    OtherHost(const OtherHost&) = delete;
    OtherHost& operator=(const OtherHost&) = delete;

  private:
    const int answer_ = other_host_answer();
};

TEST(ImageHostServicesTest, MissingSessionServicesAreReported) {
    ZqImageHandle image = nullptr;
    ASSERT_EQ(NewImage(ZQ_TYPE_U8, 3, 3, 0, &image), 0);
    ZqImageValue value = {nullptr, image};
    ZqImageValue made{};
    int32_t width = -1;
    {
        const OtherHost other;
        EXPECT_EQ(DF_GetImageSize(&value, &width, nullptr, nullptr), kNoServices);
        EXPECT_EQ(width, -1);
        ZqImageHandle found = nullptr;
        EXPECT_EQ(ZqLookUpImage(&value, &found), kNoServices);
        EXPECT_EQ(found, image) << "the image word comes through unchecked";
        EXPECT_EQ(ZqLookUpImage(nullptr, &found), kNoServices);
        EXPECT_EQ(found, nullptr);
        EXPECT_EQ(DF_Create(nullptr, ZQ_TYPE_U8, 0, 3, 3, 0, &made, nullptr), kNoServices);
        EXPECT_EQ(made.image, nullptr);
        EXPECT_EQ(Registry::instance().live_count(), 1U);
        // The image goes nevertheless, and what was handed out can be given back.
        EXPECT_EQ(DF_Dispose(&value, 0, nullptr), kNoServices);
    }
    EXPECT_EQ(Registry::instance().live_count(), 0U);
    EXPECT_EQ(DF_GetImageSize(&value, &width, nullptr, nullptr), -1074396120);
}

}  // namespace
}  // namespace zq
