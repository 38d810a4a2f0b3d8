// The two ways through the PNG handler that carry vision information.
#include "files/vision_file.h"

#include <utility>

#include "convert/convert_image.h"
#include "files/code_of.h"
#include "files/png_handler.h"
#include "files/vision_objects.h"

namespace zq {

namespace {

constexpr std::int32_t kPngCode = 4;
constexpr unsigned kPngNameId = 191;

bool is_empty(const char* path) {
    return path == nullptr || *path == '\0';
}

// Alive as long as the view: pixels that a PNG can hold.
class WritablePixels {
  public:
    explicit WritablePixels(Image& image) : view_(view_of(image)) {
        if (image.type() != PixelType::kHsl) return;
        rgb_.reinitialise({static_cast<std::int32_t>(PixelType::kRgb), 0, 0, 0});
        convert_image(image, rgb_);
        const Calibration calibration = view_.calibration;
        view_ = view_of(rgb_);
        view_.calibration = calibration;
    }
    const PixelView& view() const { return view_; }

  private:
    Image rgb_{Variant::kPrivate, {}};  // without pixels unless they are needed
    PixelView view_;
};

}  // namespace

void write_vision_file(const char* path, Image& image, const WriteOptions& options,
                       std::span<const std::uint32_t> colour_table, PngVision vision) {
    if (is_empty(path)) throw kInvalidParameter;
    gather_vision(image, vision);
    const WritablePixels pixels(image);
    PngFileHandler handler(kPngCode, kPngNameId, &vision);
    throw_if_failed(handler.write(path, {pixels.view(), options, colour_table}));
}

PngVision read_vision_file(const char* path, Image& image, const Accept& accept) {
    if (is_empty(path)) throw kUnableToReadData;
    InputFile file(path);
    PngVision vision;
    VisionObjects objects;
    PngFileHandler handler(kPngCode, kPngNameId, &vision);
    bool recognised = false;
    throw_if_failed(handler.read(
        file, image,
        [&](const FileContents& contents) {
            objects = make_objects(vision);
            accept(contents);
        },
        recognised));
    if (!recognised) throw kUnsupportedFileType;
    replace_attachments(image, std::move(objects));
    return vision;
}

}  // namespace zq
