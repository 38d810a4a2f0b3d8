// Copying rectangles of pixels.
#include "convert/copy_rows.h"

#include <cstring>

#include "kernels/stream_copy.h"

namespace zq {

void copy_block(void* to, const void* from, std::size_t bytes) {
    if (stores_for(bytes) == Stores::kStreamed) {
        stream_copy(to, from, bytes);
        finish_streaming();
    } else if (bytes > 0) {
        std::memcpy(to, from, bytes);
    }
}

void copy_rows(ConstRows from, Rows to, std::size_t rows, std::size_t bytes) {
    const bool streamed = stores_for(rows * bytes) == Stores::kStreamed;
    for (std::size_t y = 0; y < rows; ++y) {
        const auto row = static_cast<std::ptrdiff_t>(y);
        const std::uint8_t* source = from.first + row * from.stride;
        std::uint8_t* destination = to.first + row * to.stride;
        if (streamed) {
            stream_copy(destination, source, bytes);
        } else {
            std::memcpy(destination, source, bytes);
        }
    }
    if (streamed) finish_streaming();
}

}  // namespace zq
