// Sessions of images and their removal when an image is disposed.
#include "host/image_value.h"

#include <utility>

#include "host/boundary.h"
#include "host/host_string.h"
#include "host/run_hooks.h"
#include "host/services.h"
#include "image/image_lock.h"
#include "image/lifecycle.h"
#include "image/registry.h"

namespace zq::host {

namespace {

void remove_session(std::uint32_t cookie) {
    const auto remove = ud_remove_session.find();
    if (cookie != 0 && remove != nullptr) {
        remove(kSessionType, cookie);
    }
}

void dispose_from_host(void* image) {
    dispose_image(static_cast<ImageHandle>(image));
}

// The image is going: whatever the host holds for it goes first.
void leave_host(Image& image) noexcept {
    remove_session(std::exchange(image.record().hostCookie, 0));
    if (image.has_cleanup_procedure()) {
        // Only fails when this thread's first call comes without memory; the host then calls for an
        // image that is gone.
        run_core([&] { remove_cleanup_procedure(dispose_from_host, image.handle()); });
    }
}

bool is_live_image(ImageHandle image) {
    return Registry::instance().pin(Image::object_address(image)).tag == kImageTag;
}

}  // namespace

std::string_view name_of(ZqStringHandle name) {
    const std::string_view text = view(name);
    return text.substr(0, text.find('\0'));
}

LookUp look_up(const ZqImageValue* value) {
    const auto to_session = ts_cookie_to_session.find();
    if (to_session == nullptr) {
        return {value == nullptr ? nullptr : value->image, kNotInitialized};
    }
    void* session = nullptr;
    to_session(kSessionType, value, &session);
    if (value == nullptr && session == nullptr) {
        return {nullptr, kSuccess};
    }
    const ImageHandle image = value == nullptr ? static_cast<ImageHandle>(session) : value->image;
    return is_live_image(image) ? LookUp{image, kSuccess} : LookUp{nullptr, kNotAnImage};
}

ImageHandle require_image(const ZqImageValue* value) {
    const LookUp found = look_up(value);
    if (found.code != kSuccess) {
        throw found.code;
    }
    if (found.image == nullptr) {
        throw kNotAnImage;
    }
    return found.image;
}

void set_cookie(ImageHandle image, std::uint32_t cookie) {
    add_dispose_listener(leave_host);
    LockedImage(image)->record().hostCookie = cookie;
}

void register_session(ImageHandle image, ZqStringHandle name) {
    add_dispose_listener(leave_host);
    const auto register_value = ud_register_session.require();
    const ZqImageValue value = {name, image};
    std::uint32_t cookie = 0;
    const std::int32_t status = register_value(kSessionType, &value, &cookie);
    if (status != 0) {
        throw status == kHostOutOfMemory ? kNotEnoughMemory : kSystemError;
    }
    std::uint32_t old_cookie = 0;
    try {
        const LockedImage locked(image);
        old_cookie = std::exchange(locked->record().hostCookie, cookie);
    } catch (...) {
        remove_session(cookie);
        throw;
    }
    remove_session(old_cookie);
}

void dispose_at_teardown(ImageHandle image) {
    add_dispose_listener(leave_host);
    const LockedImage locked(image);
    set_cleanup_procedure(dispose_from_host, image);
    locked->set_has_cleanup_procedure(true);
}

}  // namespace zq::host
