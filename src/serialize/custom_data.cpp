// Custom data of an image.
#include "serialize/custom_data.h"

#include <array>
#include <cstddef>
#include <limits>
#include <utility>

#include "base/byte_order.h"
#include "base/checked.h"

namespace zq {
namespace {

// Sizes of host blocks have 31 bits.
constexpr std::size_t kMostValueBytes = std::numeric_limits<std::int32_t>::max();

bool is_value_size(std::size_t size) {
    return size > 0 && size <= kMostValueBytes;
}

// Tells the image at the end of a scope, on every path.
class ChangeNotice {
  public:
    explicit ChangeNotice(Image& image) : image_(image) {}
    ~ChangeNotice() { image_.attachments().note_change(); }
    ChangeNotice(const ChangeNotice&) = delete;
    ChangeNotice& operator=(const ChangeNotice&) = delete;

  private:
    Image& image_;
};

void append_number(std::vector<std::uint8_t>& bytes, std::size_t number) {
    std::array<std::uint8_t, 4> word{};
    store_le32(word.data(), checked_narrow<std::uint32_t>(number));
    bytes.insert(bytes.end(), word.begin(), word.end());
}

class Reader {
  public:
    explicit Reader(std::span<const std::uint8_t> bytes) : rest_(bytes) {}

    std::span<const std::uint8_t> take(std::size_t count) {
        if (count > rest_.size()) throw kInitializationError;
        const auto taken = rest_.first(count);
        rest_ = rest_.subspan(count);
        return taken;
    }
    std::uint32_t number() { return load_le32(take(4).data()); }
    bool at_end() const { return rest_.empty(); }

  private:
    std::span<const std::uint8_t> rest_;
};

void parse_entry(Reader& reader, CustomData& store) {
    const std::size_t key_bytes = reader.number();
    const std::size_t value_bytes = reader.number();
    const auto key = reader.take(key_bytes);
    const auto value = reader.take(value_bytes);
    const std::string_view text(reinterpret_cast<const char*>(key.data()), key.size());
    const auto& entries = store.entries();
    const bool ascending = entries.empty() || entries.rbegin()->first < text;
    if (!ascending || text.find('\0') != std::string_view::npos || !is_value_size(value.size())) {
        throw kInitializationError;
    }
    store.put(text, value);
}

}  // namespace

CustomData* CustomData::find(Image& image) {
    return dynamic_cast<CustomData*>(image.attachments().find(kCustomDataAttachment));
}

void CustomData::write(Image& image, std::string_view key, std::span<const std::uint8_t> value) {
    const ChangeNotice notice(image);
    if (!is_value_size(value.size())) throw kCustomDataSize;
    if (CustomData* store = find(image)) {
        store->put(key, value);
        return;
    }
    auto store = std::make_unique<CustomData>();
    store->put(key, value);
    image.attachments().set(kCustomDataAttachment, std::move(store));
}

std::span<const std::uint8_t> CustomData::read(Image& image, std::string_view key) {
    const CustomData* store = find(image);
    if (store == nullptr) throw kCustomDataKey;
    const auto entry = store->entries_.find(key);
    if (entry == store->entries_.end()) throw kCustomDataKey;
    return entry->second;
}

void CustomData::remove(Image& image, std::string_view key) {
    CustomData* store = find(image);
    if (store == nullptr) throw kCustomDataKey;
    const auto entry = store->entries_.find(key);
    if (entry == store->entries_.end()) throw kCustomDataKey;
    store->entries_.erase(entry);
    if (store->entries_.empty()) image.attachments().remove(kCustomDataAttachment);
    image.attachments().note_change();
}

std::vector<std::string_view> CustomData::keys(Image& image) {
    std::vector<std::string_view> keys;
    const CustomData* store = find(image);
    if (store == nullptr) return keys;
    keys.reserve(store->entries_.size());
    for (const auto& [key, value] : store->entries_) keys.emplace_back(key);
    return keys;
}

void CustomData::put(std::string_view key, std::span<const std::uint8_t> value) {
    Value copy(value.begin(), value.end());
    entries_.insert_or_assign(std::string(key), std::move(copy));
}

std::vector<std::uint8_t> serialise(const CustomData& store) {
    std::size_t size = 4;
    for (const auto& [key, value] : store.entries()) {
        size =
            checked_add(checked_add(size, key.size()), checked_add(value.size(), std::size_t{8}));
    }
    std::vector<std::uint8_t> bytes;
    bytes.reserve(size);
    append_number(bytes, store.entries().size());
    for (const auto& [key, value] : store.entries()) {
        append_number(bytes, key.size());
        append_number(bytes, value.size());
        bytes.insert(bytes.end(), key.begin(), key.end());
        bytes.insert(bytes.end(), value.begin(), value.end());
    }
    return bytes;
}

std::unique_ptr<CustomData> parse_custom_data(std::span<const std::uint8_t> bytes) {
    Reader reader(bytes);
    auto store = std::make_unique<CustomData>();
    const std::uint32_t count = reader.number();
    for (std::uint32_t i = 0; i < count; ++i) parse_entry(reader, *store);
    if (count == 0 || !reader.at_end()) throw kInitializationError;
    return store;
}

}  // namespace zq
