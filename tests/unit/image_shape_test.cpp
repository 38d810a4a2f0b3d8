// Changes of an image's shape: what they keep, what they reset, and what a failure leaves.
#include <gtest/gtest.h>

#include <climits>
#include <cstdint>
#include <cstdlib>
#include <functional>
#include <memory>
#include <optional>
#include <vector>

#include "image/image.h"
#include "image/memory.h"
#include "image/physical_memory.h"
#include "tests/support/image_probes.h"
#include "zqkemomem.h"

namespace zq {
namespace {

using zqtest::code_of;
using zqtest::fill;
using zqtest::pixels_of;
using zqtest::same_record;
using zqtest::sample;

constexpr auto kPlain = ResizeMode::kPlain;
constexpr auto kKeep = ResizeMode::kKeepContents;
constexpr auto kPhysical = ResizeMode::kPhysical;

std::unique_ptr<Image> make(const ImageShape& shape) {
    auto image = std::make_unique<Image>(Variant::kRegistered, std::string_view());
    image->reinitialise(shape);
    return image;
}

// Extra information that tells when it goes.
class Watched final : public ImageExtraInfo {
  public:
    explicit Watched(int& destroyed) : destroyed_(destroyed) {}
    ~Watched() override { ++destroyed_; }
    Watched(const Watched&) = delete;
    Watched& operator=(const Watched&) = delete;
    void remove_kind(std::int32_t /*kind*/) override {}

