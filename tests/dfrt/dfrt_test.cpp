// The library in a program that is no host: first without any host module, then with "dfrt" loaded.
#include <gtest/gtest.h>
#include <zqvissvc/errors.h>
#include <zqvissvc/image.h>
#include <zqvissvc/slots.h>

#include <vector>

#include "platform/module.h"
#include "support/message_boxes.h"

namespace {

ZqError create(ZqImageValue* image) {
    return DF_Create(nullptr, ZQ_TYPE_U8, 3, 4, 4, 0, image, nullptr);
}

TEST(DfrtTest, HostIsFoundInDfrtOnceThatIsLoaded) {
    zqtest::MessageBoxes boxes;
    ZqImageValue image{};
    // What has a failure code of its own says nothing; anything else tells the user.
    EXPECT_EQ(create(&image), ZQ_ERR_NOT_INITIALIZED);
    EXPECT_EQ(image.image, nullptr);
    void* found = nullptr;
    EXPECT_EQ(DF_GetFunction("StrLen", &found), ZQ_ERR_NOT_INITIALIZED);
    boxes.take();
    EXPECT_EQ(Dataflux::StrLen_EX("abc"), 0);
    EXPECT_EQ(Dataflux::AZNewHandle_EX(3), nullptr);
    const zqtest::MessageBoxes::Box no_host{"Fatal Error",
                                            "DATAFLUX.LIB was not called from a Dataflux process."};
    EXPECT_EQ(boxes.take(), std::vector(2, no_host));

    const zq::platform::ModuleHandle dfrt = zq::platform::load_library("dfrt");
    ASSERT_NE(dfrt, nullptr);
    EXPECT_EQ(DF_GetFunction("StrLen", &found), 0);
    EXPECT_NE(found, nullptr);
    EXPECT_EQ(found, zq::platform::find_symbol(dfrt, "StrLen"));
    EXPECT_EQ(Dataflux::StrLen_EX("abc"), 3);
    ASSERT_EQ(create(&image), 0);
    EXPECT_EQ(DF_Dispose(&image, 0, nullptr), 0);
    EXPECT_TRUE(boxes.take().empty());
}

}  // namespace
