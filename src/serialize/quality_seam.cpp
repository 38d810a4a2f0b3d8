// Hues that crossed the seam of the circle.
#include "serialize/quality_seam.h"

#include "codecs/deflate.h"
#include "serialize/quality_pixel_list.h"

namespace zq {

std::vector<std::uint64_t> crossed_hues(const Image& image, const Image& decoded) {
    constexpr std::ptrdiff_t kPixel = 4;
    std::vector<std::uint64_t> indices;
    std::uint64_t index = 0;
    for (std::int32_t y = 0; y < image.record().height; ++y) {
        const std::uint8_t* hue = image.row(y) + kHueByte;
        const std::uint8_t* back = decoded.row(y) + kHueByte;
        for (std::ptrdiff_t x = 0; x < image.record().width; ++x, ++index) {
            if (crossed_seam(hue[x * kPixel], back[x * kPixel])) indices.push_back(index);
        }
    }
    return indices;
}

void put_crossed_hues(Bytes& out, std::span<const std::uint64_t> indices) {
    Bytes list;
    PixelListWriter writer(list);
    for (const std::uint64_t index : indices) writer.put(index);
    const OpenSection section(out);
    if (!list.empty()) put_bytes(out, deflate_bytes(list));
    section.close();
}

Bytes read_crossed_hues(StreamReader& reader, const Image& image) {
    const auto packed = reader.section();
    if (packed.empty()) return {};
    // No list of pixels takes more bytes than there are pixels.
    auto list = inflate_at_most(packed, checked_narrow<std::size_t>(pixel_count(image)));
    if (!list) throw kInitializationError;
    for_each_listed(*list, image, [](std::uint64_t, StreamReader&) {});
    return std::move(*list);
}

void bring_back_hues(std::span<const std::uint8_t> list, const Image& image) {
    for_each_listed(list, image, [&](std::uint64_t index, StreamReader&) {
        std::uint8_t& hue = pixel_at(image, index)[kHueByte];
        hue = own_side(hue);
    });
}

}  // namespace zq
