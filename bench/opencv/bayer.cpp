// OpenCV's side of the Bayer benchmarks.
#include <cstdint>
#include <cstdlib>
#include <opencv2/imgproc.hpp>

#include "opencv/jobs.h"
#include "opencv/mats.h"

namespace zqbench {

namespace {

// Table and pixels have as many channels.
Job decode_and_look_up() {
    cv::Mat table(1, 256, CV_8UC4);
    for (int i = 0; i < 256; ++i) {
        table.at<cv::Vec4b>(i) = {cv::saturate_cast<uint8_t>(i * 1.5), static_cast<uint8_t>(i),
                                  cv::saturate_cast<uint8_t>(i * 1.8), 0};
    }
    return [source = noise(CV_8UC1), table, decoded = cv::Mat(), target = cv::Mat()]() mutable {
        cv::cvtColor(source, decoded, cv::COLOR_BayerBG2BGRA);
        cv::LUT(decoded, table, target);
    };
}

// No balance of the colours here: less work than ours.
Job decode_and_narrow() {
    return [source = noise(CV_16UC1), decoded = cv::Mat(), target = cv::Mat()]() mutable {
        cv::cvtColor(source, decoded, cv::COLOR_BayerBG2BGRA);
        decoded.convertTo(target, CV_8U, 1.0 / 256);
    };
}

}  // namespace

Job opencv_bayer(std::string_view name) {
    if (name == "8 bits") return decode_and_look_up();
    if (name == "16 bits") return decode_and_narrow();
    std::abort();
}

}  // namespace zqbench
