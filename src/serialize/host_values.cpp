// The strings that the data type's hooks hand out, and values made of them.
#include "serialize/host_values.h"

#include <map>
#include <mutex>
#include <string>
#include <utility>

#include "base/byte_order.h"
#include "host/host_string.h"
#include "host/image_value.h"
#include "host/services.h"
#include "image/image_lock.h"
#include "image/lifecycle.h"
#include "platform/mutex.h"
#include "serialize/flatten.h"
#include "serialize/unflatten.h"

namespace zq {

namespace {

void dispose_string(ZqStringHandle string) {
    if (string != nullptr) host::ds_dispose_handle(reinterpret_cast<ZqHandle>(string));
}

struct FlattenTable {
    using Key = std::pair<ImageHandle, bool>;  // bool: remote

    platform::Mutex mutex;
    std::map<Key, ZqStringHandle> strings;

    // A string that was taken out is the caller's alone; null when there is none.
    ZqStringHandle take(const Key& key) {
        const std::lock_guard lock(mutex);
        const auto found = strings.find(key);
        return found == strings.end() ? nullptr : std::exchange(found->second, nullptr);
    }
    // Makes a place, so that putting can not fail.
    void reserve(const Key& key) {
        const std::lock_guard lock(mutex);
        strings.try_emplace(key, nullptr);
    }
    // Returns the string that is to be disposed: one that was put there meanwhile, or this one when
    // the image has been forgotten.
    ZqStringHandle put(const Key& key, ZqStringHandle string) {
        const std::lock_guard lock(mutex);
        const auto found = strings.find(key);
        return found == strings.end() ? string : std::exchange(found->second, string);
    }
    ZqStringHandle remove(const Key& key) {
        const std::lock_guard lock(mutex);
        const auto node = strings.extract(key);
        return node ? node.mapped() : nullptr;
    }
};

FlattenTable& table() {
    static FlattenTable the_table;
    return the_table;
}

// The string of a key, out of the table for a scope: images whose locks do not lock may be
// flattened by several threads.
class TakenString {
  public:
    explicit TakenString(const FlattenTable::Key& key) : key_(key), string_(table().take(key)) {}
    ~TakenString() { dispose_string(table().put(key_, string_)); }
    TakenString(const TakenString&) = delete;
    TakenString& operator=(const TakenString&) = delete;
    ZqStringHandle& string() { return string_; }

  private:
    FlattenTable::Key key_;
    ZqStringHandle string_;
};

void forget_disposed(Image& image) noexcept {
    forget_flattened(image.handle());
}

std::uint32_t version_of(ZqStringHandle record) {
    const std::string_view bytes = host::view(record);
    return bytes.size() < 4 ? 0 : load_le32(reinterpret_cast<const std::uint8_t*>(bytes.data()));
}

// A host string for the time of a call.
class ScopedString {
  public:
    explicit ScopedString(std::string_view text) { host::set_string(&string_, text); }
    ~ScopedString() { dispose_string(string_); }
    ScopedString(const ScopedString&) = delete;
    ScopedString& operator=(const ScopedString&) = delete;
    ZqStringHandle get() const { return string_; }

  private:
    ZqStringHandle string_ = nullptr;
};

// Name and cookie of an image at one moment.
std::pair<std::string, std::uint32_t> identity_of(ImageHandle handle) {
    const LockedImage image(handle);
    return {std::string(image->name()), image->record().hostCookie};
}

}  // namespace

ZqStringHandle flatten_for_host(Image& image, bool remote, std::uint32_t version) {
    add_dispose_listener(forget_disposed);
    const FlattenTable::Key key = {image.handle(), remote};
    table().reserve(key);
    const FlattenMode mode = remote ? FlattenMode::kRemote : FlattenMode::kSettings;
    TakenString taken(key);
    ZqStringHandle& string = taken.string();
    flatten(image, &string, {.mode = static_cast<std::int32_t>(mode)}, {.version = version},
            host::Extension::kReplace);
    return string;
}

void forget_flattened(ImageHandle image) noexcept {
    for (const bool remote : {true, false}) dispose_string(table().remove({image, remote}));
}

void value_from_flattened(ZqStringHandle flattened, ZqImageValue* value) {
    if (value == nullptr) throw kNullPointer;
    const std::uint32_t version = version_of(flattened);
    const Created made = unflatten(nullptr, flattened, Redirection::kBySession);
    try {
        const auto [name, cookie] = identity_of(made.image);
        const ScopedString text(name);
        if (cookie == 0) host::register_flattened(made.image, text.get(), flattened, version);
        host::copy_string(&value->name, text.get());
    } catch (...) {
        if (made.is_new) dispose_image(made.image);
        throw;
    }
    value->image = made.image;
}

}  // namespace zq
