// One use of OpenJPEG: owners of its objects, and its view of the file. OpenJPEG neither throws nor
// jumps; nothing that it calls back throws.
#pragma once

#include <openjpeg.h>

#include <cstdint>
#include <memory>

#include "files/input_file.h"
#include "files/output_file.h"

namespace zq {

struct Jpeg2000CodecDeleter {
    void operator()(opj_codec_t* codec) const { opj_destroy_codec(codec); }
};
struct Jpeg2000StreamDeleter {
    void operator()(opj_stream_t* stream) const { opj_stream_destroy(stream); }
};
struct Jpeg2000ImageDeleter {
    void operator()(opj_image_t* image) const { opj_image_destroy(image); }
};
using Jpeg2000Codec = std::unique_ptr<opj_codec_t, Jpeg2000CodecDeleter>;
using Jpeg2000Stream = std::unique_ptr<opj_stream_t, Jpeg2000StreamDeleter>;
using Jpeg2000Image = std::unique_ptr<opj_image_t, Jpeg2000ImageDeleter>;

// The bytes of a code stream within a file.
class Jpeg2000Source {
  public:
    // The file must outlive the source, and stand still while a stream of it is in use.
    Jpeg2000Source(InputFile& file, std::uint64_t start, std::uint64_t length)
        : file_(file), start_(start), length_(length) {}

    // Positions the file at the code stream. The source must outlive the stream and stay in place.
    // Throws kUnableToReadData and kNotEnoughMemory.
    Jpeg2000Stream open();

  private:
    static OPJ_SIZE_T read(void* bytes, OPJ_SIZE_T count, void* source);
    static OPJ_OFF_T skip(OPJ_OFF_T count, void* source);
    static OPJ_BOOL seek(OPJ_OFF_T position, void* source);
    bool move_to(std::uint64_t position) noexcept;

    InputFile& file_;
    std::uint64_t start_;
    std::uint64_t length_;
    std::uint64_t position_ = 0;  // within the code stream
};

// A stream that writes from the file's position on. The file must outlive it; its last_error tells
// of failures. Throws kNotEnoughMemory.
Jpeg2000Stream open_jpeg2000_output(OutputFile& file);

}  // namespace zq
