// The properties of an image as one block of bytes: what describes it besides its geometry and
// pixels.
#pragma once

#include <cstdint>
#include <memory>
#include <span>
#include <vector>

#include "serialize/custom_data.h"

namespace zq {

struct ImageProperties {
    std::int32_t unit = 0;
    float x_step = 1.0F;
    float y_step = 1.0F;
    std::int32_t setting = 0;               // the word behind the bit depth
    std::vector<std::uint8_t> custom_data;  // serialised; empty for none
};

// Passes the properties through one after the other, the same way in every pass: counting their
// bytes, writing them, or reading them.
class PropertyExchange {
  public:
    static PropertyExchange counter() { return PropertyExchange(Pass::kCount); }
    static PropertyExchange writer(std::span<std::uint8_t> block);
    static PropertyExchange reader(std::span<const std::uint8_t> block);

    // Throws kInitializationError while reading a block that ends too early.
    void exchange(std::uint32_t& word);
    void exchange(std::int32_t& word);
    void exchange(float& number);
    void exchange(std::vector<std::uint8_t>& bytes);

    std::size_t done() const { return done_; }  // bytes

  private:
    enum class Pass { kCount, kWrite, kRead };
    explicit PropertyExchange(Pass pass) : pass_(pass) {}
    void need(std::size_t bytes) const;

    Pass pass_;
    std::span<std::uint8_t> to_;
    std::span<const std::uint8_t> from_;
    std::size_t done_ = 0;
};

// One pass. The block: a version word (1), unit, x step, y step, setting, then the length of the
// custom data and its bytes; words are little-endian. Throws kInitializationError for another
// version.
void DoImagePropertyExchangeParam(PropertyExchange& exchange, ImageProperties& properties);

// Both passes of writing. Throws kNotEnoughMemory, std::bad_alloc.
std::vector<std::uint8_t> flatten_properties(Image& image);

// Properties that were read, ready to be given to an image: nothing can fail any more.
class PreparedProperties {
  public:
    // Throws kInitializationError for a block that is not whole.
    explicit PreparedProperties(std::span<const std::uint8_t> block);
    void apply(Image& image) noexcept;

  private:
    ImageProperties properties_;
    AttachmentList::Entry custom_data_;
};

}  // namespace zq
