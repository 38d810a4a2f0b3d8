// Images under a host: creation, sessions, tear-down, disposal, lending, and the memory pool.
#include <gtest/gtest.h>
#include <zqvissvc/errors.h>
#include <zqvissvc/values.h>

#include <cstdint>
#include <cstring>
#include <functional>
#include <string>
#include <vector>

#include "refhost/refhost.h"
#include "tests/support/host_image.h"

namespace {

using zqtest::Cluster;
using zqtest::HostImage;

constexpr ZqError kNoMemory = -1074396159;
constexpr ZqError kNotAnImage = -1074396120;
constexpr ZqError kInvalidType = -1074396080;
constexpr ZqError kNullPointer = -1074395269;

// What the library holds with the host.
struct Holdings {
    size_t sessions = refhost::cookies().size();
    size_t cleanups = refhost::cleanup_procs();
    bool operator==(const Holdings&) const = default;
};

TEST(LifecycleTest, ANewImageIsASessionOfTheHost) {
    HostImage image("camera", ZQ_TYPE_I16, 6, 4, 2);
    ASSERT_NE(image.handle(), nullptr);
    EXPECT_EQ(image.name(), "camera");
    const auto session = refhost::session(image.record().hostCookie);
    ASSERT_TRUE(session);
    EXPECT_EQ(session->type, "KEMOImage");
    EXPECT_EQ(session->name, "camera");
    EXPECT_EQ(session->pointer, image.handle());
    // The same name: the same image in another shape, and a session in the place of the old one.
    const Holdings before;
    HostImage again("camera", ZQ_TYPE_SGL, 9, 8, 0);
    EXPECT_EQ(again.handle(), image.handle());
    EXPECT_EQ(image.record().type, ZQ_TYPE_SGL);
    EXPECT_EQ(image.record().width, 9);
    EXPECT_EQ(Holdings(), before);
    EXPECT_TRUE(refhost::session(image.record().hostCookie));
    const uint32_t cookie = image.record().hostCookie;
    HostImage other("Camera");
    EXPECT_NE(other.handle(), image.handle());
    EXPECT_EQ(DF_Dispose(&image.value, 0, nullptr), 0);
    EXPECT_FALSE(refhost::session(cookie));
    EXPECT_TRUE(other.is_live());
}

TEST(LifecycleTest, ArgumentsAreTakenAsHostsGiveThem) {
    HostImage image;
    EXPECT_EQ(image.create({"ab\0cd", 5}, ZQ_TYPE_U8, -3, -1, 5, 1), 0);
    EXPECT_STREQ(image.record().name, "ab");
    EXPECT_EQ(image.record().border, 0);
    EXPECT_EQ(image.record().height, 0);
    EXPECT_NE(image.record().greedySize, 0xFFFFFFFFU);
    ZqImageHandle found = nullptr;
    EXPECT_EQ(ZqFindImage("ab", &found), 0);
    EXPECT_EQ(found, image.handle());
    for (const char* name : {"AB", "a", "abc", "", static_cast<const char*>(nullptr)}) {
        EXPECT_EQ(ZqFindImage(name, &found), 0);
        EXPECT_EQ(found, nullptr) << (name == nullptr ? "null" : name);
    }
    // A value is created anew in place, its name string given as the name.
    EXPECT_EQ(DF_Create(image.value.name, ZQ_TYPE_U8, 0, 3, 3, 0, &image.value, nullptr), 0);
    EXPECT_EQ(image.record().width, 3);
}

TEST(LifecycleTest, UnnamedImagesGoWithTheCaller) {
    const Holdings before;
    HostImage named("stays");
    HostImage first("");
    HostImage second("");
    HostImage empty("", ZQ_TYPE_U8, 0, 0);
    EXPECT_NE(first.handle(), second.handle());
    EXPECT_EQ(GetHaveRegisteredCleanupProc(first.handle()), 1);
    EXPECT_EQ(GetHaveRegisteredCleanupProc(named.handle()), 0);
    EXPECT_EQ(refhost::cleanup_procs(), before.cleanups + 3);
    // Disposed by hand, it is not disposed again.
    EXPECT_EQ(DF_Dispose(&second.value, 0, nullptr), 0);
    EXPECT_EQ(refhost::cleanup_procs(), before.cleanups + 2);
    refhost::run_cleanup();
    EXPECT_TRUE(named.is_live());
    EXPECT_FALSE(first.is_live());
    EXPECT_FALSE(empty.is_live());
    EXPECT_EQ(refhost::cookies().size(), before.sessions + 1);
}

TEST(LifecycleTest, FailuresAreReportedUnderTheirFunction) {
    alignas(4) uint8_t buffer[64];
    const refhost::String name("x");
    struct Case {
        std::function<ZqError(HostImage&, ZqErrorCluster*)> call;
        ZqError code;
        const char* source;
    };
    const auto external = [&](HostImage& i, void* pixels, int32_t border, int32_t line,
                              ZqErrorCluster* e) {
        return DF_CreateFromExternalBuffer(name.get(), ZQ_TYPE_U8, border, 4, 2, 0, pixels, line,
                                           &i.value, e);
    };
    const Case cases[] = {
        {[](HostImage& i, ZqErrorCluster* e) { return i.create("x", 7, 0, 4, 4, 0, e); },
         kInvalidType, "KEMO Create\nInvalid image type."},
        {[](HostImage& i, ZqErrorCluster* e) { return i.create("", -1, 0, 4, 4, 0, e); },
         kInvalidType, "KEMO Create\nInvalid image type."},
        {[](HostImage& i, ZqErrorCluster* e) { return i.create("x", 0, 0, 50000, 50000, 0, e); },
         kNoMemory, "KEMO Create\nNot enough memory for requested operation."},
        {[&](HostImage&, ZqErrorCluster* e) {
             return DF_Create(name.get(), ZQ_TYPE_U8, 0, 4, 4, 0, nullptr, e);
         },
         kNullPointer, "KEMO Create\nNull pointer."},
        {[&](HostImage& i, ZqErrorCluster* e) { return external(i, nullptr, 0, 0, e); },
         kNullPointer, "KEMO Create From External Buffer\nNull pointer."},
        {[&](HostImage& i, ZqErrorCluster* e) { return external(i, buffer, 0, 10, e); },
         -1074396063,
         "KEMO Create From External Buffer\nThe external buffer must be aligned on a 4-byte "
         "boundary. The line width and border pixels must be 4-byte aligned, as well."},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.source);
        const Holdings before;
        HostImage image;
        Cluster error;
        EXPECT_EQ(c.call(image, error), c.code);
        EXPECT_EQ(error.code(), c.code);
        EXPECT_EQ(error.source(), c.source);
        EXPECT_EQ(image.handle(), nullptr);
        EXPECT_EQ(image.value.name, nullptr);
        EXPECT_EQ(Holdings(), before);
        // With an error pending nothing is even tried.
        Cluster pending(-7);
        EXPECT_EQ(c.call(image, pending), -7);
        EXPECT_EQ(pending.source(), "");
        ZqImageHandle found = nullptr;
        ZqFindImage("x", &found);
        EXPECT_EQ(found, nullptr);
    }
    EXPECT_EQ(kemoCreateImage(7, 0), nullptr);
    int16_t low_word = 0;
    refhost::String source;
    DF_SetErrorMode(2, 0, &low_word, source.out());
    EXPECT_EQ(source.text(), "kemoCreate\nInvalid image type.");
    const ZqImageHandle made = kemoCreateImage(ZQ_TYPE_RGB, 5);
    ASSERT_NE(made, nullptr);
    EXPECT_EQ(made->border, 5);
    EXPECT_EQ(ZqDisposeImage(made), 0);
}