  private:
    int& destroyed_;
};

TEST(ImageShapeTest, SizesAreNormalised) {
    struct Case {
        ImageShape shape;
        std::int32_t width, height, border;
    };
    const Case cases[] = {
        {{ZQ_TYPE_U8, 0, 5, 0}, 0, 0, 0},   {{ZQ_TYPE_U8, 5, 0, 1}, 0, 0, 1},
        {{ZQ_TYPE_U8, -1, 5, -3}, 0, 0, 0}, {{ZQ_TYPE_U8, 5, INT_MIN, 2}, 0, 0, 2},
        {{ZQ_TYPE_SGL, 5, 4, -3}, 5, 4, 0}, {{ZQ_TYPE_SGL, 0, 0, INT_MIN}, 0, 0, 0},
    };
    for (const Case& c : cases) {
        const auto made = make(c.shape);
        const auto resized = make({c.shape.type, 7, 7, c.shape.border});
        resized->resize(c.shape.width, c.shape.height, std::nullopt, kPlain);
        for (const Image* image : {made.get(), resized.get()}) {
            EXPECT_EQ(image->record().width, c.width);
            EXPECT_EQ(image->record().height, c.height);
            EXPECT_EQ(image->record().border, c.border);
        }
    }
}

TEST(ImageShapeTest, AddressesTheImageAndItsBorderOnly) {
    const auto image = make({ZQ_TYPE_RGB, 5, 4, 3});
    struct Case {
        std::int32_t x, y;
        std::ptrdiff_t offset;  // bytes from pixel (0, 0); rows are 16 pixels of 4 bytes apart
        GRLIBError_enum code;
    };
    const Case cases[] = {
        {-3, -3, -204, kSuccess},
        {7, 6, 412, kSuccess},
        {7, -3, -164, kSuccess},
        {-3, 6, 372, kSuccess},
        {4, 3, 208, kSuccess},
        {-4, -3, 0, kInvalidCoordinate},
        {-3, -4, 0, kInvalidCoordinate},
        {8, 6, 0, kInvalidCoordinate},
        {7, 7, 0, kInvalidCoordinate},
        {INT_MIN, 0, 0, kInvalidCoordinate},
        {0, INT_MAX, 0, kInvalidCoordinate},
    };
    for (const Case& c : cases) {
        std::uint8_t* address = image->record().firstPixel;
        EXPECT_EQ(code_of([&] { address = image->pixel(c.x, c.y); }), c.code) << c.x << ',' << c.y;
        EXPECT_EQ(address - image->record().firstPixel, c.offset) << c.x << ',' << c.y;
    }
    const auto empty = make({ZQ_TYPE_U8, 0, 0, 3});
    EXPECT_EQ(code_of([&] { empty->pixel(-1, -1); }), kImageTooSmall);
    empty->resize(0, 0, std::nullopt, kPlain);
    EXPECT_EQ(empty->record().buffer, nullptr);
}

// Blocks that never stay where they are, nor keep their alignment.
memory::HostRoutine moving_routine() {
    static std::size_t shift = 0;
    return {[](std::size_t bytes) -> void* {
                auto* raw = static_cast<std::uint8_t*>(std::malloc(bytes + 96));
                if (raw == nullptr) return nullptr;
                shift = (shift + 8) % 32;
                const std::size_t skip = 64 - reinterpret_cast<std::uintptr_t>(raw) % 32 + shift;
                raw[skip - 1] = static_cast<std::uint8_t>(skip);
                return raw + skip;
            },
            [](void* block) {
                auto* bytes = static_cast<std::uint8_t*>(block);
                std::free(bytes - bytes[-1]);
            }};
}

class MemoryMode {
  public:
    explicit MemoryMode(const memory::HostRoutine& routine) {
        memory::set_mode(memory::Mode::kHostRoutine, &routine);
    }
    ~MemoryMode() { memory::set_mode(memory::Mode::kHeap, nullptr); }
    MemoryMode(const MemoryMode&) = delete;
    MemoryMode& operator=(const MemoryMode&) = delete;
};

// Rows of the old image, its border included, that are where they were, counted from the top.
std::int32_t rows_kept(const Image& image, std::int32_t old_rows) {
    const ImageRecord& record = image.record();
    std::int32_t kept = 0;
    for (std::int32_t y = -record.border; y < old_rows - record.border; ++y, ++kept) {
        if (y >= record.height + record.border) break;
        const std::uint8_t* row = image.pixel(-record.border, y);
        for (std::int32_t x = 0; x < record.width + 2 * record.border; ++x) {
            if (row[x] != sample(x, y)) return kept;
        }
    }
    return kept;
}

TEST(ImageShapeTest, KeepsRowsWhenOnlyTheHeightChanges) {
    struct Case {
        std::int32_t width, height, border, new_width, new_height;
        std::int32_t kept;  // rows, borders counted
    };
    const Case cases[] = {
        {10, 4, 0, 10, 9, 4},  {10, 9, 0, 10, 4, 4},   {10, 4, 3, 10, 9, 10},
        {10, 9, 3, 10, 4, 10}, {33, 200, 2, 33, 1, 5}, {33, 1, 2, 33, 200, 5},
    };
    for (const bool moving : {false, true}) {
        std::optional<MemoryMode> mode;
        if (moving) mode.emplace(moving_routine());
        for (const Case& c : cases) {
            SCOPED_TRACE(testing::Message() << c.height << " to " << c.new_height);
            const auto image = make({ZQ_TYPE_U8, c.width, c.height, c.border});
            fill(*image);
            image->resize(c.new_width, c.new_height, std::nullopt, kKeep);
            EXPECT_EQ(image->record().height, c.new_height);
            EXPECT_EQ(rows_kept(*image, c.height + 2 * c.border), c.kept);
            EXPECT_EQ(reinterpret_cast<std::uintptr_t>(image->record().firstPixel) % 32, 0U);
        }
    }
}

// The caller's buffer ends with its last pixel, far short of a whole line: the copy must not read
// on.
TEST(ImageShapeTest, KeepsRowsOfAnExternalBufferWithItsOwnLineWidth) {
    for (const std::int32_t row_pixels : {12, 32, 100}) {
        std::vector<std::uint8_t> pixels(static_cast<std::size_t>(row_pixels) * 2 + 10);
        Image image(Variant::kRegistered, {});
        image.wrap_external({ZQ_TYPE_U8, 10, 3, 0}, pixels.data(), row_pixels);
        fill(image);
        const auto before = pixels;
        image.resize(10, 5, std::nullopt, kKeep);
        EXPECT_EQ(rows_kept(image, 3), 3);
        EXPECT_EQ(image.record().rowPixels, 32);
        zqtest::each_byte(image, 0,
                          [](std::uint8_t& byte, std::int32_t, std::int32_t) { byte = 0; });
        EXPECT_EQ(pixels, before) << "the owner's buffer was written after it had been left";
    }
}

TEST(ImageShapeTest, GreedyBuffersNeverShrink) {
    const auto image = make({ZQ_TYPE_U8, 1000, 1000, 0, true});
    const std::uint8_t* buffer = image->record().buffer;
    EXPECT_EQ(image->record().greedySize, 1024064U);
    image->resize(10, 10, std::nullopt, kPlain);
    EXPECT_EQ(image->record().greedySize, 1024064U);
    EXPECT_EQ(image->record().rowPixels, 32);
    image->resize(1000, 1000, std::nullopt, kPlain);
    EXPECT_EQ(image->record().buffer, buffer);
    image->resize(1000, 1001, std::nullopt, kPlain);
    EXPECT_EQ(image->record().greedySize, 1025088U);
    image->set_border(1);
    EXPECT_EQ(image->record().greedySize, 1027136U);
    image->reinitialise({ZQ_TYPE_U8, 10, 10, 0, true});
    EXPECT_EQ(image->record().greedySize, 384U);
    image->reinitialise({ZQ_TYPE_U8, 10, 10, 0, false});
    EXPECT_EQ(image->record().greedySize, 0xFFFFFFFFU);
}

TEST(ImageShapeTest, PhysicalBuffersComeFromTheirAllocatorAndGoBackThere) {
    const auto image = make({ZQ_TYPE_U8, 10, 10, 1});
    image->resize(10, 10, std::nullopt, kPhysical);
    EXPECT_EQ(zqkemomem_live(), 1);
    EXPECT_EQ(image->record().memoryInfo->physical, 1);
    fill(*image);
    const ImageRecord before = image->record();
    image->resize(10, 10, std::nullopt, kPhysical);
    EXPECT_TRUE(same_record(image->record(), before));
    image->resize(10, 20, std::nullopt, kKeep);
    EXPECT_EQ(rows_kept(*image, 12), 12);
    EXPECT_EQ(image->record().memoryInfo->physical, 0);
    EXPECT_EQ(zqkemomem_live(), 0);
    image->resize(0, 0, std::nullopt, kPhysical);
    EXPECT_EQ(zqkemomem_live(), 1);
    image->reinitialise({ZQ_TYPE_SGL, 3, 3, 0});
    EXPECT_EQ(zqkemomem_live(), 0);
}

TEST(ImageShapeTest, RefusedPhysicalMemoryLeavesAnImageWithoutPixels) {
    const auto image = make({ZQ_TYPE_U8, 10, 10, 1});
    zqkemomem_fail_next(1);
    EXPECT_EQ(code_of([&] { image->resize(20, 20, ZQ_TYPE_SGL, kPhysical); }), kMemoryError);
    EXPECT_EQ(image->record().type, ZQ_TYPE_U8);
    EXPECT_EQ(image->record().width, 0);
    EXPECT_EQ(image->record().memoryInfo->physical, 0);
    EXPECT_EQ(code_of([&] { image->pixel(0, 0); }), kImageTooSmall);
    image->resize(10, 10, std::nullopt, kPhysical);
    fill(*image);
    EXPECT_EQ(zqkemomem_live(), 1);
    image->resize(5, 5, std::nullopt, kPlain);
    EXPECT_EQ(code_of([] { PhysicalMemory("zqkemomem-that-is-not-there").allocate(64); }),
              kMemoryError);
}

TEST(ImageShapeTest, ReinitialisationResetsTheDescription) {
    Image image(Variant::kRegistered, "part");
    image.reinitialise({ZQ_TYPE_I16, 8, 8, 1, true});
    for (const ImageShape& shape :
         {ImageShape{ZQ_TYPE_I16, 8, 8, 1}, {ZQ_TYPE_SGL, 3, 2, 0}, {7, 3, 2, 0}, {-1, 3, 2, 0}}) {
        SCOPED_TRACE(shape.type);
        int destroyed = 0;
        image.record().unit = 3;
        image.record().xStep = image.record().yStep = 0.5F;
        image.record().hostCookie = 77;
        image.set_extra_info(std::make_unique<Watched>(destroyed));
        image.set_sample_offset(-32768);
        const bool valid = is_pixel_type(shape.type);
        EXPECT_EQ(code_of([&] { image.reinitialise(shape); }),
                  valid ? kSuccess : kInvalidImageType);
        EXPECT_EQ(image.record().unit, 0);
        EXPECT_EQ(image.record().xStep, 1.0F);
        EXPECT_EQ(image.record().yStep, 1.0F);
        EXPECT_EQ(image.record().greedySize, 0xFFFFFFFFU);
        EXPECT_EQ(image.record().hostCookie, 77U);
        EXPECT_EQ(image.record().extraInfo, nullptr);
        EXPECT_EQ(image.sample_offset(), 0);
        EXPECT_EQ(destroyed, 1);
        EXPECT_EQ(image.name(), "part");
        EXPECT_EQ(image.record().width, valid ? shape.width : 0);
        EXPECT_EQ(image.record().firstPixel == nullptr, !valid);
    }
}

TEST(ImageShapeTest, FailedReinitialisationLeavesAllAsItWas) {
    int destroyed = 0;
    const auto image = make({ZQ_TYPE_I16, 8, 8, 1, true});
    image->set_bit_depth(12);
    image->record().unit = 3;
    image->set_extra_info(std::make_unique<Watched>(destroyed));
    fill(*image);
    const ImageRecord before = image->record();
    const auto pixels = pixels_of(*image);
    EXPECT_EQ(code_of([&] {
                  image->reinitialise({ZQ_TYPE_RGB, 40000, 40000, 0});
              }),
              kNotEnoughMemory);
    EXPECT_TRUE(same_record(image->record(), before));
    EXPECT_EQ(pixels_of(*image), pixels);
    EXPECT_EQ(image->bit_depth(), 12);
    EXPECT_EQ(destroyed, 0);
}

TEST(ImageShapeTest, BorderChangesKeepThePixelsAndTheDescription) {
    for (const bool greedy : {false, true}) {
        const auto image = make({ZQ_TYPE_I16, 9, 5, 0, greedy});
        fill(*image);
        image->set_bit_depth(10);
        image->record().unit = 4;
        const auto pixels = pixels_of(*image);
        for (const std::int32_t border : {3, 40, 0, -5, 1}) {
            image->set_border(border);
            EXPECT_EQ(image->record().border, border < 0 ? 0 : border);
            EXPECT_EQ(pixels_of(*image), pixels);
            EXPECT_EQ(image->bit_depth(), 10);
            EXPECT_EQ(image->record().unit, 4);
            EXPECT_EQ(image->record().greedySize != 0xFFFFFFFFU, greedy);
        }
    }
}

TEST(ImageShapeTest, BitDepthsBelongTo16BitTypes) {
    struct Case {
        std::int32_t type, bits;
        GRLIBError_enum code;
    };
    const Case cases[] = {
        {ZQ_TYPE_I16, 8, kSuccess},  {ZQ_TYPE_I16, 16, kSuccess},  {ZQ_TYPE_RGBU64, 12, kSuccess},
        {ZQ_TYPE_I16, 7, kBitDepth}, {ZQ_TYPE_I16, 17, kBitDepth}, {ZQ_TYPE_RGBU64, -1, kBitDepth},
        {ZQ_TYPE_U8, 8, kBitDepth},  {ZQ_TYPE_SGL, 12, kBitDepth}, {ZQ_TYPE_U8, 0, kSuccess},
        {ZQ_TYPE_RGB, 8, kBitDepth},
    };
    for (const Case& c : cases) {
        const auto image = make({c.type, 2, 2, 0});
        EXPECT_EQ(code_of([&] { image->set_bit_depth(c.bits); }), c.code)
            << c.type << ' ' << c.bits;
        EXPECT_EQ(image->bit_depth(), c.code == kSuccess ? c.bits : 0);
    }
    const auto image = make({ZQ_TYPE_I16, 2, 2, 0});
    image->set_bit_depth(12);
    image->resize(3, 3, ZQ_TYPE_RGBU64, kPlain);
    EXPECT_EQ(image->bit_depth(), 12);
    image->resize(3, 3, ZQ_TYPE_RGB, kPlain);
    EXPECT_EQ(image->bit_depth(), 0);
}

// While the buffer is lent nothing may move it; what leaves it in place is allowed.
TEST(ImageShapeTest, LentImagesRefuseEveryChangeOfShape) {
    const auto image = make({ZQ_TYPE_U8, 6, 4, 1});
    const auto same = make({ZQ_TYPE_U8, 6, 4, 1});
    const auto other = make({ZQ_TYPE_U8, 6, 5, 1});
    fill(*image);
    fill(*same);
    std::vector<std::uint8_t> outside(256);
    struct Case {
        const char* name;
        std::function<void()> change;
        bool refused;
    };
    const Case cases[] = {
        {"reinitialise",
         [&] {
             image->reinitialise({ZQ_TYPE_U8, 6, 4, 1});
         },
         true},
        {"plain", [&] { image->resize(6, 5, std::nullopt, kPlain); }, true},
        {"to nothing", [&] { image->resize(0, 0, std::nullopt, kPlain); }, true},
        {"keep", [&] { image->resize(6, 5, std::nullopt, kKeep); }, true},
        {"physical", [&] { image->resize(6, 4, std::nullopt, kPhysical); }, true},
        {"type", [&] { image->resize(6, 4, ZQ_TYPE_SGL, kPlain); }, true},
        {"border", [&] { image->set_border(2); }, true},
        {"wrap",
         [&] {
             image->wrap_external({ZQ_TYPE_U8, 6, 4, 0}, outside.data(), 0);
         },
         true},
        {"adopt", [&] { image->adopt(*other); }, true},
        {"same size", [&] { image->resize(6, 4, ZQ_TYPE_U8, kKeep); }, false},
        {"same border", [&] { image->set_border(1); }, false},
        {"adopt same", [&] { image->adopt(*same); }, false},
    };
    EXPECT_EQ(image->lend(), image->record().buffer);
    image->lend();
    const ImageRecord before = image->record();
    const auto pixels = pixels_of(*image);
    for (int users = 2; users > 0; --users) {
        for (const Case& c : cases) {
            SCOPED_TRACE(c.name);
            EXPECT_EQ(code_of(c.change), c.refused ? kImageLent : kSuccess);
            EXPECT_TRUE(same_record(image->record(), before));
            EXPECT_EQ(pixels_of(*image), pixels);
        }
        image->give_back();
    }
    image->give_back();
    EXPECT_EQ(image->external_count(), 0);
    image->resize(6, 5, std::nullopt, kPlain);
    EXPECT_EQ(image->record().height, 5);
}

}  // namespace
}  // namespace zq
