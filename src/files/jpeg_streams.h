// JPEG streams in files: where libjpeg takes its bytes from, and where it puts them.
#pragma once

#include <memory>

#include "codecs/jpeg_session.h"
#include "files/input_file.h"
#include "files/output_file.h"

namespace zq {

// A file that ends before its stream does leaves the running step with kUnableToReadData.
class JpegFileSource final : private jpeg_source_mgr {
  public:
    // The file stands at the stream's start and must outlive the source.
    explicit JpegFileSource(InputFile& file);
    JpegFileSource(const JpegFileSource&) = delete;
    JpegFileSource& operator=(const JpegFileSource&) = delete;

    void attach(jpeg_decompress_struct& jpeg) { jpeg.src = this; }

  private:
    static boolean refill(j_decompress_ptr jpeg);
    static void skip(j_decompress_ptr jpeg, long count);

    InputFile& file_;
    std::unique_ptr<JOCTET[]> block_;
};

// A failed write leaves the running step with the mapped error number.
class JpegFileSink final : private jpeg_destination_mgr {
  public:
    // The file must outlive the sink.
    explicit JpegFileSink(OutputFile& file);
    JpegFileSink(const JpegFileSink&) = delete;
    JpegFileSink& operator=(const JpegFileSink&) = delete;

    void attach(jpeg_compress_struct& jpeg) { jpeg.dest = this; }

  private:
    static JpegFileSink& of(j_compress_ptr jpeg) { return static_cast<JpegFileSink&>(*jpeg->dest); }
    static void start(j_compress_ptr jpeg);
    static boolean empty(j_compress_ptr jpeg);
    static void finish(j_compress_ptr jpeg);
    void store(j_compress_ptr jpeg, std::size_t count);

    OutputFile& file_;
    std::unique_ptr<JOCTET[]> block_;
};

}  // namespace zq
