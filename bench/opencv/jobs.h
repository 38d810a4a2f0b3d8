// The same work as done by OpenCV, to compare with. Where the benchmarks are built without it,
// every job is empty.
#pragma once

#include <functional>
#include <string_view>

namespace zqbench {

using Job = std::function<void()>;

// A job by name: makes its pictures, kWidth by kHeight, and returns the work on them for one
// thread. Each family has its own names; an unknown one ends the program.
Job opencv_conversion(std::string_view name);
Job opencv_colour_model(std::string_view name);
Job opencv_bayer(std::string_view name);

}  // namespace zqbench
