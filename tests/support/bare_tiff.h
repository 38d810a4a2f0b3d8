// TIFF files put together and taken apart byte by byte, without libtiff.
#pragma once

#include <cstdint>
#include <map>
#include <string>
#include <vector>

namespace zqtest {

enum TiffType : uint16_t { kTiffText = 2, kTiffShort = 3, kTiffLong = 4, kTiffRational = 5 };

struct BareTiff {
    struct Field {
        uint16_t type = kTiffShort;
        std::vector<uint32_t> values;  // two for each rational
    };

    bool big_endian = false;
    bool tiled = false;
    std::map<uint16_t, Field> fields;  // those that say where the strips or tiles lie are made
    std::vector<std::string> strips;

    std::string number(uint32_t value, size_t bytes) const {
        std::string text;
        for (size_t i = 0; i < bytes; ++i) {
            const size_t shift = 8 * (big_endian ? bytes - 1 - i : i);
            text += static_cast<char>(value >> shift);
        }
        return text;
    }

    std::string values(const Field& field) const {
        constexpr size_t kBytes[] = {0, 1, 1, 2, 4, 4};
        std::string text;
        for (const uint32_t value : field.values) text += number(value, kBytes[field.type]);
        return text;
    }

    // The strips, the directory, and what its entries point to.
    std::string bytes() const {
        std::map<uint16_t, Field> all = fields;
        std::string pixels;
        Field offsets{kTiffLong, {}}, counts{kTiffLong, {}};
        for (const std::string& strip : strips) {
            offsets.values.push_back(static_cast<uint32_t>(8 + pixels.size()));
            counts.values.push_back(static_cast<uint32_t>(strip.size()));
            pixels += strip;
        }
        all.emplace(static_cast<uint16_t>(tiled ? 324 : 273), offsets);
        all.emplace(static_cast<uint16_t>(tiled ? 325 : 279), counts);
        pixels += std::string(pixels.size() % 2, '\0');
        const size_t start = 8 + pixels.size();
        std::string directory = number(static_cast<uint32_t>(all.size()), 2), behind;
        for (const auto& [tag, field] : all) {
            const size_t count = field.values.size() / (field.type == kTiffRational ? 2 : 1);
            std::string value = values(field);
            if (value.size() > 4) {
                const size_t at = start + 2 + 12 * all.size() + 4 + behind.size();
                behind += value + std::string(value.size() % 2, '\0');
                value = number(static_cast<uint32_t>(at), 4);
            }
            value.resize(4, '\0');
            directory += number(tag, 2) + number(field.type, 2) +
                         number(static_cast<uint32_t>(count), 4) + value;
        }
        return (big_endian ? "MM" : "II") + number(42, 2) +
               number(static_cast<uint32_t>(start), 4) + pixels + directory + number(0, 4) + behind;
    }
};

// A little-endian file of one page.
inline BareTiff parse_tiff(const std::string& file) {
    BareTiff tiff;
    const auto number = [&file](size_t at, size_t bytes) {
        uint32_t value = 0;
        for (size_t i = bytes; i-- > 0;) value = value << 8 | static_cast<uint8_t>(file.at(at + i));
        return value;
    };
    const size_t start = number(4, 4);
    for (size_t entry = start + 2; entry < start + 2 + 12 * number(start, 2); entry += 12) {
        BareTiff::Field field{static_cast<uint16_t>(number(entry + 2, 2)), {}};
        const bool wide = field.type == kTiffLong || field.type == kTiffRational;
        const size_t bytes = wide ? 4 : field.type == kTiffShort ? 2 : 1;
        const size_t count = number(entry + 4, 4) * (field.type == kTiffRational ? 2 : 1);
        const size_t at = count * bytes > 4 ? number(entry + 8, 4) : entry + 8;
        for (size_t i = 0; i < count; ++i) field.values.push_back(number(at + i * bytes, bytes));
        tiff.fields[static_cast<uint16_t>(number(entry, 2))] = field;
    }
    const auto& offsets = tiff.fields[273].values;
    for (size_t i = 0; i < offsets.size(); ++i)
        tiff.strips.push_back(file.substr(offsets[i], tiff.fields[279].values.at(i)));
    return tiff;
}

inline BareTiff bare_tiff(uint32_t width, uint32_t height, uint32_t photometric,
                          const std::vector<uint32_t>& bits) {
    BareTiff file;
    file.fields = {{256, {kTiffLong, {width}}},
                   {257, {kTiffLong, {height}}},
                   {258, {kTiffShort, bits}},
                   {262, {kTiffShort, {photometric}}},
                   {277, {kTiffShort, {static_cast<uint32_t>(bits.size())}}}};
    return file;
}

// Samples as a file of that byte order packs them; those of odd sizes from the highest bit on.
inline std::string packed(const BareTiff& file, const std::vector<uint32_t>& samples,
                          uint32_t bits) {
    std::string row;
    uint32_t held = 0, buffer = 0;
    for (const uint32_t sample : samples) {
        if (bits % 8 == 0) {
            row += file.number(sample, bits / 8);
            continue;
        }
        for (uint32_t bit = bits; bit-- > 0;) {
            buffer = buffer << 1 | (sample >> bit & 1);
            if (++held % 8 == 0) row += static_cast<char>(buffer);
        }
    }
    if (held % 8 != 0) row += static_cast<char>(buffer << (8 - held % 8));
    return row;
}

// Cuts a picture into blocks, row after row of them, plane after plane.
inline void store_blocks(BareTiff& file, const std::vector<uint32_t>& samples, uint32_t block_width,
                         uint32_t block_height, bool separate) {
    const uint32_t width = file.fields[256].values[0], height = file.fields[257].values[0];
    const auto bits = file.fields[258].values[0];
    const auto each = static_cast<uint32_t>(file.fields[258].values.size());
    for (uint32_t plane = 0; plane < (separate ? each : 1); ++plane) {
        for (uint32_t top = 0; top < height; top += block_height) {
            for (uint32_t left = 0; left < width; left += block_width) {
                std::string block;
                for (uint32_t y = top; y < top + block_height; ++y) {
                    if (y >= height && !file.tiled) break;
                    std::vector<uint32_t> line;
                    for (uint32_t x = left; x < left + block_width; ++x) {
                        for (uint32_t c = 0; c < each; ++c) {
                            if (separate && c != plane) continue;
                            const bool inside = x < width && y < height;
                            line.push_back(inside ? samples[(y * width + x) * each + c] : 0);
                        }
                    }
                    block += packed(file, line, bits);
                }
                file.strips.push_back(block);
            }
        }
    }
}

inline BareTiff with_strip(BareTiff file, uint32_t compression, const std::string& strip) {
    file.fields[259].values = {compression};
    file.strips = {strip};
    return file;
}

inline BareTiff with_field(BareTiff file, uint16_t tag, const std::vector<uint32_t>& values) {
    file.fields[tag].values = values;
    return file;
}

}  // namespace zqtest
