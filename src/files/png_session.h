// One use of libpng: owns its structures and turns its way of failing (longjmp) into exceptions.
#pragma once

#include <png.h>

#include <cstddef>
#include <type_traits>

#include "base/error_codes.h"

namespace zq {

class PngSession {
  public:
    enum class Use { kRead, kWrite };

    // Throws kNotEnoughMemory.
    explicit PngSession(Use use);
    ~PngSession();
    PngSession(const PngSession&) = delete;
    PngSession& operator=(const PngSession&) = delete;

    png_structp png() const { return png_; }
    png_infop info() const { return info_; }

    // Runs libpng calls; all of them but plain queries belong in here. When one fails, its recorded
    // code is thrown, or `otherwise` when none was recorded. The step is left by longjmp then: it,
    // and whatever it calls, must own nothing.
    template <class Step>
    void run(GRLIBError_enum otherwise, Step step) {
        static_assert(std::is_trivially_destructible_v<Step>, "longjmp skips destructors");
        const auto call = [](void* target) { (*static_cast<Step*>(target))(); };
        if (!guarded(call, &step)) throw failure_ != kSuccess ? failure_ : otherwise;
    }

    // For callbacks of libpng: records the code and leaves the running step.
    [[noreturn]] static void fail(png_structp png, GRLIBError_enum code);

  private:
    bool guarded(void (*step)(void*), void* target) noexcept;
    void destroy() noexcept;
    [[noreturn]] static void on_error(png_structp png, png_const_charp message);
    static void on_warning(png_structp png, png_const_charp message);
    static png_voidp allocate(png_structp png, png_alloc_size_t bytes);
    static void release(png_structp png, png_voidp block);

    Use use_;
    GRLIBError_enum failure_ = kSuccess;
    png_structp png_ = nullptr;
    png_infop info_ = nullptr;
};

}  // namespace zq
