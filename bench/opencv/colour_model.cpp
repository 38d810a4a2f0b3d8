// OpenCV's side of the colour model benchmarks.
#include <cstdlib>
#include <opencv2/core.hpp>
#include <opencv2/imgproc.hpp>

#include "colours.h"
#include "opencv/jobs.h"
#include "throughput.h"

namespace zqbench {

namespace {

cv::Mat picture(bool near_grey) {
    cv::setNumThreads(1);
    cv::Mat mat(kHeight, kWidth, CV_8UC3);
    Colours colours(near_grey);
    for (auto pixel = mat.begin<cv::Vec3b>(); pixel != mat.end<cv::Vec3b>(); ++pixel) {
        const std::uint32_t colour = colours.next();
        for (int i = 0; i < 3; ++i) (*pixel)[i] = static_cast<uchar>(colour >> 8 * i);
    }
    return mat;
}

Job to_hls(bool near_grey) {
    return [source = picture(near_grey), destination = cv::Mat()]() mutable {
        cv::cvtColor(source, destination, cv::COLOR_BGR2HLS_FULL);
    };
}

Job from_hls(bool near_grey) {
    cv::Mat hls;
    cv::cvtColor(picture(near_grey), hls, cv::COLOR_BGR2HLS_FULL);
    return [source = hls, destination = cv::Mat()]() mutable {
        cv::cvtColor(source, destination, cv::COLOR_HLS2BGR_FULL);
    };
}

}  // namespace

Job opencv_colour_model(std::string_view name) {
    if (name == "RGB to HSL noise") return to_hls(false);
    if (name == "RGB to HSL near grey") return to_hls(true);
    if (name == "HSL to RGB noise") return from_hls(false);
    if (name == "HSL to RGB near grey") return from_hls(true);
    std::abort();
}

}  // namespace zqbench
