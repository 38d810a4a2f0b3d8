// Counters and refusals of the services.
#include "service.h"

#include <array>
#include <stdexcept>
#include <string>
#include <string_view>

#include "refhost.h"

namespace refhost {
namespace {

constexpr size_t kServices = static_cast<size_t>(Service::kCount);

constexpr std::array<const char*, kServices> kNames = {
#define REFHOST_NAME(name) #name,
    REFHOST_SERVICES(REFHOST_NAME)
#undef REFHOST_NAME
};

struct Tally {
    uint64_t calls = 0;
    int refusals = 0;  // calls still to refuse; -1: all
};

Tally& tally(Service service) {
    static std::array<Tally, kServices> tallies;
    return tallies.at(static_cast<size_t>(service));
}

Service find_service(std::string_view name) {
    for (size_t i = 0; i < kServices; ++i)
        if (name == kNames.at(i)) return static_cast<Service>(i);
    throw std::invalid_argument("no host service is named " + std::string(name));
}

}  // namespace

const char* service_name(Service service) {
    return kNames.at(static_cast<size_t>(service));
}

// Never destroyed: the library may call the host while the process is being taken down.
std::mutex& host_mutex() {
    static auto* mutex = new std::mutex;
    return *mutex;
}

bool count_call(Service service) {
    Tally& entry = tally(service);
    ++entry.calls;
    const bool refused = entry.refusals != 0;
    if (entry.refusals > 0) --entry.refusals;
    return refused;
}

void refuse(std::string_view service, int count) {
    const std::lock_guard lock(host_mutex());
    tally(find_service(service)).refusals = count;
}

void refuse_none() {
    const std::lock_guard lock(host_mutex());
    for (size_t i = 0; i < kServices; ++i) tally(static_cast<Service>(i)).refusals = 0;
}

uint64_t calls(std::string_view service) {
    const std::lock_guard lock(host_mutex());
    return tally(find_service(service)).calls;
}

}  // namespace refhost
