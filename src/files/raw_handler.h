// Files without a header, read by the caller's parameters in the size of the target.
#pragma once

#include "files/handler.h"
#include "files/raw_layout.h"

namespace zq {

class RawFileHandler final : public ImageFileHandler {
  public:
    // Refuses later, when it reads: kIncompatibleImageSize for a target without pixels, and what
    // raw_layout throws.
    RawFileHandler(const ZqRawParameters& parameters, const Extent& target)
        : ImageFileHandler(kCode, kNameId), parameters_(parameters), target_(target) {}

  protected:
    bool read_header() override;
    void seek_to_data() override;
    void read_lines(Image& image) override;
    void check_job() const override { throw kUnsupportedFileType; }
    void write_header() override {}

  private:
    static constexpr std::int32_t kCode = 5;
    static constexpr unsigned kNameId = 207;

    std::size_t line_bytes() const;
    std::size_t stride() const;
    std::uint64_t plane_bytes() const;
    void read_planes(Image& image);

    ZqRawParameters parameters_;
    Extent target_;
    RawLayout layout_;
};

}  // namespace zq
