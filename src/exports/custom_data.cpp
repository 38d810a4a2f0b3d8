// Entry points: custom data on images.
#include <zqvissvc/custom_data.h>

#include "host/boundary.h"
#include "host/host_block.h"
#include "host/image_value.h"
#include "host/string_array.h"
#include "image/image_lock.h"
#include "serialize/custom_data.h"

using namespace zq;
using host::FunctionId;

ZqError ZQ_CALL DF_WriteCustomData(const ZqImageValue* image, const char* key, const void* data,
                                   uint32_t size, ZqErrorCluster* error) {
    return host::run_entry(error, FunctionId::kWriteCustomData, [&] {
        const LockedImage locked(host::require_image(image));
        if (key == nullptr || (data == nullptr && size != 0)) throw kNullPointer;
        CustomData::write(*locked, key, {static_cast<const std::uint8_t*>(data), size});
    });
}

ZqError ZQ_CALL DF_ReadCustomData(const ZqImageValue* image, const char* key, ZqHandle* value,
                                  uint32_t* size, ZqErrorCluster* error) {
    return host::run_entry(error, FunctionId::kReadCustomData, [&] {
        const LockedImage locked(host::require_image(image));
        if (key == nullptr || value == nullptr) throw kNullPointer;
        const auto bytes = CustomData::read(*locked, key);
        host::set_block(value, bytes);
        if (size != nullptr) *size = static_cast<std::uint32_t>(bytes.size());
    });
}

ZqError ZQ_CALL DF_RemoveCustomData(const ZqImageValue* image, const char* key,
                                    ZqErrorCluster* error) {
    return host::run_entry(error, FunctionId::kRemoveCustomData, [&] {
        const LockedImage locked(host::require_image(image));
        if (key == nullptr) throw kNullPointer;
        CustomData::remove(*locked, key);
    });
}

ZqError ZQ_CALL DF_EnumerateCustomKeys(const ZqImageValue* image, ZqStringArrayHandle* keys,
                                       ZqErrorCluster* error) {
    return host::run_entry(error, FunctionId::kEnumerateCustomKeys, [&] {
        const LockedImage locked(host::require_image(image));
        host::set_string_array(keys, CustomData::keys(*locked));
    });
}
