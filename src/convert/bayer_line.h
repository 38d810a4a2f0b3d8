// Tables that are clipped lines, which need not be looked up.
#pragma once

#include <cstdint>
#include <optional>
#include <span>

namespace zq {

// A gain with which entry i is min(255, i * gain >> shift) << place for every i, or nothing when no
// gain below 4096 does that. Takes 256 entries and a shift of 8 to 10, or 65,536 entries and one of
// 11 to 18.
std::optional<std::uint32_t> gain_of_line(std::span<const std::uint32_t> table, int shift,
                                          int place);

}  // namespace zq
