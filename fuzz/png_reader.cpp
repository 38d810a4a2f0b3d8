// The PNG reader on any bytes.
#include "png_mutator.h"
#include "read_target.h"

extern "C" std::size_t LLVMFuzzerCustomMutator(std::uint8_t* bytes, std::size_t size,
                                               std::size_t most, unsigned seed) {
    return zqfuzz::mutate_png(bytes, size, most, seed);
}

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* bytes, std::size_t size) {
    zqfuzz::read_target(bytes, size);
    return 0;
}