// The host refuses a service in the middle: a new image is released again, an old one stays.
TEST(LifecycleTest, AHostThatRefusesIsLeftWithoutTheImage) {
    HostImage old("old");
    for (const char* service : {"UDRegisterSesn", "NumericArrayResize"}) {
        SCOPED_TRACE(service);
        const Holdings before;
        HostImage image;
        refhost::refuse(service);
        EXPECT_EQ(image.create("new", ZQ_TYPE_U8, 0, 4, 4), kNoMemory);
        EXPECT_EQ(image.handle(), nullptr);
        EXPECT_EQ(Holdings(), before);
        ZqImageHandle found = nullptr;
        ZqFindImage("new", &found);
        EXPECT_EQ(found, nullptr);
        refhost::refuse(service);
        EXPECT_EQ(image.create("old", ZQ_TYPE_SGL, 0, 2, 2), kNoMemory);
        EXPECT_TRUE(old.is_live());
        EXPECT_TRUE(refhost::session(old.record().hostCookie));
        EXPECT_EQ(Holdings(), before);
    }
    // Without cleanup procedures an unnamed image lives until it is disposed.
    refhost::refuse("RTSetCleanupProc");
    HostImage image("");
    EXPECT_TRUE(image.is_live());
}

TEST(LifecycleTest, DisposalComesBeforeTheIncomingError) {
    HostImage named("a");
    HostImage unnamed("");
    Cluster pending(-9);
    EXPECT_EQ(DF_Dispose(&named.value, 0, pending), -9);
    EXPECT_FALSE(named.is_live());
    EXPECT_EQ(pending.code(), -9);
    EXPECT_EQ(pending.source(), "");
    // A value whose image is gone is told so; one without image, or none at all, is no error.
    Cluster error;
    EXPECT_EQ(DF_Dispose(&named.value, 0, error), kNotAnImage);
    EXPECT_EQ(error.source(), "KEMO Dispose\nNot an image.");
    EXPECT_EQ(DF_Dispose(&named.value, 0, pending), -9);
    const ZqImageValue none{};
    EXPECT_EQ(DF_Dispose(&none, 0, nullptr), 0);
    EXPECT_EQ(DF_Dispose(nullptr, 0, nullptr), 0);
    EXPECT_EQ(ZqDisposeImage(named.handle()), 0);
    EXPECT_EQ(ZqDisposeImage(nullptr), 0);
    HostImage another("b");
    EXPECT_EQ(DF_Dispose(nullptr, 1, pending), -9);
    EXPECT_FALSE(unnamed.is_live());
    EXPECT_FALSE(another.is_live());
    EXPECT_TRUE(refhost::cookies().empty());
    EXPECT_EQ(refhost::cleanup_procs(), 0U);
}

