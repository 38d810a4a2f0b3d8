// What drawing asks of a device context, and the bitmaps it makes.
#include "display/draw.h"

#include <gtest/gtest.h>

#include <cmath>
#include <limits>

using namespace zq;

namespace {

class Recorder final : public DeviceContext {
  public:
    struct Blit {
        Box source, destination;
        std::int32_t height;
        std::ptrdiff_t offset;
        bool operator==(const Blit&) const = default;
    };
    Mapping mapping() override { return mapping_; }
    void set_mapping(const Mapping& mapping) override { mapping_ = mapping; }
    Box clip_box() override { return clip; }
    Box to_logical(const Box& device) override { return device; }
    Box to_device(const Box& logical) override { return logical; }
    void exclude_clip(const Box& /*device*/) override {}
    void include_clip(const Box& /*device*/) override {}
    void set_stretching() override { stretching = true; }
    void stretch(const Dib& dib, const Box& source, const Box& destination) override {
        blits.push_back({source, destination, dib.height, dib.bits - base});
    }
    bool fill(const Box& /*device*/, const Brush& /*brush*/) override { return ++fills > 0; }
    std::uint32_t button_face() override { return 0; }

    Box clip{-10000, -10000, 10000, 10000};
    const std::uint8_t* base = nullptr;
    std::vector<Blit> blits;
    bool stretching = false;
    int fills = 0;

  private:
    Mapping mapping_;
};

ShownPixels view_of(const void* pixels, PixelType type, std::int32_t width, std::int32_t height) {
    return {.pixels = static_cast<const std::uint8_t*>(pixels),
            .type = type,
            .width = width,
            .height = height,
            .line_width = width};
}

std::vector<int> shown(const ShownPixels& view) {
    std::vector<std::uint8_t> scratch;
    const Dib dib = make_dib(view, scratch, {view.bounds(), {}});
    std::vector<int> bytes;
    for (std::int32_t y = 0; y < view.height; ++y) {
        const std::uint8_t* row = dib.bits + static_cast<std::size_t>(y) * dib.stride();
        bytes.insert(bytes.end(), row, row + view.width * dib.bits_per_pixel / 8);
    }
    return bytes;
}

}  // namespace

TEST(Draw, OnlyWhatIsVisibleAtTheSamePlaceAndInTilesWithoutLargeBitmaps) {
    const std::vector<std::uint8_t> pixels(2000 * 1500);
    const ShownPixels view = view_of(pixels.data(), PixelType::kU8, 2000, 1500);
    Recorder dc;
    dc.base = pixels.data();
    dc.clip = {5, 6, 105, 56};
    draw(dc, view, {0, 0, 2000, 1500}, {0, 0, 2000, 1500}, {});
    draw(dc, view, {0, 0, 20, 10}, {3, 4, 23, 14}, {});
    dc.clip = {3000, 0, 3001, 1};
    draw(dc, view, {0, 0, 20, 10}, {0, 0, 20, 10}, {});
    EXPECT_FALSE(dc.stretching);
    const std::vector<Recorder::Blit> visible = {{{5, 6, 105, 56}, {5, 6, 105, 56}, 1500, 0},
                                                 {{0, 0, 20, 10}, {3, 4, 23, 14}, 1500, 0}};
    EXPECT_EQ(dc.blits, visible);

    dc.blits.clear();
    draw(dc, view, {0, 0, 2000, 1500}, {7, 8, 2007, 1508}, {.large_bitmaps = false});
    const std::vector<Recorder::Blit> tiles = {
        {{0, 0, 1024, 1024}, {7, 8, 1031, 1032}, 1024, 0},
        {{1024, 0, 2000, 1024}, {1031, 8, 2007, 1032}, 1024, 0},
        {{0, 0, 1024, 476}, {7, 1032, 1031, 1508}, 476, 1024 * 2000},
        {{1024, 0, 2000, 476}, {1031, 1032, 2007, 1508}, 476, 1024 * 2000}};
    EXPECT_EQ(dc.blits, tiles);

    dc.blits.clear();
    draw(dc, view, {0, 0, 1000, 1500}, {7, 8, 1007, 1508},
         {.bottom_up = true, .large_bitmaps = false});
    const std::vector<Recorder::Blit> upside_down = {
        {{0, 0, 1000, 1024}, {7, 8, 1007, 1032}, 1024, 476 * 2000},
        {{0, 0, 1000, 476}, {7, 1032, 1007, 1508}, 476, 0}};
    EXPECT_EQ(dc.blits, upside_down);
}

