// libpng's structures, errors and memory.
#include "files/png_session.h"

#include <csetjmp>
#include <cstdlib>

namespace zq {

namespace {

// The format's own limit of width and height; what an image can be is checked by its reader.
constexpr png_uint_32 kLargestSide = 0x7FFFFFFF;
// Metadata that a reader keeps at all: the largest single chunk, inflated, and how many.
constexpr png_alloc_size_t kLargestChunk = 8'000'000;
constexpr png_uint_32 kMostChunks = 1000;

}  // namespace

PngSession::PngSession(Use use) : use_(use) {
    const auto create = use == Use::kRead ? png_create_read_struct_2 : png_create_write_struct_2;
    png_ = create(PNG_LIBPNG_VER_STRING, this, on_error, on_warning, this, allocate, release);
    info_ = png_ != nullptr ? png_create_info_struct(png_) : nullptr;
    if (info_ == nullptr) {
        destroy();
        throw kNotEnoughMemory;
    }
    png_set_user_limits(png_, kLargestSide, kLargestSide);
    png_set_chunk_malloc_max(png_, kLargestChunk);
    png_set_chunk_cache_max(png_, kMostChunks);
}

PngSession::~PngSession() {
    destroy();
}

void PngSession::destroy() noexcept {
    if (use_ == Use::kRead) {
        png_destroy_read_struct(&png_, &info_, nullptr);
    } else {
        png_destroy_write_struct(&png_, &info_);
    }
}

// The only place that libpng's errors come back to.
bool PngSession::guarded(void (*step)(void*), void* target) noexcept {
    if (setjmp(png_jmpbuf(png_)) != 0) return false;
    step(target);
    return true;
}

void PngSession::fail(png_structp png, GRLIBError_enum code) {
    static_cast<PngSession*>(png_get_error_ptr(png))->failure_ = code;
    png_error(png, "");
}

void PngSession::on_error(png_structp png, png_const_charp) {
    png_longjmp(png, 1);
}

void PngSession::on_warning(png_structp, png_const_charp) {}

png_voidp PngSession::allocate(png_structp png, png_alloc_size_t bytes) {
    png_voidp block = std::malloc(bytes);
    if (block == nullptr)
        static_cast<PngSession*>(png_get_mem_ptr(png))->failure_ = kNotEnoughMemory;
    return block;
}

void PngSession::release(png_structp, png_voidp block) {
    std::free(block);
}

}  // namespace zq
