// The list of file formats. Its order is the probing order.
#pragma once

#include <cstdint>
#include <memory>
#include <span>
#include <string_view>

#include "files/handler.h"

namespace zq {

struct HandlerEntry {
    std::int32_t code;
    unsigned name_id;  // string-table id of the type name
    std::unique_ptr<ImageFileHandler> (*make)(const HandlerEntry& entry);
    bool probed;  // takes part in finding out what a file is
    bool writable;
};

std::span<const HandlerEntry> handlers();

// Handlers that can write; null when there is none.
std::unique_ptr<ImageFileHandler> make_writer(std::int32_t code);
// Leading white space is skipped, at most 8 characters count, letter case does not.
std::unique_ptr<ImageFileHandler> make_writer(std::string_view type_name);

}  // namespace zq
