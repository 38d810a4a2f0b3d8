// The settings of flattening, the hooks of the host's data type, and reshaping for a transport.
#include <gtest/gtest.h>
#include <zqvissvc/flatten.h>

#include <atomic>
#include <cstdint>
#include <string>
#include <thread>
#include <vector>

#include "refhost/refhost.h"
#include "tests/support/host_image.h"
#include "tests/support/picture.h"
#include "tests/support/record.h"

namespace {

using zqtest::Cluster;
using zqtest::HostImage;
using zqtest::Picture;
using zqtest::Record;

constexpr ZqError kNotAnImage = -1074396120;
constexpr ZqError kBadType = -1074396080;
constexpr ZqError kLent = -1074396065;
constexpr ZqError kBadRecord = -1074395960;
constexpr ZqError kBadQuality = -1074395956;
constexpr ZqError kBadCodec = -1074395704;
constexpr ZqError kBadKind = -1074395703;
constexpr ZqError kNullPointer = -1074395269;
constexpr int32_t kNew = 0x00080000;

// Codec id and quality of the remote setting, codec id, kind and quality of the flatten setting.
struct Settings {
    int32_t remote = -1, remote_quality = -1, flatten = -1, kind = -1, quality = -1;
    bool operator==(const Settings&) const = default;

