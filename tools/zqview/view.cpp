// Zooming about a point and scrolling.
#include "view.h"

#include <algorithm>
#include <cmath>

namespace {

constexpr int32_t kMostSteps = 15;  // 16 times larger or smaller

// Zooms without the gap between 1 and -2, one-to-one being 0.
int32_t steps_of(int32_t zoom) {
    return zoom >= 1 ? zoom - 1 : std::min(zoom + 1, 0);
}

int32_t zoom_of(int32_t steps) {
    const int32_t kept = std::clamp(steps, -kMostSteps, kMostSteps);
    return kept >= 0 ? kept + 1 : kept - 1;
}

struct Ratio {
    int32_t larger, smaller;  // one of them is 1
};

Ratio ratio_of(int32_t zoom) {
    return {std::max(zoom, 1), std::max(-zoom, 1)};
}

double factor_of(int32_t zoom) {
    const Ratio ratio = ratio_of(zoom);
    return static_cast<double>(ratio.larger) / ratio.smaller;
}

// Device pixels of a side, rounded to the nearest, halves up, as the drawing calls have it.
int64_t scaled(int32_t side, int32_t zoom) {
    const Ratio ratio = ratio_of(zoom);
    return (int64_t{side} * ratio.larger + ratio.smaller / 2) / ratio.smaller;
}

// Where the image begins in the client area: what is smaller than it is centred.
int64_t origin(int32_t side, int32_t zoom, int32_t client, int32_t offset) {
    const int64_t size = scaled(side, zoom);
    return size < client ? (client - size) / 2 : -int64_t{offset};
}

bool is_empty(Extent extent) {
    return extent.width < 1 || extent.height < 1;
}

int32_t clamped(int64_t offset, int32_t side, int32_t zoom, int32_t client) {
    const int64_t most = std::clamp<int64_t>(scaled(side, zoom) - client, 0, INT32_MAX);
    return static_cast<int32_t>(std::clamp<int64_t>(offset, 0, most));
}

}  // namespace

void View::show(Extent image) {
    if (image == image_) return;
    image_ = image;
    fit();
}

void View::resize(Extent client) {
    const bool was_empty = is_empty(client_);
    client_ = client;
    if (was_empty) fit();
    clamp_offset();
}

std::string View::zoom_text() const {
    const Ratio ratio = ratio_of(zoom_);
    return std::to_string(ratio.larger) + ":" + std::to_string(ratio.smaller);
}

void View::zoom_by(int32_t steps, Point about) {
    zoom_to(zoom_of(steps_of(zoom_) + std::clamp(steps, -2 * kMostSteps, 2 * kMostSteps)), about);
}

void View::zoom_to(int32_t zoom, Point about) {
    const int32_t wanted = zoom_of(steps_of(zoom));
    const double ratio = factor_of(wanted) / factor_of(zoom_);
    const auto moved = [&](int32_t at, int32_t side, int32_t client, int32_t offset) {
        const auto in_image = static_cast<double>(at - origin(side, zoom_, client, offset));
        return clamped(std::llround(in_image * ratio) - at, side, wanted, client);
    };
    offset_ = {moved(about.x, image_.width, client_.width, offset_.x),
               moved(about.y, image_.height, client_.height, offset_.y)};
    zoom_ = wanted;
}

void View::fit() {
    zoom_ = 1;
    const auto fits = [&] {
        return is_empty(client_) || (scaled(image_.width, zoom_) <= client_.width &&
                                     scaled(image_.height, zoom_) <= client_.height);
    };
    while (!fits() && steps_of(zoom_) > -kMostSteps) zoom_ = zoom_of(steps_of(zoom_) - 1);
    offset_ = {0, 0};
}

void View::drag(int32_t dx, int32_t dy) {
    offset_ = {clamped(int64_t{offset_.x} - dx, image_.width, zoom_, client_.width),
               clamped(int64_t{offset_.y} - dy, image_.height, zoom_, client_.height)};
}

void View::clamp_offset() {
    drag(0, 0);
}
