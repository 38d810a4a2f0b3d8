// Images into records.
#pragma once

#include <zqvissvc/types.h>

#include <cstdint>

#include "host/host_string.h"
#include "image/image.h"
#include "serialize/flatten_settings.h"

namespace zq {

struct RecordFormat {
    std::uint32_t version = kStringVersion;
    std::uint32_t keep_name = 0;
};

// Writes one record of the image, which must be locked, into a host string. Throws what
// FlattenSettings::choose does, kInitializationError for a version that is not written,
// kNotEnoughMemory; the string then is what it was.
void flatten(Image& image, ZqStringHandle* string, const FlattenRequest& request,
             const RecordFormat& format, host::Extension extension);

}  // namespace zq