    static Settings read() {
        Settings now;
        EXPECT_EQ(DF_RPCImageCompression3(&now.remote, &now.remote_quality, 0, nullptr), 0);
        EXPECT_EQ(DF_FlattenImageCompression(&now.flatten, &now.kind, &now.quality, 0, nullptr), 0);
        return now;
    }
};
void PrintTo(const Settings& s, std::ostream* out) {
    *out << s.remote << '/' << s.remote_quality << ' ' << s.flatten << '/' << s.kind << '/'
         << s.quality;
}

class FlattenSettingsTest : public testing::Test {
  protected:
    void TearDown() override {
        for (int32_t codec : {1, 0}) {
            int32_t quality = 750, kind = 0;
            DF_RPCImageCompression2(&codec, &quality, 1, nullptr);
            DF_FlattenImageCompression(&codec, &kind, &quality, 1, nullptr);
        }
    }
};

TEST_F(FlattenSettingsTest, EachOperationChangesItsOwnAndTheOldOneBoth) {
    enum Operation { kFlatten, kKind, kOld, kNewer };
    struct Step {
        Operation operation;
        int32_t codec, kind, quality;
        ZqError code;
        Settings after;
    };
    const Step steps[] = {
        {kFlatten, 1, 2, 5, 0, {0, 1000, 1, 2, 10}},
        {kFlatten, 1, 2, -1, kBadQuality, {0, 1000, 1, 2, 10}},
        {kFlatten, 3, 2, 1001, kBadQuality, {0, 1000, 1, 2, 10}},
        {kFlatten, 3, 3, 50, kBadCodec, {0, 1000, 1, 2, 10}},
        {kFlatten, 0, 3, 50, kBadKind, {0, 1000, 1, 2, 10}},
        {kKind, 9, 1, 5000, 0, {0, 1000, 1, 1, 10}},
        {kKind, 9, -1, 5000, kBadKind, {0, 1000, 1, 1, 10}},
        {kNewer, 1, 0, 400, 0, {1, 400, 1, 1, 10}},
        {kNewer, 1, 0, 1001, kBadQuality, {1, 400, 1, 1, 10}},
        {kNewer, -1, 0, 400, kBadCodec, {1, 400, 1, 1, 10}},
        {kOld, 7, 0, 400, kBadCodec, {1, 400, 1, 1, 10}},
        {kOld, 2, 0, -99, 0, {2, 1000, 2, 1, 1000}},
        {kOld, 1, 0, 99999, 0, {1, 1000, 1, 1, 1000}},
        {kFlatten, 1, 0, 1000, 0, {1, 1000, 1, 0, 1000}},
        {kNewer, 0, 0, 10, 0, {0, 1000, 1, 0, 1000}},
    };
    EXPECT_EQ(Settings::read(), (Settings{0, 1000, 0, 0, 1000})) << "at first";
    for (const Step& step : steps) {
        int32_t codec = step.codec, kind = step.kind, quality = step.quality;
        Cluster error;
        const ZqError code = step.operation == kFlatten
                                 ? DF_FlattenImageCompression(&codec, &kind, &quality, 1, error)
                             : step.operation == kKind
                                 ? DF_FlattenImageCompression(nullptr, &kind, nullptr, 1, error)
                             : step.operation == kOld
                                 ? DF_RPCImageCompression2(&codec, &quality, 1, error)
                                 : DF_RPCImageCompression3(&codec, &quality, 1, error);
        EXPECT_EQ(code, step.code);
        EXPECT_EQ(Settings::read(), step.after) << "step " << (&step - steps);
        const char* const names[] = {"KEMO Flatten Image Options", "KEMO Flatten Image Options",
                                     "KEMO Remote Compression", "KEMO Remote Display Options"};
        if (code != 0) {
            EXPECT_EQ(error.source().find(names[step.operation]), 0U) << error.source();
        }
    }
    int32_t codec = 1;
    EXPECT_EQ(DF_RPCImageCompression2(nullptr, &codec, 1, nullptr), kNullPointer);
    EXPECT_EQ(DF_RPCImageCompression3(&codec, nullptr, 1, nullptr), kNullPointer);
    EXPECT_EQ(DF_FlattenImageCompression(&codec, nullptr, nullptr, 1, nullptr), kNullPointer);
    EXPECT_EQ(DF_RPCImageCompression3(&codec, nullptr, 0, nullptr), 0) << "the id alone";
    const Settings before = Settings::read();
    int32_t both = 0;
    EXPECT_EQ(DF_FlattenImageCompression(&both, nullptr, &both, 0, nullptr), 0);
    EXPECT_EQ(DF_RPCImageCompression2(&both, &both, 0, nullptr), 0);
    EXPECT_EQ(Settings::read(), before) << "reading into one word";
}

TEST_F(FlattenSettingsTest, EachModeFollowsItsSetting) {
    const Picture picture(ZQ_TYPE_U8, 9, 9);
    int32_t codec = 2, kind = 1, quality = 0;
    ASSERT_EQ(DF_FlattenImageCompression(&codec, &kind, &quality, 1, nullptr), 0);
    codec = 1;
    ASSERT_EQ(DF_RPCImageCompression3(&codec, &quality, 1, nullptr), 0);
    const uint32_t expected[3][2] = {{1, 0}, {2, 1}, {0, 0}};
    for (int32_t mode = 0; mode < 3; ++mode) {
        refhost::String string;
        ASSERT_EQ(FlattenImageToArray1D2(picture.handle(), string.out(), mode, 0, 0, 0, 0, -1), 0);
        const Record record(string.text());
        EXPECT_EQ(record.words[zqtest::kCodec], expected[mode][0]) << mode;
        EXPECT_EQ(record.words[zqtest::kKind], expected[mode][1]) << mode;
    }
}

// A quality that counts for one call only is never seen by anybody else.
TEST_F(FlattenSettingsTest, StressTemporaryQualityStaysPrivate) {
    constexpr int kThreads = 4, kRounds = 50;
    int32_t codec = 1, kind = 0, quality = 300;
    ASSERT_EQ(DF_FlattenImageCompression(&codec, &kind, &quality, 1, nullptr), 0);
    std::atomic<int> wrong{0};
    std::vector<std::thread> threads;
    threads.reserve(kThreads);
    for (int t = 0; t < kThreads; ++t) {
        threads.emplace_back([&, t] {
            const Picture picture(ZQ_TYPE_U8, 40, 40);
            std::string first;
            for (int i = 0; i < kRounds; ++i) {
                refhost::String string;
                const bool given = t % 2 == 0;
                wrong += FlattenImageToArray1D2(picture.handle(), string.out(), given ? 2 : 1, 1, 0,
                                                t == 0 ? 1000 : 20, 0, -1) != 0;
                std::string text = string.text();
                if (i == 0) first = text;
                wrong += text != first;
                int32_t id = 0, seen = 0;
                DF_FlattenImageCompression(&id, nullptr, &seen, 0, nullptr);
                wrong += seen != 300;
            }
        });
    }
    for (std::thread& thread : threads) thread.join();
    EXPECT_EQ(wrong, 0);
}

// A value made of flattened bytes; the image goes with it unless it is somebody else's.
class Unflattened {
  public:
    explicit Unflattened(const std::string& bytes) {
        const refhost::String string(bytes);
        code = DF_ImageDTUnFlatten(string.get(), &value);
    }
    ~Unflattened() { refhost::dispose(value.name); }
    Unflattened(const Unflattened&) = delete;
    Unflattened& operator=(const Unflattened&) = delete;
    std::string name() const { return refhost::text(value.name); }

