// Taking several locks in one global order.
#include "image/image_lock.h"

#include <algorithm>
#include <functional>

#include "image/registry.h"

namespace zq {

namespace {

Pin pin_image(ImageHandle handle) {
    Pin pin = Registry::instance().pin(Image::object_address(handle));
    if (!pin || pin.tag != kImageTag) {
        throw kNotAnImage;
    }
    return pin;
}

// Gates in the global order (by address), each once.
void order(std::vector<std::shared_ptr<ObjectGate>>& gates) {
    std::sort(gates.begin(), gates.end(),
              [](const auto& a, const auto& b) { return std::less<>()(a.get(), b.get()); });
    gates.erase(std::unique(gates.begin(), gates.end()), gates.end());
}

}  // namespace

ImageLock::ImageLock(std::span<const ImageHandle> images) {
    gates_.reserve(images.size());
    for (const ImageHandle handle : images) {
        gates_.push_back(pin_image(handle).gate);
    }
    order(gates_);
    for (const auto& gate : gates_) {
        if (!gate->lock()) {
            release();
            throw kNotAnImage;
        }
        ++locked_;
    }
}

void ImageLock::release() noexcept {
    while (locked_ > 0) {
        gates_[--locked_]->unlock();
    }
}

LockedImage::LockedImage(ImageHandle handle)
    : gate_(pin_image(handle).gate), image_(Image::from_handle(handle)) {
    if (!gate_->lock()) {
        throw kNotAnImage;
    }
}

void lock_images(std::span<const ImageHandle> images) {
    ImageLock lock(images);
    lock.keep();
}

void unlock_images(std::span<const ImageHandle> images) noexcept {
    // Without a list of its own: unlocking works without memory.
    for (auto each = images.begin(); each != images.end(); ++each) {
        const Pin pin = Registry::instance().pin_to_unlock(Image::object_address(*each));
        if (pin && pin.tag == kImageTag && std::find(images.begin(), each, *each) == each) {
            pin.gate->unlock();
        }
    }
}

}  // namespace zq
