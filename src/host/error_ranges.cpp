// Registered ranges of error codes.
#include "host/error_ranges.h"

#include <algorithm>
#include <map>
#include <mutex>

#include "base/error_codes.h"
#include "platform/mutex.h"
#include "platform/string_resource.h"

namespace zq::host {
namespace {

constexpr std::int64_t kLastStringId = 65535;

std::size_t load_by_procedure(const TextSource& source, std::int64_t id, char* text,
                              std::size_t capacity) {
    const std::int32_t length = source.procedure(source.argument, static_cast<std::int32_t>(id),
                                                 text, static_cast<std::int32_t>(capacity));
    const std::size_t kept = std::min(static_cast<std::size_t>(std::max(length, 0)), capacity - 1);
    text[kept] = '\0';
    return kept;
}

class RangeMap {
  public:
    static RangeMap& instance() {
        static RangeMap map;
        return map;
    }

    void add(const ErrorRange& range) {
        const std::lock_guard lock(mutex_);
        const auto next = ranges_.lower_bound(range.first);
        if (next != ranges_.end() && next->second.first <= range.last) throw kInvalidParameter;
        ranges_.emplace(range.last, range);
    }

    std::optional<ErrorRange> find(std::int32_t code) {
        const std::lock_guard lock(mutex_);
        const auto range = ranges_.lower_bound(code);
        if (range == ranges_.end() || range->second.first > code) return std::nullopt;
        return range->second;
    }

  private:
    RangeMap() {
        ranges_.emplace(kLastCode, ErrorRange{.first = kFirstCode,
                                              .last = kLastCode,
                                              .first_message_id = kFirstMessageId,
                                              .source = {}});
    }

    platform::Mutex mutex_;
    std::map<std::int32_t, ErrorRange> ranges_;  // by last code
};

}  // namespace

std::size_t TextSource::load(std::int64_t id, char* text, std::size_t capacity) const {
    text[0] = '\0';
    if (id < 1 || id > kLastStringId) return 0;
    if (procedure != nullptr) return load_by_procedure(*this, id, text, capacity);
    return platform::load_string(module, static_cast<unsigned>(id), text, capacity);
}

void register_error_range(const ErrorRange& range) {
    const std::int64_t last_id =
        std::int64_t{range.first_message_id} + range.last - std::int64_t{range.first};
    if (range.last < range.first || range.first_message_id < 1 || last_id > kLastStringId) {
        throw kInvalidParameter;
    }
    RangeMap::instance().add(range);
}

std::optional<ErrorRange> find_error_range(std::int32_t code) {
    return RangeMap::instance().find(code);
}

}  // namespace zq::host
