// OpenCV's side of the colour model benchmarks.
#include <cstdlib>

#include "opencv/jobs.h"

namespace zqbench {

Job opencv_colour_model(std::string_view /*name*/) {
    std::abort();
}

}  // namespace zqbench
