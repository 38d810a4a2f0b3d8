// Entry points: the host's image data type.
#include <zqvissvc/values.h>

#include <array>

#include "host/boundary.h"
#include "host/host_string.h"
#include "host/image_value.h"
#include "host/services.h"
#include "image/image_lock.h"

using namespace zq;

namespace {

constexpr std::array<const char*, 12> kHookNames = {"DF_ImageDTUnFlatten",
                                                    "DF_ImageDTFlatten",
                                                    "DF_ImageDTOpen",
                                                    "DF_ImageDTClose",
                                                    "DF_ImageDTDuplicate",
                                                    "",
                                                    "",
                                                    "",
                                                    "",
                                                    "",
                                                    "DF_ImageDTFlatten2",
                                                    ""};

void clear_name(ZqImageValue& value) {
    if (value.name != nullptr) {
        host::ds_dispose_handle(reinterpret_cast<ZqHandle>(value.name));
        value.name = nullptr;
    }
}

void unregister(const ZqImageValue& value) {
    const auto unregister_value = host::ud_unregister_session.require();
    unregister_value(host::kSessionType, &value);
    host::set_cookie(value.image, 0);
}

}  // namespace

ZqError ZQ_CALL DF_ImageDTClassInfo(int32_t selector, ZqStringHandle* name) {
    return host::run_core([&] {
        const auto index = static_cast<std::uint32_t>(selector);
        if (index < kHookNames.size()) {
            host::set_string(name, kHookNames[index]);
        }
    });
}

ZqError ZQ_CALL DF_ImageDTOpen(const ZqImageValue* /*value*/, void** out) {
    if (out != nullptr) {
        *out = nullptr;
    }
    return kSuccess;
}

ZqError ZQ_CALL DF_ImageDTClose(const ZqImageValue* /*value*/) {
    return kSuccess;
}

ZqError ZQ_CALL DF_ImageDTDuplicate(const ZqImageValue* value, ZqImageValue* out) {
    return host::run_core([&] {
        if (value == nullptr || out == nullptr) {
            throw kNullPointer;
        }
        *out = *value;
    });
}

ZqError ZQ_CALL DF_DFDTToImage(ZqImageValue* value, const ZqImageValue* cluster) {
    return host::run_host([&] {
        if (value == nullptr) {
            throw kNullPointer;
        }
        const host::LookUp found = host::look_up(cluster);
        if (found.code != kSuccess || found.image == nullptr) {
            host::copy_string(&value->name, cluster == nullptr ? nullptr : cluster->name);
            return;
        }
        const LockedImage image(found.image);
        host::set_string(&value->name, image->name());
        value->image = found.image;
    });
}

ZqError ZQ_CALL DF_ImageToDFDT(const ZqImageValue* cluster, ZqImageValue* value) {
    return host::run_host([&] {
        if (value == nullptr) {
            throw kNullPointer;
        }
        if (cluster == nullptr || cluster->image == nullptr) {
            clear_name(*value);
            return;
        }
        const bool was_live = value->image != nullptr && host::look_up(value).code == kSuccess;
        if (was_live) {
            host::require_image(cluster);
        }
        host::copy_string(&value->name, cluster->name);
        if (was_live) {
            unregister(*value);
        }
        value->image = cluster->image;
        if (was_live) {
            host::register_session(value->image, value->name);
        }
    });
}

ZqError ZQ_CALL SetImageCookies(ZqImageHandle image, uint32_t cookie) {
    return host::run_host([&] { host::set_cookie(image, cookie); });
}

ZqError ZQ_CALL ZqLookUpImage(const ZqImageValue* value, ZqImageHandle* image) {
    return host::run_host([&] {
        if (image == nullptr) {
            throw kNullPointer;
        }
        const host::LookUp found = host::look_up(value);
        *image = found.image;
        return found.code;
    });
}
