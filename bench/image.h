// Images of the benchmarks.
#pragma once

#include <zqvissvc/image.h>

#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <cstring>

namespace zqbench {

inline void check(bool good, const char* what) {
    if (good) return;
    std::fprintf(stderr, "zqvis_bench: %s failed\n", what);
    std::abort();
}

class Image {
  public:
    explicit Image(int32_t type, int32_t width = 0, int32_t height = 0) {
        check(NewImage(type, width, height, 3, &handle_) == 0, "NewImage");
    }
    ~Image() { ZqDisposeImage(handle_); }
    Image(const Image&) = delete;
    Image& operator=(const Image&) = delete;

    ZqImageHandle handle() const { return handle_; }
    ZqImageValue value() const { return {nullptr, handle_}; }
    size_t row_bytes() const { return kBytes[handle_->type] * static_cast<size_t>(handle_->width); }
    uint8_t* row(int32_t y) const {
        const auto stride = static_cast<ptrdiff_t>(kBytes[handle_->type]) * handle_->rowPixels;
        return handle_->firstPixel + stride * y;
    }

  private:
    static constexpr size_t kBytes[] = {1, 2, 4, 8, 4, 4, 8};
    ZqImageHandle handle_ = nullptr;
};

// Pixels of random bytes, or of random floats from 0 to 256; the same for every run.
inline void fill_with_noise(const Image& image) {
    const bool has_floats =
        image.handle()->type == ZQ_TYPE_SGL || image.handle()->type == ZQ_TYPE_COMPLEX;
    uint32_t random = 1;
    for (int32_t y = 0; y < image.handle()->height; ++y) {
        uint8_t* byte = image.row(y);
        for (size_t i = 0; i < image.row_bytes(); i += has_floats ? 4 : 1) {
            random = random * 1664525U + 1013904223U;
            const float number = static_cast<float>(random >> 8) / 65536.0F;
            if (has_floats) std::memcpy(byte + i, &number, sizeof number);
            if (!has_floats) byte[i] = static_cast<uint8_t>(random >> 24);
        }
    }
}

}  // namespace zqbench
