// Changes of an image's shape: re-initialisation, resize, border, external buffers, and taking over
// pixels.
#include <algorithm>
#include <cstring>
#include <limits>
#include <utility>

#include "image/image.h"
#include "image/memory.h"
#include "image/physical_memory.h"

namespace zq {

namespace {

// Negative sizes and borders count as 0; an image without width or height has neither.
Extent normalised(PixelType type, std::int32_t width, std::int32_t height, std::int32_t border) {
    const bool empty = width <= 0 || height <= 0;
    return {type, empty ? 0 : width, empty ? 0 : height, std::max(border, 0)};
}

// First byte of the left border pixel of the top border row.
std::uint8_t* top_left(std::uint8_t* first, const Extent& extent, std::int32_t row_pixels) {
    return first - (std::ptrdiff_t{row_pixels} + 1) * extent.border * bytes_per_pixel(extent.type);
}

std::size_t bytes_of_rows(const Extent& extent, std::int32_t row_pixels) {
    const auto rows =
        static_cast<std::size_t>(extent.height) + 2 * static_cast<std::size_t>(extent.border);
    return rows * static_cast<std::size_t>(row_pixels) *
           static_cast<std::size_t>(bytes_per_pixel(extent.type));
}

void copy_rows(std::uint8_t* to, std::ptrdiff_t to_stride, const std::uint8_t* from,
               std::ptrdiff_t from_stride, std::int32_t rows, std::size_t row_bytes) {
    if (to_stride == from_stride && static_cast<std::ptrdiff_t>(row_bytes) == to_stride) {
        std::memcpy(to, from, row_bytes * static_cast<std::size_t>(rows));
        return;
    }
    for (std::int32_t y = 0; y < rows; ++y) {
        std::memcpy(to + y * to_stride, from + y * from_stride, row_bytes);
    }
}

bool is_multiple_of_4(std::int64_t value) {
    return value % 4 == 0;
}

}  // namespace

void Image::reset_description(bool greedy) {
    record_.unit = 0;
    record_.xStep = 1.0F;
    record_.yStep = 1.0F;
    record_.reserved[0] = 0;
    record_.reserved[1] = 0;
    record_.words[0] = 0;
    if (is_greedy() != greedy) {
        record_.greedySize = greedy ? 0 : kNotGreedy;
    }
    memory_record_.words[0] = 0;
    setting_ = 0;
    sample_offset_ = 0;
    set_extra_info(nullptr);
}

void Image::reinitialise(const ImageShape& shape, ResizeMode mode) {
    refuse_when_lent();
    if (!is_pixel_type(shape.type)) {
        reset_description(shape.greedy);
        forget_pixels();
        throw kInvalidImageType;
    }
    // The buffer comes first, so that a failed allocation leaves everything as it was.
    const std::uint32_t old_greedy_size = record_.greedySize;
    record_.greedySize = shape.greedy ? 0 : kNotGreedy;
    try {
        reshape(
            normalised(static_cast<PixelType>(shape.type), shape.width, shape.height, shape.border),
            mode);
    } catch (...) {
        record_.greedySize = old_greedy_size;
        throw;
    }
    reset_description(shape.greedy);
}

void Image::resize(std::int32_t width, std::int32_t height, std::optional<std::int32_t> new_type,
                   ResizeMode mode) {
    const PixelType target_type = new_type ? to_pixel_type(*new_type) : type();
    reshape(normalised(target_type, width, height, record_.border), mode);
}

void Image::resize(std::int32_t width, std::int32_t height, std::int32_t border) {
    reshape(normalised(type(), width, height, border), ResizeMode::kPlain);
}

void Image::resize(const ImageShape& shape) {
    reshape(normalised(to_pixel_type(shape.type), shape.width, shape.height, shape.border),
            ResizeMode::kPlain);
}

Layout Image::layout_for(const Extent& target) const {
    Layout layout = lay_out(target);
    if (is_greedy()) {
        layout.buffer_bytes = std::max<std::size_t>(layout.buffer_bytes, record_.greedySize);
    }
    return layout;
}

void Image::reshape(const Extent& target, ResizeMode mode) {
    const bool wants_physical = mode == ResizeMode::kPhysical;
    const Extent old = extent();
    if (target == old && wants_physical == (memory_record_.physical != 0)) {
        return;
    }
    refuse_when_lent();
    if (target.width == 0 && record_.buffer == nullptr && !wants_physical) {
        // An image that never had pixels needs no memory until it gets some.
        settle(target, row_pixels_for(target));
        return;
    }
    const Layout layout = layout_for(target);
    const bool keep = mode == ResizeMode::kKeepContents && target.width == old.width &&
                      target.type == old.type && target.border == old.border;
    if (wants_physical) {
        reshape_in_physical_memory(target, layout);
    } else {
        reshape_in_memory_layer(target, layout, keep);
    }
    if (is_greedy()) {
        record_.greedySize = static_cast<std::uint32_t>(layout.buffer_bytes);
    }
}

// Only a buffer of the memory layer can be resized in place; others are replaced. An external one
// stays its owner's.
void Image::reshape_in_memory_layer(const Extent& target, const Layout& layout, bool keep) {
    const Extent old = extent();
    const bool in_place = source_ == BufferSource::kMemoryLayer;
    const std::ptrdiff_t old_offset =
        in_place ? top_left(record_.firstPixel, old, record_.rowPixels) - record_.buffer : 0;
    auto* buffer =
        static_cast<std::uint8_t*>(in_place ? memory::resize(record_.buffer, layout.buffer_bytes)
                                            : memory::allocate(layout.buffer_bytes));
    std::uint8_t* first = place_first_pixel(buffer, target, layout.row_pixels);
    if (keep && in_place) {
        std::memmove(top_left(first, target, layout.row_pixels), buffer + old_offset,
                     std::min(bytes_of_rows(old, record_.rowPixels),
                              bytes_of_rows(target, layout.row_pixels)));
    } else if (keep && record_.buffer != nullptr) {
        // Pixel by pixel: an external buffer may have another row distance, and may end with the
        // last pixel of its last row.
        const std::ptrdiff_t pixel_bytes = bytes_per_pixel(old.type);
        copy_rows(top_left(first, target, layout.row_pixels), layout.row_pixels * pixel_bytes,
                  top_left(record_.firstPixel, old, record_.rowPixels), row_stride(),
                  std::min(old.height, target.height) + 2 * old.border,
                  static_cast<std::size_t>((old.width + 2 * old.border) * pixel_bytes));
    }
    if (!in_place) {
        release_buffer();
    }
    record_.buffer = buffer;
    source_ = BufferSource::kMemoryLayer;
    memory_record_.physical = 0;
    settle(target, layout.row_pixels);
}

// Contiguous memory is scarce: the old buffer goes back before the new one is asked for.
void Image::reshape_in_physical_memory(const Extent& target, const Layout& layout) {
    PhysicalMemory::instance().bind();
    forget_pixels();
    record_.buffer = PhysicalMemory::instance().allocate(layout.buffer_bytes);
    source_ = BufferSource::kPhysical;
    memory_record_.physical = 1;
    settle(target, layout.row_pixels);
}

void Image::settle(const Extent& target, std::int32_t row_pixels) {
    record_.type = static_cast<std::int32_t>(target.type);
    record_.width = target.width;
    record_.height = target.height;
    record_.border = target.border;
    record_.rowPixels = row_pixels;
    record_.firstPixel =
        record_.buffer == nullptr ? nullptr : place_first_pixel(record_.buffer, target, row_pixels);
    sample_offset_ = 0;
    if (!has_bit_depth(target.type)) {
        setting_ = 0;
    }
}

void Image::release_buffer() noexcept {
    free_buffer(record_.buffer, source_);
    record_.buffer = nullptr;
    source_ = BufferSource::kNone;
    memory_record_.physical = 0;
}

void Image::forget_pixels() noexcept {
    release_buffer();
    record_.firstPixel = nullptr;
    record_.width = 0;
    record_.height = 0;
}

void Image::set_border(std::int32_t border) {
    Extent target = extent();
    target.border = std::max(border, 0);
    if (target == extent()) {
        return;
    }
    refuse_when_lent();
    if (record_.buffer == nullptr) {
        settle(target, row_pixels_for(target));
        return;
    }
    Image relaid(Variant::kPrivate, {});
    relaid.record_.greedySize = record_.greedySize;
    relaid.reshape(target, ResizeMode::kPlain);
    relaid.copy_pixels_from(*this, 0);
    const std::int32_t setting = setting_;
    const std::int32_t offset = sample_offset_;
    exchange_pixels(relaid);
    setting_ = setting;
    sample_offset_ = offset;
}

void Image::wrap_external(const ImageShape& shape, std::uint8_t* buffer, std::int32_t row_pixels) {
    const Extent target =
        normalised(to_pixel_type(shape.type), shape.width, shape.height, shape.border);
    if (buffer == nullptr) {
        throw kNullPointer;
    }
    const std::int64_t pixel_bytes = bytes_per_pixel(target.type);
    const std::int32_t row = row_pixels > 0 ? row_pixels : row_pixels_for(target);
    if (!is_multiple_of_4(
            static_cast<std::int64_t>(reinterpret_cast<std::uintptr_t>(buffer) % 4)) ||
        !is_multiple_of_4(target.border * pixel_bytes) || !is_multiple_of_4(row * pixel_bytes)) {
        throw kExternalBufferAlignment;
    }
    const double rows = static_cast<double>(target.height) + 2.0 * target.border;
    if (rows * row * static_cast<double>(pixel_bytes) >=
        static_cast<double>(std::numeric_limits<std::ptrdiff_t>::max())) {
        throw kNotEnoughMemory;
    }
    refuse_when_lent();
    forget_pixels();
    reset_description(shape.greedy);
    record_.buffer = buffer;
    source_ = BufferSource::kExternal;
    settle(target, row);
    record_.firstPixel = buffer + (std::int64_t{row} + 1) * target.border * pixel_bytes;
}

void Image::adopt(Image& source) {
    take_over(source, 0);
}

void Image::adopt_with_border(Image& source) {
    take_over(source, source.record_.border);
}

void Image::take_over(Image& source, std::int32_t copied_border) {
    const Extent wanted = source.extent();
    const std::int32_t setting = source.setting_;
    const std::int32_t offset = source.sample_offset_;
    if (wanted == extent()) {
        copy_pixels_from(source, copied_border);
    } else if (source_ != BufferSource::kExternal && source_ != BufferSource::kPhysical &&
               !is_greedy() && external_count_ == 0) {
        exchange_pixels(source);
    } else {
        reshape(wanted, ResizeMode::kPlain);
        copy_pixels_from(source, copied_border);
    }
    setting_ = setting;
    sample_offset_ = offset;
}

void Image::exchange_pixels(Image& source) {
    std::swap(record_.type, source.record_.type);
    std::swap(record_.width, source.record_.width);
    std::swap(record_.height, source.record_.height);
    std::swap(record_.border, source.record_.border);
    std::swap(record_.rowPixels, source.record_.rowPixels);
    std::swap(record_.buffer, source.record_.buffer);
    std::swap(record_.firstPixel, source.record_.firstPixel);
    std::swap(record_.greedySize, source.record_.greedySize);
    std::swap(memory_record_.physical, source.memory_record_.physical);
    std::swap(source_, source.source_);
}

// Of the border, as many pixels as the caller says.
void Image::copy_pixels_from(const Image& source, std::int32_t border) {
    if (record_.firstPixel == nullptr || source.record_.firstPixel == nullptr) {
        return;
    }
    const std::ptrdiff_t pixel_bytes = bytes_per_pixel(type());
    const std::ptrdiff_t columns = std::ptrdiff_t{record_.width} + 2 * std::ptrdiff_t{border};
    copy_rows(row(-border) - border * pixel_bytes, row_stride(),
              source.row(-border) - border * pixel_bytes, source.row_stride(),
              record_.height + 2 * border, static_cast<std::size_t>(columns * pixel_bytes));
}

}  // namespace zq
