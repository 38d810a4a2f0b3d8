// What qualities are tried on: an image, or a small picture that stands for it.
#pragma once

#include <cstdint>
#include <memory>
#include <optional>
#include <span>
#include <vector>

#include "image/image.h"
#include "serialize/quality_blocks.h"

namespace zq {

inline std::int64_t pixels_of(const Image& image) {
    return std::int64_t{image.record().width} * image.record().height;
}

// A rectangle of the picture, and what it stands for.
struct SamplePart {
    std::int32_t x, y, width, height;
    std::uint64_t index;                     // of its first pixel in the image: y * width + x
    double count;                            // how many times the image has it
    std::vector<std::uint64_t> others = {};  // indexes of some that are equal
};

// Borrows the image.
class QualitySample {
  public:
    static QualitySample whole_of(const Image& image);

    // A small part of the image: for JPEG four strips of whole blocks, spread from the top left to
    // the bottom right; else one rectangle from the middle.
    static QualitySample strips_of(const Image& image);

    // For JPEG, whose blocks come out the same wherever they stand: each different block of the
    // image. Nothing where more than half of all or more than 2^14 are different, as in
    // photographs.
    static std::optional<QualitySample> blocks_of(const Image& image);

    // For wavelets: four whole tiles from all over the image. Nothing where it has less.
    static std::optional<QualitySample> tiles_of(const Image& image);

    // For JPEG: blocks from all over the image, eight times as many as in the strips.
    static QualitySample lattice_of(const Image& image);

    const Image& picture() const { return part_ ? *part_ : image_; }
    const Image& image() const { return image_; }
    std::uint64_t image_width() const { return static_cast<std::uint64_t>(image_.record().width); }
    std::span<const SamplePart> parts() const { return parts_; }
    bool is_whole() const { return part_ == nullptr; }
    // An error of the picture that is below this part of another one means that the image's is
    // smaller too; 1 where the picture tells the image's errors exactly.
    double confidence() const { return confidence_; }
    bool is_exact() const { return confidence_ == 1; }

  private:
    static QualitySample mosaic(const Image& image, std::span<const JpegBlock> blocks,
                                double confidence);
    QualitySample(const Image& image, std::unique_ptr<Image> part, std::vector<SamplePart> parts,
                  double confidence)
        : image_(image),
          part_(std::move(part)),
          parts_(std::move(parts)),
          confidence_(confidence) {}

    const Image& image_;
    std::unique_ptr<Image> part_;
    std::vector<SamplePart> parts_;
    double confidence_;
};

}  // namespace zq
