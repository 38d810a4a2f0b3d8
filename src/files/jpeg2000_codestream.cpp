// Walking through the main header and all tile-parts: sizes, layers, and whether it is all there.
#include "files/jpeg2000_codestream.h"

#include <algorithm>

namespace zq {

namespace {

enum Marker : std::uint16_t {
    kStart = 0xFF4F,
    kSize = 0xFF51,
    kCodingStyle = 0xFF52,
    kComponentStyle = 0xFF53,
    kTilePart = 0xFF90,
    kTileData = 0xFF93,
    kEnd = 0xFFD9,
};

constexpr std::uint32_t kMostComponents = 16;  // far more than pictures have
constexpr int kMostBits = 38;
// A packet without any code block is a byte, whatever the size of the picture; so blank pictures
// have hardly any bytes. Up to here they need none, and beyond a byte for so many.
constexpr std::uint64_t kFreeSamples = std::uint64_t{1} << 26;
constexpr std::uint64_t kMostSamplesAByte = 4096;
constexpr std::uint64_t kMostTiles = 65535;
constexpr std::uint64_t kTilePartBytes = 14;  // at least, its data included

constexpr std::uint64_t divide_up(std::uint64_t a, std::uint64_t b) {
    return (a + b - 1) / b;
}

void require_header(bool holds) {
    if (!holds) throw kInvalidFileHeader;
}

class Walk {
  public:
    explicit Walk(Jpeg2000Cursor& cursor) : cursor_(cursor), most_bytes_(cursor.left()) {}

    Jpeg2000Codestream run() {
        stream_.start = cursor_.position();
        require_header(cursor_.u16() == kStart && cursor_.u16() == kSize);
        const std::vector<std::uint8_t> size = segment();
        read_size(Jpeg2000Fields(size));
        check_plausible();
        skip_header(kTilePart, true);
        require_header(has_style_);
        read_tile_parts();
        stream_.length = cursor_.position() - stream_.start;
        return stream_;
    }

  private:
    std::vector<std::uint8_t> segment() {
        const std::uint16_t length = cursor_.u16();  // counts itself
        require_header(length >= 2);
        return cursor_.bytes(length - 2U);
    }

    // Segments up to the marker that ends this header, and that marker.
    void skip_header(std::uint16_t last, bool is_main) {
        for (;;) {
            const std::uint16_t marker = cursor_.u16();
            if (marker == last) return;
            require_header(marker > 0xFF4F && marker != kTilePart && marker != kTileData &&
                           marker != kEnd);
            const std::vector<std::uint8_t> content = segment();
            if (marker == kCodingStyle) read_style(Jpeg2000Fields(content), is_main);
            if (marker == kComponentStyle) read_component_style(Jpeg2000Fields(content), is_main);
        }
    }

    void read_size(Jpeg2000Fields size) {
        Jpeg2000Grid& grid = stream_.grid;
        size.u16();  // capabilities
        for (std::uint32_t* field :
             {&grid.right, &grid.bottom, &grid.left, &grid.top, &grid.tile_width, &grid.tile_height,
              &grid.tile_left, &grid.tile_top})
            *field = size.u32();
        require_header(grid.left < grid.right && grid.top < grid.bottom);
        require_header(grid.tile_left <= grid.left && grid.tile_top <= grid.top);
        require_header(std::uint64_t{grid.tile_left} + grid.tile_width > grid.left &&
                       std::uint64_t{grid.tile_top} + grid.tile_height > grid.top);
        const std::uint16_t count = size.u16();
        require_header(count >= 1);
        if (count > kMostComponents) throw kUnsupportedFileType;
        for (int i = 0; i < count; ++i) read_component(size);
        tiles_ = divide_up(grid.right - grid.tile_left, grid.tile_width) *
                 divide_up(grid.bottom - grid.tile_top, grid.tile_height);
        require_header(tiles_ <= kMostTiles);
    }

    void read_component(Jpeg2000Fields& size) {
        const std::uint8_t depth = size.u8();
        Jpeg2000Component component{.bits = (depth & 0x7F) + 1, .is_signed = (depth & 0x80) != 0};
        component.dx = size.u8();
        component.dy = size.u8();
        require_header(component.bits <= kMostBits && component.dx != 0 && component.dy != 0);
        require_header(stream_.width(component) != 0 && stream_.height(component) != 0);
        stream_.components.push_back(component);
    }

    void check_plausible() const {
        if (tiles_ > most_bytes_ / kTilePartBytes) throw kUnableToReadData;
        std::uint64_t samples = 0;  // of few components, so that the sum fits
        for (const Jpeg2000Component& component : stream_.components) {
            samples += std::min(stream_.width(component) * stream_.height(component),
                                std::uint64_t{1} << 55);
        }
        if (samples > kFreeSamples && (samples - kFreeSamples) / kMostSamplesAByte > most_bytes_)
            throw kUnableToReadData;
    }

    void read_style(Jpeg2000Fields content, bool is_main) {
        const std::uint8_t style = content.u8();
        content.u8();  // progression order
        const std::uint16_t layers = content.u16();
        require_header(layers >= 1);
        if (layers > 1) throw kMoreThanOneLayer;
        content.u8();  // transformation of components
        for (const Jpeg2000Component& component : stream_.components)
            check_divisions(content, component, style, is_main);
        has_style_ = has_style_ || is_main;
    }