TEST(LifecycleTest, LentBuffersOutliveTheirImage) {
    HostImage image("lender", ZQ_TYPE_U8, 100, 100, 0);
    void* buffer = nullptr;
    void* second = nullptr;
    int32_t count = -1;
    EXPECT_EQ(Gen_MarkExternalBuffer(&image.value, 1, &buffer), 0);
    EXPECT_EQ(Gen_MarkExternalBuffer(&image.value, 1, &second), 0);
    EXPECT_EQ(buffer, image.record().buffer);
    EXPECT_EQ(Gen_GetExternalCount(&image.value, &count), 0);
    EXPECT_EQ(count, 2);
    Cluster error;
    EXPECT_EQ(DF_SetImageSize(&image.value, 5, 5, error), -1074396065);
    EXPECT_EQ(image.create("lender", ZQ_TYPE_U8, 0, 100, 100), -1074396065);
    DF_Dispose(&image.value, 0, nullptr);
    std::memset(buffer, 1, 100 * 128);
    void* invented = &count;
    EXPECT_EQ(Gen_MarkExternalBuffer(&image.value, 0, &invented), kNotAnImage);
    EXPECT_EQ(Gen_MarkExternalBuffer(&image.value, 1, &invented), kNotAnImage);
    EXPECT_EQ(Gen_MarkExternalBuffer(&image.value, 0, &buffer), 0);
    std::memset(buffer, 2, 100 * 128);
    EXPECT_EQ(Gen_MarkExternalBuffer(&image.value, 0, &buffer), 0);
    EXPECT_EQ(Gen_MarkExternalBuffer(&image.value, 0, &buffer), kNotAnImage);
    EXPECT_EQ(Gen_GetExternalCount(&image.value, &count), kNotAnImage);
    EXPECT_EQ(Gen_GetExternalCount(nullptr, &count), kNullPointer);
    EXPECT_EQ(Gen_GetExternalCount(&image.value, nullptr), kNullPointer);
    EXPECT_EQ(Gen_MarkExternalBuffer(nullptr, 1, &buffer), kNullPointer);
    EXPECT_EQ(Gen_MarkExternalBuffer(&image.value, 0, nullptr), kNullPointer);
}