    ZqImageValue value{};
    ZqError code;
};

TEST(FlattenHooksTest, AValueComesBackByCookieAndName) {
    HostImage image("lamp", ZQ_TYPE_U8, 4, 3, 0);
    image.handle()->firstPixel[0] = 7;
    ZqStringHandle string = nullptr;
    ASSERT_EQ(DF_ImageDTFlatten(&image.value, &string), 0);
    const std::string bytes = refhost::text(string);
    EXPECT_EQ(Record(bytes).words[zqtest::kVersion], 0x00080000U);
    image.handle()->firstPixel[0] = 1;
    {
        const Unflattened same(bytes);
        ASSERT_EQ(same.code, 0);
        EXPECT_EQ(same.value.image, image.handle()) << "same cookie, same name";
        EXPECT_EQ(same.name(), "lamp");
        EXPECT_EQ(image.handle()->firstPixel[0], 7) << "refilled";
    }
    Record other(bytes);
    other.name = "lamb";
    Record stale(bytes);
    stale.words[zqtest::kCookie] += 1000;
    for (const Record& record : {other, stale}) {
        const size_t sessions = refhost::cookies().size();
        Unflattened made(record.bytes());
        ASSERT_EQ(made.code, 0);
        EXPECT_NE(made.value.image, image.handle());
        EXPECT_EQ(made.name().find("remote image "), 0U) << made.name();
        ASSERT_EQ(refhost::cookies().size(), sessions + 1) << "registered";
        const auto session = refhost::session(made.value.image->hostCookie);
        ASSERT_TRUE(session);
        EXPECT_EQ(session->name, made.name());
        EXPECT_EQ(session->flattened, record.bytes());
        EXPECT_EQ(session->version, 0x00080000U);
        DF_Dispose(&made.value, 0, nullptr);
    }
    DF_Dispose(&image.value, 0, nullptr);
    Unflattened dead(bytes);
    ASSERT_EQ(dead.code, 0);
    EXPECT_EQ(dead.name().find("remote image "), 0U) << "the session is gone";
    DF_Dispose(&dead.value, 0, nullptr);
}

TEST(FlattenHooksTest, ARefusedRegistrationLeavesNoImage) {
    HostImage image("lamp");
    ZqStringHandle string = nullptr;
    ASSERT_EQ(DF_ImageDTFlatten(&image.value, &string), 0);
    Record record(refhost::text(string));
    record.name = "other";
    for (const char* service : {"UDRegisterSesnFlatten2", "NumericArrayResize"}) {
        refhost::refuse(service);
        const Unflattened made(record.bytes());
        EXPECT_NE(made.code, 0) << service;
        EXPECT_EQ(made.value.image, nullptr);
        ZqImageHandle left = nullptr;
        char name[32];
        snprintf(name, sizeof name, "remote image %08X", record.words[zqtest::kSource]);
        EXPECT_EQ(ZqFindImage(name, &left), 0);
        EXPECT_EQ(left, nullptr) << service;
    }
    EXPECT_EQ(Unflattened("").code, kBadRecord);
    EXPECT_EQ(Unflattened("short").code, kBadRecord);
    EXPECT_EQ(DF_ImageDTUnFlatten(string, nullptr), kNullPointer);
}

TEST(FlattenHooksTest, StringsAreKeptForEachImageAndMode) {
    HostImage image("a"), second("b");
    ZqStringHandle kept = nullptr, again = nullptr, remote = nullptr, other = nullptr;
    const size_t before = refhost::live_handles();
    ASSERT_EQ(DF_ImageDTFlatten(&image.value, &kept), 0);
    const std::string first = refhost::text(kept);
    ASSERT_EQ(DF_ImageDTFlatten(&image.value, &again), 0);
    EXPECT_EQ(again, kept) << "one string, with one record";
    EXPECT_EQ(refhost::text(again), first);
    ASSERT_EQ(DF_ImageDTFlatten2(&image.value, 1, 0x00070100, &remote), 0);
    EXPECT_EQ(Record(refhost::text(remote)).words[zqtest::kVersion], 0x00070100U);
    ASSERT_EQ(DF_ImageDTFlatten2(&second.value, 0, -1, &other), 0);
    EXPECT_EQ(refhost::live_handles(), before + 3);
    EXPECT_EQ(RemoveImageFromFlattenTable(image.handle()), 0);
    EXPECT_EQ(refhost::live_handles(), before + 1);
    EXPECT_EQ(RemoveImageFromFlattenTable(nullptr), 0);
    DF_Dispose(&second.value, 0, nullptr);
    EXPECT_EQ(RemoveImageFromFlattenTable(second.handle()), 0);
    EXPECT_EQ(refhost::live_handles(), before) << "gone with its image";
    ZqStringHandle untouched = nullptr;
    EXPECT_EQ(DF_ImageDTFlatten(&second.value, &untouched), kNotAnImage);
    EXPECT_EQ(DF_ImageDTFlatten2(&image.value, 0, 5, &untouched), kBadRecord);
    EXPECT_EQ(DF_ImageDTFlatten(&image.value, nullptr), kNullPointer);
    EXPECT_EQ(untouched, nullptr);
}

// The lock of a private image locks nobody out.
TEST(FlattenHooksTest, StressAPrivateImageInSeveralThreads) {
    ZqImageHandle image = nullptr;
    ASSERT_EQ(NewPrivateNamedImage(ZQ_TYPE_U8, 64, 64, 0, "private", 0, &image), 0);
    const ZqImageValue value = {nullptr, image};
    std::atomic<int> wrong{0};
    std::vector<std::thread> threads;
    threads.reserve(3);
    for (int t = 0; t < 3; ++t) {
        threads.emplace_back([&, t] {
            for (int i = 0; i < 100; ++i) {
                ZqStringHandle string = nullptr;
                wrong += t == 2 ? RemoveImageFromFlattenTable(image) != 0
                                : DF_ImageDTFlatten(&value, &string) != 0;
            }
        });
    }
    for (std::thread& thread : threads) thread.join();
    EXPECT_EQ(wrong, 0);
    ZqDisposeImage(image);
}

TEST(ReconstructTest, ReshapesAsCreationDoes) {
    HostImage image("a", ZQ_TYPE_U8, 6, 4, 1);
    image.handle()->unit = 3;
    Cluster error;
    ASSERT_EQ(DF_ReconstructImage(&image.value, ZQ_TYPE_RGB, 11, 7, 2, 1, error), 0);
    EXPECT_EQ(image.record().type, ZQ_TYPE_RGB);
    EXPECT_EQ(image.record().width, 11);
    EXPECT_EQ(image.record().height, 7);
    EXPECT_EQ(image.record().border, 2);
    EXPECT_EQ(image.record().unit, 0);
    EXPECT_NE(image.record().greedySize, 0xFFFFFFFF);
    EXPECT_EQ(DF_ReconstructImage(&image.value, 7, 11, 7, 2, 0, error), kBadType);
    EXPECT_EQ(error.source(), "KEMO Reconstruct\nInvalid image type.");
    const ZqImageValue nothing{};
    Cluster other;
    EXPECT_EQ(DF_ReconstructImage(&nothing, 0, 1, 1, 0, 0, other), kNotAnImage);
}

TEST(ReconstructTest, LendsThePixelsToATransport) {
    HostImage image("a", ZQ_TYPE_U8, 6, 4, 3);
    void* pixel = nullptr;
    int32_t line = 0;
    ASSERT_EQ(Gen_ReconstructImageAndMarkAsExternal(&image.value, ZQ_TYPE_I16, 33, 2, -1, 0, 12,
                                                    &pixel, &line),
              0);
    EXPECT_EQ(image.record().border, 3) << "kept";
    EXPECT_EQ(line, image.record().rowPixels);
    EXPECT_EQ(pixel, image.record().firstPixel);
    for (int32_t y = 0; y < 2; ++y) {
        for (int32_t x = 0; x < 33; ++x) static_cast<int16_t*>(pixel)[y * line + x] = 1000;
    }
    int32_t bits = 0, lent = 0;
    EXPECT_EQ(DF_ImageBitDepth2(&image.value, 0, &bits, nullptr), 0);
    EXPECT_EQ(bits, 12);
    EXPECT_EQ(Gen_GetExternalCount(&image.value, &lent), 0);
    EXPECT_EQ(lent, 1);
    EXPECT_EQ(DF_ReconstructImage(&image.value, ZQ_TYPE_U8, 1, 1, 0, 0, nullptr), kLent);
    void* refused = nullptr;
    EXPECT_EQ(
        Gen_ReconstructImageAndMarkAsExternal2(&image.value, 0, 1, 1, 0, 0, 0, 0, &refused, &line),
        kLent);
    EXPECT_EQ(refused, nullptr);
    refhost::String string;
    ASSERT_EQ(DF_FlattenImageToString(&image.value, string.out(), nullptr), 0);
    EXPECT_EQ(DF_UnflattenImageFromString(&image.value, string.get(), nullptr), 0)
        << "same shape: filled in place";
    void* buffer = image.record().buffer;
    EXPECT_EQ(Gen_MarkExternalBuffer(&image.value, 0, &buffer), 0);
    EXPECT_EQ(DF_ReconstructImage(&image.value, ZQ_TYPE_U8, 1, 1, 0, 0, nullptr), 0);

    struct Case {
        const ZqImageValue* image;
        void** pixel;
        int32_t* line;
        ZqError code;
    };
    const ZqImageValue nothing{};
    const Case cases[] = {{nullptr, &pixel, &line, kNullPointer},
                          {&nothing, nullptr, &line, kNullPointer},
                          {&nothing, &pixel, nullptr, kNullPointer},
                          {&nothing, &pixel, &line, kNotAnImage}};
    for (const Case& c : cases) {
        EXPECT_EQ(
            Gen_ReconstructImageAndMarkAsExternal2(c.image, 0, 1, 1, 0, 0, 0, 0, c.pixel, c.line),
            c.code);
    }
}

}  // namespace
