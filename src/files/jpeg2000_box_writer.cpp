// Putting boxes together.
#include "files/jpeg2000_box_writer.h"

#include <algorithm>
#include <string_view>
#include <utility>

#include "files/jpeg2000_writer.h"

namespace zq {

namespace {

constexpr std::uint32_t kSrgb = 16, kGrey = 17;

class Bytes {
  public:
    void u8(std::uint32_t value) { all_.push_back(static_cast<std::uint8_t>(value)); }
    void u16(std::uint32_t value) {
        u8(value >> 8);
        u8(value);
    }
    void u32(std::uint32_t value) {
        u16(value >> 16);
        u16(value);
    }
    void text(std::string_view text) { all_.insert(all_.end(), text.begin(), text.end()); }

    // A box with what `content` puts into it.
    template <class Content>
    void box(std::string_view name, Content&& content) {
        Bytes inside;
        content(inside);
        u32(static_cast<std::uint32_t>(inside.all_.size() + 8));
        text(name);
        all_.insert(all_.end(), inside.all_.begin(), inside.all_.end());
    }

    std::vector<std::uint8_t>& all() { return all_; }

  private:
    std::vector<std::uint8_t> all_;
};

// Colours 1 to `colours`, then the alpha of them all.
void put_definitions(Bytes& bytes, std::uint32_t colours) {
    bytes.u16(colours + 1);
    for (std::uint32_t i = 0; i <= colours; ++i) {
        const bool alpha = i == colours;
        bytes.u16(i);
        bytes.u16(alpha ? 1 : 0);
        bytes.u16(alpha ? 0 : i + 1);
    }
}

void put_palette(Bytes& header, std::span<const std::uint32_t> table, std::uint32_t columns) {
    header.box("pclr", [&](Bytes& box) {
        box.u16(static_cast<std::uint32_t>(table.size()));
        box.u8(columns);
        for (std::uint32_t i = 0; i < columns; ++i) box.u8(8 - 1);
        for (const std::uint32_t entry : table) {
            for (const unsigned shift : {16U, 8U, 0U}) box.u8(entry >> shift);
            if (columns == 4) box.u8(entry >> 24);
        }
    });
    header.box("cmap", [columns](Bytes& box) {
        for (std::uint32_t i = 0; i < columns; ++i) {
            box.u16(0);  // component
            box.u8(1);   // through the palette
            box.u8(i);
        }
    });
}

}  // namespace

std::vector<std::uint8_t> jp2_boxes(const Jpeg2000Samples& samples, std::uint32_t width,
                                    std::uint32_t height, std::span<const std::uint32_t> table) {
    const auto has_alpha = [](std::uint32_t entry) { return entry >> 24 != 0; };
    const bool alpha = samples.alpha || std::any_of(table.begin(), table.end(), has_alpha);
    const std::uint32_t colours = table.empty() ? static_cast<std::uint32_t>(samples.colours) : 3;
    Bytes bytes;
    bytes.box("jP  ", [](Bytes& box) { box.u32(0x0D0A870A); });
    bytes.box("ftyp", [](Bytes& box) {
        box.text("jp2 ");
        box.u32(0);
        box.text("jp2 ");
    });
    bytes.box("jp2h", [&](Bytes& header) {
        header.box("ihdr", [&](Bytes& box) {
            box.u32(height);
            box.u32(width);
            box.u16(static_cast<std::uint32_t>(samples.count()));
            box.u8(static_cast<std::uint32_t>(samples.bits - 1) | (samples.is_signed ? 0x80U : 0));
            box.u8(7);  // the only compression
            box.u16(0);
        });
        header.box("colr", [colours](Bytes& box) {
            box.u8(1);  // enumerated
            box.u16(0);
            box.u32(colours == 3 ? kSrgb : kGrey);
        });
        if (!table.empty()) put_palette(header, table, alpha ? 4 : 3);
        if (alpha) header.box("cdef", [colours](Bytes& box) { put_definitions(box, colours); });
    });
    bytes.u32(0);
    bytes.text("jp2c");
    return std::move(bytes.all());
}

}  // namespace zq
