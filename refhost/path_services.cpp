// Text and path services. A path is a heap object that holds its text, with '/' between its parts.
#include <zqvissvc/host.h>

#include <algorithm>
#include <cstring>
#include <memory>
#include <string>
#include <unordered_map>
#include <utility>

#include "account.h"
#include "refhost.h"
#include "service.h"

namespace refhost {
namespace {

struct Path {
    std::string text;
    bool reported = false;
};

// The paths that clients hold, by the address they know them under. Never destroyed, like the heap.
using Paths = std::unordered_map<const void*, std::unique_ptr<Path>>;
Paths& paths() {
    static auto* all = new Paths;
    return *all;
}

Path* find(ZqPath path) {
    const auto found = paths().find(path);
    return found == paths().end() ? nullptr : found->second.get();
}

ZqPath make(std::string text) {
    auto made = std::make_unique<Path>(Path{std::move(text)});
    ZqPath path = made.get();
    paths()[path] = std::move(made);
    return path;
}

int32_t text_to_path(const char* text, int32_t length, ZqPath* path) {
    if (text == nullptr || length < 0 || path == nullptr) return kBadArgument;
    std::string copy(text, static_cast<size_t>(length));
    if (*path == nullptr) {
        *path = make(std::move(copy));
        return kOk;
    }
    Path* target = find(*path);
    if (target == nullptr) return kBadArgument;
    target->text = std::move(copy);
    return kOk;
}

ZqPath empty_path(ZqPath path) {
    if (path == nullptr) return make("");
    Path* target = find(path);
    if (target == nullptr) return nullptr;
    target->text.clear();
    return path;
}

int32_t add_path(ZqPath base, ZqPath relative, ZqPath result) {
    const Path* front = find(base);
    const Path* back = find(relative);
    Path* target = find(result);
    if (front == nullptr || back == nullptr || target == nullptr) return kBadArgument;
    const bool separate = !front->text.empty() && !back->text.empty() && front->text.back() != '/';
    target->text = front->text + (separate ? "/" : "") + back->text;
    return kOk;
}

int32_t count_string(const char* text, uint8_t* counted) {
    constexpr size_t kMaxLength = 255;
    if (text == nullptr || counted == nullptr) return kBadArgument;
    const size_t length = std::min(std::strlen(text), kMaxLength);
    counted[0] = static_cast<uint8_t>(length);
    std::copy_n(text, length, counted + 1);
    return kOk;
}

}  // namespace

size_t take_unreported_paths() {
    size_t count = 0;
    for (auto& [address, path] : paths())
        if (!std::exchange(path->reported, true)) ++count;
    return count;
}

std::optional<std::string> path_text(ZqPath path) {
    const std::lock_guard lock(host_mutex());
    const Path* found = find(path);
    if (found == nullptr) return std::nullopt;
    return found->text;
}

bool dispose_path(ZqPath path) {
    const std::lock_guard lock(host_mutex());
    return paths().erase(path) == 1;
}

REFHOST_EXPORT int32_t ZQ_CALL StrLen(const char* text) {
    return serve(Service::kStrLen, int32_t{0}, [=] {
        return text == nullptr
                   ? 0
                   : static_cast<int32_t>(std::min<size_t>(std::strlen(text), INT32_MAX));
    });
}

REFHOST_EXPORT int32_t ZQ_CALL CToPStr(const char* text, uint8_t* counted) {
    return serve(Service::kCToPStr, kBadArgument, [=] { return count_string(text, counted); });
}

// Makes the path when *path is null, otherwise replaces what it holds.
REFHOST_EXPORT int32_t ZQ_CALL FTextToPath(const char* text, int32_t length, ZqPath* path) {
    return serve(Service::kFTextToPath, kOutOfMemory,
                 [=] { return text_to_path(text, length, path); });
}

// Empties the path, or makes an empty one when it is null.
REFHOST_EXPORT ZqPath ZQ_CALL FEmptyPath(ZqPath path) {
    return serve(Service::kFEmptyPath, ZqPath{}, [=] { return empty_path(path); });
}

// The result may be one of the other two.
REFHOST_EXPORT int32_t ZQ_CALL FAddPath(ZqPath base, ZqPath relative, ZqPath result) {
    return serve(Service::kFAddPath, kOutOfMemory,
                 [=] { return add_path(base, relative, result); });
}

static_assert(has_signature<ZqStrLenProc>(StrLen));
static_assert(has_signature<ZqCToPStrProc>(CToPStr));
static_assert(has_signature<ZqTextToPathProc>(FTextToPath));
static_assert(has_signature<ZqEmptyPathProc>(FEmptyPath));
static_assert(has_signature<ZqAddPathProc>(FAddPath));

}  // namespace refhost
