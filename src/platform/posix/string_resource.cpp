// The string table, compiled in, sorted by id.
#include "platform/string_resource.h"

#include <algorithm>
#include <string_view>

namespace zq::platform {
namespace {

struct TableString {
    unsigned id;
    std::string_view text;
};

constexpr TableString kTable[] = {
#define ZQ_STRING(id, text) {id, text},
#include "base/string_table.def"
#undef ZQ_STRING
};

static_assert(std::ranges::adjacent_find(kTable, std::ranges::greater_equal{}, &TableString::id) ==
                  std::ranges::end(kTable),
              "ids ascend, each stands once");

std::string_view find_string(unsigned id) {
    const auto* found = std::ranges::lower_bound(kTable, id, {}, &TableString::id);
    const bool exists = found != std::ranges::end(kTable) && found->id == id;
    return exists ? found->text : std::string_view{};
}

}  // namespace

std::size_t load_string(ModuleHandle module, unsigned id, char* text, std::size_t capacity) {
    if (capacity == 0) return 0;
    const std::string_view found = module == nullptr ? find_string(id) : std::string_view{};
    const std::size_t length = found.copy(text, capacity - 1);
    text[length] = '\0';
    return length;
}

}  // namespace zq::platform
