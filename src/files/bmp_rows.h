// Lines of BMP files to rows of images.
#pragma once

#include <array>
#include <cstdint>

#include "files/bmp_header.h"

namespace zq {

// Whether the palette is the full ramp from black to white, so that the file is a grey picture.
bool is_grey_ramp(const BmpHeader& header);
// The pixel that an index becomes: its shade in a file with a grey ramp, else the index.
std::array<std::uint8_t, 256> index_values(const BmpHeader& header);

class BmpRowDecoder {
  public:
    explicit BmpRowDecoder(const BmpHeader& header);

    // Whether a line begins with the row as the image holds it.
    bool is_copy() const { return how_ == How::kCopy; }
    // Reads header.line_bytes() at most; writes the row's pixels and nothing beyond.
    void decode(const std::uint8_t* line, std::uint8_t* row) const;

  private:
    enum class How { kCopy, kIndices, kBgr, kBgrx, kMasks16, kMasks32 };

    // A run of bits becomes its shade; of more than 8 bits the highest 8 count.
    struct Channel {
        int shift = 0;
        std::uint32_t mask = 0;  // behind the shift
        std::array<std::uint8_t, 256> shades{};
    };

    static Channel make_channel(std::uint32_t mask);
    void choose_for_masks(const BmpHeader& header);
    void fill_indices(const BmpHeader& header);
    void decode_indices(const std::uint8_t* line, std::uint8_t* row) const;
    template <std::size_t kBytes>
    void decode_masks(const std::uint8_t* line, std::uint8_t* row) const;

    How how_ = How::kCopy;
    std::size_t width_;
    std::size_t row_bytes_ = 0;
    std::size_t indices_a_byte_ = 0;
    std::array<std::array<std::uint8_t, 8>, 256> indices_{};  // the pixels in each byte
    std::array<Channel, 4> channels_{};                       // blue, green, red, alpha
};

}  // namespace zq
