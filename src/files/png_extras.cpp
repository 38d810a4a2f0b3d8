// A walk over chunks. Most are passed over unread; nothing is kept that the file's own bytes do not
// explain.
#include "files/png_extras.h"

#include <zlib.h>

#include <algorithm>
#include <array>
#include <limits>
#include <string_view>

#include "base/byte_order.h"
#include "base/error_codes.h"
#include "files/png_chunks.h"
#include "files/png_texts.h"

namespace zq {

namespace {

using Bytes = std::span<const std::uint8_t>;

constexpr std::string_view kPixelsPerUnitChunk = "pHYs";
constexpr std::size_t kChunkHead = 8;  // length and name
constexpr std::size_t kCheckSum = 4;
constexpr std::uint32_t kLongestChunk = 0x7FFFFFFF;
// A single chunk from a file whose size nobody knows.
constexpr std::uint32_t kMostUnknown = 8'000'000;
// All deflated texts of a file together: kilobytes in real files.
constexpr std::size_t kMostInflatedText = std::size_t{4} << 20;

class Walk {
  public:
    Walk(InputFile& file, PngVision* vision) : file_(file), vision_(vision) {}

    PngExtras run() {
        while (step()) {
        }
        if (!extras_.calibration && pixels_per_unit_) {
            extras_.calibration = calibration_of(*pixels_per_unit_);
        }
        return extras_;
    }

  private:
    struct Kind {
        std::string_view name;
        bool is_private;                  // stands between header and picture, once
        bool is_vision;                   // of no use to a read that wants the picture alone
        bool (Walk::*take)(Bytes chunk);  // false: not well-formed
    };
    static const std::array<Kind, 9> kKinds;

    // False at the end.
    bool step();
    void skip(std::uint64_t count);
    bool fits(std::uint32_t length) const;
    const Kind* kind_of(std::string_view name) const;
    bool is_wanted(const Kind& kind) const;
    void read(const Kind& kind, std::uint32_t length);

    bool take_pixels_per_unit(Bytes chunk);
    bool take_pixel_size(Bytes chunk);
    bool take_sample_offset(Bytes chunk);
    bool take_significant_bits(Bytes chunk);
    bool take_timing(Bytes chunk) { return keep(chunk, vision_->timing); }
    bool take_objects(Bytes chunk) { return keep(chunk, vision_->objects); }
    bool take_private_objects(Bytes chunk) { return keep(chunk, vision_->private_objects); }
    bool take_text(Bytes chunk) { return keep(parse_text(chunk)); }
    bool take_deflated_text(Bytes chunk);
    static bool keep(Bytes chunk, std::vector<std::uint8_t>& payload);
    bool keep(std::optional<PngText> text);

