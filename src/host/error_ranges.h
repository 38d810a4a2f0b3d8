// Which table holds the texts of an error code: the ranges of codes that this library and its
// siblings registered.
#pragma once

#include <zqvissvc/errors.h>

#include <cstddef>
#include <cstdint>
#include <optional>

#include "platform/module.h"

namespace zq::host {

inline constexpr std::int32_t kFirstCode = -1074396160;
inline constexpr std::int32_t kLastCode = -1074395138;
inline constexpr std::int32_t kFirstMessageId = 50001;
inline constexpr std::int32_t kSuccessMessageId = 50000;
inline constexpr std::int32_t kUnknownErrorId = 2;

// Where texts come from: a module's string table, or a procedure of the sibling library.
struct TextSource {
    platform::ModuleHandle module = nullptr;  // null: this library's own table
    ZqLoadTextProc procedure = nullptr;       // goes before the module
    void* argument = nullptr;

    // At most capacity - 1 bytes and a terminator; returns the length, 0 when there is no such
    // text.
    std::size_t load(std::int64_t id, char* text, std::size_t capacity) const;
};

struct ErrorRange {
    std::int32_t first = 0;
    std::int32_t last = 0;
    std::int32_t first_message_id = 0;
    TextSource source;
};

// Throws kInvalidParameter when the range is reversed, has ids out of the range of string tables,
// or overlaps one that is registered. Safe against concurrent look-ups.
void register_error_range(const ErrorRange& range);

// The registered range that holds the code.
std::optional<ErrorRange> find_error_range(std::int32_t code);

}  // namespace zq::host
