// Locks on images for the duration of an operation.
#pragma once

#include <cstddef>
#include <memory>
#include <span>
#include <vector>

#include "base/error_codes.h"
#include "image/image.h"

namespace zq {

// Holds the locks of one or more images and releases them on every path. All images of one request
// are taken in one global order, each once, so requests that share images never block each other
// for ever. Throws kNotAnImage when a handle names no live image (also when another thread disposes
// it meanwhile); nothing stays locked then. A private image is not locked: its owner sees to that.
class ImageLock {
  public:
    explicit ImageLock(std::span<const ImageHandle> images);
    ~ImageLock() { release(); }
    ImageLock(const ImageLock&) = delete;
    ImageLock& operator=(const ImageLock&) = delete;

    // Leaves the images locked, for a caller that unlocks them later.
    void keep() { locked_ = 0; }

  private:
    void release() noexcept;

    std::vector<std::shared_ptr<ObjectGate>> gates_;
    std::size_t locked_ = 0;
};

// One locked image for a scope: `LockedImage image(handle); image->resize(...)`.
class LockedImage {
  public:
    explicit LockedImage(ImageHandle handle);
    ~LockedImage() { gate_->unlock(); }
    LockedImage(const LockedImage&) = delete;
    LockedImage& operator=(const LockedImage&) = delete;

    Image* operator->() const { return image_; }
    Image& operator*() const { return *image_; }

  private:
    std::shared_ptr<ObjectGate> gate_;
    Image* image_;
};

// The unpaired forms for sibling libraries. lock_images throws as ImageLock does. unlock_images
// undoes one lock request for the same images, also for those that another thread waits to dispose;
// images that are gone are skipped.
void lock_images(std::span<const ImageHandle> images);
void unlock_images(std::span<const ImageHandle> images) noexcept;

}  // namespace zq
