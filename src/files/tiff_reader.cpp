// Reading TIFF. Strips and tiles are decoded by libtiff; what they hold is put in place here.
#include "files/tiff_reader.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <memory>

#include "base/checked.h"
#include "files/orientation.h"
#include "files/tiff_inflater.h"
#include "files/tiff_unpacker.h"
#include "files/write_job.h"

namespace zq {

namespace {

// Strips up to here are decoded whole, which is faster; larger ones a few rows at a time.
constexpr std::uint64_t kLargestWholeStrip = std::uint64_t{4} << 20;
constexpr std::size_t kInflatedAtOnce = std::size_t{128} << 10;
// Samples are looked at while the processor's caches have them.
constexpr std::size_t kBand = std::size_t{256} << 10;
constexpr std::int32_t kUnitCentimetre = 4;
constexpr std::int32_t kUnitInch = 8;

bool is_uncompressed(TIFF* tiff, const TiffLayout& layout) {
    std::uint16_t order = FILLORDER_MSB2LSB;
    TIFFGetFieldDefaulted(tiff, TIFFTAG_FILLORDER, &order);
    return layout.compression == COMPRESSION_NONE && order == FILLORDER_MSB2LSB;
}

std::uint32_t rows_per_strip(TIFF* tiff, const TiffLayout& layout) {
    std::uint32_t rows = 0;
    TIFFGetFieldDefaulted(tiff, TIFFTAG_ROWSPERSTRIP, &rows);
    if (rows == 0) throw kInvalidFileHeader;
    return std::min(rows, layout.height);
}

struct RgbaImageEnder {
    void operator()(TIFFRGBAImage* image) const { TIFFRGBAImageEnd(image); }
};

}  // namespace

TiffReader::TiffReader(InputFile& file)
    : session_(file), layout_(read_tiff_layout(session_)), sink_(layout_) {}

std::int32_t TiffReader::width() const {
    const bool transposed = Orientation(layout_.orientation).is_transposed();
    return checked_narrow<std::int32_t>(transposed ? layout_.height : layout_.width);
}

std::int32_t TiffReader::height() const {
    const bool transposed = Orientation(layout_.orientation).is_transposed();
    return checked_narrow<std::int32_t>(transposed ? layout_.width : layout_.height);
}

std::optional<Calibration> TiffReader::calibration() const {
    TIFF* const tiff = session_.tiff();
    std::uint16_t unit = RESUNIT_NONE;
    float x = 0, y = 0;
    TIFFGetFieldDefaulted(tiff, TIFFTAG_RESOLUTIONUNIT, &unit);
    TIFFGetField(tiff, TIFFTAG_XRESOLUTION, &x);
    TIFFGetField(tiff, TIFFTAG_YRESOLUTION, &y);
    if (unit != RESUNIT_INCH && unit != RESUNIT_CENTIMETER) return std::nullopt;
    if (!std::isnormal(1 / x) || !std::isnormal(1 / y) || x < 0 || y < 0) return std::nullopt;
    if (Orientation(layout_.orientation).is_transposed()) std::swap(x, y);
    return Calibration{unit == RESUNIT_INCH ? kUnitInch : kUnitCentimetre, 1 / x, 1 / y};
}

std::vector<std::uint32_t> TiffReader::colour_table() const {
    if (layout_.colour != TiffColour::kPalette) return {};
    std::array<const std::uint16_t*, 3> maps{};
    if (TIFFGetField(session_.tiff(), TIFFTAG_COLORMAP, &maps[0], &maps[1], &maps[2]) != 1)
        throw kInvalidFileHeader;
    const std::size_t count = std::size_t{1} << layout_.bits;
    // Some writers put bytes where the format has words.
    const bool are_bytes = std::all_of(maps.begin(), maps.end(), [count](const auto* map) {
        return std::all_of(map, map + count, [](std::uint16_t v) { return v < 256; });
    });
    const int shift = are_bytes ? 0 : 8;
    std::vector<std::uint32_t> table(kColourTableSize, 0);
    for (std::size_t i = 0; i < count; ++i) {
        for (const auto* map : maps)
            table[i] = table[i] << 8 | static_cast<std::uint32_t>(map[i] >> shift);
    }
    return table;
}

void TiffReader::read_pixels(Image& image) {
    const Orientation orientation(layout_.orientation);
    if (orientation.is_transposed()) {
        Image stored(Variant::kPrivate, {});
        stored.reinitialise({.type = static_cast<std::int32_t>(image.type()),
                             .width = height(),
                             .height = width(),
                             .border = 0});
        read_stored(stored);
        Orientation::transpose(stored, image);
        image.set_sample_offset(stored.sample_offset());
    } else {
        read_stored(image);
    }
    orientation.flip(image);
}

std::uint8_t* TiffReader::pixel_of(const Image& image, std::uint32_t x, std::uint32_t y) const {
    return image.row(static_cast<std::int32_t>(y)) +
           std::size_t{x} * static_cast<std::size_t>(bytes_per_pixel(image.type()));
}

void TiffReader::read_stored(Image& image) {
    if (layout_.colour == TiffColour::kForeign) {
        read_foreign(image);
        return;
    }
    const bool is_unsigned = layout_.number == TiffNumber::kUnsigned;
    if (is_unsigned && image.type() == PixelType::kI16 && layout_.bits == 16)
        unsigned_rows_.emplace(image);
    const int planes = layout_.separate ? layout_.used_samples() : 1;
    for (int plane = 0; plane < planes; ++plane) {
        if (layout_.tiled) {
            read_plane_of_tiles(image, plane);
        } else {
            read_plane_of_strips(image, plane);
        }
    }
    if (layout_.alpha == TiffAlpha::kPremultiplied) {
        for (std::uint32_t y = 0; y < layout_.height; ++y)
            sink_.finish_row(pixel_of(image, 0, y), layout_.width);
    }
    image.set_sample_offset(unsigned_rows_ ? unsigned_rows_->offset() : 0);
}

// The rows from `y` on are complete.
void TiffReader::rows_done(std::uint32_t y, std::uint32_t rows) {
    if (unsigned_rows_)
        unsigned_rows_->add(static_cast<std::int32_t>(y), static_cast<std::int32_t>(rows));
}

void TiffReader::read_plane_of_strips(const Image& image, int plane) {
    TIFF* const tiff = session_.tiff();
    if (static_cast<std::uint64_t>(TIFFScanlineSize(tiff)) != layout_.row_bytes(layout_.width))
        throw kInvalidFileHeader;
    const std::uint32_t most = rows_per_strip(tiff, layout_);
    if (is_uncompressed(tiff, layout_)) {
        read_uncompressed_plane(image, plane, most);
        return;
    }
    const bool whole = layout_.row_bytes(layout_.width) * most <= kLargestWholeStrip;
    const auto read = TiffUnpacker::suits(tiff, layout_)   ? &TiffReader::read_packed
                      : whole                              ? &TiffReader::read_strip
                      : TiffInflater::suits(tiff, layout_) ? &TiffReader::read_deflated
                                                           : &TiffReader::read_lines;
    for (std::uint32_t y = 0; y < layout_.height; y += most) {
        const std::uint32_t rows = std::min(most, layout_.height - y);
        (this->*read)(image, plane, y, rows);
        if (rows < most) break;  // y must not wrap
    }
}

void TiffReader::read_uncompressed_plane(const Image& image, int plane, std::uint32_t strip_rows) {
    for (std::uint32_t y = 0; y < layout_.height;) {
        const FileRows place = place_of_rows(plane, y, strip_rows);
        read_uncompressed(image, plane, y, place);
        y += place.count;
    }
}

// Strips that follow each other in the file count as one.
TiffReader::FileRows TiffReader::place_of_rows(int plane, std::uint32_t y,
                                               std::uint32_t strip_rows) const {
    TIFF* const tiff = session_.tiff();
    const std::uint64_t line = layout_.row_bytes(layout_.width);
    FileRows place{};
    while (y + place.count < layout_.height) {
        const std::uint32_t next = y + place.count;
        const std::uint32_t strip = TIFFComputeStrip(tiff, next, static_cast<std::uint16_t>(plane));
        const std::uint32_t rows = std::min(strip_rows, layout_.height - next);
        const std::uint64_t start = TIFFGetStrileOffset(tiff, strip);
        if (place.count == 0) place.start = start;
        if (start != checked_add(place.start, checked_mul(std::uint64_t{place.count}, line))) break;
        if (start == 0 || TIFFGetStrileByteCount(tiff, strip) / line < rows)
            throw kUnableToReadData;
        place.count += rows;
    }
    return place;
}

// Into the image itself where it takes samples as they are.
void TiffReader::read_uncompressed(const Image& image, int plane, std::uint32_t y, FileRows place) {
    const bool plain = sink_.is_plain();
    const auto line = checked_narrow<std::size_t>(layout_.row_bytes(layout_.width));
    const std::ptrdiff_t stride = plain ? image.row_stride() : static_cast<std::ptrdiff_t>(line);
    const std::size_t most = std::clamp<std::size_t>(kBand / line, 1, place.count);
    buffer_.resize(plain ? 0 : most * line);
    for (std::uint32_t done = 0; done < place.count;) {
        const std::uint32_t rows = std::min(static_cast<std::uint32_t>(most), place.count - done);
        const std::uint64_t start =
            checked_add(place.start, checked_mul<std::uint64_t>(done, line));
        std::uint8_t* const bytes = plain ? pixel_of(image, 0, y + done) : buffer_.data();
        if (!session_.read_rows_at(start, {bytes, stride, line, rows})) throw kUnableToReadData;
        for (std::uint32_t i = 0; i < rows; ++i)
            session_.swap_samples({bytes + static_cast<std::ptrdiff_t>(i) * stride, line},
                                  layout_.bits);
        if (plain) {
            rows_done(y + done, rows);
        } else {
            put_rows(image, plane, y + done, rows);
        }
        done += rows;
    }
}

void TiffReader::read_packed(const Image& image, int plane, std::uint32_t y, std::uint32_t rows) {
    TiffUnpacker unpacker(session_,
                          TIFFComputeStrip(session_.tiff(), y, static_cast<std::uint16_t>(plane)));
    const bool plain = sink_.is_plain();
    const auto line = checked_narrow<std::size_t>(layout_.row_bytes(layout_.width));
    buffer_.resize(plain ? 0 : line);
    for (std::uint32_t i = 0; i < rows; ++i) {
        std::uint8_t* const row = pixel_of(image, 0, y + i);
        const std::span<std::uint8_t> bytes(plain ? row : buffer_.data(), line);
        unpacker.read_row(bytes);
        session_.swap_samples(bytes, layout_.bits);
        if (!plain) sink_.put(plane, bytes.data(), row, layout_.width);
        rows_done(y + i, 1);
    }
}

void TiffReader::read_deflated(const Image& image, int plane, std::uint32_t y, std::uint32_t rows) {
    TiffInflater inflater(session_, layout_,
                          TIFFComputeStrip(session_.tiff(), y, static_cast<std::uint16_t>(plane)));
    const auto line = checked_narrow<std::size_t>(layout_.row_bytes(layout_.width));
    const std::size_t most = std::clamp<std::size_t>(kInflatedAtOnce / line, 1, rows);
    buffer_.resize(line * most);
    for (std::uint32_t done = 0; done < rows;) {
        const auto count = static_cast<std::uint32_t>(std::min<std::size_t>(most, rows - done));
        inflater.read_rows(std::span(buffer_).first(count * line));
        put_rows(image, plane, y + done, count);
        done += count;
    }
    inflater.finish(std::uint64_t{line} * rows_per_strip(session_.tiff(), layout_));
}

// Damaged strips of some codecs come short without an error; what is missing counts as 0.
void TiffReader::read_strip(const Image& image, int plane, std::uint32_t y, std::uint32_t rows) {
    TIFF* const tiff = session_.tiff();
    const auto line = static_cast<std::size_t>(layout_.row_bytes(layout_.width));
    buffer_.assign(line * rows, 0);
    const auto bytes = static_cast<tmsize_t>(buffer_.size());
    const std::uint32_t strip = TIFFComputeStrip(tiff, y, static_cast<std::uint16_t>(plane));
    if (TIFFReadEncodedStrip(tiff, strip, buffer_.data(), bytes) != bytes) throw kUnableToReadData;
    put_rows(image, plane, y, rows);
}

void TiffReader::read_lines(const Image& image, int plane, std::uint32_t y, std::uint32_t rows) {
    buffer_.assign(checked_narrow<std::size_t>(layout_.row_bytes(layout_.width)), 0);
    for (std::uint32_t i = 0; i < rows; ++i) {
        if (TIFFReadScanline(session_.tiff(), buffer_.data(), y + i,
                             static_cast<std::uint16_t>(plane)) != 1) {
            throw kUnableToReadData;
        }
        put_rows(image, plane, y + i, 1);
    }
}

// Whole rows from the buffer.
void TiffReader::put_rows(const Image& image, int plane, std::uint32_t y, std::uint32_t rows) {
    const auto line = static_cast<std::size_t>(layout_.row_bytes(layout_.width));
    for (std::uint32_t i = 0; i < rows; ++i)
        sink_.put(plane, &buffer_[i * line], pixel_of(image, 0, y + i), layout_.width);
    rows_done(y, rows);
}

void TiffReader::read_plane_of_tiles(const Image& image, int plane) {
    TIFF* const tiff = session_.tiff();
    std::uint32_t width = 0, height = 0;
    TIFFGetField(tiff, TIFFTAG_TILEWIDTH, &width);
    TIFFGetField(tiff, TIFFTAG_TILELENGTH, &height);
    const auto line = static_cast<std::size_t>(TIFFTileRowSize(tiff));
    const tmsize_t bytes = TIFFTileSize(tiff);
    if (width == 0 || height == 0 || line != layout_.row_bytes(width) ||
        static_cast<std::uint64_t>(bytes) != std::uint64_t{line} * height) {
        throw kInvalidFileHeader;
    }
    for (std::uint64_t y = 0; y < layout_.height; y += height) {
        for (std::uint64_t x = 0; x < layout_.width; x += width) {
            const auto left = static_cast<std::uint32_t>(x), top = static_cast<std::uint32_t>(y);
            buffer_.assign(static_cast<std::size_t>(bytes), 0);
            if (TIFFReadTile(tiff, buffer_.data(), left, top, 0,
                             static_cast<std::uint16_t>(plane)) != bytes) {
                throw kUnableToReadData;
            }
            const std::uint32_t pixels = std::min(width, layout_.width - left);
            const std::uint32_t rows = std::min(height, layout_.height - top);
            for (std::uint32_t i = 0; i < rows; ++i)
                sink_.put(plane, &buffer_[i * line], pixel_of(image, left, top + i), pixels);
        }
        rows_done(static_cast<std::uint32_t>(y),
                  static_cast<std::uint32_t>(std::min<std::uint64_t>(height, layout_.height - y)));
    }
}

// Colour models that libtiff turns into RGB itself, a strip or a row of tiles at a time.
void TiffReader::read_foreign(const Image& image) {
    TIFF* const tiff = session_.tiff();
    std::array<char, 1024> message{};
    TIFFRGBAImage state{};
    if (TIFFRGBAImageBegin(&state, tiff, 1, message.data()) != 1) throw kUnsupportedFileType;
    const std::unique_ptr<TIFFRGBAImage, RgbaImageEnder> end(&state);
    state.req_orientation = state.orientation = ORIENTATION_TOPLEFT;
    std::uint32_t most = 0;
    if (layout_.tiled) {
        TIFFGetField(tiff, TIFFTAG_TILELENGTH, &most);
        most = std::min(std::max(most, 1U), layout_.height);
    } else {
        most = rows_per_strip(tiff, layout_);
    }
    std::vector<std::uint32_t> raster(std::size_t{layout_.width} * most);
    for (std::uint32_t y = 0; y < layout_.height; y += most) {
        const std::uint32_t rows = std::min(most, layout_.height - y);
        state.row_offset = static_cast<int>(y);
        if (TIFFRGBAImageGet(&state, raster.data(), layout_.width, rows) != 1)
            throw kUnableToReadData;
        for (std::uint32_t i = 0; i < rows; ++i) {
            const std::uint32_t* const from = &raster[std::size_t{i} * layout_.width];
            auto* const to = reinterpret_cast<std::uint32_t*>(pixel_of(image, 0, y + i));
            for (std::uint32_t x = 0; x < layout_.width; ++x) {
                to[x] = TIFFGetR(from[x]) << 16 | TIFFGetG(from[x]) << 8 | TIFFGetB(from[x]);
            }
        }
        if (rows < most) break;
    }
}

}  // namespace zq
