// Files without a header, read by any parameters: the first 16 bytes of an input choose them.
#include <cstring>

#include "read_target.h"

namespace {

constexpr std::size_t kParameters = 16;

ZqRawParameters parameters;

void read_raw(const char* path, zq::Image& target, const zq::Accept& accept) {
    if (!zq::read_file(path, target, &parameters, accept)) throw kUnsupportedFileType;
}

}  // namespace

// Small numbers more often than not, as large ones are refused at once or lead behind the file.
extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* bytes, std::size_t size) {
    if (size < kParameters) return 0;
    const auto number = [&](std::size_t at) {
        std::int32_t value;
        std::memcpy(&value, bytes + at, sizeof(value));
        return bytes[0] % 8 != 0 ? value % 16 : value;
    };
    parameters = {.present = 1,
                  .format = bytes[1] - 1,
                  .dataOffset = number(4),
                  .layoutMode = bytes[2] % 4,
                  .layout = {number(8), number(12)},
                  .byteOrder = bytes[3] % 2};
    zqfuzz::read_target(bytes + kParameters, size - kParameters, read_raw);
    return 0;
}
