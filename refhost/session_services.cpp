// Session services: the registry of cookies by which the host knows the values of a registered data
// type.
#include <zqvissvc/host.h>

#include <algorithm>
#include <map>
#include <string>
#include <utility>

#include "heap.h"
#include "service.h"

namespace refhost {
namespace {

struct Sessions {
    uint32_t next_cookie = 1;
    std::map<uint32_t, Session> by_cookie;
};

// Never destroyed, like the heap.
Sessions& sessions() {
    static auto* all = new Sessions;
    return *all;
}

// The session pointer is what a value is recognised by: all copies of a value carry it, and unnamed
// ones nothing else.
auto find_value(const char* type, const ZqImageValue& value) {
    return std::find_if(sessions().by_cookie.begin(), sessions().by_cookie.end(),
                        [&](const auto& entry) {
                            return entry.second.pointer == value.image && entry.second.type == type;
                        });
}

Session* find_cookie(const char* type, uint32_t cookie) {
    const auto found = sessions().by_cookie.find(cookie);
    return found != sessions().by_cookie.end() && found->second.type == type ? &found->second
                                                                             : nullptr;
}

struct Registration {
    const char* type;
    const ZqImageValue* value;
    ZqStringHandle flattened;
    std::optional<uint32_t> version;
};

int32_t add(Service service, const Registration& asked, uint32_t* cookie) {
    if (asked.type == nullptr || asked.value == nullptr || cookie == nullptr) return kBadArgument;
    std::optional<std::string> name = heap().read_string(asked.value->name, service_name(service));
    std::optional<std::string> flattened =
        heap().read_string(asked.flattened, service_name(service));
    if (!name || !flattened) return kBadArgument;
    Sessions& all = sessions();
    while (all.next_cookie == 0 || all.by_cookie.contains(all.next_cookie)) ++all.next_cookie;
    all.by_cookie[all.next_cookie] = {asked.type, std::move(*name), asked.value->image,
                                      std::move(*flattened), asked.version};
    *cookie = all.next_cookie++;
    return kOk;
}

int32_t remove_cookie(const char* type, uint32_t cookie) {
    if (type == nullptr || find_cookie(type, cookie) == nullptr) return kBadArgument;
    sessions().by_cookie.erase(cookie);
    return kOk;
}

int32_t remove_value(const char* type, const ZqImageValue* value) {
    if (type == nullptr || value == nullptr) return kBadArgument;
    const size_t removed = std::erase_if(sessions().by_cookie, [&](const auto& entry) {
        return entry.second.pointer == value->image && entry.second.type == type;
    });
    return removed > 0 ? kOk : kBadArgument;
}

int32_t look_up_cookie(const char* type, uint32_t cookie, ZqStringHandle* name, void** pointer) {
    const Session* found = type == nullptr ? nullptr : find_cookie(type, cookie);
    if (found == nullptr) return kBadArgument;
    if (name != nullptr) {
        const int32_t status = heap().write_string(name, found->name, "UDCookieToName");
        if (status != kOk) return status;
    }
    if (pointer != nullptr) *pointer = found->pointer;
    return kOk;
}

int32_t look_up_value(const char* type, const ZqImageValue* value, void** pointer) {
    if (type == nullptr || pointer == nullptr) return kBadArgument;
    *pointer = nullptr;
    if (value == nullptr || value->image == nullptr) return kOk;
    const auto found = find_value(type, *value);
    if (found != sessions().by_cookie.end()) *pointer = found->second.pointer;
    return kOk;
}

}  // namespace

std::optional<Session> session(uint32_t cookie) {
    const std::lock_guard lock(host_mutex());
    const auto found = sessions().by_cookie.find(cookie);
    if (found == sessions().by_cookie.end()) return std::nullopt;
    return found->second;
}

std::vector<uint32_t> cookies() {
    const std::lock_guard lock(host_mutex());
    std::vector<uint32_t> all;
    for (const auto& [cookie, entry] : sessions().by_cookie) all.push_back(cookie);
    return all;
}

REFHOST_EXPORT int32_t ZQ_CALL UDRegisterSesn(const char* type, const ZqImageValue* value,
                                              uint32_t* cookie) {
    constexpr auto kService = Service::kUDRegisterSesn;
    return serve(kService, kOutOfMemory, [=] {
        return add(kService, {type, value, nullptr, {}}, cookie);
    });
}

REFHOST_EXPORT int32_t ZQ_CALL UDRegisterSesnFlatten(const char* type, const ZqImageValue* value,
                                                     ZqStringHandle flattened, uint32_t* cookie) {
    constexpr auto kService = Service::kUDRegisterSesnFlatten;
    return serve(kService, kOutOfMemory, [=] {
        return add(kService, {type, value, flattened, {}}, cookie);
    });
}

REFHOST_EXPORT int32_t ZQ_CALL UDRegisterSesnFlatten2(const char* type, const ZqImageValue* value,
                                                      ZqStringHandle flattened, uint32_t version,
                                                      uint32_t* cookie) {
    constexpr auto kService = Service::kUDRegisterSesnFlatten2;
    return serve(kService, kOutOfMemory, [=] {
        return add(kService, {type, value, flattened, version}, cookie);
    });
}

REFHOST_EXPORT int32_t ZQ_CALL UDRemoveSesn(const char* type, uint32_t cookie) {
    return serve(Service::kUDRemoveSesn, kBadArgument, [=] { return remove_cookie(type, cookie); });
}

REFHOST_EXPORT int32_t ZQ_CALL UDUnregisterSesn(const char* type, const ZqImageValue* value) {
    return serve(Service::kUDUnregisterSesn, kBadArgument,
                 [=] { return remove_value(type, value); });
}

REFHOST_EXPORT int32_t ZQ_CALL UDCookieToName(const char* type, uint32_t cookie,
                                              ZqStringHandle* name, void** pointer) {
    return serve(Service::kUDCookieToName, kOutOfMemory,
                 [=] { return look_up_cookie(type, cookie, name, pointer); });
}

REFHOST_EXPORT int32_t ZQ_CALL TSCookieToSesn(const char* type, const ZqImageValue* value,
                                              void** pointer) {
    return serve(Service::kTSCookieToSesn, kBadArgument,
                 [=] { return look_up_value(type, value, pointer); });
}

static_assert(has_signature<ZqRegisterSessionProc>(UDRegisterSesn));
static_assert(has_signature<ZqRegisterSessionFlattenProc>(UDRegisterSesnFlatten));
static_assert(has_signature<ZqRegisterSessionFlatten2Proc>(UDRegisterSesnFlatten2));
static_assert(has_signature<ZqRemoveSessionProc>(UDRemoveSesn));
static_assert(has_signature<ZqUnregisterSessionProc>(UDUnregisterSesn));
static_assert(has_signature<ZqCookieToNameProc>(UDCookieToName));
static_assert(has_signature<ZqCookieToSessionProc>(TSCookieToSesn));

}  // namespace refhost
