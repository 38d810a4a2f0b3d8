// The JPEG 2000 reader on any bytes.
#include "read_target.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* bytes, std::size_t size) {
    zqfuzz::read_target(bytes, size);
    return 0;
}
