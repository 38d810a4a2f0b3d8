// The colours of the pictures that both sides of the colour model benchmarks convert.
#pragma once

#include <cstdint>

namespace zqbench {

// One colour after the other, the same ones for every run: blue, green, red from the lowest byte
// up.
class Colours {
  public:
    // Near grey, as most of a photograph is, or any colour as likely as any other.
    explicit Colours(bool near_grey) : near_grey_(near_grey) {}

    std::uint32_t next() {
        random_ = random_ * 6364136223846793005U + 1442695040888963407U;
        const auto any = static_cast<std::uint32_t>(random_ >> 40);
        if (!near_grey_) return any;
        const std::uint32_t grey = any % 241;
        return grey * 0x010101U + (any >> 4 & 0x0F0F0FU);  // up to 255 each
    }

  private:
    bool near_grey_;
    std::uint64_t random_ = 1;
};

}  // namespace zqbench
