// Images over a caller's buffer, and images that take over a finished picture.
#include <gtest/gtest.h>

#include <array>
#include <cstdint>
#include <cstring>
#include <functional>
#include <memory>
#include <optional>
#include <vector>

#include "image/image.h"
#include "image/lent_buffers.h"
#include "tests/support/image_probes.h"
#include "zqkemomem.h"

namespace zq {
namespace {

using zqtest::code_of;
using zqtest::fill;
using zqtest::pixels_of;
using zqtest::same_record;

TEST(ImageExternalTest, BuffersMustBeAlignedTo4Bytes) {
    struct Case {
        std::int32_t type, border, row_pixels;
        std::size_t shift;  // bytes that the buffer lies behind an aligned address
        GRLIBError_enum code;
        std::int32_t expected_row = 0;
        std::ptrdiff_t first = 0;  // bytes from the buffer to pixel (0, 0)
    };
    const Case cases[] = {
        {ZQ_TYPE_U8, 0, 0, 0, kSuccess, 32, 0},
        {ZQ_TYPE_U8, 0, 12, 4, kSuccess, 12, 0},
        {ZQ_TYPE_U8, 4, 20, 0, kSuccess, 20, 84},
        {ZQ_TYPE_U8, 4, -1, 8, kSuccess, 32, 132},
        {ZQ_TYPE_I16, 2, 10, 0, kSuccess, 10, 44},
        {ZQ_TYPE_SGL, 1, 5, 0, kSuccess, 5, 24},
        {ZQ_TYPE_RGBU64, 1, 0, 4, kSuccess, 8, 72},
        {ZQ_TYPE_U8, 0, 0, 1, kExternalBufferAlignment},
        {ZQ_TYPE_U8, 0, 0, 2, kExternalBufferAlignment},
        {ZQ_TYPE_SGL, 0, 0, 3, kExternalBufferAlignment},
        {ZQ_TYPE_U8, 1, 0, 0, kExternalBufferAlignment},
        {ZQ_TYPE_U8, 2, 0, 0, kExternalBufferAlignment},
        {ZQ_TYPE_U8, 3, 0, 0, kExternalBufferAlignment},
        {ZQ_TYPE_I16, 1, 0, 0, kExternalBufferAlignment},
        {ZQ_TYPE_U8, 0, 10, 0, kExternalBufferAlignment},
        {ZQ_TYPE_I16, 0, 11, 0, kExternalBufferAlignment},
        {7, 0, 0, 0, kInvalidImageType},
        {-1, 0, 0, 0, kInvalidImageType},
    };
    alignas(32) std::array<std::uint8_t, 1024> storage{};
    for (const Case& c : cases) {
        SCOPED_TRACE(testing::Message() << "type " << c.type << " border " << c.border << " row "
                                        << c.row_pixels << " at " << c.shift);
        Image image(Variant::kRegistered, {});
        image.reinitialise({ZQ_TYPE_U8, 2, 2, 0});
        const ImageRecord before = image.record();
        std::uint8_t* buffer = storage.data() + c.shift;
        EXPECT_EQ(code_of([&] {
                      image.wrap_external({c.type, 3, 3, c.border}, buffer, c.row_pixels);
                  }),
                  c.code);
        if (c.code != kSuccess) {
            EXPECT_TRUE(same_record(image.record(), before));
            continue;
        }
        EXPECT_EQ(image.record().buffer, buffer);
        EXPECT_EQ(image.record().rowPixels, c.expected_row);
        EXPECT_EQ(image.record().firstPixel - buffer, c.first);
        EXPECT_EQ(image.pixel(-c.border, -c.border), buffer);
        fill(image);
    }
    Image image(Variant::kRegistered, {});
    EXPECT_EQ(code_of([&] {
                  image.wrap_external({ZQ_TYPE_U8, 3, 3, 0}, nullptr, 0);
              }),
              kNullPointer);
    EXPECT_EQ(code_of([&] {
                  image.wrap_external({ZQ_TYPE_RGBU64, 3, INT32_MAX, INT32_MAX - 1}, storage.data(),
                                      INT32_MAX - 1);
              }),
              kNotEnoughMemory);
}

// Each change gives the image a buffer of its own; the caller's is neither written nor freed.
TEST(ImageExternalTest, ChangesOfShapeDetachTheBuffer) {
    struct Case {
        const char* name;
        void (*change)(Image&);
        bool keeps_pixels;
    };
    const Case cases[] = {
        {"resize", [](Image& i) { i.resize(4, 4, std::nullopt, ResizeMode::kPlain); }, false},
        {"type", [](Image& i) { i.resize(8, 4, ZQ_TYPE_I16, ResizeMode::kPlain); }, false},
        {"border", [](Image& i) { i.set_border(2); }, true},
        {"physical", [](Image& i) { i.resize(8, 4, std::nullopt, ResizeMode::kPhysical); }, false},
        {"created again",
         [](Image& i) {
             i.reinitialise({ZQ_TYPE_U8, 9, 4, 4, true});
         },
         false},
        {"to nothing", [](Image& i) { i.resize(0, 0, std::nullopt, ResizeMode::kPlain); }, false},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        std::vector<std::uint8_t> buffer(16 * 12);
        Image image(Variant::kRegistered, {});
        image.wrap_external({ZQ_TYPE_U8, 8, 4, 4}, buffer.data(), 16);
        fill(image);
        const auto bytes = buffer;
        const auto pixels = pixels_of(image);
        c.change(image);
        EXPECT_NE(image.record().buffer, buffer.data());
        EXPECT_TRUE(!c.keeps_pixels || pixels_of(image) == pixels);
        std::memset(image.record().buffer, 0, 64);
        EXPECT_EQ(buffer, bytes);
    }
    EXPECT_EQ(zqkemomem_live(), 0);
}

// How the target of adopt() comes about, and what becomes of its address.
TEST(ImageExternalTest, AdoptTakesThePictureWhateverTheTarget) {
    static std::vector<std::uint8_t> outside(64 * 64);
    const auto external = [](Image& i, std::int32_t width, std::int32_t height) {
        i.wrap_external({ZQ_TYPE_I16, width, height, 2}, outside.data(), 0);
    };
    struct Case {
        const char* name;
        std::function<void(Image&)> prepare;
        bool keeps_address;
        GRLIBError_enum code = kSuccess;
    };
    const Case cases[] = {
        {"same shape",
         [](Image& i) {
             i.reinitialise({ZQ_TYPE_I16, 9, 7, 2});
         },
         true},
        {"other size",
         [](Image& i) {
             i.reinitialise({ZQ_TYPE_I16, 9, 6, 2});
         },
         false},
        {"other type",
         [](Image& i) {
             i.reinitialise({ZQ_TYPE_RGB, 9, 7, 2});
         },
         false},
        {"empty",
         [](Image& i) {
             i.reinitialise({ZQ_TYPE_I16, 0, 0, 2});
         },
         false},
        {"greedy, larger",
         [](Image& i) {
             i.reinitialise({ZQ_TYPE_SGL, 99, 99, 2, true});
         },
         true},
        {"greedy, smaller",
         [](Image& i) {
             i.reinitialise({ZQ_TYPE_U8, 1, 1, 2, true});
         },
         false},
        {"external, same shape", [&](Image& i) { external(i, 9, 7); }, true},
        {"external, other size", [&](Image& i) { external(i, 5, 5); }, false},
        {"physical, same shape",
         [](Image& i) {
             i.reinitialise({ZQ_TYPE_I16, 9, 7, 2});
             i.resize(9, 7, std::nullopt, ResizeMode::kPhysical);
         },
         true},
        {"physical, other size",
         [](Image& i) {
             i.reinitialise({ZQ_TYPE_I16, 9, 6, 2});
             i.resize(9, 6, std::nullopt, ResizeMode::kPhysical);
         },
         false},
        {"lent, same shape",
         [](Image& i) {
             i.reinitialise({ZQ_TYPE_I16, 9, 7, 2});
             i.lend();
         },
         true},
        {"lent, other size",
         [](Image& i) {
             i.reinitialise({ZQ_TYPE_I16, 9, 6, 2});
             i.lend();
         },
         true, kImageLent},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        Image source(Variant::kPrivate, {});
        source.reinitialise({ZQ_TYPE_I16, 9, 7, 2});
        fill(source);
        source.set_bit_depth(12);
        source.set_sample_offset(-32768);
        const auto pixels = pixels_of(source);
        Image target(Variant::kRegistered, {});
        c.prepare(target);
        const ImageRecord before = target.record();
        EXPECT_EQ(code_of([&] { target.adopt(source); }), c.code);
        EXPECT_TRUE(!c.keeps_address || target.record().buffer == before.buffer);
        EXPECT_EQ(target.record().greedySize != 0xFFFFFFFFU, before.greedySize != 0xFFFFFFFFU);
        if (c.code == kSuccess) {
            EXPECT_EQ(target.record().width, 9);
            EXPECT_EQ(pixels_of(target), pixels);
            EXPECT_EQ(target.bit_depth(), 12);
            EXPECT_EQ(target.sample_offset(), -32768);
            fill(target);
        } else {
            EXPECT_TRUE(same_record(target.record(), before));
            EXPECT_EQ(target.bit_depth(), 0);
        }
        target.give_back();
    }
    EXPECT_EQ(zqkemomem_live(), 0);
}

// The last of several users frees the buffer; the sanitizer sees an early or a missing free.
TEST(ImageExternalTest, LentBuffersOutliveTheirImage) {
    auto image = std::make_unique<Image>(Variant::kRegistered, std::string_view());
    image->reinitialise({ZQ_TYPE_U8, 16, 16, 0});
    image->resize(16, 16, std::nullopt, ResizeMode::kPhysical);
    LentBuffers& lent = LentBuffers::instance();
    const void* handle = image->handle();
    std::uint8_t* buffer = image->lend();
    image->lend();
    image->lend();
    image->give_back();
    EXPECT_FALSE(lent.give_back_orphan(handle, buffer)) << "its image is alive";
    image.reset();
    std::memset(buffer, 1, 16 * 32);
    EXPECT_FALSE(lent.give_back(handle, buffer + 1));
    EXPECT_FALSE(lent.give_back(buffer, buffer));
    EXPECT_TRUE(lent.give_back_orphan(handle, buffer));
    std::memset(buffer, 2, 16 * 32);
    EXPECT_EQ(zqkemomem_live(), 1);
    EXPECT_TRUE(lent.give_back(handle, buffer));
    EXPECT_EQ(zqkemomem_live(), 0);
    EXPECT_FALSE(lent.give_back(handle, buffer));
}

// A user returns the buffer while the disposal is under way: the image is closed, not yet gone.
TEST(ImageExternalTest, ReturnDuringDisposalLeavesTheBufferToTheImage) {
    auto image = std::make_unique<Image>(Variant::kRegistered, std::string_view());
    image->reinitialise({ZQ_TYPE_U8, 16, 16, 0});
    image->resize(16, 16, std::nullopt, ResizeMode::kPhysical);
    std::uint8_t* buffer = image->lend();
    EXPECT_TRUE(LentBuffers::instance().give_back(image->handle(), buffer));
    EXPECT_EQ(zqkemomem_live(), 1);
    image.reset();
    EXPECT_EQ(zqkemomem_live(), 0);
}

}  // namespace
}  // namespace zq
