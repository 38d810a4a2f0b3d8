// Find-or-create and disposal on top of the registry.
#include "image/lifecycle.h"

#include <array>
#include <atomic>
#include <memory>

#include "image/lent_buffers.h"
#include "image/registry.h"

namespace zq {

namespace {

std::array<std::atomic<DisposeListener>, 4> listeners{};

class ImageHandler final : public ObjectHandler {
  public:
    void release_resources(Object& object) noexcept override {
        for (const auto& listener : listeners) {
            if (const DisposeListener call = listener.load()) {
                call(static_cast<Image&>(object));
            }
        }
    }
    void destroy(Object* object) noexcept override { delete object; }
};

ImageHandler image_handler;

using Use = std::function<void(Image&)>;

// Runs `use` on an image under its lock; null when the pin is empty or the image went away
// meanwhile.
ImageHandle use_if_live(const Pin& pin, const Use& use) {
    if (!pin || pin.tag != kImageTag || !pin.gate->lock()) {
        return nullptr;
    }
    const std::unique_ptr<ObjectGate, void (*)(ObjectGate*)> unlock(
        pin.gate.get(), [](ObjectGate* gate) { gate->unlock(); });
    auto* image = static_cast<Image*>(pin.object);
    use(*image);
    return image->handle();
}

Created find_or_create(std::string_view name, Variant variant, const Use& shape) {
    for (;;) {
        const Pin pin = Registry::instance().find(name, kImageTag);
        if (const ImageHandle found = use_if_live(pin, shape)) {
            return {found, false};
        }
        auto image = std::make_unique<Image>(variant, name);
        shape(*image);
        const ImageHandle handle = image->handle();
        std::unique_ptr<Object> object = std::move(image);
        // Another thread may have registered the name since; then its image is the one to take.
        if (Registry::instance().add(object, image_handler, kImageTag, name, !name.empty())) {
            return {handle, true};
        }
    }
}

}  // namespace

ImageHandle new_image(const ImageShape& shape) {
    return new_named_image(shape, {}, Variant::kRegistered).image;
}

Created new_named_image(const ImageShape& shape, std::string_view name, Variant variant) {
    return find_or_create(name, variant, [&shape](Image& image) { image.reinitialise(shape); });
}

Created new_filled_image(std::string_view name, Variant variant,
                         const std::function<void(Image&)>& fill) {
    return find_or_create(name, variant, fill);
}

Created new_external_image(const ImageShape& shape, std::uint8_t* buffer, std::int32_t row_pixels,
                           std::string_view name) {
    return find_or_create(name, Variant::kRegistered,
                          [&](Image& image) { image.wrap_external(shape, buffer, row_pixels); });
}

bool is_live_image(ImageHandle handle) {
    return Registry::instance().pin(Image::object_address(handle)).tag == kImageTag;
}

bool take_back_buffer(ImageHandle handle, std::uint8_t* buffer) {
    LentBuffers& lent = LentBuffers::instance();
    // First, because a new image may have the handle of the one that is gone.
    if (lent.give_back_orphan(handle, buffer)) {
        return true;
    }
    const Pin pin = Registry::instance().pin(Image::object_address(handle));
    // Asked again, because the image may have gone and its handle come back since then.
    const auto give_back = [&](Image& image) {
        if (!lent.give_back_orphan(handle, buffer)) image.give_back();
    };
    return use_if_live(pin, give_back) != nullptr || lent.give_back(handle, buffer);
}

void dispose_image(ImageHandle handle) {
    if (handle == nullptr) {
        return;
    }
    const std::uintptr_t address = Image::object_address(handle);
    if (const Pin pin = Registry::instance().pin(address); pin && pin.tag == kImageTag) {
        Registry::instance().dispose(address);
    }
}

void dispose_all_images() {
    Registry::instance().dispose_all(kImageTag);
}

void add_dispose_listener(DisposeListener listener) {
    for (auto& place : listeners) {
        DisposeListener expected = nullptr;
        if (place.compare_exchange_strong(expected, listener) || expected == listener) {
            return;
        }
    }
}

}  // namespace zq
