// Walking through the boxes up to the code stream.
#include "files/jpeg2000_boxes.h"

#include <algorithm>
#include <limits>

#include "files/write_job.h"

namespace zq {

namespace {

// Of a box that counts; what profiles and palettes that can be used need is less.
constexpr std::uint64_t kMostContent = 4096;

constexpr std::uint32_t name(const char (&text)[5]) {
    std::uint32_t value = 0;
    for (int i = 0; i < 4; ++i) value = value << 8 | static_cast<std::uint8_t>(text[i]);
    return value;
}

struct Box {
    std::uint32_t name;
    std::uint64_t end;  // in the file
};

// Leaves the cursor at the content. `end` is that of the box or file around it.
Box read_box(Jpeg2000Cursor& cursor, std::uint64_t end) {
    const std::uint64_t start = cursor.position();
    std::uint64_t length = cursor.u32();
    const std::uint32_t name = cursor.u32();
    if (length == 1) length = cursor.u64();
    if (length == 0) return {name, end};
    if (length < cursor.position() - start) throw kInvalidFileHeader;
    if (length > end - start) throw kUnableToReadData;
    return {name, start + length};
}

class Header {
  public:
    explicit Header(Jpeg2000Boxes& boxes) : boxes_(boxes) {}

    void read(Jpeg2000Cursor& cursor, std::uint64_t end) {
        while (cursor.position() < end) {
            const Box box = read_box(cursor, end);
            read_content(cursor, box);
            cursor.seek(box.end);
        }
    }

    void finish() {
        if (any_colour_ && !known_colour_) throw kColourSpaceMethod;
        if (!boxes_.palette) return;
        if (boxes_.palette->channels.empty()) throw kInvalidFileHeader;
        for (const std::uint8_t column : boxes_.palette->channels) {
            if (column >= boxes_.palette->columns) throw kInvalidFileHeader;
        }
    }

  private:
    void read_content(Jpeg2000Cursor& cursor, const Box& box) {
        const bool counts = box.name == name("colr") || box.name == name("pclr") ||
                            box.name == name("cmap") || box.name == name("cdef");
        if (!counts) return;
        const std::uint64_t length = std::min(box.end - cursor.position(), kMostContent);
        const std::vector<std::uint8_t> content = cursor.bytes(static_cast<std::size_t>(length));
        const Jpeg2000Fields fields(content);
        if (box.name == name("colr")) read_colour(fields);
        if (box.name == name("pclr")) read_palette(fields);
        if (box.name == name("cmap")) read_mapping(fields);
        if (box.name == name("cdef")) read_definitions(fields);
    }

    // The first that can be shown counts. Profiles are not applied.
    void read_colour(Jpeg2000Fields fields) {
        constexpr std::uint8_t kEnumerated = 1, kRestrictedProfile = 2;
        any_colour_ = true;
        const std::uint8_t method = fields.u8();
        fields.u16();  // precedence, approximation
        if (known_colour_) return;
        if (method == kRestrictedProfile) known_colour_ = true;
        if (method != kEnumerated) return;
        switch (fields.u32()) {
            case 16:
                boxes_.colour = Jpeg2000Colour::kRgb;
                break;
            case 17:
                boxes_.colour = Jpeg2000Colour::kGrey;
                break;
            case 18:
                boxes_.colour = Jpeg2000Colour::kYcc;
                break;
            default:
                return;
        }
        known_colour_ = true;
    }

    Jpeg2000Palette& palette() {
        return boxes_.palette ? *boxes_.palette : boxes_.palette.emplace();
    }

    void read_palette(Jpeg2000Fields fields) {
        constexpr std::uint8_t kMostBits = 16;
        const std::size_t count = fields.u16();
        Jpeg2000Palette& target = palette();
        target.columns = fields.u8();
        if (count == 0 || target.columns == 0) throw kInvalidFileHeader;
        if (count > kColourTableSize || target.columns > 4) throw kUnsupportedFileType;
        std::vector<unsigned> bits;
        for (std::size_t i = 0; i < target.columns; ++i) bits.push_back(fields.u8() + 1U);
        // The highest bit means signed, which makes it too large as well.
        if (*std::max_element(bits.begin(), bits.end()) > kMostBits) throw kUnsupportedFileType;
        target.entries.clear();
        for (std::size_t i = 0; i < count * target.columns; ++i) {
            const unsigned column = bits[i % target.columns], most = (1U << column) - 1;
            const unsigned value = column > 8 ? fields.u16() : fields.u8();
            target.entries.push_back(
                static_cast<std::uint8_t>((std::min(value, most) * 255 + most / 2) / most));
        }
    }

    // Channels that are all columns for the samples of one component, as colour tables are.
    void read_mapping(Jpeg2000Fields fields) {
        constexpr std::uint8_t kThroughPalette = 1;
        Jpeg2000Palette& target = palette();
        target.channels.clear();
        while (fields.left() >= 4) {
            const std::uint16_t component = fields.u16();
            const bool first = target.channels.empty();
            if (first) target.component = component;
            if (component != target.component || fields.u8() != kThroughPalette)
                throw kUnsupportedFileType;
            target.channels.push_back(fields.u8());
        }
    }

    void read_definitions(Jpeg2000Fields fields) {
        for (std::uint16_t count = fields.u16(); count > 0; --count) {
            Jpeg2000Definition definition{};
            definition.channel = fields.u16();
            definition.type = fields.u16();
            definition.association = fields.u16();
            boxes_.definitions.push_back(definition);
        }
    }

    Jpeg2000Boxes& boxes_;
    bool any_colour_ = false;
    bool known_colour_ = false;
};

}  // namespace

bool is_jp2(const Jpeg2000FirstBytes& bytes) {
    constexpr Jpeg2000FirstBytes kSignature = {0,   0,   0,    12,   'j',  'P',
                                               ' ', ' ', 0x0D, 0x0A, 0x87, 0x0A};
    return bytes == kSignature;
}

bool is_jpeg2000_codestream(const Jpeg2000FirstBytes& bytes) {
    constexpr std::array<std::uint8_t, 4> kMarkers = {0xFF, 0x4F, 0xFF, 0x51};
    return std::equal(kMarkers.begin(), kMarkers.end(), bytes.begin());
}

std::uint64_t jpeg2000_file_end(const InputFile& file) {
    if (file.size() != InputFile::kUnknownSize) return static_cast<std::uint64_t>(file.size());
    return std::numeric_limits<std::int64_t>::max();
}

Jpeg2000Boxes read_jp2_boxes(InputFile& file) {
    const std::uint64_t end = jpeg2000_file_end(file);
    Jpeg2000Cursor cursor(file, kJpeg2000Signature, end);
    Jpeg2000Boxes boxes;
    Header header(boxes);
    for (;;) {
        const Box box = read_box(cursor, end);
        if (box.name == name("jp2h")) header.read(cursor, box.end);
        if (box.name == name("jp2c")) {
            header.finish();
            boxes.start = cursor.position();
            boxes.end = box.end;
            return boxes;
        }
        cursor.seek(box.end);
    }
}

}  // namespace zq