    void read_component_style(Jpeg2000Fields content, bool is_main) {
        const std::size_t count = stream_.components.size();
        const std::size_t index = content.u8();
        require_header(index < count);
        const std::uint8_t style = content.u8();
        check_divisions(content, stream_.components[index], style, is_main);
    }

    // Each precinct has a packet and each packet a byte, while OpenJPEG takes hundreds of bytes for
    // a precinct, and for a code block. Counts the precincts that lie wholly inside, and all
    // blocks, of the whole picture or of one tile.
    void check_divisions(Jpeg2000Fields content, const Jpeg2000Component& component,
                         std::uint8_t style, bool is_main) const {
        constexpr std::uint8_t kOwnPrecincts = 1, kOnePrecinct = 0xFF;
        constexpr unsigned kMostLevels = 32;
        const unsigned levels = content.u8();
        require_header(levels <= kMostLevels);
        const unsigned block_width = (content.u8() & 15U) + 2, block_height = content.u8() % 16 + 2;
        content.u16();  // style of code blocks, wavelet
        std::uint64_t width = stream_.width(component), height = stream_.height(component);
        if (!is_main) {
            width = std::min<std::uint64_t>(width, stream_.grid.tile_width / component.dx);
            height = std::min<std::uint64_t>(height, stream_.grid.tile_height / component.dy);
        }
        std::uint64_t packets = 0, blocks = 0;
        for (unsigned resolution = 0; resolution <= levels; ++resolution) {
            const bool own = (style & kOwnPrecincts) != 0;
            const unsigned size = own ? content.u8() : kOnePrecinct, down = levels - resolution;
            const unsigned column = size & 15U, line = size >> 4U;
            if (own) packets += (width >> down >> column) * (height >> down >> line);
            // Above the lowest resolution three bands share a precinct, and are half as large.
            const unsigned half = resolution == 0 ? 0 : 1, bands = resolution == 0 ? 1 : 3;
            const auto count = [down, half](std::uint64_t side, unsigned block, unsigned precinct) {
                const unsigned inside = std::max(precinct, half) - half;
                return (side >> (down + half) >> std::min(block, inside)) + 1;
            };
            blocks += bands * count(width, block_width, column) * count(height, block_height, line);
            if (packets > most_bytes_ || blocks > most_blocks(width * height))
                throw kUnableToReadData;
        }
    }

    // A block that nothing is told of takes hardly a bit, so bytes bound the small ones only, which
    // take more memory than their samples.
    std::uint64_t most_blocks(std::uint64_t samples) const {
        constexpr std::uint64_t kFree = std::uint64_t{1} << 15, kByByte = 8, kLargeArea = 64;
        return samples / kLargeArea + (kFree + kByByte * most_bytes_) / stream_.components.size();
    }

    // Up to the end of the code stream.
    void read_tile_parts() {
        std::vector<bool> seen(static_cast<std::size_t>(tiles_));
        std::uint16_t marker = kTilePart;
        while (marker == kTilePart) {
            const std::uint64_t start = cursor_.position() - 2;
            const std::vector<std::uint8_t> content = segment();
            Jpeg2000Fields fields(content);
            const std::uint16_t tile = fields.u16();
            const std::uint32_t length = fields.u32();
            if (tile >= tiles_) throw kUnableToReadData;
            seen[tile] = true;
            skip_header(kTileData, false);
            skip_tile_data(start, length);
            marker = cursor_.u16();
        }
        const bool whole = std::find(seen.begin(), seen.end(), false) == seen.end();
        if (marker != kEnd || !whole) throw kUnableToReadData;
    }

    // A length of 0 reaches up to the end marker, which then ends the file or box.
    void skip_tile_data(std::uint64_t start, std::uint32_t length) {
        const std::uint64_t so_far = cursor_.position() - start;
        if (length == 0 && cursor_.left() >= 2) {
            cursor_.skip(cursor_.left() - 2);
        } else if (length < so_far) {
            throw kUnableToReadData;
        } else {
            cursor_.skip(length - so_far);
        }
    }

    Jpeg2000Cursor& cursor_;
    std::uint64_t most_bytes_;  // what the code stream can have
    Jpeg2000Codestream stream_;
    std::uint64_t tiles_ = 0;
    bool has_style_ = false;
};

std::uint64_t samples_between(std::uint32_t first, std::uint32_t last, std::uint32_t step) {
    return divide_up(last, step) - divide_up(first, step);
}

}  // namespace

std::uint64_t Jpeg2000Codestream::width(const Jpeg2000Component& component) const {
    return samples_between(grid.left, grid.right, component.dx);
}

std::uint64_t Jpeg2000Codestream::height(const Jpeg2000Component& component) const {
    return samples_between(grid.top, grid.bottom, component.dy);
}

Jpeg2000Codestream read_jpeg2000_codestream(Jpeg2000Cursor& cursor) {
    return Walk(cursor).run();
}

}  // namespace zq
