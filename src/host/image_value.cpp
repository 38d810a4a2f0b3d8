// Sessions of images and their removal when an image is disposed.
#include "host/image_value.h"

#include <utility>

#include "host/boundary.h"
#include "host/host_string.h"
#include "host/run_hooks.h"
#include "host/services.h"
#include "image/image_lock.h"
#include "image/lifecycle.h"

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

// Has the host register a value and remembers the cookie that it gives.
template <class Register>
void register_by(ImageHandle image, Register ask_host) {
    add_dispose_listener(leave_host);
    std::uint32_t cookie = 0;
    const std::int32_t status = ask_host(&cookie);
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
    const auto register_value = ud_register_session.require();
    const ZqImageValue value = {name, image};
    register_by(
        image, [&](std::uint32_t* cookie) { return register_value(kSessionType, &value, cookie); });
}

void register_flattened(ImageHandle image, ZqStringHandle name, ZqStringHandle flattened,
                        std::uint32_t version) {
    const ZqImageValue value = {name, image};
    if (const auto with_version = ud_register_session_flatten2.find()) {
        register_by(image, [&](std::uint32_t* cookie) {
            return with_version(kSessionType, &value, flattened, version, cookie);
        });
    } else if (const auto with_bytes = ud_register_session_flatten.find()) {
        register_by(image, [&](std::uint32_t* cookie) {
            return with_bytes(kSessionType, &value, flattened, cookie);
        });
    } else {
        register_session(image, name);
    }
}

ImageHandle find_session(std::uint32_t cookie, std::string_view name) {
    const auto to_name = ud_cookie_to_name.find();
    if (cookie == 0 || to_name == nullptr) return nullptr;
    ZqStringHandle known_name = nullptr;
    void* session = nullptr;
    const bool known =
        to_name(kSessionType, cookie, &known_name, &session) == 0 && view(known_name) == name;
    if (known_name != nullptr) ds_dispose_handle(reinterpret_cast<ZqHandle>(known_name));
    const auto image = static_cast<ImageHandle>(session);
    return known && is_live_image(image) ? image : nullptr;
}

void dispose_at_teardown(ImageHandle image) {
    add_dispose_listener(leave_host);
    const LockedImage locked(image);
    set_cleanup_procedure(dispose_from_host, image);
    locked->set_has_cleanup_procedure(true);
}

}  // namespace zq::host