TEST(Draw, PlacesZoomedImages) {
    struct Case {
        std::int32_t zoom, width, client, offset;
        std::int32_t viewport, window, origin;
        bool background;
    };
    const Case cases[] = {
        {2, 100, 300, 0, 2, 1, 50, true},      // smaller: centred
        {20, 100, 300, 0, 16, 1, 0, false},    // the largest zoom
        {-3, 90, 30, 0, 1, 3, 0, false},       // fits exactly
        {-99, 1600, 10, 5, 1, 16, -5, false},  // scrolled
        {0, 100, 80, 50, 1, 1, -20, false},    // not past the end
        {1, 100, 80, -10, 1, 1, 10, true},     // moved right while it reaches the end
        {1, 100, 300, -10, 1, 1, 100, true},   // too small for that
        {1, 100, 80, INT32_MIN, 1, 1, INT32_MAX, true},
    };
    const std::vector<std::uint8_t> pixels(1600 * 1600);
    for (const Case& c : cases) {
        Recorder dc;
        if (!c.background) dc.clip = {0, 0, c.width, c.width};
        const ShownPixels view = view_of(pixels.data(), PixelType::kU8, c.width, c.width);
        draw_zoomed(dc, view, {c.zoom, {c.offset, c.offset}, {0, 0, c.client, c.client}}, {});
        const Mapping mapping = dc.mapping();
        EXPECT_EQ(mapping.viewport_extent, (Point{c.viewport, c.viewport})) << c.zoom;
        EXPECT_EQ(mapping.window_extent, (Point{c.window, c.window})) << c.zoom;
        EXPECT_EQ(mapping.viewport_origin, (Point{c.origin, c.origin}))
            << c.zoom << ' ' << c.offset;
        EXPECT_EQ(dc.fills, c.background ? 1 : 0) << c.zoom;
        EXPECT_EQ(dc.stretching, c.viewport != c.window) << c.zoom;
    }
}

TEST(Draw, ShowsEveryType) {
    constexpr float kNan = std::numeric_limits<float>::quiet_NaN();
    alignas(4) const std::int16_t samples[] = {-4, 3, 4, 1023, 1024, 32767};
    ShownPixels grey = view_of(samples, PixelType::kI16, 6, 1);
    EXPECT_EQ(shown(grey), (std::vector<int>{0, 0, 0, 7, 7, 255})) << "smallest to largest";
    grey.right_shift = 2;
    EXPECT_EQ(shown(grey), (std::vector<int>{0, 0, 1, 255, 255, 255}));
    grey.right_shift = 0;
    grey.bit_depth = 10;
    EXPECT_EQ(shown(grey), (std::vector<int>{0, 1, 1, 255, 255, 255})) << "rounded";

    const float floats[] = {1, 2, kNan, 3};
    EXPECT_EQ(shown(view_of(floats, PixelType::kSgl, 4, 1)), (std::vector<int>{0, 127, 0, 255}));
    const float equal[] = {7, 7};
    EXPECT_EQ(shown(view_of(equal, PixelType::kSgl, 2, 1)), (std::vector<int>{0, 0}));
    const float negative[] = {-2, -1};  // up to the tiny positive start of the largest
    EXPECT_EQ(shown(view_of(negative, PixelType::kSgl, 2, 1)), (std::vector<int>{0, 127}));

    // 3 x 3 pixels, each a magnitude of 9 / 128 times its number: exchanged crosswise, the last
    // column and row stay.
    std::vector<float> spectrum(18);
    for (std::size_t i = 0; i < 9; ++i)
        spectrum[2 * i] = 9.0F / 128 * (static_cast<float>(i) + 0.5F);
    EXPECT_EQ(shown(view_of(spectrum.data(), PixelType::kComplex, 3, 3)),
              (std::vector<int>{4, 3, 2, 1, 0, 5, 6, 7, 8}));
    std::vector<std::uint8_t> scratch;
    const Dib middle =
        make_dib(view_of(spectrum.data(), PixelType::kComplex, 3, 3), scratch, {{0, 1, 3, 2}, {}});
    EXPECT_EQ(middle.first_row, 1);
    EXPECT_EQ(std::vector<int>(middle.bits, middle.bits + 3), (std::vector<int>{1, 0, 5}));

    const std::uint16_t wide[] = {100, 300, 65535, 1};
    ShownPixels wide_view = view_of(wide, PixelType::kRgbU64, 1, 1);
    wide_view.bit_depth = 10;
    std::vector<int> colour = shown(wide_view);
    colour.resize(3);
    EXPECT_EQ(colour, (std::vector<int>{25, 75, 255}));
    const std::uint8_t hsl[] = {77, 0, 0, 0};
    colour = shown(view_of(hsl, PixelType::kHsl, 1, 1));
    colour.resize(3);
    EXPECT_EQ(colour, (std::vector<int>{76, 76, 76})) << "no saturation is grey";
}

TEST(Draw, TakesRowsInPlaceWhereTheyAreAligned) {
    alignas(4) std::uint8_t pixels[64] = {};
    struct Case {
        std::size_t offset;
        std::int32_t width;
        PixelType type;
        bool packed, in_place;
    };
    const Case cases[] = {
        {0, 8, PixelType::kU8, false, true},  {0, 6, PixelType::kU8, false, false},
        {1, 8, PixelType::kU8, false, false}, {0, 4, PixelType::kRgb, true, true},
        {0, 5, PixelType::kRgb, true, false}, {2, 4, PixelType::kRgb, true, false},
        {0, 5, PixelType::kRgb, false, true}, {2, 4, PixelType::kRgb, false, false},
    };
    for (const Case& c : cases) {
        ShownPixels view = view_of(pixels + c.offset, c.type, c.width, 2);
        view.packed_colour = c.packed;
        std::vector<std::uint8_t> scratch;
        EXPECT_EQ(make_dib(view, scratch, {view.bounds(), {}}).bits == view.pixels, c.in_place)
            << c.offset << ' ' << c.width;
    }
}
