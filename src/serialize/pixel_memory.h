// What the memory of an image has been through before pixels are written.
#pragma once

namespace zq {

// Fresh memory lies in the cache when it is first written, since the system has just cleared it:
// going past the cache would cost then, and saves otherwise.
enum class PixelMemory { kUsed, kFresh };

}  // namespace zq
