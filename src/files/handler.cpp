// The common steps of reading and writing.
#include "files/handler.h"

#include <array>

#include "base/checked.h"
#include "files/code_of.h"
#include "platform/string_resource.h"

namespace zq {

namespace {

constexpr std::size_t kTypeNameLength = 8;

void check_colour_table(const WriteJob& job) {
    const std::size_t count = job.colour_table.size();
    if (count == 0) return;
    if (count != kColourTableSize) throw kPaletteSize;
    if (job.pixels.type != PixelType::kU8) throw kPaletteNeeds8Bit;
}

}  // namespace

std::string ImageFileHandler::padded_type_name(unsigned name_id) {
    std::array<char, kTypeNameLength + 1> text{};
    platform::load_string(nullptr, name_id, text.data(), text.size());
    std::string name(text.data());
    name.resize(kTypeNameLength, ' ');
    return name;
}

std::size_t ImageFileHandler::Header::bytes_per_line() const {
    const auto bits =
        static_cast<std::uint64_t>(bits_per_pixel) * static_cast<std::uint64_t>(width);
    return checked_narrow<std::size_t>(bits / 8);
}

GRLIBError_enum ImageFileHandler::read(InputFile& file, Image& target, const Accept& accept,
                                       bool& recognised) noexcept {
    input_ = &file;
    recognised = false;
    return code_of([&] { recognised = read_steps(target, accept); });
}

bool ImageFileHandler::read_steps(Image& target, const Accept& accept) {
    if (!read_header()) return false;
    seek_to_data();
    read_pixels(target, accept, {type_name(), header_.pixel_format, read_colour_table()});
    set_calibration(target);
    return true;
}

void ImageFileHandler::read_pixels(Image& target, const Accept& accept,
                                   const FileContents& contents) {
    const Extent shape{header_.type, header_.width, header_.height, target.extent().border};
    if (!may_read_in_place() || shape != target.extent()) {
        read_through_staging(target, accept, contents);
        return;
    }
    accept(contents);
    read_lines(target);
    target.set_bit_depth(header_.bit_depth);
    target.set_sample_offset(0);
}

void ImageFileHandler::set_calibration(Image& target) const {
    if (!header_.calibration) return;
    target.record().unit = header_.calibration->unit;
    target.record().xStep = header_.calibration->x_step;
    target.record().yStep = header_.calibration->y_step;
}

void ImageFileHandler::read_through_staging(Image& target, const Accept& accept,
                                            const FileContents& contents) {
    Image staging(Variant::kPrivate, {});
    staging.reinitialise({.type = static_cast<std::int32_t>(header_.type),
                          .width = header_.width,
                          .height = header_.height,
                          .border = target.extent().border});
    read_lines(staging);
    staging.set_bit_depth(header_.bit_depth);
    accept(contents);
    target.adopt(staging);
}

void ImageFileHandler::read_lines(Image& image) {
    const auto rows = static_cast<std::size_t>(image.record().height);
    input().read_rows({image.row(0), image.row_stride(), header_.bytes_per_line(), rows});
}

GRLIBError_enum ImageFileHandler::write(const char* path, const WriteJob& job) noexcept {
    job_ = &job;
    output_path_ = path;
    const GRLIBError_enum code = code_of([&] { write_steps(path); });
    output_.reset();
    return code;
}

void ImageFileHandler::write_steps(const char* path) {
    check_colour_table(job());
    check_job();
    output_.emplace(path);
    write_header();
    write_colour_table();
    write_lines();
    write_end();
    output_->commit();
}

void ImageFileHandler::write_lines() {
    const PixelView& pixels = job().pixels;
    const auto rows = static_cast<std::size_t>(pixels.height);
    output_->write_rows({pixels.first, pixels.stride, header_.bytes_per_line(), rows});
}

}  // namespace zq
