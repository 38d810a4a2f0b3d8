// One use of libjpeg: owns its structure and turns its way of failing (a call that must not return)
// into exceptions.
#pragma once

#include <csetjmp>
#include <cstddef>
#include <cstdio>
#include <type_traits>

// After <cstdio>, which it needs.
#include <jpeglib.h>

#include "base/error_codes.h"

namespace zq {

// What compressing and decompressing share: the error handler and the way back from it.
class JpegSession {
  public:
    JpegSession(const JpegSession&) = delete;
    JpegSession& operator=(const JpegSession&) = delete;

    // Runs libjpeg calls; all of them but plain queries belong in here. When one fails, its
    // recorded code is thrown (kNotEnoughMemory when libjpeg ran out of it), or `otherwise` when
    // none was recorded; the session is of no more use then. The step is left by longjmp: it, and
    // whatever it calls, must own nothing.
    template <class Step>
    void run(GRLIBError_enum otherwise, Step step) {
        static_assert(std::is_trivially_destructible_v<Step>, "longjmp skips destructors");
        const auto call = [](void* target) { (*static_cast<Step*>(target))(); };
        if (!guarded(call, &step)) throw failure_ != kSuccess ? failure_ : otherwise;
    }

    // For callbacks of libjpeg: records the code and leaves the running step.
    [[noreturn]] static void fail(j_common_ptr jpeg, GRLIBError_enum code);

    // What libjpeg found wrong and passed over so far, harmless oddities included.
    long warnings() const { return errors_.num_warnings; }
    // Those of them that cost pixels: missing bytes, impossible codes.
    long damages() const { return damages_; }

  protected:
    JpegSession();
    ~JpegSession() = default;

    template <class Jpeg>
    void attach(Jpeg& jpeg) {
        jpeg.err = &errors_;
        jpeg.client_data = this;
    }

  private:
    bool guarded(void (*step)(void*), void* target) noexcept;
    [[noreturn]] static void on_error(j_common_ptr jpeg);
    static void on_message(j_common_ptr jpeg, int level);

    jpeg_error_mgr errors_{};
    std::jmp_buf back_{};
    GRLIBError_enum failure_ = kSuccess;
    long damages_ = 0;
};

class JpegCompressor final : public JpegSession {
  public:
    JpegCompressor();  // throws kNotEnoughMemory
    ~JpegCompressor();
    jpeg_compress_struct& jpeg() { return jpeg_; }

  private:
    jpeg_compress_struct jpeg_{};
};

class JpegDecompressor final : public JpegSession {
  public:
    JpegDecompressor();  // throws kNotEnoughMemory
    ~JpegDecompressor();
    jpeg_decompress_struct& jpeg() { return jpeg_; }

  private:
    jpeg_decompress_struct jpeg_{};
};

}  // namespace zq
