// Entry points: images as bytes.
#include <zqvissvc/flatten.h>

#include <utility>

#include "base/required.h"
#include "host/boundary.h"
#include "host/host_string.h"
#include "host/image_value.h"
#include "image/image_lock.h"
#include "serialize/flatten.h"
#include "serialize/host_values.h"
#include "serialize/rebuild.h"
#include "serialize/unflatten.h"

using namespace zq;
using host::FunctionId;

namespace {

// -1 stands for the newest version.
std::uint32_t record_version(std::int32_t version) {
    return version == -1 ? kNewestVersion : static_cast<std::uint32_t>(version);
}

ZqError flatten_value(const ZqImageValue* value, bool remote, std::int32_t version,
                      ZqStringHandle* flattened) {
    return host::run_host([&] {
        ZqStringHandle& target = required(flattened);
        const LockedImage image(host::require_image(value));
        target = flatten_for_host(*image, remote, record_version(version));
    });
}

}  // namespace

ZqError ZQ_CALL DF_FlattenImageToString(const ZqImageValue* image, ZqStringHandle* string,
                                        ZqErrorCluster* error) {
    return host::run_entry(error, FunctionId::kFlattenImageToString, [&] {
        const LockedImage locked(host::require_image(image));
        flatten(*locked, string, {}, {}, host::Extension::kAppend);
    });
}

ZqError ZQ_CALL DF_UnflattenImageFromString(ZqImageValue* image, ZqStringHandle string,
                                            ZqErrorCluster* error) {
    return host::run_entry(error, FunctionId::kUnflattenImageFromString, [&] {
        const ImageHandle destination = host::require_image(image);
        const ImageHandle rebuilt = unflatten(destination, string, Redirection::kNone).image;
        if (rebuilt == destination) return;
        host::set_string(&image->name, LockedImage(rebuilt)->name());
        image->image = rebuilt;
    });
}

ZqError ZQ_CALL DF_FlattenImageCompression(int32_t* codecId, int32_t* kind, int32_t* quality,
                                           uint8_t set, ZqErrorCluster* error) {
    return host::run_entry(error, FunctionId::kFlattenImageOptions, [&] {
        FlattenSettings::instance().exchange_flatten(codecId, kind, quality, set != 0);
    });
}

ZqError ZQ_CALL DF_RPCImageCompression2(int32_t* codecId, int32_t* quality, uint8_t set,
                                        ZqErrorCluster* error) {
    return host::run_entry(error, FunctionId::kRemoteCompression, [&] {
        FlattenSettings::instance().exchange_both(codecId, quality, set != 0);
    });
}

ZqError ZQ_CALL DF_RPCImageCompression3(int32_t* codecId, int32_t* quality, uint8_t set,
                                        ZqErrorCluster* error) {
    return host::run_entry(error, FunctionId::kRemoteDisplayOptions, [&] {
        FlattenSettings::instance().exchange_remote(codecId, quality, set != 0);
    });
}

ZqError ZQ_CALL DF_ImageDTFlatten(const ZqImageValue* value, ZqStringHandle* flattened) {
    return flatten_value(value, false, -1, flattened);
}

ZqError ZQ_CALL DF_ImageDTFlatten2(const ZqImageValue* value, uint8_t remote, int32_t version,
                                   ZqStringHandle* flattened) {
    return flatten_value(value, remote != 0, version, flattened);
}

ZqError ZQ_CALL DF_ImageDTUnFlatten(ZqStringHandle flattened, ZqImageValue* value) {
    return host::run_host([&] { value_from_flattened(flattened, value); });
}

ZqError ZQ_CALL FlattenImageToArray1D2(ZqImageHandle image, ZqStringHandle* string, int32_t mode,
                                       int32_t codecId, int32_t kind, int32_t quality,
                                       uint8_t keepName, int32_t version) {
    return host::run_core([&] {
        const LockedImage locked(image);
        flatten(*locked, string, {mode, codecId, kind, quality},
                {record_version(version), keepName}, host::Extension::kAppend);
    });
}

ZqError ZQ_CALL FlattenImageToArray1D(ZqImageHandle image, ZqStringHandle* string) {
    return host::run_core(
        [&] { flatten(*LockedImage(image), string, {}, {}, host::Extension::kAppend); });
}

ZqError ZQ_CALL UnflattenImageFromArray1D(ZqImageHandle* image, ZqStringHandle string) {
    return host::run_core([&] {
        ImageHandle& target = required(image);
        target = unflatten(target, string, Redirection::kBySession).image;
    });
}

ZqError ZQ_CALL RpcConvertToGRImage3(ZqImageHandle* image, const ZqFlattenContext* context,
                                     uint32_t contextLength, const char* name) {
    return host::run_core([&] {
        ImageHandle& target = required(image);
        const ZqFlattenContext& source = required(context);
        AttachmentList::Entry attachment;
        if (contextLength >= ZQ_FLATTEN_CONTEXT_BASE && source.attachmentBlock != nullptr) {
            attachment =
                prepare_attachment(block_bytes(source.attachmentBlock, source.attachmentBlockSize));
        }
        target = rebuild(target, {source, contextLength, name == nullptr ? "" : name,
                                  std::move(attachment)})
                     .image;
    });
}

ZqError ZQ_CALL RemoveImageFromFlattenTable(ZqImageHandle image) {
    return host::run_core([&] {
        if (!is_live_image(image)) return;
        const LockedImage locked(image);
        forget_flattened(image);
    });
}