TEST(LifecycleTest, AnExternalBufferStaysItsOwners) {
    std::vector<uint8_t> pixels(20 * 10, 3);
    const refhost::String name("outside");
    HostImage image;
    ASSERT_EQ(DF_CreateFromExternalBuffer(name.get(), ZQ_TYPE_U8, 4, 8, 2, 0, pixels.data(), 20,
                                          &image.value, nullptr),
              0);
    void* address = nullptr;
    EXPECT_EQ(ZqGetPixelAddress(image.handle(), -4, -4, &address), 0);
    EXPECT_EQ(address, pixels.data());
    void* buffer = nullptr;
    EXPECT_EQ(Gen_MarkExternalBuffer(&image.value, 1, &buffer), 0);
    DF_Dispose(&image.value, 0, nullptr);
    EXPECT_EQ(Gen_MarkExternalBuffer(&image.value, 0, &buffer), 0);
    EXPECT_EQ(pixels, std::vector<uint8_t>(20 * 10, 3));
}

TEST(LifecycleTest, ThePoolRefusesWhatItMust) {
    constexpr ZqError kExists = -1074396089;
    constexpr ZqError kEnabled = -1074396090;
    constexpr ZqError kMissing = -1074396091;
    constexpr ZqError kInUse = -1074396092;
    HostImage image("pooled", ZQ_TYPE_U8, 0, 0, 0);
    const auto size = [](int32_t kb) {
        return [kb](ZqErrorCluster* e) { return DF_SetMemoryPoolSize(kb, e); };
    };
    const auto enable = [](int32_t on) {
        return [on](ZqErrorCluster* e) { return DF_EnableMemoryPool(on, e); };
    };
    const auto reset = [](ZqErrorCluster* e) { return DF_ResetMemoryPool(e); };
    const auto resize = [&](int32_t side) {
        return [&image, side](ZqErrorCluster* e) {
            return DF_SetImageSize(&image.value, side, side, e);
        };
    };
    struct Step {
        std::function<ZqError(ZqErrorCluster*)> call;
        ZqError code;
    };
    const Step steps[] = {
        {size(0), 0},    {reset, 0},         {enable(1), kMissing},      {enable(0), kMissing},
        {size(4), 0},    {size(4), kExists}, {size(8), kExists},         {enable(2), 0},
        {reset, 0},      {enable(1), 0},     {reset, kEnabled},          {size(0), kEnabled},
        {resize(30), 0}, {size(0), kInUse},  {resize(100), -1074396139}, {reset, kEnabled},
        {enable(0), 0},  {size(0), kInUse},  {size(-1), kInUse},         {reset, 0},
        {size(0), 0},    {resize(40), 0},    {enable(1), kMissing},      {size(1), 0},
        {size(0), 0},    {size(0), 0},
    };
    for (size_t i = 0; i < std::size(steps); ++i) {
        Cluster error;
        EXPECT_EQ(steps[i].call(error), steps[i].code) << "step " << i;
        EXPECT_EQ(error.failed(), steps[i].code != 0);
        if (steps[i].code == kMissing) {
            EXPECT_EQ(error.source().substr(0, 13), "KEMO Private\n");
        }
    }
    EXPECT_EQ(image.record().width, 40);
    EXPECT_EQ(refhost::cleanup_procs(), 0U);
    // Giving memory back does not wait for an error that is pending; asking for it does.
    Cluster pending(-9);
    EXPECT_EQ(DF_SetMemoryPoolSize(4, pending), -9);
    EXPECT_EQ(DF_EnableMemoryPool(1, nullptr), kMissing);
    EXPECT_EQ(DF_SetMemoryPoolSize(4, nullptr), 0);
    EXPECT_EQ(DF_ResetMemoryPool(pending), -9);
    EXPECT_EQ(DF_SetMemoryPoolSize(0, pending), -9);
    EXPECT_EQ(DF_EnableMemoryPool(0, nullptr), kMissing);
}

