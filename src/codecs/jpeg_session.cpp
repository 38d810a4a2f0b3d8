// libjpeg's structures and errors.
#include "codecs/jpeg_session.h"

#include <jerror.h>

namespace zq {

namespace {

// Warnings after which libjpeg goes on with pixels that it made up.
bool is_damage(int message) {
    switch (message) {
        case JWRN_ARITH_BAD_CODE:
        case JWRN_HIT_MARKER:
        case JWRN_HUFF_BAD_CODE:
        case JWRN_JPEG_EOF:
        case JWRN_MUST_RESYNC:
            return true;
        default:
            return false;
    }
}

}  // namespace

JpegSession::JpegSession() {
    jpeg_std_error(&errors_);
    errors_.error_exit = on_error;
    errors_.emit_message = on_message;
}

// The only place that libjpeg's errors come back to.
bool JpegSession::guarded(void (*step)(void*), void* target) noexcept {
    if (setjmp(back_) != 0) return false;
    step(target);
    return true;
}

void JpegSession::fail(j_common_ptr jpeg, GRLIBError_enum code) {
    auto* session = static_cast<JpegSession*>(jpeg->client_data);
    session->failure_ = code;
    std::longjmp(session->back_, 1);
}

void JpegSession::on_error(j_common_ptr jpeg) {
    fail(jpeg, jpeg->err->msg_code == JERR_OUT_OF_MEMORY ? kNotEnoughMemory : kSuccess);
}

// Warnings have level -1; what is above is tracing.
void JpegSession::on_message(j_common_ptr jpeg, int level) {
    if (level >= 0) return;
    ++jpeg->err->num_warnings;
    if (is_damage(jpeg->err->msg_code)) {
        ++static_cast<JpegSession*>(jpeg->client_data)->damages_;
    }
}

JpegCompressor::JpegCompressor() {
    attach(jpeg_);
    run(kNotEnoughMemory, [this] { jpeg_create_compress(&jpeg_); });
}

JpegCompressor::~JpegCompressor() {
    jpeg_destroy_compress(&jpeg_);
}

JpegDecompressor::JpegDecompressor() {
    attach(jpeg_);
    run(kNotEnoughMemory, [this] { jpeg_create_decompress(&jpeg_); });
}

JpegDecompressor::~JpegDecompressor() {
    jpeg_destroy_decompress(&jpeg_);
}

}  // namespace zq
