// Turning pictures that a file holds otherwise than they are to be seen.
#pragma once

#include <cstdint>

#include "image/image.h"

namespace zq {

// The orientations 1 to 8 of TIFF (and Exif): which side the stored row 0 and column 0 show.
class Orientation {
  public:
    explicit Orientation(int code) : code_(code) {}

    // Stored rows are columns of the picture, so width and height change places.
    bool is_transposed() const { return code_ >= 5; }

    // From stored rows to the picture. `upright` has the picture's size and the type of `stored`.
    static void transpose(const Image& stored, Image& upright);
    // What is left to do with an image whose rows are the picture's.
    void flip(Image& image) const;

  private:
    bool is_mirrored() const { return code_ == 2 || code_ == 3 || code_ == 6 || code_ == 7; }
    bool is_upside_down() const { return code_ == 3 || code_ == 4 || code_ == 7 || code_ == 8; }

    int code_;
};

}  // namespace zq
