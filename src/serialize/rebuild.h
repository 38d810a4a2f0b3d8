// Images out of flatten contexts.
#pragma once

#include <cstdint>
#include <span>
#include <string_view>

#include "image/lifecycle.h"
#include "serialize/flatten_context.h"

namespace zq {

// The object of an attachment block, ready to be attached; empty for no bytes. Throws what the
// object's class gives, std::bad_alloc. Trap: the class may call the host, so the bytes must not
// lie in host memory.
AttachmentList::Entry prepare_attachment(std::span<const std::uint8_t> block);

// What an image is to be made of. Blocks and name are borrowed.
struct RebuildSource {
    const ZqFlattenContext& context;
    std::size_t context_length;  // declared, in bytes; at least ZQ_FLATTEN_CONTEXT_BASE
    std::string_view name;
    AttachmentList::Entry attachment;
};

// Rebuilds the destination, or makes a new image when it is not a live one, and returns the image;
// the one that the context refers to, if it does. All that can fail comes before any image is
// touched: kInitializationError for a context that is not valid, a reference that means no live
// image, or memory far beyond what the pixel block can explain (the destination's own does not
// count); kInvalidImageType, kNullPointer, whatever a resize throws.
Created rebuild(ImageHandle destination, RebuildSource source);

}  // namespace zq
