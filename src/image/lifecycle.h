// Creation and disposal of images.
#pragma once

#include <cstdint>
#include <functional>
#include <string_view>

#include "image/image.h"

namespace zq {

// All creation functions throw kInvalidImageType, kNotEnoughMemory (or the memory layer's code) or
// std::bad_alloc and leave no image behind; the registry owns the image, the caller gets its
// handle.

struct Created {
    ImageHandle image;
    bool is_new;  // false: an image of that name was there and has been re-initialised
};

ImageHandle new_image(const ImageShape& shape);

// Finds or creates: an image of that name is locked and re-initialised (its contents, calibration
// and extra information are lost; it keeps its variant), otherwise one of the given variant is
// made. An empty name makes an unnamed image.
Created new_named_image(const ImageShape& shape, std::string_view name, Variant variant);

// The same with pixels: `fill` gives an image, which nobody else can reach meanwhile, shape and
// contents; it may be called for a second one when another thread was faster. What it throws leaves
// no image behind.
Created new_filled_image(std::string_view name, Variant variant,
                         const std::function<void(Image&)>& fill);

// As new_named_image, but the pixels are the caller's buffer, which must outlive its use by the
// image and is never freed here. A later change of size gives the image a buffer of its own and
// leaves the caller's alone. Also throws kExternalBufferAlignment and kNullPointer.
Created new_external_image(const ImageShape& shape, std::uint8_t* buffer, std::int32_t row_pixels,
                           std::string_view name);

// Whether the handle, which may be anything, is that of a live image; it may go at any moment.
bool is_live_image(ImageHandle handle);

// Takes back a buffer that `handle` lent: from the image while it lives, else from the buffer's
// remaining users. False when there is no such image and it has lent no such buffer.
bool take_back_buffer(ImageHandle handle, std::uint8_t* buffer);

// Waits for operations under way on the image. A null handle or one that is not (any more)
// registered is no error.
void dispose_image(ImageHandle handle);
void dispose_all_images();

// Told of each image that is being disposed, before it goes: nobody else can reach the image by
// then. Not told of the images that are left when the library is unloaded. At most four listeners,
// added once when a layer above starts.
using DisposeListener = void (*)(Image& image) noexcept;
void add_dispose_listener(DisposeListener listener);

}  // namespace zq
