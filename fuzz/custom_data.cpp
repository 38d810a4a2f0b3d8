// Custom data from any bytes: refused with its one code, or exactly what the store writes again.
#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <span>

#include "serialize/custom_data.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* bytes, std::size_t size) {
    const std::span<const std::uint8_t> input(bytes, size);
    try {
        const auto again = zq::serialise(*zq::parse_custom_data(input));
        if (again != zq::CustomData::Value(input.begin(), input.end())) std::abort();
    } catch (GRLIBError_enum code) {
        if (code != kInitializationError) std::abort();
    }
    return 0;
}
