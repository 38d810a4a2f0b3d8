// Records out of host strings into images.
#pragma once

#include <zqvissvc/types.h>

#include "image/lifecycle.h"

namespace zq {

// Whether the image that the record's session cookie means is refilled.
enum class Redirection { kNone, kBySession };

// Rebuilds an image from the one record that the string holds, as rebuild() does. Throws
// kInitializationError also for a string that is missing or empty.
Created unflatten(ImageHandle destination, ZqStringHandle string, Redirection redirection);

}  // namespace zq
