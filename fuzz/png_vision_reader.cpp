// The PNG reader with vision information on any bytes: what an image got from a file is what
// another gets from it.
#include "files/vision_file.h"
#include "files/vision_objects.h"
#include "png_mutator.h"
#include "read_target.h"

namespace {

bool same_texts(const std::vector<zq::PngText>& a, const std::vector<zq::PngText>& b) {
    return std::equal(a.begin(), a.end(), b.begin(), b.end(), [](const auto& x, const auto& y) {
        return x.keyword == y.keyword && x.text == y.text;
    });
}

zq::PngVision vision_of(zq::Image& image) {
    zq::PngVision vision;
    zq::gather_vision(image, vision);
    vision.version = zq::kPngVersion;
    return vision;
}

void read_vision(const char* path, zq::Image& target, const zq::Accept& accept) {
    zq::read_vision_file(path, target, accept);
    const zq::PngVision first = vision_of(target);
    zq::Image copy(zq::Variant::kPrivate, {});
    zq::replace_attachments(copy, zq::make_objects(first));
    const zq::PngVision second = vision_of(copy);
    zqfuzz::require(first.timing == second.timing && first.objects == second.objects &&
                        first.private_objects == second.private_objects,
                    "the same objects again");
    zqfuzz::require(same_texts(first.texts, second.texts), "the same texts again");
}

}  // namespace

extern "C" std::size_t LLVMFuzzerCustomMutator(std::uint8_t* bytes, std::size_t size,
                                               std::size_t most, unsigned seed) {
    return zqfuzz::mutate_png(bytes, size, most, seed);
}

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* bytes, std::size_t size) {
    zqfuzz::read_target(bytes, size, read_vision);
    return 0;
}
