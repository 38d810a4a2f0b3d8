// OpenCV's side of the bayer benchmarks.
#include <cstdlib>

#include "opencv/jobs.h"

namespace zqbench {

Job opencv_bayer(std::string_view /*name*/) {
    std::abort();
}

}  // namespace zqbench
