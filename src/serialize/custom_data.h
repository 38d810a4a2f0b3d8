// Custom data of an image: named byte strings that ride with it, and their form in records and
// files.
#pragma once

#include <cstdint>
#include <functional>
#include <map>
#include <memory>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "image/image.h"

namespace zq {

// The store hangs on its image from the first entry to the last, so it is never empty there.
// Threads: the image's lock.
class CustomData final : public Attachment {
  public:
    using Value = std::vector<std::uint8_t>;
    // Ascending by the keys' bytes, as unsigned numbers.
    using Entries = std::map<std::string, Value, std::less<>>;

    // Borrowed; null for an image without custom data, and for one where a client's own object has
    // taken the place of the store.
    static CustomData* find(Image& image);

    // Copies the value; one that the key had is replaced. The image is told of a change also when
    // it fails. Throws kCustomDataSize for a value that is empty or that no host block could give
    // back, std::bad_alloc; what was stored stays.
    static void write(Image& image, std::string_view key, std::span<const std::uint8_t> value);
    // Valid until the entry changes. Throws kCustomDataKey for a missing key.
    static std::span<const std::uint8_t> read(Image& image, std::string_view key);
    // Throws kCustomDataKey for a missing key.
    static void remove(Image& image, std::string_view key);
    // In order; valid until an entry changes.
    static std::vector<std::string_view> keys(Image& image);

    // Adds an entry or replaces its value; nothing has changed when it throws.
    void put(std::string_view key, std::span<const std::uint8_t> value);
    const Entries& entries() const { return entries_; }

  private:
    Entries entries_;
};

// A 32-bit count of entries, then for each entry, in the store's order, the 32-bit lengths of key
// and value and the bytes of both; little-endian. Throws kNotEnoughMemory for what does not fit.
std::vector<std::uint8_t> serialise(const CustomData& store);

// Takes exactly what serialise gives for a store with entries. Throws kInitializationError for
// anything else; memory is asked for only as the bytes are there.
std::unique_ptr<CustomData> parse_custom_data(std::span<const std::uint8_t> bytes);

}  // namespace zq
