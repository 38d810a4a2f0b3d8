// An image for tests: made, filled and compared through the exported functions.
#pragma once

#include <zqvissvc/image.h>

#include <cstdint>
#include <cstring>
#include <stdexcept>
#include <string>

namespace zqtest {

class Picture {
  public:
    explicit Picture(int32_t type, int32_t width = 0, int32_t height = 0, int32_t border = 3) {
        if (NewImage(type, width, height, border, &handle_) != 0) throw std::bad_alloc();
        fill(1);
    }
    ~Picture() { ZqDisposeImage(handle_); }
    Picture(const Picture&) = delete;
    Picture& operator=(const Picture&) = delete;

    ZqImageHandle handle() const { return handle_; }
    const ZqImageRecord& record() const { return *handle_; }
    ZqImageValue value() const { return {nullptr, handle_}; }

    template <class T>
    T& at(int32_t x, int32_t y) {
        void* pixel = nullptr;
        if (ZqGetPixelAddress(handle_, x, y, &pixel) != 0) throw std::out_of_range("pixel");
        return *static_cast<T*>(pixel);
    }

    static size_t pixel_bytes(int32_t type) {
        constexpr size_t kBytes[] = {1, 2, 4, 8, 4, 4, 8};
        return kBytes[type];
    }

    // The rows of the image proper, top row first, without padding.
    std::string pixels() const {
        std::string all;
        const size_t bytes = pixel_bytes(handle_->type);
        for (int32_t y = 0; y < handle_->height; ++y) all.append(row(y), bytes * width());
        return all;
    }
    void set_pixels(const std::string& all) {
        const size_t line = pixel_bytes(handle_->type) * width();
        for (int32_t y = 0; y < handle_->height; ++y) {
            std::memcpy(row(y), all.data() + static_cast<size_t>(y) * line, line);
        }
    }

    // Every byte different from its neighbours, and from what another seed gives.
    void fill(uint32_t seed) {
        std::string all = pixels();
        for (char& byte : all) {
            seed = seed * 1664525U + 1013904223U;
            byte = static_cast<char>(seed >> 24);
        }
        set_pixels(all);
    }

    // Type, size, border and pixels in one comparable text.
    std::string state() const {
        return std::to_string(handle_->type) + ' ' + std::to_string(handle_->width) + 'x' +
               std::to_string(handle_->height) + '+' + std::to_string(handle_->border) + ' ' +
               pixels();
    }

  private:
    size_t width() const { return static_cast<size_t>(handle_->width); }
    char* row(int32_t y) const {
        const auto stride = static_cast<ptrdiff_t>(pixel_bytes(handle_->type)) * handle_->rowPixels;
        return reinterpret_cast<char*>(handle_->firstPixel + y * stride);
    }

    ZqImageHandle handle_ = nullptr;
};

}  // namespace zqtest
