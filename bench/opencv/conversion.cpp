// OpenCV's side of the conversion benchmarks.
#include <cstdlib>

#include "opencv/jobs.h"

namespace zqbench {

Job opencv_conversion(std::string_view /*name*/) {
    std::abort();
}

}  // namespace zqbench
