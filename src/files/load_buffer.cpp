// Files to buffers. A buffer is the pixels of a private image that is kept until it is given back.
#include "files/load_buffer.h"

#include <map>
#include <memory>
#include <mutex>
#include <utility>
#include <vector>

#include "convert/convert_image.h"
#include "files/code_of.h"
#include "files/image_files.h"
#include "platform/mutex.h"

namespace zq {

namespace {

constexpr std::int32_t kSixteenBitModes = 0x78;

PixelType type_of_mode(std::int32_t mode) {
    if (mode == 0) return PixelType::kU8;
    if (mode == 4) return PixelType::kRgb;
    if ((mode & kSixteenBitModes) != 0) return PixelType::kI16;
    throw kBufferMode;
}

using ImageOwner = std::unique_ptr<Image>;

ImageOwner make_image(PixelType type) {
    auto image = std::make_unique<Image>(Variant::kPrivate, std::string_view());
    image->reinitialise(
        {.type = static_cast<std::int32_t>(type), .width = 0, .height = 0, .border = 0});
    return image;
}

// Images by the address of their first pixel.
class LoadedImages {
  public:
    static LoadedImages& instance() {
        static LoadedImages images;
        return images;
    }

    void keep(ImageOwner image) {
        const void* pixels = image->record().firstPixel;
        if (pixels == nullptr) return;
        const std::lock_guard lock(mutex_);
        images_.emplace(pixels, std::move(image));
    }

    ImageOwner take(const void* pixels) {
        const std::lock_guard lock(mutex_);
        const auto found = images_.find(pixels);
        if (found == images_.end()) return nullptr;
        ImageOwner image = std::move(found->second);
        images_.erase(found);
        return image;
    }

  private:
    platform::Mutex mutex_;
    std::map<const void*, ImageOwner> images_;
};

// An image of the wanted type; `image` itself when it already is one.
ImageOwner converted(ImageOwner image, PixelType type, const std::vector<std::uint32_t>& table) {
    if (image->type() == type) return image;
    ImageOwner result = make_image(type);
    if (type == PixelType::kRgb && !table.empty()) {
        apply_colour_table(*image, table, *result);
    } else {
        convert_image(*image, *result);
    }
    return result;
}

void throw_if(GRLIBError_enum code, GRLIBError_enum reported) {
    if (code != kSuccess) throw reported;
}

}  // namespace

LoadedBuffer load_buffer(const char* path, std::int32_t mode) {
    const PixelType type = type_of_mode(mode);
    ImageOwner image;
    std::vector<std::uint32_t> table;
    const auto accept = [&table](const FileContents& contents) { table = contents.colour_table; };
    throw_if(code_of([&] { image = make_image(type); }), kBufferNotEnoughMemory);
    const auto read = [&] {
        if (!read_file(path, *image, nullptr, accept)) throw kUnsupportedFileType;
    };
    throw_if(code_of(read), kBufferReadFailed);
    throw_if(code_of([&] { image = converted(std::move(image), type, table); }),
             kBufferNotEnoughMemory);

    const ImageRecord& record = image->record();
    const LoadedBuffer result = {record.firstPixel, record.width, record.height, record.rowPixels,
                                 record.type};
    throw_if(code_of([&] { LoadedImages::instance().keep(std::move(image)); }),
             kBufferNotEnoughMemory);
    return result;
}

void free_loaded_buffer(const void* pixels) noexcept {
    LoadedImages::instance().take(pixels);
}

}  // namespace zq
