// Arrays of counted strings of the host.
#include "host/string_array.h"

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <utility>
#include <vector>

#include "base/checked.h"
#include "host/host_array.h"
#include "host/host_string.h"
#include "host/services.h"

namespace zq::host {
namespace {

constexpr std::size_t kCountBytes = sizeof(std::int32_t);
constexpr ElementType kHandleType =
    sizeof(ZqStringHandle) == 8 ? ElementType::kU64 : ElementType::kU32;

// Strings that nobody else has; disposed in the end.
class Strings {
  public:
    explicit Strings(std::size_t count) : handles_(count) {}
    ~Strings() {
        for (ZqStringHandle handle : handles_) {
            if (handle != nullptr) ds_dispose_handle(reinterpret_cast<ZqHandle>(handle));
        }
    }
    Strings(const Strings&) = delete;
    Strings& operator=(const Strings&) = delete;

    std::vector<ZqStringHandle>& handles() { return handles_; }

  private:
    std::vector<ZqStringHandle> handles_;
};

// The elements of an array; a count that exceeds the block is cut.
std::vector<ZqStringHandle> elements_of(ZqStringArrayHandle array) {
    if (array == nullptr || *array == nullptr) return {};
    const std::int32_t size = ds_get_handle_size(reinterpret_cast<ZqHandle>(array));
    if (size < static_cast<std::int32_t>(kCountBytes)) return {};
    const std::size_t room =
        (static_cast<std::size_t>(size) - kCountBytes) / sizeof(ZqStringHandle);
    const auto count = static_cast<std::size_t>(std::max((*array)->count, 0));
    std::vector<ZqStringHandle> elements(std::min(count, room));
    const auto* block = reinterpret_cast<const std::uint8_t*>(*array);
    if (!elements.empty()) {
        std::memcpy(elements.data(), block + kCountBytes, elements.size() * sizeof elements[0]);
    }
    return elements;
}

}  // namespace

void set_string_array(ZqStringArrayHandle* target, std::span<const std::string_view> texts) {
    if (target == nullptr) throw kNullPointer;
    const auto count = checked_narrow<std::int32_t>(texts.size());
    Strings strings(texts.size());
    std::vector<ZqStringHandle>& fresh = strings.handles();
    for (std::size_t i = 0; i < texts.size(); ++i) set_string(&fresh[i], texts[i]);

    std::vector<ZqStringHandle> old = elements_of(*target);
    ZqHandle handle = reinterpret_cast<ZqHandle>(*target);
    std::uint8_t* block = resize_array(kHandleType, 1, &handle, texts.size());
    std::memcpy(block, &count, kCountBytes);
    if (count > 0) {
        std::memcpy(block + kCountBytes, fresh.data(), fresh.size() * sizeof fresh[0]);
    }
    *target = reinterpret_cast<ZqStringArrayHandle>(handle);
    fresh.swap(old);
}

}  // namespace zq::host
