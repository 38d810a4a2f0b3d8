// Host image values: from a value to its image, and from a new image to a value that the host
// knows.
#pragma once

#include <zqvissvc/types.h>

#include <cstdint>
#include <string_view>

#include "base/error_codes.h"
#include "image/image.h"

namespace zq::host {

// The type under which images are sessions of the host.
inline constexpr char kSessionType[] = "KEMOImage";

struct LookUp {
    ImageHandle image;
    GRLIBError_enum code;
};

// The name of an image as a host string gives it: names are kept zero-terminated, so it counts up
// to its first zero byte. Valid as long as view(name) is.
std::string_view name_of(ZqStringHandle name);

// The value's image word decides; the host's session only tells whether a null value means
// anything.
LookUp look_up(const ZqImageValue* value);

// As look_up; throws its code, and kNotAnImage when the value means no image.
ImageHandle require_image(const ZqImageValue* value);

// Registers an image with the host under a name and remembers the cookie in the image; a session
// that the image had is removed. Throws kNotInitialized when the host lacks the service,
// kNotEnoughMemory when it has no memory, kSystemError when it refuses for another reason.
void register_session(ImageHandle image, ZqStringHandle name);

// Registers a value that was made of flattened bytes, as register_session does, by the service that
// the host has for that, if any.
void register_flattened(ImageHandle image, ZqStringHandle name, ZqStringHandle flattened,
                        std::uint32_t version);

// The live image that the host knows by the cookie under exactly this name, or null; also when the
// host lacks the service.
ImageHandle find_session(std::uint32_t cookie, std::string_view name);

// Makes the host dispose the image when it tears the caller down.
void dispose_at_teardown(ImageHandle image);

void set_cookie(ImageHandle image, std::uint32_t cookie);

}  // namespace zq::host
