// Flattening of the host's image values: the strings that the data type's hooks hand out, and
// values made of such strings. Threads: safe.
#pragma once

#include <zqvissvc/types.h>

#include <cstdint>

#include "image/image.h"

namespace zq {

// Flattens a locked image, for the host to keep or, `remote`, to send. The string stays here until
// the same is asked for again or the image is forgotten. Throws as flatten() does; the string that
// was there then stays.
ZqStringHandle flatten_for_host(Image& image, bool remote, std::uint32_t version);

// Disposes the image's strings.
void forget_flattened(ImageHandle image) noexcept;

// Makes *value mean the image of a record; a new image is registered with the host, and is disposed
// again when the host does not take it. Throws as unflatten() and register_flattened() do.
void value_from_flattened(ZqStringHandle flattened, ZqImageValue* value);

}  // namespace zq
