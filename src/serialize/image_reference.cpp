// References to images in 32 bits.
#include "serialize/image_reference.h"

#include <ctime>
#include <memory>
#include <mutex>
#include <unordered_map>

#include "image/lifecycle.h"
#include "platform/mutex.h"
#include "platform/thread.h"

namespace zq {

namespace {

constexpr bool kHandleFits = sizeof(ImageHandle) == sizeof(std::uint32_t);

// Where the tokens of a process begin: elsewhere than those of others, since the names of rebuilt
// images come from them and records outlive the process.
std::uint32_t first_token() {
    const auto place = std::make_unique<char>();  // addresses differ from process to process
    const std::uint64_t mixed = static_cast<std::uint64_t>(std::time(nullptr)) << 20U ^
                                static_cast<std::uint64_t>(std::clock()) << 10U ^
                                platform::current_thread() ^
                                reinterpret_cast<std::uintptr_t>(place.get());
    return static_cast<std::uint32_t>(mixed * 0x9E3779B97F4A7C15U >> 32);
}

struct Tokens {
    platform::Mutex mutex;
    std::uint32_t last = first_token();
    std::unordered_map<std::uint32_t, ImageHandle> images;
    std::unordered_map<ImageHandle, std::uint32_t> tokens;
};

Tokens& tokens() {
    static Tokens all;
    return all;
}

void forget(Image& image) noexcept {
    Tokens& all = tokens();
    const std::lock_guard lock(all.mutex);
    const auto found = all.tokens.find(image.handle());
    if (found != all.tokens.end()) {
        all.images.erase(found->second);
        all.tokens.erase(found);
    }
}

std::uint32_t token_of(Image& image) {
    add_dispose_listener(forget);
    Tokens& all = tokens();
    const std::lock_guard lock(all.mutex);
    std::uint32_t& token = all.tokens[image.handle()];
    if (token != 0) return token;
    do {
        ++all.last;
    } while (all.last == 0 || all.images.contains(all.last));
    try {
        all.images.emplace(all.last, image.handle());
    } catch (...) {
        all.tokens.erase(image.handle());
        throw;
    }
    token = all.last;
    return token;
}

ImageHandle find_token(std::uint32_t token) {
    Tokens& all = tokens();
    const std::lock_guard lock(all.mutex);
    const auto found = all.images.find(token);
    return found == all.images.end() ? nullptr : found->second;
}

ImageHandle as_handle(std::uint32_t reference) {
    return reinterpret_cast<ImageHandle>(std::uintptr_t{reference});
}

}  // namespace

std::uint32_t reference_of(Image& image) {
    if constexpr (kHandleFits) {
        return static_cast<std::uint32_t>(reinterpret_cast<std::uintptr_t>(image.handle()));
    } else {
        return token_of(image);
    }
}

ImageHandle find_reference(std::uint32_t reference) {
    const ImageHandle handle = kHandleFits ? as_handle(reference) : find_token(reference);
    return is_live_image(handle) ? handle : nullptr;
}

}  // namespace zq
