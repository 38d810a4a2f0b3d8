// OpenCV's side of the benchmarks of files.
#include <array>
#include <cstdlib>
#include <opencv2/imgcodecs.hpp>
#include <opencv2/imgproc.hpp>
#include <string>
#include <string_view>
#include <vector>

#include "image.h"
#include "opencv/jobs.h"

namespace zqbench {

namespace {

// Tags of TIFF are parameters by their numbers.
constexpr int kPredictor = 317, kNoPredictor = 1, kRowsPerStrip = 278;
constexpr int kFiltered = 1;  // the strategy that libpng takes for filtered rows

struct Settings {
    std::string_view name;
    std::vector<int> parameters;
};

std::vector<int> parameters_of(std::string_view name, const cv::Mat& matrix) {
    const int strip_rows = (64 << 10) / (matrix.cols * static_cast<int>(matrix.elemSize()));
    const auto tiff = [strip_rows](int compression) -> std::vector<int> {
        return {cv::IMWRITE_TIFF_COMPRESSION,
                compression,
                kPredictor,
                kNoPredictor,
                kRowsPerStrip,
                strip_rows};
    };
    const Settings kSettings[] = {
        {"BMP", {}},
        {"JPEG", {cv::IMWRITE_JPEG_QUALITY, 75}},
        {"JPEG 2000", {cv::IMWRITE_JPEG2000_COMPRESSION_X1000, 1000}},  // lossless
        {"PNG", {cv::IMWRITE_PNG_COMPRESSION, 6, cv::IMWRITE_PNG_STRATEGY, kFiltered}},
        {"TIFF", tiff(1)},
        {"TIFF LZW", tiff(5)},
        {"TIFF deflate", tiff(32946)},
        {"TIFF PackBits", tiff(32773)},
    };
    for (const Settings& settings : kSettings) {
        if (settings.name == name) return settings.parameters;
    }
    std::abort();
}

// OpenCV writes the samples that a matrix has, so the filler has to go.
cv::Mat matrix_of(const Pixels& pixels) {
    const int depth = pixels.bits == 8 ? CV_8U : CV_16U;
    const cv::Mat rows(pixels.height, pixels.width, CV_MAKETYPE(depth, pixels.colour ? 4 : 1),
                       const_cast<void*>(pixels.first), pixels.stride);
    cv::Mat matrix = rows;
    if (pixels.colour) cv::cvtColor(rows, matrix, cv::COLOR_BGRA2BGR);
    return matrix;
}

}  // namespace

Job opencv_write(const std::string& path, const Pixels& pixels, std::string_view settings) {
    cv::setNumThreads(1);
    const cv::Mat matrix = matrix_of(pixels);
    return [path, matrix, parameters = parameters_of(settings, matrix)] {
        check(cv::imwrite(path, matrix, parameters), "imwrite");
    };
}

Job opencv_read(const std::string& path) {
    cv::setNumThreads(1);
    return [path] { check(!cv::imread(path, cv::IMREAD_UNCHANGED).empty(), "imread"); };
}

}  // namespace zqbench
