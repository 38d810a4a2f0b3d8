// Rebuilding images.
#include "serialize/rebuild.h"

#include <cstdio>
#include <cstring>
#include <limits>
#include <memory>
#include <optional>
#include <string>

#include "image/attachment_classes.h"
#include "image/image_lock.h"
#include "serialize/flatten_settings.h"
#include "serialize/image_reference.h"
#include "serialize/properties.h"

namespace zq {

namespace {

// What new memory an image may take without pixels to show for it, and for each byte of pixels. No
// codec needs more, unless a small image has a border of thousands of pixels: the plain one stores
// whole rows, the packed one a bit a pixel, and the quality codec keeps its blocks long enough.
constexpr std::uint64_t kFreeBytes = std::uint64_t{64} << 20;
constexpr std::uint64_t kBytesPerBlockByte = 1024;

ImageShape shape_of(const ZqFlattenContext& context) {
    constexpr auto kMost = static_cast<std::uint32_t>(std::numeric_limits<std::int32_t>::max());
    if (context.width > kMost || context.height > kMost || context.border > kMost) {
        throw kInitializationError;
    }
    return {static_cast<std::int32_t>(context.type), static_cast<std::int32_t>(context.width),
            static_cast<std::int32_t>(context.height), static_cast<std::int32_t>(context.border)};
}

void refuse_what_pixels_do_not_explain(const ImageShape& shape, std::uint64_t block_size) {
    const bool empty = shape.width == 0 || shape.height == 0;
    const Layout layout = lay_out({to_pixel_type(shape.type), empty ? 0 : shape.width,
                                   empty ? 0 : shape.height, shape.border});
    // An image without rows is flattened without a block, so here none counts.
    const std::uint64_t explained = empty ? 0 : kBytesPerBlockByte * block_size;
    if (layout.buffer_bytes > kFreeBytes + explained) {
        throw kInitializationError;
    }
}

std::string name_of_remote(std::uint32_t source_image) {
    char name[32];
    std::snprintf(name, sizeof name, "remote image %08X", static_cast<unsigned>(source_image));
    return name;
}

// Whatever may fail comes before anything is lost: the checks when one of these is made, then the
// image's memory and pixels, then what describes it.
class Rebuilding {
  public:
    explicit Rebuilding(RebuildSource source)
        : source_(std::move(source)), context_(source_.context), shape_(shape_of(context_)) {
        to_pixel_type(shape_.type);
        prepare_pixels();
        if (is_full() && context_.propertyBlockSize != 0) {
            properties_.emplace(block_bytes(context_.propertyBlock, context_.propertyBlockSize));
        }
    }

    void into(Image& image) {
        if (!has_shape(image)) refuse_what_pixels_do_not_explain(shape_, context_.pixelBlockSize);
        write_pixels(image);
        describe(image);
    }

    Created into_new_image() {
        refuse_what_pixels_do_not_explain(shape_, context_.pixelBlockSize);
        const bool private_one = is_full() && context_.keepName != 0 && !source_.name.empty();
        const std::string name =
            private_one ? std::string(source_.name) : name_of_remote(context_.sourceImage);
        const Created made =
            new_filled_image(name, private_one ? Variant::kPrivate : Variant::kRegistered,
                             [this](Image& image) { create(image); });
        describe(*LockedImage(made.image));
        return made;
    }

  private:
    bool is_full() const { return source_.context_length >= ZQ_FLATTEN_CONTEXT_FULL; }

    void prepare_pixels() {
        block_bytes(context_.pixelBlock, context_.pixelBlockSize);
        if (context_.pixelBlockSize != 0) {
            const auto id = static_cast<std::int32_t>(context_.codecId);
            codec_ = FlattenSettings::instance().decoder(id);
        }
        if (codec_ != nullptr) codec_->check(context_);
    }

    bool may_fail_late() const { return codec_ != nullptr && codec_->may_fail_late(); }

    void decode_aside() {
        if (decoded_aside_ != nullptr) return;
        auto aside = std::make_unique<Image>(Variant::kPrivate, std::string_view());
        aside->reinitialise(shape_);
        codec_->decode(*aside, context_, PixelMemory::kFresh);
        decoded_aside_ = std::move(aside);
    }

    bool has_shape(const Image& image) const {
        const ImageRecord& record = image.record();
        return record.type == shape_.type && record.width == shape_.width &&
               record.height == shape_.height && record.border == shape_.border;
    }

    // An image that is not yet to be found, or one of that name. May be called again for another.
    void create(Image& image) {
        ImageShape shape = shape_;
        if (may_fail_late()) {
            decode_aside();
            shape.width = shape.height = 0;
        }
        image.reinitialise(shape);
        if (codec_ == nullptr || !codec_->writes_all(image, context_)) clear(image);
        write_pixels(image);
    }

    // A codec that fails leaves the pixels; a shape that has gone can not be brought back.
    void write_pixels(Image& image) {
        if (!may_fail_late()) {
            image.resize(shape_);
            if (codec_ != nullptr) codec_->decode(image, context_, PixelMemory::kUsed);
        } else if (has_shape(image)) {
            codec_->decode(image, context_, PixelMemory::kUsed);
        } else {
            decode_aside();
            if (has_bit_depth(decoded_aside_->type())) {
                decoded_aside_->set_setting(image.setting());
            }
            image.adopt_with_border(*decoded_aside_);
            decoded_aside_.reset();
        }
    }

    // Nobody gets to see what was in the memory before.
    static void clear(Image& image) {
        const std::span<std::uint8_t> rows = image.whole_rows();
        if (!rows.empty()) std::memset(rows.data(), 0, rows.size());
    }

    void describe(Image& image) {
        image.record().reserved[0] = static_cast<std::int32_t>(context_.imageWords[0]);
        image.record().reserved[1] = static_cast<std::int32_t>(context_.imageWords[1]);
        image.set_sample_offset(0);
        image.set_extra_info(nullptr);
        image.attachments().set(std::move(source_.attachment));
        if (source_.context_length >= ZQ_FLATTEN_CONTEXT_SETTING) {
            image.set_setting(static_cast<std::int32_t>(context_.imageSetting));
        }
        if (properties_) properties_->apply(image);
        image.attachments().note_change();
    }

    RebuildSource source_;
    const ZqFlattenContext& context_;
    ImageShape shape_;
    std::shared_ptr<const PixelCodec> codec_;  // null: the pixels are not written
    std::unique_ptr<Image> decoded_aside_;
    std::optional<PreparedProperties> properties_;
};

}  // namespace

AttachmentList::Entry prepare_attachment(std::span<const std::uint8_t> block) {
    if (block.empty()) return nullptr;
    return AttachmentList::make_entry(kGeometryAttachment2,
                                      make_attachment(kGeometryAttachment2, block));
}

Created rebuild(ImageHandle destination, RebuildSource source) {
    if (source.context_length < ZQ_FLATTEN_CONTEXT_BASE) throw kInitializationError;
    if (source.context_length >= ZQ_FLATTEN_CONTEXT_FULL && source.context.referencedImage != 0) {
        const ImageHandle referenced = find_reference(source.context.referencedImage);
        if (referenced == nullptr) throw kInitializationError;
        return {referenced, false};
    }
    Rebuilding rebuilding(std::move(source));
    if (!is_live_image(destination)) return rebuilding.into_new_image();
    const LockedImage image(destination);
    rebuilding.into(*image);
    return {destination, false};
}

}  // namespace zq
