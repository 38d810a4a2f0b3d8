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

}  // namespace zqbench
