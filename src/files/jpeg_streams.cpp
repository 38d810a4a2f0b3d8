// The callbacks by which libjpeg reads and writes files.
#include "files/jpeg_streams.h"

namespace zq {

namespace {

void do_nothing(j_decompress_ptr) {}

}  // namespace

JpegFileSource::JpegFileSource(InputFile& file)
    : jpeg_source_mgr{},
      file_(file),
      block_(std::make_unique_for_overwrite<JOCTET[]>(kStreamBuffer)) {
    init_source = do_nothing;
    term_source = do_nothing;
    fill_input_buffer = refill;
    skip_input_data = skip;
    resync_to_restart = jpeg_resync_to_restart;
}

boolean JpegFileSource::refill(j_decompress_ptr jpeg) {
    auto& source = static_cast<JpegFileSource&>(*jpeg->src);
    source.next_input_byte = source.block_.get();
    source.bytes_in_buffer = source.file_.read_some(source.block_.get(), kStreamBuffer);
    if (source.bytes_in_buffer == 0) {
        JpegSession::fail(reinterpret_cast<j_common_ptr>(jpeg), kUnableToReadData);
    }
    return TRUE;
}

void JpegFileSource::skip(j_decompress_ptr jpeg, long count) {
    if (count <= 0) return;
    jpeg_source_mgr& source = *jpeg->src;
    auto left = static_cast<std::size_t>(count);
    while (left > source.bytes_in_buffer) {
        left -= source.bytes_in_buffer;
        refill(jpeg);
    }
    source.next_input_byte += left;
    source.bytes_in_buffer -= left;
}

JpegFileSink::JpegFileSink(OutputFile& file)
    : jpeg_destination_mgr{},
      file_(file),
      block_(std::make_unique_for_overwrite<JOCTET[]>(kStreamBuffer)) {
    init_destination = start;
    empty_output_buffer = empty;
    term_destination = finish;
}

void JpegFileSink::start(j_compress_ptr jpeg) {
    JpegFileSink& sink = of(jpeg);
    sink.next_output_byte = sink.block_.get();
    sink.free_in_buffer = kStreamBuffer;
}

void JpegFileSink::store(j_compress_ptr jpeg, std::size_t count) {
    if (!file_.try_write(block_.get(), count)) {
        JpegSession::fail(reinterpret_cast<j_common_ptr>(jpeg), file_.last_error());
    }
}

// Called when the block is full to its last byte; free_in_buffer means nothing then.
boolean JpegFileSink::empty(j_compress_ptr jpeg) {
    of(jpeg).store(jpeg, kStreamBuffer);
    start(jpeg);
    return TRUE;
}

void JpegFileSink::finish(j_compress_ptr jpeg) {
    JpegFileSink& sink = of(jpeg);
    sink.store(jpeg, kStreamBuffer - sink.free_in_buffer);
}

}  // namespace zq
