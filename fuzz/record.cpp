// Whole records: into an image of another shape, then by what came out of it.
#include <zqvissvc/flatten.h>
#include <zqvissvc/image.h>

#include <cstring>
#include <string_view>

#include "image/lifecycle.h"
#include "image/registry.h"
#include "read_target.h"
#include "refhost/refhost.h"

namespace {

// Whole images are compared: what a failure must leave alone.
std::string whole_state(ZqImageHandle handle) {
    zq::Image& image = *zq::Image::from_handle(handle);
    const auto rows = image.whole_rows();
    return zqfuzz::state_of(image) +
           std::string(reinterpret_cast<const char*>(rows.data()), rows.size());
}

bool is_known(ZqError code) {
    constexpr std::array known = {kNotEnoughMemory, kInvalidImageType, kInitializationError,
                                  kFlattenKind};
    return std::find(known.begin(), known.end(), code) != known.end();
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* bytes, std::size_t size) {
    const refhost::String record(std::string_view(reinterpret_cast<const char*>(bytes), size));
    ZqImageHandle target = nullptr;
    zqfuzz::require(NewImage(2, 3, 2, 1, &target) == 0, "an image");
    const auto rows = zq::Image::from_handle(target)->whole_rows();
    std::fill(rows.begin(), rows.end(), std::uint8_t{1});
    const std::string before = whole_state(target);
    const std::size_t live = zq::Registry::instance().live_count();

    ZqImageHandle image = target;
    const ZqError code = UnflattenImageFromArray1D(&image, record.get());
    if (code != 0) {
        zqfuzz::require(is_known(code), "a known code");
        zqfuzz::require(whole_state(target) == before, "a target left alone");
    } else {
        refhost::String again;
        zqfuzz::require(FlattenImageToArray1D2(image, again.out(), 2, 0, 1, 0, 1, -1) == 0,
                        "flattened again");
        ZqImageHandle copy = nullptr;
        zqfuzz::require(UnflattenImageFromArray1D(&copy, again.get()) == 0, "and rebuilt");
        zqfuzz::require(zqfuzz::state_of(*zq::Image::from_handle(copy)) ==
                            zqfuzz::state_of(*zq::Image::from_handle(image)),
                        "the same image");
        if (copy != image) ZqDisposeImage(copy);
    }
    zqfuzz::require(zq::Registry::instance().live_count() == live, "no image left over");
    ZqDisposeImage(target);
    return 0;
}
