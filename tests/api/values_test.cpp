// The host's image data type: its hooks, the way between clusters, values and handles.
#include <gtest/gtest.h>
#include <zqvissvc/values.h>

#include <climits>
#include <cstdint>
#include <string>

#include "refhost/refhost.h"
#include "tests/support/host_image.h"

namespace {

using zqtest::HostImage;

constexpr ZqError kNotAnImage = -1074396120;
constexpr ZqError kNullPointer = -1074395269;

TEST(ValuesTest, TheClassNamesItsHooks) {
    const char* const names[] = {"DF_ImageDTUnFlatten",
                                 "DF_ImageDTFlatten",
                                 "DF_ImageDTOpen",
                                 "DF_ImageDTClose",
                                 "DF_ImageDTDuplicate",
                                 "",
                                 "",
                                 "",
                                 "",
                                 "",
                                 "DF_ImageDTFlatten2",
                                 ""};
    for (int32_t selector = 0; selector < 12; ++selector) {
        refhost::String name("before");
        EXPECT_EQ(DF_ImageDTClassInfo(selector, name.out()), 0);
        EXPECT_EQ(name.text(), names[selector]) << selector;
    }
    for (const int32_t selector : {12, INT_MAX, -1, INT_MIN}) {
        refhost::String name("before");
        EXPECT_EQ(DF_ImageDTClassInfo(selector, name.out()), 0);
        EXPECT_EQ(name.text(), "before") << selector;
        EXPECT_EQ(DF_ImageDTClassInfo(selector, nullptr), 0);
    }
}

TEST(ValuesTest, CopiesMeanTheSameImage) {
    HostImage image("part");
    ZqImageValue copy{};
    EXPECT_EQ(DF_ImageDTDuplicate(&image.value, &copy), 0);
    EXPECT_EQ(copy.name, image.value.name);
    EXPECT_EQ(copy.image, image.handle());
    void* out = &copy;
    EXPECT_EQ(DF_ImageDTOpen(&image.value, &out), 0);
    EXPECT_EQ(out, nullptr);
    EXPECT_EQ(DF_ImageDTClose(&copy), 0);
    EXPECT_TRUE(image.is_live());
    EXPECT_EQ(DF_ImageDTDuplicate(nullptr, &copy), kNullPointer);
    EXPECT_EQ(DF_ImageDTDuplicate(&image.value, nullptr), kNullPointer);
    EXPECT_EQ(DF_ImageDTOpen(nullptr, nullptr), 0);
    EXPECT_EQ(DF_ImageDTClose(nullptr), 0);
}

TEST(ValuesTest, LookUpFollowsTheImageWord) {
    HostImage image("part");
    ZqImageHandle found = nullptr;
    // Core images have no session of the host; the value's name does not matter.
    ZqImageHandle core = nullptr;
    ASSERT_EQ(NewImage(ZQ_TYPE_U8, 2, 2, 0, &core), 0);
    for (const ZqImageHandle handle : {image.handle(), core}) {
        const ZqImageValue value = {nullptr, handle};
        EXPECT_EQ(ZqLookUpImage(&value, &found), 0);
        EXPECT_EQ(found, handle);
        EXPECT_EQ(ZqDisposeImage(handle), 0);
        EXPECT_EQ(ZqLookUpImage(&value, &found), kNotAnImage);
        EXPECT_EQ(found, nullptr);
    }
    int32_t no_image[64] = {};
    const ZqImageValue invented = {nullptr, reinterpret_cast<ZqImageHandle>(no_image)};
    EXPECT_EQ(ZqLookUpImage(&invented, &found), kNotAnImage);
    found = core;
    EXPECT_EQ(ZqLookUpImage(nullptr, &found), 0);
    EXPECT_EQ(found, nullptr);
    EXPECT_EQ(ZqLookUpImage(&invented, nullptr), kNullPointer);
}

TEST(ValuesTest, ClusterToValueTakesTheImagesOwnName) {
    HostImage image("part");
    const refhost::String other("another name");
    HostImage value;
    const ZqImageValue cluster = {other.get(), image.handle()};
    EXPECT_EQ(DF_DFDTToImage(&value.value, &cluster), 0);
    EXPECT_EQ(value.name(), "part");
    EXPECT_EQ(value.handle(), image.handle());
    // An image that is gone: the name alone, the value's image word stays.
    DF_Dispose(&image.value, 0, nullptr);
    value.value.image = nullptr;
    EXPECT_EQ(DF_DFDTToImage(&value.value, &cluster), 0);
    EXPECT_EQ(value.name(), "another name");
    EXPECT_EQ(value.handle(), nullptr);
    refhost::refuse("NumericArrayResize");
    EXPECT_EQ(DF_DFDTToImage(&value.value, &image.value), -1074396159);
    EXPECT_EQ(value.name(), "another name");
    EXPECT_EQ(DF_DFDTToImage(&value.value, nullptr), 0);
    EXPECT_EQ(value.name(), "");
    EXPECT_EQ(DF_DFDTToImage(nullptr, &cluster), kNullPointer);
}

TEST(ValuesTest, ValueOfTheDataTypeIsRegisteredAnew) {
    HostImage first("first");
    HostImage second("second");
    const uint32_t old_first = first.record().hostCookie;
    const uint32_t old_second = second.record().hostCookie;
    // A value that means nothing yet only takes the cluster over.
    const refhost::String text("any");
    HostImage value;
    ZqImageValue cluster = {text.get(), first.handle()};
    EXPECT_EQ(DF_ImageToDFDT(&cluster, &value.value), 0);
    EXPECT_EQ(value.name(), "any");
    EXPECT_EQ(value.handle(), first.handle());
    EXPECT_EQ(first.record().hostCookie, old_first);
    // Now it means the first image; its registration goes, the second's is made anew.
    cluster = {second.value.name, second.handle()};
    EXPECT_EQ(DF_ImageToDFDT(&cluster, &value.value), 0);
    EXPECT_EQ(value.name(), "second");
    EXPECT_EQ(value.handle(), second.handle());
    EXPECT_FALSE(refhost::session(old_first));
    EXPECT_FALSE(refhost::session(old_second));
    EXPECT_EQ(first.record().hostCookie, 0U);
    ASSERT_TRUE(refhost::session(second.record().hostCookie));
    EXPECT_EQ(refhost::session(second.record().hostCookie)->name, "second");
    EXPECT_EQ(refhost::cookies().size(), 1U);
    // For the image that it means already.
    const uint32_t middle = second.record().hostCookie;
    EXPECT_EQ(DF_ImageToDFDT(&cluster, &value.value), 0);
    EXPECT_NE(second.record().hostCookie, middle);
    EXPECT_EQ(refhost::cookies().size(), 1U);
    // A cluster whose image is gone leaves the registration alone.
    cluster = {first.value.name, first.handle()};
    ZqDisposeImage(first.handle());
    EXPECT_EQ(DF_ImageToDFDT(&cluster, &value.value), kNotAnImage);
    EXPECT_EQ(value.name(), "second");
    EXPECT_TRUE(refhost::session(second.record().hostCookie));
    cluster.image = nullptr;
    EXPECT_EQ(DF_ImageToDFDT(&cluster, &value.value), 0);
    EXPECT_EQ(value.value.name, nullptr);
    EXPECT_EQ(DF_ImageToDFDT(nullptr, &value.value), 0);
    EXPECT_EQ(DF_ImageToDFDT(&cluster, nullptr), kNullPointer);
}

TEST(ValuesTest, CookiesAreRecordedAndTheirSessionsRemoved) {
    ZqImageHandle image = nullptr;
    ASSERT_EQ(NewImage(ZQ_TYPE_U8, 2, 2, 0, &image), 0);
    EXPECT_EQ(image->hostCookie, 0U);
    HostImage donor("donor");
    const uint32_t cookie = donor.record().hostCookie;
    EXPECT_EQ(SetImageCookies(donor.handle(), 0), 0);
    EXPECT_EQ(SetImageCookies(image, cookie), 0);
    EXPECT_EQ(image->hostCookie, cookie);
    DF_Dispose(&donor.value, 0, nullptr);
    EXPECT_TRUE(refhost::session(cookie));
    EXPECT_EQ(ZqDisposeImage(image), 0);
    EXPECT_FALSE(refhost::session(cookie));
}

}  // namespace
