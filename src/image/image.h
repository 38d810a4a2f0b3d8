// The image object: the public record, the buffer behind it, and every operation that changes its
// shape. Locking is image_lock.h's, naming and lifetime are registry.h's.
#pragma once

#include <zqvissvc/types.h>

#include <cstdint>
#include <memory>
#include <optional>
#include <span>
#include <string_view>

#include "image/attachments.h"
#include "image/layout.h"
#include "image/lent_buffers.h"
#include "image/object.h"
#include "image/pixel_type.h"

namespace zq {

using ImageHandle = ZqImageHandle;
using ImageRecord = ZqImageRecord;

enum class ResizeMode : std::int32_t { kPlain = 0, kKeepContents = 1, kPhysical = 2 };

enum class Variant { kRegistered, kPrivate };

// Arguments of creation and re-initialisation as callers give them: the type is not yet checked, a
// negative border or size counts as 0.
struct ImageShape {
    std::int32_t type;
    std::int32_t width;
    std::int32_t height;
    std::int32_t border;
    bool greedy = false;
};

class Image final : public Object {
  public:
    // Without pixels yet; `name` is copied, empty means unnamed.
    Image(Variant variant, std::string_view name);
    ~Image() override;

    // The object behind a handle. The handle must be live (registry.h checks that).
    static Image* from_handle(ImageHandle handle) {
        return reinterpret_cast<Image*>(object_address(handle));
    }
    // Where the object of a handle starts; arithmetic only, so any handle will do.
    static std::uintptr_t object_address(ImageHandle handle) {
        return reinterpret_cast<std::uintptr_t>(handle) - sizeof(void*);
    }
    const std::shared_ptr<ObjectGate>& gate() const override { return gate_; }
    ImageHandle handle() { return &record_; }
    // The handle of an image that may be gone by now; arithmetic only.
    static ImageHandle handle_of(const Object* image) {
        return reinterpret_cast<ImageHandle>(reinterpret_cast<std::uintptr_t>(image) +
                                             sizeof(void*));
    }

    const ImageRecord& record() const { return record_; }
    ImageRecord& record() { return record_; }
    PixelType type() const { return static_cast<PixelType>(record_.type); }
    Extent extent() const { return {type(), record_.width, record_.height, record_.border}; }
    std::string_view name() const;
    Variant variant() const { return variant_; }

    // Shape. All of them throw kImageLent while the buffer is lent out, kNotEnoughMemory,
    // kPoolExhausted or kMemoryError; a failed resize leaves the image as it was, but for
    // kPhysical: when the allocator is there but refuses, the image is left without pixels.
    // reinitialise also throws kInvalidImageType
    // and then leaves the image without pixels.
    void reinitialise(const ImageShape& shape, ResizeMode mode = ResizeMode::kPlain);
    void resize(std::int32_t width, std::int32_t height, std::optional<std::int32_t> new_type,
                ResizeMode mode);
    // resize in mode kPlain, and the border with it, in one step.
    void resize(std::int32_t width, std::int32_t height, std::int32_t border);
    // The same with a type; a greedy flag has no effect.
    void resize(const ImageShape& shape);
    // Re-lays the buffer; the pixels of the image proper are kept, the border's are undefined.
    void set_border(std::int32_t border);
    // Makes the caller's buffer the image's pixels, the first byte being pixel (-border, -border).
    // row_pixels of 0 or less means the library's own row layout. Throws kExternalBufferAlignment,
    // kNullPointer, kInvalidImageType.
    void wrap_external(const ImageShape& shape, std::uint8_t* buffer, std::int32_t row_pixels);

    // Takes over the shape and pixels of `source`, whose border must be the image's own: how a
    // reader hands in a finished picture at once. When type and size stay, the pixels are copied to
    // where they are now, so addresses handed out stay valid; otherwise the buffers are exchanged
    // (a lent or greedy image, or one over an external or physical buffer, is resized and copied
    // into). Throws as resize does and leaves the image as it was.
    void adopt(Image& source);
    // The same for a source of any border, with its size and its pixels.
    void adopt_with_border(Image& source);

