// zqvis bayer: the raw samples of a colour sensor into a picture.
#include <zqvissvc/bayer.h>
#include <zqvissvc/errors.h>

#include <algorithm>
#include <array>
#include <charconv>
#include <limits>
#include <memory>
#include <string_view>
#include <vector>

#include "batch.h"
#include "commands.h"
#include "failure.h"
#include "output_file.h"
#include "picture.h"
#include "size.h"
#include "streams.h"

namespace {

struct Options {
    std::string file;
    OutputFile output;
    std::string size;
    uint32_t pattern = 0;
    uint32_t bits = 8;
    std::vector<double> gains = {1, 1, 1};
};

bool is_gain(std::string_view text) {
    double gain = -1;
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), gain);
    return error == std::errc() && end == text.data() + text.size() && gain >= 0 && gain < 3.999;
}

class Mosaic {
  public:
    // The decoder reads the line after a single one, which is the same one here.
    Mosaic(const std::string& path, Size size, uint32_t bits)
        : size_(size), sample_bytes_(bits > 8 ? 2 : 1) {
        const uint64_t count = uint64_t{sample_bytes_} * static_cast<uint32_t>(size.width) *
                               static_cast<uint32_t>(size.height);
        if (count > std::numeric_limits<ptrdiff_t>::max() / 2)
            throw Failure(ZQ_ERR_NOT_ENOUGH_MEMORY);
        bytes_ = read_bytes(path, static_cast<size_t>(count));
        if (bytes_.size() < count) throw Failure(ZQ_ERR_UNABLE_TO_READ_DATA);
        if (size.height == 1) bytes_.insert(bytes_.end(), bytes_.begin(), bytes_.end());
        if (sample_bytes_ == 1) return;
        words_.resize(bytes_.size() / 2);
        for (size_t i = 0; i < words_.size(); ++i)
            words_[i] = static_cast<uint16_t>(bytes_[2 * i] | bytes_[2 * i + 1] << 8);
    }

    const void* samples() const {
        return sample_bytes_ == 1 ? static_cast<const void*>(bytes_.data()) : words_.data();
    }
    Size size() const { return size_; }

  private:
    Size size_;
    uint32_t sample_bytes_;
    std::vector<uint8_t> bytes_;
    std::vector<uint16_t> words_;
};

void decode(const Mosaic& mosaic, const Options& options, const Picture& picture) {
    std::array<std::vector<uint32_t>, 3> tables;
    for (auto& table : tables) table.resize(options.bits > 8 ? 65536 : 256);
    auto& [red, green, blue] = tables;
    check(Gen_CalculateBayerColorLUT(options.gains[0], options.gains[1], options.gains[2],
                                     red.data(), green.data(), blue.data(), options.bits));
    const auto [width, height] = mosaic.size();
    const auto columns = static_cast<uint32_t>(width);
    uint8_t* const pixels = picture.row(0).data();
    const uint32_t line_width =
        height > 1 ? static_cast<uint32_t>((picture.row(1).data() - pixels) / 4) : columns;
    check(Gen_BayerColorDecode(reinterpret_cast<uint32_t*>(pixels), mosaic.samples(),
                               static_cast<uint32_t>(height), columns, line_width, columns,
                               red.data(), green.data(), blue.data(), options.pattern,
                               options.bits));
}

int run(const Options& options, bool quiet) {
    format_of(options.output);  // wrong usage, before anything is done
    return run_batch({options.file}, quiet, [&](const std::string& file) {
        const Input input(file);
        const Mosaic mosaic(input.path(), to_size(options.size), options.bits);
        Picture picture(ZQ_TYPE_RGB, mosaic.size().width, mosaic.size().height);
        decode(mosaic, options, picture);
        write_picture(picture, options.output);
        return std::string();
    });
}

}  // namespace

void add_bayer(CLI::App& tool, Session& session) {
    CLI::App* command =
        tool.add_subcommand("bayer", "Decodes the raw samples of a colour sensor into a picture");
    auto options = std::make_shared<Options>();
    command
        ->add_option("RAW", options->file,
                     "Samples, row after row, unpadded: bytes, or little-endian 16-bit words for "
                     "more than 8 bits; - is standard input")
        ->required();
    add_output_option(*command, options->output);
    add_size_option(*command, options->size);
    command
        ->add_option("--pattern", options->pattern,
                     "First two colours of rows 0 and 1: 0 GB RG, 1 GR BG, 2 BG GR, 3 RG GB")
        ->required()
        ->check(CLI::Range(0, 3));
    command->add_option("--bits", options->bits, "Significant bits of a sample")
        ->check(CLI::Range(1, 16))
        ->capture_default_str();
    command
        ->add_option("--gains", options->gains, "RED,GREEN,BLUE, each at least 0 and below 3.999")
        ->delimiter(',')
        ->expected(3)
        ->check([](const std::string& text) {
            return is_gain(text) ? std::string() : text + " is no gain";
        });
    command->callback([options, &session] { session.status = run(*options, session.quiet); });
}
