// The same work as done by OpenCV, to compare with. Where the benchmarks are built without it,
// every job is empty.
#pragma once

#include <cstddef>
#include <functional>
#include <string>
#include <string_view>

namespace zqbench {

using Job = std::function<void()>;

// A job by name: makes its pictures, kWidth by kHeight, and returns the work on them for one
// thread. Each family has its own names; an unknown one ends the program.
Job opencv_conversion(std::string_view name);
Job opencv_colour_model(std::string_view name);
Job opencv_bayer(std::string_view name);

// Pixels of an image of ours: a grey sample, or blue, green, red and a filler.
struct Pixels {
    const void* first;
    std::size_t stride;  // bytes
    int width, height;
    bool colour;
    int bits;
};

// Files; what there is to write is copied first. `settings` names a format and its options as our
// files have them, and the path's extension is the format's. A read throws its pixels away.
Job opencv_write(const std::string& path, const Pixels& pixels, std::string_view settings);
Job opencv_read(const std::string& path);

}  // namespace zqbench
