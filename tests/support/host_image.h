// Image values and error clusters as a host holds them.
#pragma once

#include <zqvissvc/image.h>
#include <zqvissvc/values.h>

#include <cstdint>
#include <string>
#include <string_view>

#include "refhost/refhost.h"

namespace zqtest {

// An error cluster and its source text; starts empty or with an error that an earlier call left.
class Cluster {
  public:
    explicit Cluster(int32_t pending = 0)
        : cluster_{static_cast<uint8_t>(pending != 0 ? 1 : 0), pending, nullptr} {}
    ~Cluster() { refhost::dispose(cluster_.source); }
    Cluster(const Cluster&) = delete;
    Cluster& operator=(const Cluster&) = delete;

    operator ZqErrorCluster*() { return &cluster_; }
    int32_t code() const { return cluster_.code; }
    bool failed() const { return cluster_.status != 0; }
    std::string source() const { return refhost::text(cluster_.source); }

  private:
    ZqErrorCluster cluster_;
};

// A value of the host's image type; the image goes with it when it is still there.
class HostImage {
  public:
    HostImage() = default;
    explicit HostImage(std::string_view name, int32_t type = ZQ_TYPE_U8, int32_t width = 6,
                       int32_t height = 4, int32_t border = 1) {
        create(name, type, border, width, height);
    }
    ~HostImage() {
        DF_Dispose(&value, 0, nullptr);
        refhost::dispose(value.name);
    }
    HostImage(const HostImage&) = delete;
    HostImage& operator=(const HostImage&) = delete;

    ZqError create(std::string_view name, int32_t type, int32_t border, int32_t width,
                   int32_t height, uint8_t greedy = 0, ZqErrorCluster* error = nullptr) {
        const refhost::String text(name);
        return DF_Create(text.get(), type, border, width, height, greedy, &value, error);
    }
    ZqImageHandle handle() const { return value.image; }
    const ZqImageRecord& record() const { return *value.image; }
    std::string name() const { return refhost::text(value.name); }
    bool is_live() const {
        ZqImageHandle found = nullptr;
        return ZqLookUpImage(&value, &found) == 0 && found == value.image;
    }

    ZqImageValue value{};
};

}  // namespace zqtest
