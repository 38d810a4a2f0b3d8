// Filling a flatten context from an image, and writing it out.
#include "serialize/flatten.h"

#include <cstring>
#include <new>

#include "convert/copy_rows.h"
#include "serialize/flatten_context.h"
#include "serialize/image_reference.h"
#include "serialize/properties.h"

namespace zq {

namespace {

void describe(FlattenContext& context, Image& image) {
    const ImageRecord& record = image.record();
    ZqFlattenContext& words = context.words;
    words.unit = static_cast<std::uint32_t>(record.unit);
    words.xStep = record.xStep;
    words.yStep = record.yStep;
    words.type = static_cast<std::uint32_t>(record.type);
    words.width = static_cast<std::uint32_t>(record.width);
    words.height = static_cast<std::uint32_t>(record.height);
    words.imageWords[0] = static_cast<std::uint32_t>(record.reserved[0]);
    words.imageWords[1] = static_cast<std::uint32_t>(record.reserved[1]);
    words.border = static_cast<std::uint32_t>(record.border);
    words.lineWidth = static_cast<std::uint32_t>(record.rowPixels);
    words.sourceImage = reference_of(image);
    words.imageSetting = static_cast<std::uint32_t>(image.setting());
}

// Properties that there is no memory for are left out.
void add_properties(FlattenContext& context, Image& image) {
    try {
        context.own_properties(flatten_properties(image));
    } catch (const std::bad_alloc&) {
        context.own_properties({});
    }
}

// The attachment's class comes first: its routine may do to the image what it wants, and the pixel
// block may lie in the image's memory.
void fill(FlattenContext& context, Image& image, const FlattenChoice& choice,
          std::uint32_t version) {
    const bool by_reference = choice.kind == FlattenKind::kByReference;
    const Attachment* attachment =
        by_reference ? nullptr : image.attachments().find(kGeometryAttachment2);
    if (attachment != nullptr) context.own_attachment(attachment->flattened());
    if (choice.kind == FlattenKind::kWithProperties && version == kNewestVersion) {
        add_properties(context, image);
    }
    describe(context, image);
    context.words.codecId = static_cast<std::uint32_t>(choice.codec_id);
    context.words.kind = static_cast<std::uint32_t>(choice.kind);
    if (by_reference) {
        context.words.referencedImage = context.words.sourceImage;
    } else if (image.record().height > 0) {
        choice.codec->encode(context, image);
    }
}

RecordHeader header_of(const FlattenContext& context, const Image& image,
                       const RecordFormat& format) {
    using W = RecordWord;
    const ZqFlattenContext& words = context.words;
    RecordHeader header(format.version);
    const bool newest = format.version == kNewestVersion;
    if (newest) {
        header[W::kKind] = words.kind;
        header[W::kReferencedImage] = words.referencedImage;
        header[W::kKeepName] = format.keep_name;
        header[W::kPropertySize] = words.propertyBlockSize;
    }
    header[W::kSetting] = words.imageSetting;
    header[W::kHostCookie] = image.record().hostCookie;
    header[W::kNameLength] = checked_narrow<std::uint32_t>(image.name().size());
    header[W::kSourceImage] = words.sourceImage;
    header[W::kType] = words.type;
    header[W::kWidth] = words.width;
    header[W::kHeight] = words.height;
    header[W::kBorder] = words.border;
    header[W::kImageWord6] = words.imageWords[0];
    header[W::kImageWord7] = words.imageWords[1];
    header[W::kLineWidth] = words.lineWidth;
    header[W::kCodecId] = words.codecId;
    header[W::kPixelSize] = words.pixelBlockSize;
    header[W::kAttachmentSize] = words.attachmentBlockSize;
    return header;
}

// What the image's memory does not have of the last row's padding becomes zeros.
void write_pixels(std::uint8_t* to, const FlattenContext& context) {
    const std::span<const std::uint8_t> from = context.readable_pixels();
    copy_block(to, from.data(), from.size());
    const std::size_t missing = context.words.pixelBlockSize - from.size();
    if (missing > 0) std::memset(to + from.size(), 0, missing);
}

void write_blocks(std::uint8_t* to, const FlattenContext& context, const RecordHeader& header,
                  const Image& image) {
    write_pixels(to, context);
    to += header[RecordWord::kPixelSize];
    copy_block(to, context.words.attachmentBlock, header[RecordWord::kAttachmentSize]);
    to += header[RecordWord::kAttachmentSize];
    copy_block(to, image.name().data(), image.name().size());
    to += image.name().size();
    copy_block(to, context.words.propertyBlock, header[RecordWord::kPropertySize]);
}

}  // namespace

void flatten(Image& image, ZqStringHandle* string, const FlattenRequest& request,
             const RecordFormat& format, host::Extension extension) {
    const FlattenChoice choice = FlattenSettings::instance().choose(request);
    if (format.version != kStringVersion && format.version != kNewestVersion) {
        throw kInitializationError;
    }
    FlattenContext context;
    fill(context, image, choice, format.version);
    const RecordHeader header = header_of(context, image, format);
    const auto size = checked_narrow<std::size_t>(header.record_size());
    // Attachments may have called the host meanwhile; from here on nothing does.
    std::uint8_t* record = host::extend_string(string, size, extension);
    header.write({record, header.size()});
    if (header.kind() != FlattenKind::kByReference) {
        write_blocks(record + header.size(), context, header, image);
    }
}

}  // namespace zq
