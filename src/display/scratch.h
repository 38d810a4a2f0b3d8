// Memory for the rows of one draw, kept for the next one.
#pragma once

#include <cstdint>
#include <vector>

namespace zq {

// Lends the process's one kept block, or a new one while that is in use; fresh pages would cost
// more than the drawing.
class Scratch {
  public:
    Scratch();
    ~Scratch();
    Scratch(const Scratch&) = delete;
    Scratch& operator=(const Scratch&) = delete;

    // Contents are whatever the draw before left.
    std::vector<std::uint8_t>& bytes() { return bytes_; }

    static constexpr std::size_t kMostKept = std::size_t{64} << 20;

  private:
    std::vector<std::uint8_t> bytes_;
};

}  // namespace zq
