// The common base of all file formats: the order in which a file is read and written, and the
// reading and writing of plain pixel lines. One handler object serves one call.
#pragma once

#include <cstdint>
#include <functional>
#include <optional>
#include <string>
#include <vector>

#include "files/input_file.h"
#include "files/output_file.h"
#include "files/pixel_format.h"
#include "files/write_job.h"
#include "image/image.h"

namespace zq {

// What a read tells about the file beside its pixels.
struct FileContents {
    std::string type_name;  // padded with blanks to 8 characters
    PixelFormat pixel_format;
    std::vector<std::uint32_t> colour_table;  // empty, or 256 entries 0xAARRGGBB
};

// Called once the file proved good and before the target changes; throwing refuses the read.
using Accept = std::function<void(const FileContents&)>;

class ImageFileHandler {
  public:
    ImageFileHandler(std::int32_t type_code, unsigned name_id)
        : type_code_(type_code), name_id_(name_id) {}
    virtual ~ImageFileHandler() = default;
    ImageFileHandler(const ImageFileHandler&) = delete;
    ImageFileHandler& operator=(const ImageFileHandler&) = delete;

    // Reads the file, positioned at its start, into the image. A file of another type is success
    // with `recognised` false. On failure the target is what it was, unless its pixels were read in
    // place (below) and the system failed in the middle of them.
    GRLIBError_enum read(InputFile& file, Image& target, const Accept& accept,
                         bool& recognised) noexcept;

    // On failure the path holds what it held before.
    GRLIBError_enum write(const char* path, const WriteJob& job) noexcept;

    // Padded with blanks to 8 characters.
    std::string type_name() const { return padded_type_name(name_id_); }
    std::int32_t type_code() const { return type_code_; }
    static std::string padded_type_name(unsigned name_id);

  protected:
    // What a header says of the pixels.
    struct Header {
        PixelFormat pixel_format = PixelFormat::kGrey8;
        PixelType type = PixelType::kU8;
        std::int32_t width = 0;
        std::int32_t height = 0;
        std::int32_t bits_per_pixel = 0;           // in the file
        std::int32_t bit_depth = 0;                // attribute of the image; 0: none
        std::optional<Calibration> calibration{};  // none: the target keeps its own

        // In the file; a broken byte at the end is cut off.
        std::size_t bytes_per_line() const;
    };

    // Reading, in this order. read_header fills header_; false: not a file of this type. The
    // calibration may also be filled later, in read_lines.
    virtual bool read_header() = 0;
    virtual void seek_to_data() {}
    virtual std::vector<std::uint32_t> read_colour_table() { return {}; }
    // Whether lines may be read straight into a target that already has the file's shape, because
    // nothing but a failing disk can stop them.
    virtual bool may_read_in_place() const { return false; }
    // The image has the header's type and size. Here and in write_lines: as many bytes a line as
    // the header says, top line first, nothing between lines, and nothing behind the last.
    virtual void read_lines(Image& image);

    // Writing, in this order. check_job throws for what the format cannot hold, before any file is
    // touched. The file is open from write_header on, and complete when write_end returns.
    virtual void check_job() const = 0;
    virtual void write_header() = 0;
    virtual void write_colour_table() {}
    virtual void write_lines();
    virtual void write_end() {}

    InputFile& input() const { return *input_; }
    OutputFile& output() { return *output_; }
    const WriteJob& job() const { return *job_; }
    const char* output_path() const { return output_path_; }  // as the caller gave it

    Header header_;

  private:
    bool read_steps(Image& target, const Accept& accept);
    void write_steps(const char* path);
    void read_pixels(Image& target, const Accept& accept, const FileContents& contents);
    void read_through_staging(Image& target, const Accept& accept, const FileContents& contents);
    void set_calibration(Image& target) const;

    std::int32_t type_code_;
    unsigned name_id_;
    InputFile* input_ = nullptr;
    const WriteJob* job_ = nullptr;
    const char* output_path_ = nullptr;
    std::optional<OutputFile> output_;
};

}  // namespace zq
