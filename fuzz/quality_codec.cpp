// The quality codec on any block, for an image of the type and size that the block announces. Check
// sums are made right: otherwise nothing behind them would ever be reached.
#include "serialize/quality_codec.h"

#include <zlib.h>

#include <algorithm>
#include <vector>

#include "base/byte_order.h"
#include "read_target.h"

namespace {

constexpr std::size_t kHeader = 24;
constexpr std::uint32_t kMostSide = 600;        // more than one tile of wavelets
constexpr std::int32_t kMostCodedAgain = 1024;  // pixels

void mend_check_sum(std::vector<std::uint8_t>& block) {
    const std::size_t length =
        std::min<std::size_t>(zq::load_le32(block.data() + 16), block.size() - kHeader);
    const uLong head = adler32(1, block.data(), 20);
    const uLong sum = adler32(head, block.data() + kHeader, static_cast<uInt>(length));
    zq::store_le32(block.data() + 20, static_cast<std::uint32_t>(sum));
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* bytes, std::size_t size) {
    if (size < kHeader) return 0;
    std::vector<std::uint8_t> block(bytes, bytes + size);
    mend_check_sum(block);
    const auto side = [&](std::size_t at) {
        return static_cast<std::int32_t>(zq::load_le32(block.data() + at) % kMostSide);
    };
    zq::Image image(zq::Variant::kPrivate, {});
    image.reinitialise({.type = block[5] % 7, .width = side(8), .height = side(12), .border = 2});
    const auto line = static_cast<std::size_t>(image.record().width) *
                      static_cast<std::size_t>(zq::bytes_per_pixel(image.type()));
    for (std::int32_t y = 0; y < image.record().height; ++y) {
        std::fill_n(image.row(y), line, std::uint8_t{3});
    }
    const std::string before = zqfuzz::state_of(image);
    try {
        zq::decompress_pixels(image, block);
    } catch (GRLIBError_enum code) {
        zqfuzz::require(code == kInitializationError || code == kNotEnoughMemory, "a known code");
        zqfuzz::require(zqfuzz::state_of(image) == before, "an image left alone");
        return 0;
    }
    // What came out can be coded again; large images take too long to try all they are tried with.
    if (image.record().width * image.record().height > kMostCodedAgain) return 0;
    const auto again = zq::compress_pixels(image, 100);
    zq::decompress_pixels(image, again);
    return 0;
}
