// Entry points: PNG files with vision information.
#include <zqvissvc/files.h>

#include <memory>
#include <utility>
#include <vector>

#include "files/vision_file.h"
#include "host/boundary.h"
#include "host/host_array.h"
#include "host/image_value.h"
#include "image/image_lock.h"

using namespace zq;
using host::FunctionId;

// What sibling libraries hold.
struct ZqVisionFile {
    PngVision vision;
};

namespace {

template <class T>
T& required(T* target) {
    if (target == nullptr) throw kNullPointer;
    return *target;
}

template <class Vision>
auto& payload_of(Vision& vision, std::int32_t part) {
    switch (part) {
        case ZQ_VISION_TIMING:
            return vision.timing;
        case ZQ_VISION_OBJECTS:
            return vision.objects;
        case ZQ_VISION_PRIVATE_OBJECTS:
            return vision.private_objects;
        default:
            throw kInvalidParameter;
    }
}

std::span<const std::uint8_t> part_of(const PngVision& vision, std::int32_t part) {
    if (part != ZQ_VISION_VERSION) return payload_of(vision, part);
    return {reinterpret_cast<const std::uint8_t*>(vision.version.data()), vision.version.size()};
}

void write_image(const char* path, ZqImageHandle handle, const ZqWriteOptions* options,
                 const ZqArrayU32Handle* table, const PngVision& vision) {
    const LockedImage image(handle);
    write_vision_file(path, *image, WriteOptions::from(options),
                      host::view(table == nullptr ? nullptr : *table), vision);
}

PngVision read_image(ZqImageHandle handle, const char* path, std::int32_t* pixel_format,
                     ZqArrayU32Handle* table) {
    const LockedImage image(handle);
    return read_vision_file(path, *image, [&](const FileContents& contents) {
        if (table != nullptr) host::set_array(table, contents.colour_table);
        if (pixel_format != nullptr) {
            *pixel_format = static_cast<std::int32_t>(contents.pixel_format);
        }
    });
}

}  // namespace

ZqError ZQ_CALL DF_WriteImageAndVisionInfo(const ZqImageValue* image, const char* path,
                                           ZqArrayU32Handle* colourTable, ZqErrorCluster* error) {
    return host::run_entry(error, FunctionId::kWriteImageAndVisionInfo, [&] {
        write_image(path, host::require_image(image), nullptr, colourTable, {});
    });
}

ZqError ZQ_CALL DF_ReadImageAndVisionInfo(const ZqImageValue* image, const char* path,
                                          uint8_t wantColourTable, ZqArrayU32Handle* colourTable,
                                          ZqErrorCluster* error) {
    return host::run_entry(error, FunctionId::kReadImageAndVisionInfo, [&] {
        read_image(host::require_image(image), path, nullptr,
                   wantColourTable != 0 ? colourTable : nullptr);
    });
}

ZqError ZQ_CALL ZqNewVisionFile(const ZqPngSettings* settings, ZqVisionFile** file) {
    return host::run_core([&] {
        ZqVisionFile*& target = required(file);
        auto made = std::make_unique<ZqVisionFile>();
        if (settings != nullptr) made->vision.settings = *settings;
        target = made.release();
    });
}

ZqError ZQ_CALL ZqDisposeVisionFile(ZqVisionFile* file) {
    return host::run_core([file] { const std::unique_ptr<ZqVisionFile> owner(file); });
}

ZqError ZQ_CALL ZqWriteVisionFile(const char* path, ZqImageHandle image,
                                  const ZqWriteOptions* options, ZqArrayU32Handle* colourTable,
                                  const ZqVisionFile* file) {
    return host::run_core([&] {
        write_image(path, image, options, colourTable,
                    file == nullptr ? PngVision() : file->vision);
    });
}

ZqError ZQ_CALL ZqReadVisionFile(ZqImageHandle image, const char* path, int32_t* pixelFormat,
                                 ZqArrayU32Handle* colourTable, ZqVisionFile* file) {
    return host::run_core([&] {
        PngVision read = read_image(image, path, pixelFormat, colourTable);
        if (file == nullptr) return;
        read.settings = file->vision.settings;
        file->vision = std::move(read);
    });
}

ZqError ZQ_CALL ZqGetVisionPart(const ZqVisionFile* file, int32_t part, const void** bytes,
                                uint32_t* size) {
    return host::run_core([&] {
        const std::span<const std::uint8_t> found = part_of(required(file).vision, part);
        if (bytes != nullptr) *bytes = found.empty() ? nullptr : found.data();
        if (size != nullptr) *size = static_cast<std::uint32_t>(found.size());
    });
}

ZqError ZQ_CALL ZqSetVisionPart(ZqVisionFile* file, int32_t part, const void* bytes,
                                uint32_t size) {
    return host::run_core([&] {
        std::vector<std::uint8_t>& payload = payload_of(required(file).vision, part);
        if (bytes == nullptr && size != 0) throw kNullPointer;
        const std::span given(static_cast<const std::uint8_t*>(bytes), size);
        payload = std::vector<std::uint8_t>(given.begin(), given.end());
    });
}
