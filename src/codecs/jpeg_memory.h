// JPEG streams in memory: where libjpeg puts its bytes, and where it takes them from.
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <memory>
#include <span>

#include "codecs/jpeg_session.h"

namespace zq {

// Grows as the stream does, without clearing memory. Must outlive the session's last call.
class JpegSink final : private jpeg_destination_mgr {
  public:
    // `expected` bytes are reserved at the start of the stream. Growing further may leave the
    // running step with kNotEnoughMemory.
    explicit JpegSink(std::size_t expected);
    JpegSink(const JpegSink&) = delete;
    JpegSink& operator=(const JpegSink&) = delete;

    void attach(jpeg_compress_struct& jpeg) { jpeg.dest = this; }
    // The finished stream; valid until the sink is gone.
    std::span<const std::uint8_t> bytes() const { return {block_.get(), size_}; }

  private:
    static JpegSink& of(j_compress_ptr jpeg) { return static_cast<JpegSink&>(*jpeg->dest); }
    static void start(j_compress_ptr jpeg);
    static boolean grow(j_compress_ptr jpeg);
    static void finish(j_compress_ptr jpeg);
    bool reserve(std::size_t bytes) noexcept;

    struct Free {
        void operator()(std::uint8_t* block) const { std::free(block); }
    };
    std::unique_ptr<std::uint8_t, Free> block_;
    std::size_t capacity_ = 0;
    std::size_t size_ = 0;
    std::size_t expected_;
};

// Reads borrowed bytes. A stream that ends early is taken to end with its end marker, and counts as
// a warning.
class JpegSource final : private jpeg_source_mgr {
  public:
    explicit JpegSource(std::span<const std::uint8_t> bytes);
    JpegSource(const JpegSource&) = delete;
    JpegSource& operator=(const JpegSource&) = delete;

    void attach(jpeg_decompress_struct& jpeg) { jpeg.src = this; }

  private:
    static boolean refill(j_decompress_ptr jpeg);
    static void skip(j_decompress_ptr jpeg, long count);
};

}  // namespace zq
