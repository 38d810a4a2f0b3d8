// Reading a file, and its pixels as text.
#include "document.h"

#include <fmt/format.h>
#include <zqvissvc/image.h>

#include <cstring>

#include "failure.h"

namespace {

// Component i of a pixel.
template <class T>
T component(const uint8_t* pixel, size_t i) {
    T value;
    std::memcpy(&value, pixel + i * sizeof(T), sizeof(T));
    return value;
}

template <class T>
std::string colour_text(const uint8_t* pixel) {
    return fmt::format("red {}, green {}, blue {}", component<T>(pixel, 2), component<T>(pixel, 1),
                       component<T>(pixel, 0));
}

std::string value_text(int32_t type, const uint8_t* pixel) {
    switch (type) {
        case ZQ_TYPE_U8:
            return fmt::format("{}", *pixel);
        case ZQ_TYPE_I16:
            return fmt::format("{}", component<int16_t>(pixel, 0));
        case ZQ_TYPE_SGL:
            return fmt::format("{}", component<float>(pixel, 0));
        case ZQ_TYPE_COMPLEX:
            return fmt::format("{} {:+} i", component<float>(pixel, 0), component<float>(pixel, 1));
        case ZQ_TYPE_RGB:
            return colour_text<uint8_t>(pixel);
        case ZQ_TYPE_HSL:
            return fmt::format("hue {}, saturation {}, luminance {}", pixel[2], pixel[1], pixel[0]);
        case ZQ_TYPE_RGBU64:
            return colour_text<uint16_t>(pixel);
        default:
            return {};
    }
}

}  // namespace

std::string name_of(const std::string& path) {
    return path.substr(path.find_last_of("/\\") + 1);
}

Document::Document(std::string path)
    : path_(std::move(path)), stored_(std::make_unique<Picture>(path_)), facts_(stored_->facts()) {
    if (!stored_->colour_table().empty()) shown_ = stored_->with_colours_applied();
}

std::string Document::description() const {
    return fmt::format("{} - {} x {}, {}", name_of(path_), facts_.width, facts_.height,
                       Gen_ImageTypeToText(facts_.type));
}

std::string Document::value_at(Point pixel) const {
    if (pixel.x < 0 || pixel.y < 0 || pixel.x >= facts_.width || pixel.y >= facts_.height) {
        return {};
    }
    const size_t at = static_cast<size_t>(pixel.x) * bytes_per_pixel(facts_.type);
    std::string text = fmt::format("({}, {})  {}", pixel.x, pixel.y,
                                   value_text(facts_.type, stored_->row(pixel.y).data() + at));
    if (shown_ != nullptr) {
        const size_t colour = static_cast<size_t>(pixel.x) * bytes_per_pixel(ZQ_TYPE_RGB);
        text += "  " + value_text(ZQ_TYPE_RGB, shown_->row(pixel.y).data() + colour);
    }
    return text;
}

void Document::draw(void* window, const View& view, void* dc) const {
    const Picture& picture = shown_ != nullptr ? *shown_ : *stored_;
    picture.draw(window, view.zoom(), view.offset().x, view.offset().y, dc);
}
