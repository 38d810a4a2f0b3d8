// A device context and window in memory, with the semantics of the system's.
#pragma once

#include <memory>
#include <vector>

#include "platform/device_context.h"

namespace zq {

class Canvas final : public DeviceContext {
  public:
    // Throws kInvalidParameter for a side outside 1 to kLargestSide.
    Canvas(std::int32_t width, std::int32_t height);

    static constexpr std::int32_t kLargestSide = 32767;

    // Canvases that callers hold: each handle is checked against the living ones. open throws as
    // the constructor, close throws kNotAnObject, find returns null.
    static void* open(std::int32_t width, std::int32_t height);
    static void close(void* handle);
    static Canvas* find(void* handle);

    std::uint32_t* pixels() { return pixels_.data(); }
    Box bounds() const { return {0, 0, width_, height_}; }
    void set_clip(const Box& device) { clip_ = {intersect(device, bounds())}; }

    Mapping mapping() override { return mapping_; }
    void set_mapping(const Mapping& mapping) override { mapping_ = mapping; }
    Box clip_box() override;
    Box to_logical(const Box& device) override;
    Box to_device(const Box& logical) override;
    void exclude_clip(const Box& device) override;
    void include_clip(const Box& device) override;
    void set_stretching() override {}  // there is no other way
    void stretch(const Dib& dib, const Box& source, const Box& destination) override;
    std::vector<std::int32_t> rows_to_stretch(const Box& source, const Box& destination,
                                              bool bottom_up) override;
    bool fill(const Box& device, const Brush& brush) override;
    std::uint32_t button_face() override { return 0xF0F0F0; }

  private:
    std::uint32_t* row(std::int32_t y) {
        return pixels_.data() + static_cast<std::ptrdiff_t>(y) * width_;
    }

    std::int32_t width_;
    std::int32_t height_;
    std::vector<std::uint32_t> pixels_;
    std::vector<Box> clip_;  // disjoint, inside the bounds
    Mapping mapping_;
};

}  // namespace zq