// The caller is torn down while the pool is enabled and a named image lies in it.
TEST(LifecycleTest, ThePoolGoesWithTheCaller) {
    HostImage image("survivor");
    EXPECT_EQ(DF_SetMemoryPoolSize(4, nullptr), 0);
    EXPECT_EQ(DF_EnableMemoryPool(1, nullptr), 0);
    EXPECT_EQ(DF_SetImageSize(&image.value, 20, 20, nullptr), 0);
    refhost::run_cleanup();
    EXPECT_EQ(DF_EnableMemoryPool(1, nullptr), -1074396091);
    std::memset(image.record().firstPixel, 1, 20);
    EXPECT_EQ(DF_SetImageSize(&image.value, 200, 200, nullptr), 0);
    EXPECT_EQ(DF_SetMemoryPoolSize(4, nullptr), 0);
}

TEST(LifecycleTest, MemoryModesAreChecked) {
    static int live = 0;
    const auto allocate = [](size_t bytes) -> void* {
        ++live;
        return ::operator new(bytes);
    };
    const auto release = [](void* block) {
        --live;
        ::operator delete(block);
    };
    for (const int32_t mode : {0, 4, -1, 1}) {
        EXPECT_EQ(ZqSetMemoryMode(mode, nullptr, release), -1074395997) << mode;
    }
    EXPECT_EQ(ZqSetMemoryMode(1, allocate, release), 0);
    {
        HostImage image("mine");
        EXPECT_EQ(live, 1);
        EXPECT_EQ(ZqSetMemoryMode(3, nullptr, nullptr), 0);
    }
    EXPECT_EQ(live, 0);
}

TEST(LifecycleTest, CoreFunctionsCheckTheirPointers) {
    ZqImageHandle image = nullptr;
    EXPECT_EQ(NewImage(ZQ_TYPE_U8, 1, 1, 0, nullptr), kNullPointer);
    EXPECT_EQ(NewNamedImage(ZQ_TYPE_U8, 1, 1, 0, "x", 0, nullptr), kNullPointer);
    EXPECT_EQ(ZqFindImage("x", &image), 0);
    EXPECT_EQ(image, nullptr);
    EXPECT_EQ(ZqLockImages(nullptr, 1), kNullPointer);
    EXPECT_EQ(ZqLockImages(nullptr, -1), -1074395997);
    EXPECT_EQ(ZqLockImages(nullptr, 0), 0);
    ASSERT_EQ(NewImage(ZQ_TYPE_U8, 1, 1, 0, &image), 0);
    EXPECT_EQ(ZqGetPixelAddress(image, 0, 0, nullptr), kNullPointer);
    EXPECT_EQ(ZqResizeImage(image, 1, 1, 0, 0, 3), -1074395997);
    EXPECT_EQ(ZqResizeImage(image, 1, 1, 1, 7, 0), kInvalidType);
    EXPECT_EQ(ZqDisposeImage(image), 0);
    EXPECT_EQ(ZqResizeImage(image, 2, 2, 0, 0, 0), kNotAnImage);
    EXPECT_EQ(SetImageCookies(image, 5), kNotAnImage);
    EXPECT_EQ(GetHaveRegisteredCleanupProc(image), 0);
}

}  // namespace
