// Reading records.
#include "serialize/unflatten.h"

#include <string>
#include <string_view>
#include <vector>

#include "host/host_string.h"
#include "host/image_value.h"
#include "serialize/rebuild.h"
#include "serialize/record.h"

namespace zq {

namespace {

std::span<const std::uint8_t> bytes_of(ZqStringHandle string) {
    const std::string_view text = host::view(string);
    return {reinterpret_cast<const std::uint8_t*>(text.data()), text.size()};
}

std::string text_of(std::span<const std::uint8_t> bytes) {
    return {reinterpret_cast<const char*>(bytes.data()), bytes.size()};
}

ZqFlattenContext context_of(const RecordHeader& header) {
    using W = RecordWord;
    ZqFlattenContext context{};
    context.type = header[W::kType];
    context.width = header[W::kWidth];
    context.height = header[W::kHeight];
    context.imageWords[0] = header[W::kImageWord6];
    context.imageWords[1] = header[W::kImageWord7];
    context.border = header[W::kBorder];
    context.lineWidth = header[W::kLineWidth];
    context.codecId = header[W::kCodecId];
    context.sourceImage = header[W::kSourceImage];
    context.pixelBlockSize = header[W::kPixelSize];
    context.attachmentBlockSize = header[W::kAttachmentSize];
    context.imageSetting = header[W::kSetting];
    context.propertyBlockSize = header[W::kPropertySize];
    context.kind = header[W::kKind];
    context.referencedImage = header[W::kReferencedImage];
    context.keepName = header[W::kKeepName];
    return context;
}

}  // namespace

Created unflatten(ImageHandle destination, ZqStringHandle string, Redirection redirection) {
    const RecordHeader header = RecordHeader::read(bytes_of(string));
    if (header.kind() == FlattenKind::kByReference && header[RecordWord::kReferencedImage] == 0) {
        throw kInitializationError;
    }
    RecordBlocks blocks = blocks_of(header, bytes_of(string));
    const std::string name = text_of(blocks.name);
    // Both of these may call the host, which may move the string.
    const std::vector<std::uint8_t> flattened(blocks.attachment.begin(), blocks.attachment.end());
    AttachmentList::Entry attachment = prepare_attachment(flattened);
    if (redirection == Redirection::kBySession && !name.empty()) {
        const ImageHandle known = host::find_session(header[RecordWord::kHostCookie], name);
        if (known != nullptr) destination = known;
    }
    if (bytes_of(string).size() != header.record_size()) throw kInitializationError;
    blocks = blocks_of(header, bytes_of(string));
    ZqFlattenContext context = context_of(header);
    context.pixelBlock = blocks.pixels.data();
    context.propertyBlock = blocks.properties.data();
    // An image's name ends at a zero byte.
    const std::string_view image_name = name.c_str();
    return rebuild(destination,
                   {context, ZQ_FLATTEN_CONTEXT_FULL, image_name, std::move(attachment)});
}

}  // namespace zq
