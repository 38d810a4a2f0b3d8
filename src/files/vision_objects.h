// Vision information: an image's attachments as payloads of a file, and back.
#pragma once

#include <cstdint>
#include <span>
#include <vector>

#include "files/png_vision.h"
#include "image/image.h"

namespace zq {

// Payload of the private part of a file, not of an image: carried, and understood by nobody here.
inline constexpr ClassId kTimingAttachment = {
    0x6B1F0A52, 0x27C4, 0x4E0B, {0x9A, 0x35, 0xD8, 0x41, 0x7E, 0xC6, 0x52, 0x0F}};

// Fills what `vision` does not hold yet: the payloads from the objects, the texts from the custom
// data. Throws what an object throws, and kUnableToWriteData for more objects than can be read
// again.
void gather_vision(Image& image, PngVision& vision);

// Objects ready to be hung on an image; what may fail is behind them.
using VisionObjects = std::vector<AttachmentList::Entry>;
// A damaged payload gives none. Throws kNotEnoughMemory and std::bad_alloc.
VisionObjects make_objects(const PngVision& vision);

// The image then has these attachments and no others.
void replace_attachments(Image& image, VisionObjects objects) noexcept;

}  // namespace zq
