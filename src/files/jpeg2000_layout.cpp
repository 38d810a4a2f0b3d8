// From boxes and markers to the image's type and the meaning of each component.
#include "files/jpeg2000_layout.h"

#include <algorithm>
#include <optional>

#include "base/checked.h"
#include "files/jpeg2000_boxes.h"
#include "files/write_job.h"

namespace zq {

namespace {

constexpr int kMostBits = 16;

// Which channel is what.
struct Channels {
    std::array<std::size_t, 3> colours = {0, 1, 2};
    std::optional<std::size_t> alpha;
    bool premultiplied = false;

    std::vector<std::size_t> all(std::size_t colour_count) const {
        std::vector<std::size_t> used(colours.begin(),
                                      colours.begin() + static_cast<std::ptrdiff_t>(colour_count));
        if (alpha) used.push_back(*alpha);
        return used;
    }
};

Channels channels_of(const std::vector<Jpeg2000Definition>& definitions) {
    constexpr std::uint16_t kColour = 0, kOpacity = 1, kPremultiplied = 2, kWholeImage = 0;
    Channels channels;
    for (const Jpeg2000Definition& definition : definitions) {
        const std::uint16_t type = definition.type, association = definition.association;
        if (type == kColour && association >= 1 && association <= channels.colours.size())
            channels.colours[association - 1U] = definition.channel;
        if ((type == kOpacity || type == kPremultiplied) && association == kWholeImage) {
            channels.alpha = definition.channel;
            channels.premultiplied = type == kPremultiplied;
        }
    }
    return channels;
}

// Each channel exists and has one meaning.
void check_channels(const Channels& channels, std::size_t colour_count, std::size_t count) {
    std::vector<std::size_t> used = channels.all(colour_count);
    std::sort(used.begin(), used.end());
    const bool unique = std::adjacent_find(used.begin(), used.end()) == used.end();
    if (!unique || used.back() >= count) throw kInvalidFileHeader;
}

bool is_subsampled(const Jpeg2000Component& component, const Jpeg2000Component& than) {
    return component.dx > than.dx || component.dy > than.dy;
}

// Where no box says it.
Jpeg2000Colour guess_colour(const Jpeg2000Codestream& stream, std::size_t channel_count,
                            bool has_alpha) {
    if (channel_count < (has_alpha ? 4U : 3U)) return Jpeg2000Colour::kGrey;
    const auto& components = stream.components;
    const bool chroma = components.size() >= 3 && is_subsampled(components[1], components[0]) &&
                        is_subsampled(components[2], components[0]);
    return chroma ? Jpeg2000Colour::kYcc : Jpeg2000Colour::kRgb;
}

void check_component(const Jpeg2000Component& component, const Jpeg2000Component& main) {
    if (component.bits > kMostBits || component.dx % main.dx != 0 || component.dy % main.dy != 0)
        throw kUnsupportedFileType;
}

PixelFormat grey_format(int bits) {
    if (bits > 8) return PixelFormat::kGrey16;
    if (bits > 4) return PixelFormat::kGrey8;
    if (bits > 2) return PixelFormat::kGrey4;
    return bits > 1 ? PixelFormat::kGrey2 : PixelFormat::kGrey1;
}

class Chooser {
  public:
    Chooser(const Jpeg2000Boxes& boxes, Jpeg2000Layout& layout)
        : boxes_(boxes), layout_(layout), channels_(channels_of(boxes.definitions)) {}

    void choose() {
        const std::size_t components = layout_.stream.components.size();
        const std::size_t count = boxes_.palette ? boxes_.palette->channels.size() : components;
        Jpeg2000Colour colour = boxes_.colour;
        if (colour == Jpeg2000Colour::kUnknown)
            colour = guess_colour(layout_.stream, count, channels_.alpha.has_value());
        colour_count_ = colour == Jpeg2000Colour::kGrey ? 1 : 3;
        check_channels(channels_, colour_count_, count);
        layout_.is_ycc = colour == Jpeg2000Colour::kYcc;
        if (boxes_.palette) {
            choose_table();
        } else {
            choose_components();
        }
    }

