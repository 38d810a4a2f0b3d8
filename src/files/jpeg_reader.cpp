// Reading JPEG. Greys go straight into the image's rows; colours pass through one row of 32-bit
// pixels, on the way from which they get their alpha.
#include "files/jpeg_reader.h"

#include <memory>

#include "files/jpeg_units.h"
#include "kernels/alpha_rows.h"

namespace zq {

namespace {

// A component of full size has a block for 64 pixels, and a block takes a bit at least; but
// arithmetic coding spends nearly nothing on empty blocks, so such pictures may have that many
// pixels whatever the file's size.
constexpr std::uint64_t kMostPixelsAByte = 512;
constexpr std::uint64_t kFreeArithmeticPixels = std::uint64_t{1} << 24;
// Each scan may cost a walk over the whole picture, however few bytes it has. Far more than any
// encoder makes.
constexpr int kMostScans = 500;

void watch_scans(j_common_ptr jpeg) {
    if (reinterpret_cast<j_decompress_ptr>(jpeg)->input_scan_number > kMostScans) {
        JpegSession::fail(jpeg, kUnableToReadData);
    }
}

std::uint32_t product(std::uint32_t a, std::uint32_t b) {
    return ((a * b + 128) * 257) >> 16;  // a * b / 255, rounded
}

// In place: cyan, magenta, yellow, black bytes to blue, green, red, alpha 0. `flip` is 255 for
// samples that count the ink, and 0 for those that count what is left of the paper.
void cmyk_to_bgra(std::uint8_t* pixel, std::size_t pixels, std::uint8_t flip) {
    for (std::size_t i = 0; i < pixels; ++i, pixel += 4) {
        const auto paper = [pixel, flip](int ink) -> std::uint32_t {
            return static_cast<std::uint8_t>(pixel[ink] ^ flip);
        };
        const std::uint32_t black = paper(3), red = product(paper(0), black);
        const std::uint32_t green = product(paper(1), black), blue = product(paper(2), black);
        pixel[0] = static_cast<std::uint8_t>(blue);
        pixel[1] = static_cast<std::uint8_t>(green);
        pixel[2] = static_cast<std::uint8_t>(red);
        pixel[3] = 0;
    }
}

// A row that lies at no multiple of 32 bytes: such ones libjpeg writes past the cache, from where
// they would have to be fetched again.
class RowBetween {
  public:
    explicit RowBetween(std::size_t pixels)
        : memory_(std::make_unique_for_overwrite<std::uint32_t[]>(pixels + kAlignment)) {
        const auto address =
            reinterpret_cast<std::uintptr_t>(memory_.get()) / sizeof(std::uint32_t);
        row_ = memory_.get() + (address % kAlignment == 0 ? 1 : 0);
    }
    std::uint32_t* row() const { return row_; }

  private:
    static constexpr std::size_t kAlignment = 8;  // pixels

    std::unique_ptr<std::uint32_t[]> memory_;
    std::uint32_t* row_;
};

}  // namespace

JpegReader::JpegReader(InputFile& file) : file_(file), source_(file) {
    progress_.progress_monitor = watch_scans;
}

void JpegReader::read_info() {
    session_.run(kInvalidFileHeader, [this] {
        source_.attach(jpeg());
        jpeg().progress = &progress_;
        jpeg_read_header(&jpeg(), TRUE);
    });
    const int components = jpeg().num_components;
    const bool known = components == 1 || components == 3 || components == 4;
    if (!known || jpeg().data_precision != 8) throw kInvalidFileHeader;
    check_plausible();
}

void JpegReader::check_plausible() {
    if (file_.size() == InputFile::kUnknownSize) return;
    const std::uint64_t pixels = std::uint64_t{jpeg().image_width} * jpeg().image_height;
    if (jpeg().arith_code != FALSE && pixels <= kFreeArithmeticPixels) return;
    if (pixels / kMostPixelsAByte > static_cast<std::uint64_t>(file_.size())) {
        throw kUnableToReadData;
    }
}

std::optional<Calibration> JpegReader::calibration() {
    const jpeg_decompress_struct& info = jpeg();
    if (info.saw_JFIF_marker == FALSE || info.X_density == 0 || info.Y_density == 0) {
        return std::nullopt;
    }
    return Calibration{unit_of_density(info.density_unit), static_cast<float>(info.X_density),
                       static_cast<float>(info.Y_density)};
}

// The functions up to read_row are called inside a step.

void JpegReader::start() {
    switch (jpeg().num_components) {
        case 1:
            jpeg().out_color_space = JCS_GRAYSCALE;
            break;
        case 3:
            jpeg().out_color_space = JCS_EXT_BGRX;
            break;
        default:
            jpeg().out_color_space = JCS_CMYK;
            break;
    }
    jpeg_start_decompress(&jpeg());
}

void JpegReader::read_row(const Image& image, std::uint32_t* between) {
    const std::size_t pixels = jpeg().output_width;
    std::uint8_t* target = image.row(static_cast<std::int32_t>(jpeg().output_scanline));
    JSAMPROW row = between != nullptr ? reinterpret_cast<JSAMPROW>(between) : target;
    jpeg_read_scanlines(&jpeg(), &row, 1);
    if (between == nullptr) return;
    if (jpeg().num_components == 4) {
        cmyk_to_bgra(row, pixels, jpeg().saw_Adobe_marker != FALSE ? 0 : 255);
    }
    // The image's memory is new, and what the system has just cleared is in the cache.
    copy_with_alpha(between, reinterpret_cast<std::uint32_t*>(target), pixels, 0, Stores::kCached);
}

void JpegReader::read_pixels(Image& image) {
    const std::unique_ptr<RowBetween> between =
        is_grey() ? nullptr : std::make_unique<RowBetween>(jpeg().image_width);
    std::uint32_t* const row = between ? between->row() : nullptr;
    session_.run(kUnableToReadData, [this, &image, row] {
        start();
        while (jpeg().output_scanline < jpeg().output_height) read_row(image, row);
        // A file that lacks its end is a file cut short.
        jpeg_finish_decompress(&jpeg());
    });
    if (session_.damages() > 0) throw kUnableToReadData;
}

}  // namespace zq
