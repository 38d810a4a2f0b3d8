// Reading JPEG 2000. OpenJPEG decodes the code stream alone; boxes are none of its business.
#include "files/jpeg2000_reader.h"

#include <algorithm>
#include <array>
#include <optional>
#include <vector>

#include "files/unsigned_grey.h"

namespace zq {

namespace {

std::int64_t divide_up(std::int64_t a, std::int64_t b) {
    return (a + b - 1) / b;
}

// Where the sample of a component lies that covers a sample of another; the first and last ones
// serve for what lies beyond.
class Covering {
  public:
    Covering(std::uint32_t start, std::uint32_t main_step, std::uint32_t step, OPJ_UINT32 count)
        : main_step_(main_step),
          step_(step),
          main_first_(divide_up(start, main_step)),
          first_(divide_up(start, step)),
          last_(std::int64_t{count} - 1) {}

    std::size_t operator()(std::int64_t main) const {
        const std::int64_t position = (main_first_ + main) * main_step_;
        const std::int64_t sample = position / step_ - first_;
        return static_cast<std::size_t>(std::clamp<std::int64_t>(sample, 0, last_));
    }

  private:
    std::int64_t main_step_, step_, main_first_, first_, last_;
};

// Rows of a component at the picture's width, those of OpenJPEG itself or, where the component has
// fewer samples than the picture, a copy that the next row takes the place of.
class ComponentRows {
  public:
    ComponentRows(const opj_image_t& image, const Jpeg2000Layout& layout, std::size_t index)
        : samples_(image.comps[index]) {
        const Jpeg2000Component& own = layout.stream.components[index];
        const Jpeg2000Component& main = layout.main_component();
        if (own.dx == main.dx && own.dy == main.dy) return;
        const Jpeg2000Grid& grid = layout.stream.grid;
        line_.emplace(grid.top, main.dy, own.dy, samples_.h);
        const Covering column(grid.left, main.dx, own.dx, samples_.w);
        wide_.resize(static_cast<std::size_t>(layout.width()));
        columns_.resize(wide_.size());
        for (std::size_t x = 0; x < columns_.size(); ++x)
            columns_[x] = static_cast<std::uint32_t>(column(static_cast<std::int64_t>(x)));
    }

    SampleRow row(std::int32_t y) {
        if (!line_) return samples_.data + static_cast<std::size_t>(y) * samples_.w;
        const std::int32_t* const row = samples_.data + (*line_)(y)*samples_.w;
        std::transform(columns_.begin(), columns_.end(), wide_.begin(),
                       [row](std::uint32_t x) { return row[x]; });
        return wide_.data();
    }

