// The bytes of a strip or tile as a TIFF file has them, piece by piece.
#pragma once

#include <cstdint>
#include <memory>
#include <span>

#include "files/tiff_session.h"

namespace zq {

class TiffStripBytes {
  public:
    // The session must outlive this. Throws kUnableToReadData for a strip that has no place in the
    // file.
    TiffStripBytes(TiffSession& session, std::uint32_t strip);

    // Never empty; stands until the next call. Throws kUnableToReadData when there is no more, or
    // the file ends early.
    std::span<const std::uint8_t> next();

  private:
    TiffSession& session_;
    std::uint64_t position_;
    std::uint64_t left_;  // bytes that were not read yet
    std::unique_ptr<std::uint8_t[]> bytes_;
};

}  // namespace zq
