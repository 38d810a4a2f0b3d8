// The callbacks by which libjpeg writes and reads memory.
#include "codecs/jpeg_memory.h"

#include <jerror.h>

#include <algorithm>
#include <array>

namespace zq {

namespace {

constexpr std::size_t kSmallestBlock = 4096;
constexpr std::array<JOCTET, 2> kEndMarker = {0xFF, JPEG_EOI};

void do_nothing(j_decompress_ptr) {}

}  // namespace

JpegSink::JpegSink(std::size_t expected)
    : jpeg_destination_mgr{}, expected_(std::max(expected, kSmallestBlock)) {
    init_destination = start;
    empty_output_buffer = grow;
    term_destination = finish;
}

bool JpegSink::reserve(std::size_t bytes) noexcept {
    auto* larger = static_cast<std::uint8_t*>(std::realloc(block_.get(), bytes));
    if (larger == nullptr) return false;
    // realloc has given back the old block.
    static_cast<void>(block_.release());
    block_.reset(larger);
    next_output_byte = larger + capacity_;
    free_in_buffer = bytes - capacity_;
    capacity_ = bytes;
    return true;
}

void JpegSink::start(j_compress_ptr jpeg) {
    JpegSink& sink = of(jpeg);
    sink.capacity_ = 0;
    if (!sink.reserve(sink.expected_)) {
        JpegSession::fail(reinterpret_cast<j_common_ptr>(jpeg), kNotEnoughMemory);
    }
}

// Called when the block is full to its last byte.
boolean JpegSink::grow(j_compress_ptr jpeg) {
    JpegSink& sink = of(jpeg);
    if (sink.capacity_ > SIZE_MAX / 2 || !sink.reserve(sink.capacity_ * 2)) {
        JpegSession::fail(reinterpret_cast<j_common_ptr>(jpeg), kNotEnoughMemory);
    }
    return TRUE;
}

void JpegSink::finish(j_compress_ptr jpeg) {
    JpegSink& sink = of(jpeg);
    sink.size_ = sink.capacity_ - sink.free_in_buffer;
}

JpegSource::JpegSource(std::span<const std::uint8_t> bytes) : jpeg_source_mgr{} {
    next_input_byte = bytes.data();
    bytes_in_buffer = bytes.size();
    init_source = do_nothing;
    term_source = do_nothing;
    fill_input_buffer = refill;
    skip_input_data = skip;
    resync_to_restart = jpeg_resync_to_restart;
}

boolean JpegSource::refill(j_decompress_ptr jpeg) {
    WARNMS(jpeg, JWRN_JPEG_EOF);
    jpeg->src->next_input_byte = kEndMarker.data();
    jpeg->src->bytes_in_buffer = kEndMarker.size();
    return TRUE;
}

void JpegSource::skip(j_decompress_ptr jpeg, long count) {
    if (count <= 0) return;
    jpeg_source_mgr& source = *jpeg->src;
    const std::size_t step = std::min(static_cast<std::size_t>(count), source.bytes_in_buffer);
    source.next_input_byte += step;
    source.bytes_in_buffer -= step;
}

}  // namespace zq