    InputFile& file_;
    PngVision* vision_;
    PngExtras extras_;
    std::optional<PixelsPerUnit> pixels_per_unit_;
    std::uint64_t at_ = kPngSignatureBytes;  // where the next chunk starts
    bool behind_header_ = false;
    bool behind_picture_ = false;
    std::array<bool, 9> present_{};
    std::size_t text_room_ = kMostInflatedText;
};

constinit const std::array<Walk::Kind, 9> Walk::kKinds = {{
    {kPixelsPerUnitChunk, false, false, &Walk::take_pixels_per_unit},
    {kPixelSizeChunk, true, false, &Walk::take_pixel_size},
    {kSampleOffsetChunk, true, false, &Walk::take_sample_offset},
    {kSignificantBitsChunk, true, false, &Walk::take_significant_bits},
    {kTimingChunk, true, true, &Walk::take_timing},
    {kObjectsChunk, true, true, &Walk::take_objects},
    {kPrivateObjectsChunk, true, true, &Walk::take_private_objects},
    {kTextChunk, false, true, &Walk::take_text},
    {kDeflatedTextChunk, false, true, &Walk::take_deflated_text},
}};

bool Walk::step() {
    std::array<std::uint8_t, kChunkHead> head{};
    if (file_.read_some(head.data(), head.size()) != head.size()) return false;
    const std::uint32_t length = load_be32(head.data());
    const std::string_view name(reinterpret_cast<const char*>(&head[4]), 4);
    if (length > kLongestChunk || name == "IEND") return false;
    if (name == "IDAT") {
        if (vision_ == nullptr) return false;
        behind_picture_ = true;
    }
    if (!fits(length)) return false;
    const std::uint64_t next = at_ + kChunkHead + length + kCheckSum;
    const Kind* kind = kind_of(name);
    if (kind != nullptr && kind->is_private && !behind_header_) throw kInvalidFileHeader;
    if (name == "IHDR") behind_header_ = true;
    if (kind != nullptr && is_wanted(*kind)) {
        read(*kind, length);
    } else {
        skip(std::uint64_t{length} + kCheckSum);
    }
    at_ = next;
    return true;
}

bool Walk::fits(std::uint32_t length) const {
    if (file_.size() == InputFile::kUnknownSize) return length <= kMostUnknown;
    const std::uint64_t end = at_ + kChunkHead + length + kCheckSum;
    return end <= static_cast<std::uint64_t>(file_.size()) &&
           end <= static_cast<std::uint64_t>(std::numeric_limits<long>::max());
}

// What lies in the stream's buffer is read over: a seek may throw the buffer away.
void Walk::skip(std::uint64_t count) {
    std::array<std::uint8_t, 4096> passed;
    if (count > kStreamBuffer) {
        file_.seek(at_ + kChunkHead + count);
        return;
    }
    while (count > 0) {
        const auto part = static_cast<std::size_t>(std::min<std::uint64_t>(count, passed.size()));
        if (file_.read_some(passed.data(), part) != part) return;
        count -= part;
    }
}

const Walk::Kind* Walk::kind_of(std::string_view name) const {
    const auto* const found = std::find_if(kKinds.begin(), kKinds.end(),
                                           [name](const Kind& kind) { return kind.name == name; });
    return found == kKinds.end() ? nullptr : found;
}

bool Walk::is_wanted(const Kind& kind) const {
    if (kind.is_vision) {
        if (vision_ == nullptr) return false;
        if (!kind.is_private) return true;
    }
    return !behind_picture_ && !present_[static_cast<std::size_t>(&kind - kKinds.data())];
}

void Walk::read(const Kind& kind, std::uint32_t length) {
    std::vector<std::uint8_t> chunk(length + kCheckSum);
    if (file_.read_some(chunk.data(), chunk.size()) != chunk.size()) return;
    const std::uint32_t stated = load_be32(&chunk[length]);
    uLong sum = crc32(0, reinterpret_cast<const Bytef*>(kind.name.data()), 4);
    sum = crc32(sum, chunk.data(), length);
    if (sum != stated) return;
    const bool taken = (this->*kind.take)(Bytes(chunk).first(length));
    if (taken) present_[static_cast<std::size_t>(&kind - kKinds.data())] = true;
}

bool Walk::take_pixels_per_unit(Bytes chunk) {
    pixels_per_unit_ = parse_pixels_per_unit(chunk);
    return pixels_per_unit_.has_value();
}

// Says more exactly what the standard chunk in front of it says, and nothing without it.
bool Walk::take_pixel_size(Bytes chunk) {
    if (!pixels_per_unit_) return false;
    extras_.calibration = parse_pixel_size(chunk);
    return extras_.calibration.has_value();
}

bool Walk::take_sample_offset(Bytes chunk) {
    extras_.sample_offset = parse_sample_offset(chunk);
    return extras_.sample_offset.has_value();
}

bool Walk::take_significant_bits(Bytes chunk) {
    extras_.significant_bits = parse_significant_bits(chunk);
    return extras_.significant_bits.has_value();
}

bool Walk::take_deflated_text(Bytes chunk) {
    std::optional<PngText> text = parse_deflated_text(chunk, text_room_);
    // One that fails may have been inflated a long way: many of them must not add up.
    text_room_ -= text ? text->text.size() : text_room_ / 2;
    return keep(std::move(text));
}

bool Walk::keep(Bytes chunk, std::vector<std::uint8_t>& payload) {
    std::optional<std::vector<std::uint8_t>> parsed = parse_payload(chunk);
    if (parsed) payload = std::move(*parsed);
    return parsed.has_value();
}

// The first version counts, as the first of any text does.
bool Walk::keep(std::optional<PngText> text) {
    if (!text) return false;
    if (text->keyword != kVersionKeyword) {
        vision_->texts.push_back(std::move(*text));
    } else if (vision_->version.empty()) {
        vision_->version = std::move(text->text);
    }
    return true;
}

}  // namespace

PngExtras read_png_extras(InputFile& file, PngVision* vision) {
    PngExtras extras = Walk(file, vision).run();
    file.seek(kPngSignatureBytes);
    return extras;
}

}  // namespace zq