    // Address of a pixel of the image or its border. Throws kImageTooSmall without pixels,
    // kInvalidCoordinate outside.
    std::uint8_t* pixel(std::int32_t x, std::int32_t y) const;
    // First pixel of row y of the image proper; y is not checked. Shape: row_stride() bytes to the
    // next.
    std::uint8_t* row(std::int32_t y) const { return record_.firstPixel + y * row_stride(); }
    std::ptrdiff_t row_stride() const {
        return std::ptrdiff_t{record_.rowPixels} * bytes_per_pixel(type());
    }

    // The rows of the image with its border, as one block from pixel (-border, -border) on: whole
    // rows, except that an external buffer may end with the last pixel of its last row. Empty
    // without pixels.
    std::span<std::uint8_t> whole_rows() const;
    // Makes the padding behind each row zeros; that of an external buffer stays its owner's.
    void clear_padding() const;

    // Lending. lend returns the start of the buffer; give_back lowers the count, which never falls
    // below 0.
    std::uint8_t* lend();
    void give_back();
    std::int32_t external_count() const { return external_count_; }

    // 0 (not set), or 8 to 16 for I16 and RGB (U64); else throws kBitDepth. A type without a bit
    // depth resets it.
    void set_bit_depth(std::int32_t bits);
    std::int32_t bit_depth() const { return is_bit_depth(setting_) ? setting_ : 0; }
    // The word behind the bit depth, as flattened images carry it. Any number is kept, for whoever
    // wrote it; one that can not be a bit depth of the type counts as not set.
    void set_setting(std::int32_t setting) { setting_ = setting; }
    std::int32_t setting() const { return setting_; }

    // What reading added to a 16-bit file's samples: value = sample + offset. The writers of TIFF
    // and lossless JPEG 2000 take it away again, so that a file's samples survive a round trip.
    void set_sample_offset(std::int32_t offset) { sample_offset_ = offset; }
    std::int32_t sample_offset() const { return sample_offset_; }

    AttachmentList& attachments() { return attachments_; }
    ImageExtraInfo* extra_info() const { return static_cast<ImageExtraInfo*>(record_.extraInfo); }
    void set_extra_info(std::unique_ptr<ImageExtraInfo> extra);
    // Drops what describes the old geometry: extra information of kinds 2 and 3, then the two
    // geometry attachments.
    void drop_geometry_attachments();

    bool has_cleanup_procedure() const { return has_cleanup_procedure_; }
    void set_has_cleanup_procedure(bool has) { has_cleanup_procedure_ = has; }

  private:
    bool is_greedy() const { return record_.greedySize != kNotGreedy; }
    bool is_bit_depth(std::int32_t bits) const {
        return bits >= 8 && bits <= 16 && has_bit_depth(type());
    }
    void refuse_when_lent() const;
    void reset_description(bool greedy);
    void reshape(const Extent& target, ResizeMode mode);
    void reshape_in_memory_layer(const Extent& target, const Layout& layout, bool keep);
    void reshape_in_physical_memory(const Extent& target, const Layout& layout);
    void settle(const Extent& target, std::int32_t row_pixels);
    void release_buffer() noexcept;
    void forget_pixels() noexcept;
    void exchange_pixels(Image& source);
    void copy_pixels_from(const Image& source, std::int32_t border);
    void take_over(Image& source, std::int32_t copied_border);
    Layout layout_for(const Extent& target) const;

    static constexpr std::uint32_t kNotGreedy = 0xFFFFFFFF;

    // Follows the table of operations at once: clients and from_handle rely on it.
    ImageRecord record_{};
    std::shared_ptr<ObjectGate> gate_;
    ZqMemoryRecord memory_record_{};
    AttachmentList attachments_;
    Variant variant_;
    BufferSource source_ = BufferSource::kNone;
    std::int32_t external_count_ = 0;
    std::int32_t setting_ = 0;
    std::int32_t sample_offset_ = 0;
    bool has_cleanup_procedure_ = false;
};

}  // namespace zq
