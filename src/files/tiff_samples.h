// Samples of TIFF rows into the pixels of image rows.
#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

#include "files/tiff_layout.h"

namespace zq {

// Puts stretches of rows of the file into rows of an image of the layout's type.
class TiffSampleSink {
  public:
    explicit TiffSampleSink(const TiffLayout& layout);

    // Whether rows of the file are rows of the image as they are.
    bool is_plain() const { return is_plain_; }

    // `samples` as libtiff delivers them, in the machine's byte order, aligned for their size: all
    // samples of `pixels` pixels, or only those of one plane. Planes come in order; each stretch of
    // a row gets every plane in use.
    void put(int plane, const std::uint8_t* samples, std::uint8_t* row, std::size_t pixels);

    // What can be done only when all planes are there.
    void finish_row(std::uint8_t* row, std::size_t pixels) const;

  private:
    template <class Sample>
    void put_as(int plane, const Sample* samples, std::uint8_t* row, std::size_t pixels) const;
    template <class Sample>
    void put_colour(int first, int last, const Sample* samples, Sample* row,
                    std::size_t pixels) const;
    template <class Sample>
    void put_sample(int index, const Sample* samples, Sample* row, std::size_t pixels) const;
    void put_numbers(const std::uint8_t* samples, std::uint8_t* row, std::size_t pixels) const;
    std::size_t step() const;

    TiffLayout layout_;
    bool is_plain_;
    std::vector<std::uint8_t> bytes_;  // samples of a number of bits of their own, unpacked
    std::vector<std::uint16_t> words_;
};

// The other way round: three samples of each four, red first. No overlap.
void bgra64_to_rgb48(const std::uint16_t* from, std::uint16_t* to, std::size_t pixels);

}  // namespace zq
