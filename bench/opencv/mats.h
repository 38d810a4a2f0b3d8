// Pictures for the jobs of OpenCV.
#pragma once

#include <opencv2/core.hpp>

#include "throughput.h"

namespace zqbench {

// One thread, and a picture full of noise.
inline cv::Mat noise(int type) {
    cv::setNumThreads(1);
    cv::Mat mat(kHeight, kWidth, type);
    cv::randu(mat, cv::Scalar::all(0), cv::Scalar::all(256));
    return mat;
}

}  // namespace zqbench
