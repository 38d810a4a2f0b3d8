// Stands for the jobs of OpenCV where it is not there.
#include "opencv/jobs.h"

namespace zqbench {

Job opencv_conversion(std::string_view /*name*/) {
    return {};
}

Job opencv_colour_model(std::string_view /*name*/) {
    return {};
}

Job opencv_bayer(std::string_view /*name*/) {
    return {};
}

Job opencv_write(const std::string& /*path*/, const Pixels& /*pixels*/,
                 std::string_view /*settings*/) {
    return {};
}

Job opencv_read(const std::string& /*path*/) {
    return {};
}

}  // namespace zqbench