  private:
    void choose_components() {
        const auto& components = layout_.stream.components;
        for (std::size_t i = 0; i < layout_.colours.size(); ++i)
            layout_.colours[i] = channels_.colours[std::min(i, colour_count_ - 1)];
        const Jpeg2000Component& main = layout_.main_component();
        for (const std::size_t index : layout_.colours) {
            const Jpeg2000Component& component = components[index];
            check_component(component, main);
            if (component.bits != main.bits || component.is_signed != main.is_signed)
                throw kUnsupportedFileType;
        }
        choose_alpha(main);
        const bool is_grey = colour_count_ == 1 && layout_.alpha_kind == Jpeg2000Alpha::kNone;
        if (is_grey) {
            choose_grey(main);
        } else {
            choose_colour(main);
        }
    }

    void choose_alpha(const Jpeg2000Component& main) {
        if (!channels_.alpha) return;
        layout_.alpha = *channels_.alpha;
        const Jpeg2000Component& component = layout_.stream.components[layout_.alpha];
        check_component(component, main);
        if (component.is_signed) throw kUnsupportedFileType;
        layout_.alpha_kind =
            channels_.premultiplied ? Jpeg2000Alpha::kPremultiplied : Jpeg2000Alpha::kStraight;
    }

    void choose_grey(const Jpeg2000Component& main) {
        layout_.type = main.bits > 8 || main.is_signed ? PixelType::kI16 : PixelType::kU8;
        layout_.format = grey_format(main.is_signed ? std::max(main.bits, 8) : main.bits);
    }

    void choose_colour(const Jpeg2000Component& main) {
        if (main.is_signed) throw kUnsupportedFileType;
        const bool alpha = layout_.alpha_kind != Jpeg2000Alpha::kNone;
        if (main.bits <= 8) {
            layout_.type = PixelType::kRgb;
            layout_.format = alpha ? PixelFormat::kRgb32 : PixelFormat::kRgb24;
        } else {
            layout_.type = PixelType::kRgbU64;
            layout_.format = alpha ? PixelFormat::kRgb64 : PixelFormat::kRgb48;
        }
    }

    void choose_table() {
        const Jpeg2000Palette& palette = *boxes_.palette;
        if (palette.component >= layout_.stream.components.size()) throw kInvalidFileHeader;
        layout_.colours.fill(palette.component);
        const Jpeg2000Component& main = layout_.main_component();
        if (layout_.is_ycc || main.is_signed || main.bits > 8) throw kUnsupportedFileType;
        layout_.type = PixelType::kU8;
        layout_.format = grey_format(main.bits);
        layout_.colour_table.assign(kColourTableSize, 0);
        for (std::size_t i = 0; i < palette.entries.size() / palette.columns; ++i)
            layout_.colour_table[i] = entry(&palette.entries[i * palette.columns]);
    }

    std::uint32_t entry(const std::uint8_t* columns) const {
        const auto channel = [&](std::size_t index) -> std::uint32_t {
            return columns[boxes_.palette->channels[index]];
        };
        std::uint32_t value = channels_.alpha ? channel(*channels_.alpha) : 0;
        for (std::size_t i = 0; i < layout_.colours.size(); ++i)
            value = value << 8 | channel(channels_.colours[std::min(i, colour_count_ - 1)]);
        return value;
    }

    const Jpeg2000Boxes& boxes_;
    Jpeg2000Layout& layout_;
    Channels channels_;
    std::size_t colour_count_ = 3;
};

}  // namespace

std::int32_t Jpeg2000Layout::width() const {
    return checked_narrow<std::int32_t>(stream.width(main_component()));
}

std::int32_t Jpeg2000Layout::height() const {
    return checked_narrow<std::int32_t>(stream.height(main_component()));
}

int Jpeg2000Layout::bits_per_pixel() const {
    const int colour_count = is_grey() ? 1 : 3;
    return main_component().bits * (colour_count + (alpha_kind != Jpeg2000Alpha::kNone ? 1 : 0));
}

std::int32_t Jpeg2000Layout::bit_depth() const {
    const int bits = main_component().bits;
    return type == PixelType::kI16 && bits > 8 && bits < 16 ? bits : 0;
}

bool read_jpeg2000_layout(InputFile& file, Jpeg2000Layout& layout) {
    Jpeg2000FirstBytes first{};
    file.read_some(first.data(), first.size());
    Jpeg2000Boxes boxes;
    if (is_jp2(first)) {
        boxes = read_jp2_boxes(file);
    } else if (is_jpeg2000_codestream(first)) {
        boxes.end = jpeg2000_file_end(file);
    } else {
        return false;
    }
    Jpeg2000Cursor cursor(file, boxes.start, boxes.end);
    layout.stream = read_jpeg2000_codestream(cursor);
    Chooser(boxes, layout).choose();
    return true;
}

}  // namespace zq
