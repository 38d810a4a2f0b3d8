// OpenCV's side of the conversion benchmarks.
#include <cstdlib>
#include <opencv2/core.hpp>
#include <opencv2/imgproc.hpp>
#include <vector>

#include "mats.h"
#include "opencv/jobs.h"

namespace zqbench {

namespace {

Job depth_change(int from, int to, double scale = 1.0) {
    return [=, source = noise(from), destination = cv::Mat()]() mutable {
        source.convertTo(destination, to, scale);
    };
}

Job colour_change(int from, int code) {
    return [=, source = noise(from), destination = cv::Mat()]() mutable {
        cv::cvtColor(source, destination, code);
    };
}

Job magnitudes() {
    return [source = noise(CV_32FC2), planes = std::vector<cv::Mat>(),
            destination = cv::Mat()]() mutable {
        cv::split(source, planes);
        cv::magnitude(planes[0], planes[1], destination);
    };
}

}  // namespace

Job opencv_conversion(std::string_view name) {
    if (name == "U8 to I16") return depth_change(CV_8U, CV_16S);
    if (name == "U8 to SGL") return depth_change(CV_8U, CV_32F);
    if (name == "U8 to RGB") return colour_change(CV_8U, cv::COLOR_GRAY2BGRA);
    if (name == "RGB to RGBU64") return depth_change(CV_8UC4, CV_16UC4);
    if (name == "I16 to U8") return depth_change(CV_16S, CV_8U);
    if (name == "I16 of 12 bits to U8") return depth_change(CV_16S, CV_8U, 1 / 16.0);
    if (name == "SGL to U8") return depth_change(CV_32F, CV_8U);
    if (name == "SGL to I16") return depth_change(CV_32F, CV_16S);
    if (name == "RGB to U8") return colour_change(CV_8UC4, cv::COLOR_BGRA2GRAY);
    if (name == "split and magnitude") return magnitudes();
    std::abort();
}

}  // namespace zqbench
