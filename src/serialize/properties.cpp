// The property exchange.
#include "serialize/properties.h"

#include <bit>
#include <cstring>

#include "base/byte_order.h"
#include "base/checked.h"

namespace zq {

namespace {

constexpr std::uint32_t kVersion = 1;

}  // namespace

PropertyExchange PropertyExchange::writer(std::span<std::uint8_t> block) {
    PropertyExchange exchange(Pass::kWrite);
    exchange.to_ = block;
    return exchange;
}

PropertyExchange PropertyExchange::reader(std::span<const std::uint8_t> block) {
    PropertyExchange exchange(Pass::kRead);
    exchange.from_ = block;
    return exchange;
}

void PropertyExchange::need(std::size_t bytes) const {
    if (pass_ == Pass::kRead && bytes > from_.size() - done_) throw kInitializationError;
}

void PropertyExchange::exchange(std::uint32_t& word) {
    need(sizeof word);
    if (pass_ == Pass::kWrite) store_le32(to_.data() + done_, word);
    if (pass_ == Pass::kRead) word = load_le32(from_.data() + done_);
    done_ += sizeof word;
}

void PropertyExchange::exchange(std::int32_t& word) {
    auto bits = std::bit_cast<std::uint32_t>(word);
    exchange(bits);
    word = std::bit_cast<std::int32_t>(bits);
}

void PropertyExchange::exchange(float& number) {
    auto bits = std::bit_cast<std::uint32_t>(number);
    exchange(bits);
    number = std::bit_cast<float>(bits);
}

void PropertyExchange::exchange(std::vector<std::uint8_t>& bytes) {
    auto length = checked_narrow<std::uint32_t>(bytes.size());
    exchange(length);
    need(length);
    if (pass_ == Pass::kRead) {
        const auto first = from_.begin() + static_cast<std::ptrdiff_t>(done_);
        bytes.assign(first, first + static_cast<std::ptrdiff_t>(length));
    } else if (pass_ == Pass::kWrite && length > 0) {
        std::memcpy(to_.data() + done_, bytes.data(), length);
    }
    done_ = checked_add<std::size_t>(done_, length);
}

// NOLINTNEXTLINE(readability-identifier-naming): the name by which the toolkit knows the exchange.
void DoImagePropertyExchangeParam(PropertyExchange& exchange, ImageProperties& properties) {
    std::uint32_t version = kVersion;
    exchange.exchange(version);
    if (version != kVersion) throw kInitializationError;
    exchange.exchange(properties.unit);
    exchange.exchange(properties.x_step);
    exchange.exchange(properties.y_step);
    exchange.exchange(properties.setting);
    exchange.exchange(properties.custom_data);
}

std::vector<std::uint8_t> flatten_properties(Image& image) {
    const ImageRecord& record = image.record();
    ImageProperties properties = {record.unit, record.xStep, record.yStep, image.setting(), {}};
    if (const CustomData* store = CustomData::find(image)) {
        properties.custom_data = serialise(*store);
    }
    PropertyExchange counting = PropertyExchange::counter();
    DoImagePropertyExchangeParam(counting, properties);
    std::vector<std::uint8_t> block(counting.done());
    PropertyExchange writing = PropertyExchange::writer(block);
    DoImagePropertyExchangeParam(writing, properties);
    return block;
}

PreparedProperties::PreparedProperties(std::span<const std::uint8_t> block) {
    PropertyExchange reading = PropertyExchange::reader(block);
    DoImagePropertyExchangeParam(reading, properties_);
    if (reading.done() != block.size()) throw kInitializationError;
    if (!properties_.custom_data.empty()) {
        custom_data_ = AttachmentList::make_entry(kCustomDataAttachment,
                                                  parse_custom_data(properties_.custom_data));
    }
}

void PreparedProperties::apply(Image& image) noexcept {
    ImageRecord& record = image.record();
    record.unit = properties_.unit;
    record.xStep = properties_.x_step;
    record.yStep = properties_.y_step;
    image.set_setting(properties_.setting);
    if (custom_data_ != nullptr) {
        image.attachments().set(std::move(custom_data_));
    } else if (CustomData::find(image) != nullptr) {
        image.attachments().remove(kCustomDataAttachment);
    }
}

}  // namespace zq
