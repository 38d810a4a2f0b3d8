// The image object: description, pixels' addresses, lending, attributes. Changes of shape are in
// image_shape.cpp.
#include "image/image.h"

#include <cstddef>
#include <cstring>
#include <limits>

namespace zq {

namespace {

char* copy_name(std::string_view name) {
    if (name.empty()) {
        return nullptr;
    }
    auto copy = std::make_unique<char[]>(name.size() + 1);
    std::memcpy(copy.get(), name.data(), name.size());
    return copy.release();
}

}  // namespace

Image::Image(Variant variant, std::string_view name)
    : gate_(std::make_shared<ObjectGate>(variant == Variant::kRegistered)), variant_(variant) {
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Winvalid-offsetof"
    static_assert(offsetof(Image, record_) == sizeof(void*));
#pragma GCC diagnostic pop
    record_.xStep = 1.0F;
    record_.yStep = 1.0F;
    record_.greedySize = kNotGreedy;
    record_.customData = attachments_.head();
    record_.memoryInfo = &memory_record_;
    record_.name = copy_name(name);
}

Image::~Image() {
    if (external_count_ > 0) {
        LentBuffers::instance().orphan(handle(), record_.buffer, source_);
    } else {
        release_buffer();
    }
    delete extra_info();
    delete[] record_.name;
}

std::string_view Image::name() const {
    return record_.name == nullptr ? std::string_view() : record_.name;
}

std::uint8_t* Image::pixel(std::int32_t x, std::int32_t y) const {
    if (record_.firstPixel == nullptr) {
        throw kImageTooSmall;
    }
    const std::int64_t border = record_.border;
    if (x < -border || x >= record_.width + border || y < -border || y >= record_.height + border) {
        throw kInvalidCoordinate;
    }
    return row(y) + std::ptrdiff_t{x} * bytes_per_pixel(type());
}

std::span<std::uint8_t> Image::whole_rows() const {
    if (record_.firstPixel == nullptr || record_.width == 0) {
        return {};
    }
    const auto border = std::ptrdiff_t{record_.border};
    const std::ptrdiff_t pixel_bytes = bytes_per_pixel(type());
    const std::ptrdiff_t rows = record_.height + 2 * border;
    const std::ptrdiff_t last_row = source_ == BufferSource::kExternal
                                        ? (record_.width + 2 * border) * pixel_bytes
                                        : row_stride();
    return {row(0) - border * (row_stride() + pixel_bytes),
            static_cast<std::size_t>((rows - 1) * row_stride() + last_row)};
}

void Image::clear_padding() const {
    const std::span<std::uint8_t> rows = whole_rows();
    const auto stride = static_cast<std::size_t>(row_stride());
    const auto used =
        (static_cast<std::size_t>(record_.width) + 2 * static_cast<std::size_t>(record_.border)) *
        static_cast<std::size_t>(bytes_per_pixel(type()));
    if (source_ == BufferSource::kExternal || used >= stride) {
        return;
    }
    for (std::size_t start = used; start < rows.size(); start += stride) {
        std::memset(rows.data() + start, 0, stride - used);
    }
}

std::uint8_t* Image::lend() {
    if (external_count_ == std::numeric_limits<std::int32_t>::max()) {
        throw kSystemError;
    }
    LentBuffers::instance().lend(handle(), record_.buffer);
    ++external_count_;
    return record_.buffer;
}

void Image::give_back() {
    if (external_count_ > 0) {
        --external_count_;
        LentBuffers::instance().give_back(handle(), record_.buffer);
    }
}

void Image::refuse_when_lent() const {
    if (external_count_ > 0) {
        throw kImageLent;
    }
}

void Image::set_bit_depth(std::int32_t bits) {
    if (bits != 0 && !is_bit_depth(bits)) {
        throw kBitDepth;
    }
    setting_ = bits;
}

void Image::set_extra_info(std::unique_ptr<ImageExtraInfo> extra) {
    delete extra_info();
    record_.extraInfo = extra.release();
}

void Image::drop_geometry_attachments() {
    if (ImageExtraInfo* extra = extra_info()) {
        extra->remove_kind(2);
        extra->remove_kind(3);
    }
    attachments_.remove(kGeometryAttachment1);
    attachments_.remove(kGeometryAttachment2);
}

}  // namespace zq
