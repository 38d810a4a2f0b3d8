// The callbacks by which OpenJPEG reads and writes files.
#include "files/jpeg2000_session.h"

#include <algorithm>

namespace zq {

namespace {

constexpr OPJ_SIZE_T kFailed = static_cast<OPJ_SIZE_T>(-1);  // also OpenJPEG's end of file

OPJ_SIZE_T write_bytes(void* bytes, OPJ_SIZE_T count, void* file) {
    return static_cast<OutputFile*>(file)->try_write(bytes, count) ? count : kFailed;
}

Jpeg2000Stream create(OPJ_BOOL is_input) {
    Jpeg2000Stream stream(opj_stream_create(kStreamBuffer, is_input));
    if (!stream) throw kNotEnoughMemory;
    return stream;
}

}  // namespace

OPJ_SIZE_T Jpeg2000Source::read(void* bytes, OPJ_SIZE_T count, void* source) {
    auto& self = *static_cast<Jpeg2000Source*>(source);
    const std::uint64_t wanted = std::min<std::uint64_t>(count, self.length_ - self.position_);
    const std::size_t got = self.file_.read_some(bytes, static_cast<std::size_t>(wanted));
    self.position_ += got;
    return got == 0 ? kFailed : got;
}

bool Jpeg2000Source::move_to(std::uint64_t position) noexcept {
    if (position > length_ || !file_.try_seek(start_ + position)) return false;
    position_ = position;
    return true;
}

OPJ_OFF_T Jpeg2000Source::skip(OPJ_OFF_T count, void* source) {
    auto& self = *static_cast<Jpeg2000Source*>(source);
    if (count < 0) return -1;
    const std::uint64_t possible =
        std::min(static_cast<std::uint64_t>(count), self.length_ - self.position_);
    return self.move_to(self.position_ + possible) ? static_cast<OPJ_OFF_T>(possible) : -1;
}

OPJ_BOOL Jpeg2000Source::seek(OPJ_OFF_T position, void* source) {
    const bool done = position >= 0 && static_cast<Jpeg2000Source*>(source)->move_to(
                                           static_cast<std::uint64_t>(position));
    return done ? OPJ_TRUE : OPJ_FALSE;
}

Jpeg2000Stream Jpeg2000Source::open() {
    if (!move_to(0)) throw kUnableToReadData;
    Jpeg2000Stream stream = create(OPJ_STREAM_READ);
    opj_stream_set_user_data(stream.get(), this, nullptr);
    opj_stream_set_user_data_length(stream.get(), length_);
    opj_stream_set_read_function(stream.get(), read);
    opj_stream_set_skip_function(stream.get(), skip);
    opj_stream_set_seek_function(stream.get(), seek);
    return stream;
}

Jpeg2000Stream open_jpeg2000_output(OutputFile& file) {
    Jpeg2000Stream stream = create(OPJ_STREAM_WRITE);
    opj_stream_set_user_data(stream.get(), &file, nullptr);
    opj_stream_set_write_function(stream.get(), write_bytes);
    return stream;
}

}  // namespace zq