  private:
    const opj_image_comp_t& samples_;
    std::optional<Covering> line_;  // none: as many samples as the picture
    std::vector<std::uint32_t> columns_;
    std::vector<std::int32_t> wide_;
};

}  // namespace

bool Jpeg2000Reader::read_info() {
    if (!read_jpeg2000_layout(file_, layout_)) return false;
    source_.emplace(file_, layout_.stream.start, layout_.stream.length);
    stream_ = source_->open();
    codec_.reset(opj_create_decompress(OPJ_CODEC_J2K));
    if (!codec_) throw kNotEnoughMemory;
    opj_dparameters_t parameters;
    opj_set_default_decoder_parameters(&parameters);
    opj_image_t* image = nullptr;
    // Strict: OpenJPEG would fill in what a damaged stream lacks.
    const bool done = opj_setup_decoder(codec_.get(), &parameters) == OPJ_TRUE &&
                      opj_decoder_set_strict_mode(codec_.get(), OPJ_TRUE) == OPJ_TRUE &&
                      opj_read_header(stream_.get(), codec_.get(), &image) == OPJ_TRUE;
    samples_.reset(image);
    if (!done) throw kInvalidFileHeader;
    return true;
}

void Jpeg2000Reader::decode() {
    const bool done = opj_decode(codec_.get(), stream_.get(), samples_.get()) == OPJ_TRUE &&
                      opj_end_decompress(codec_.get(), stream_.get()) == OPJ_TRUE;
    codec_.reset();
    if (!done || samples_->numcomps != layout_.stream.components.size()) throw kUnableToReadData;
    for (const std::size_t index : layout_.colours) check_component(index);
    if (layout_.alpha_kind != Jpeg2000Alpha::kNone) check_component(layout_.alpha);
}

void Jpeg2000Reader::check_component(std::size_t index) const {
    const opj_image_comp_t& samples = samples_->comps[index];
    const Jpeg2000Component& component = layout_.stream.components[index];
    if (samples.data == nullptr || samples.w != layout_.stream.width(component) ||
        samples.h != layout_.stream.height(component)) {
        throw kUnableToReadData;
    }
}

void Jpeg2000Reader::read_grey(Image& image) const {
    const Jpeg2000Component& component = layout_.main_component();
    const auto width = static_cast<std::size_t>(layout_.width());
    const bool indices = !layout_.colour_table.empty();
    UnsignedGreyRows unsigned_rows(image);
    ComponentRows rows(*samples_, layout_, layout_.colours[0]);
    const std::int32_t height = layout_.height();
    for (std::int32_t y = 0; y < height; ++y) {
        const SampleRow row = rows.row(y);
        if (image.type() == PixelType::kU8) {
            if (!indices) spread_samples(row, width, component.bits, 8);
            samples_to_bytes(row, image.row(y), width);
        } else {
            samples_to_words(row, reinterpret_cast<std::uint16_t*>(image.row(y)), width);
            if (!component.is_signed) unsigned_rows.add(y, 1);
        }
    }
    image.set_sample_offset(unsigned_rows.offset());
}

void Jpeg2000Reader::read_colour(Image& image) const {
    const auto width = static_cast<std::size_t>(layout_.width());
    const int bits = layout_.main_component().bits;
    const int wanted = image.type() == PixelType::kRgb ? 8 : 16;
    const bool alpha = layout_.alpha_kind != Jpeg2000Alpha::kNone;
    const bool premultiplied = layout_.alpha_kind == Jpeg2000Alpha::kPremultiplied;
    // Grey with alpha has one row for all.
    const std::size_t rows = layout_.colours[1] == layout_.colours[0] ? 1 : 3;
    std::vector<ComponentRows> colours;
    for (std::size_t i = 0; i < rows; ++i)
        colours.emplace_back(*samples_, layout_, layout_.colours[i]);
    std::optional<ComponentRows> opacities;
    if (alpha) opacities.emplace(*samples_, layout_, layout_.alpha);
    const int alpha_bits = layout_.stream.components[layout_.alpha].bits;
    const auto finish = [&](auto* to, const std::array<SampleRow, 3>& rgb, SampleRow opacity) {
        samples_to_colour(rgb, opacity, to, width);
        if (premultiplied) divide_by_alpha(to, width);
    };
    const std::int32_t height = layout_.height();
    for (std::int32_t y = 0; y < height; ++y) {
        std::array<SampleRow, 3> rgb;
        for (std::size_t i = 0; i < rgb.size(); ++i) rgb[i] = i < rows ? colours[i].row(y) : rgb[0];
        if (layout_.is_ycc && rows == 3) ycc_to_rgb_samples(rgb, width, bits);
        for (std::size_t i = 0; i < rows; ++i) spread_samples(rgb[i], width, bits, wanted);
        const SampleRow opacity = opacities ? opacities->row(y) : nullptr;
        if (opacities) spread_samples(opacity, width, alpha_bits, wanted);
        if (wanted == 8) {
            finish(image.row(y), rgb, opacity);
        } else {
            finish(reinterpret_cast<std::uint16_t*>(image.row(y)), rgb, opacity);
        }
    }
}

void Jpeg2000Reader::read_pixels(Image& image) {
    decode();
    if (layout_.is_grey()) {
        read_grey(image);
    } else {
        read_colour(image);
    }
}

}  // namespace zq
