// Reads an input as an image file and checks what must hold whatever its bytes are.
#pragma once

#include <sys/mman.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <string>
#include <vector>

#include "files/image_files.h"

namespace zqfuzz {

inline void require(bool holds, const char* what) {
    if (holds) return;
    std::fprintf(stderr, "broken: %s\n", what);
    std::abort();
}

// A file in memory that has a path.
class MemoryFile {
  public:
    MemoryFile() : file_(memfd_create("fuzz", 0)), path_("/proc/self/fd/" + std::to_string(file_)) {
        require(file_ >= 0, "a file in memory");
    }
    ~MemoryFile() { close(file_); }
    MemoryFile(const MemoryFile&) = delete;
    MemoryFile& operator=(const MemoryFile&) = delete;

    void store(const std::uint8_t* bytes, std::size_t size) const {
        require(ftruncate(file_, 0) == 0, "ftruncate");
        require(pwrite(file_, bytes, size, 0) == static_cast<ssize_t>(size), "pwrite");
    }
    const char* path() const { return path_.c_str(); }

  private:
    int file_;
    std::string path_;
};

inline std::string state_of(const zq::Image& image) {
    const zq::ImageRecord& record = image.record();
    std::string state = std::to_string(record.type) + ' ' + std::to_string(record.width) + ' ' +
                        std::to_string(record.height) + ' ' + std::to_string(image.bit_depth()) +
                        ' ' + std::to_string(image.sample_offset()) + ' ';
    const auto line = static_cast<std::size_t>(record.width) *
                      static_cast<std::size_t>(zq::bytes_per_pixel(image.type()));
    for (std::int32_t y = 0; y < record.height; ++y) {
        state.append(reinterpret_cast<const char*>(image.row(y)), line);
    }
    return state;
}

// How a target reads a file into an image.
using Reader = void (*)(const char* path, zq::Image& target, const zq::Accept& accept);

inline void read_any(const char* path, zq::Image& target, const zq::Accept& accept) {
    if (!zq::read_file(path, target, nullptr, accept)) throw kUnsupportedFileType;
}

inline GRLIBError_enum read(Reader reader, const char* path, zq::Image& target,
                            zq::FileContents& contents) {
    try {
        reader(path, target, [&](const zq::FileContents& c) { contents = c; });
        return kSuccess;
    } catch (GRLIBError_enum code) {
        return code;
    }
}

inline void check_contents(const zq::FileContents& contents, const zq::Image& image) {
    const auto format = static_cast<std::int32_t>(contents.pixel_format);
    require(format >= 0 && format <= 19, "a known pixel format");
    const std::size_t entries = contents.colour_table.size();
    require(entries == 0 || (entries == 256 && image.type() == zq::PixelType::kU8),
            "a whole colour table for indices only");
    require(image.bit_depth() == 0 || (image.bit_depth() >= 8 && image.bit_depth() <= 16),
            "a valid bit depth");
}

// Once into another shape, then into the shape that came out of it.
inline void read_target(const std::uint8_t* bytes, std::size_t size, Reader reader = read_any) {
    static const MemoryFile file;
    file.store(bytes, size);
    zq::Image target(zq::Variant::kPrivate, {});
    target.reinitialise({.type = 2, .width = 3, .height = 2, .border = 1});
    std::fill_n(target.row(0), 12, std::uint8_t{1});
    std::fill_n(target.row(1), 12, std::uint8_t{2});
    const std::string before = state_of(target);

    zq::FileContents contents;
    const GRLIBError_enum code = read(reader, file.path(), target, contents);
    if (code != kSuccess) {
        constexpr std::array known = {kNotEnoughMemory,     kInvalidFileHeader, kFileIo,
                                      kUnsupportedFileType, kUnableToReadData,  kColourSpaceMethod,
                                      kMoreThanOneLayer,    kInvalidParameter};
        require(std::find(known.begin(), known.end(), code) != known.end(), "a known code");
        require(state_of(target) == before, "a target left alone");
        return;
    }
    check_contents(contents, target);
    require(target.extent().border == 1, "the target's border");
    // A few bytes may make a large blank picture; the time is better spent on others.
    constexpr std::int64_t kLarge = std::int64_t{1} << 22;
    if (std::int64_t{target.extent().width} * target.extent().height > kLarge) return;
    const std::string first = state_of(target);
    require(read(reader, file.path(), target, contents) == kSuccess, "the same result again");
    require(state_of(target) == first, "the same pixels again");
}

}  // namespace zqfuzz
