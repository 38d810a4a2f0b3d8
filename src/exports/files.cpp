// Entry points: image files and plain pixel buffers in files.
#include <zqvissvc/files.h>

#include <array>

#include "convert/convert_image.h"
#include "files/image_files.h"
#include "files/load_buffer.h"
#include "files/save_buffer.h"
#include "host/boundary.h"
#include "host/host_array.h"
#include "host/host_string.h"
#include "host/image_value.h"
#include "image/image_lock.h"

using namespace zq;
using host::FunctionId;

namespace {

template <class T>
void put(T* target, T value) {
    if (target != nullptr) *target = value;
}

template <class Type>
void write_image(const char* path, ZqImageHandle handle, const ZqWriteOptions* options, Type type,
                 const ZqArrayU32Handle* table) {
    const LockedImage image(handle);
    write_file(path, type,
               {.pixels = view_of(*image),
                .options = WriteOptions::from(options),
                .colour_table = host::view(table == nullptr ? nullptr : *table)});
}

void read_image(ZqImageHandle handle, const char* path, const ZqRawParameters* raw,
                ZqStringHandle* type_name, std::int32_t* pixel_format, ZqArrayU32Handle* table) {
    const LockedImage image(handle);
    const auto accept = [&](const FileContents& contents) {
        if (type_name != nullptr) host::set_string(type_name, contents.type_name);
        if (table != nullptr) host::set_array(table, contents.colour_table);
        put(pixel_format, static_cast<std::int32_t>(contents.pixel_format));
    };
    if (read_file(path, *image, raw, accept)) return;
    if (type_name != nullptr) host::set_string(type_name, "xxx");
    throw kUnsupportedFileType;
}

}  // namespace

ZqError ZQ_CALL DF_WriteFile2(const ZqImageValue* image, const char* path, const char* fileType,
                              ZqArrayU32Handle* colourTable, const ZqWriteOptions* options,
                              ZqErrorCluster* error) {
    return host::run_entry(error, FunctionId::kWriteFile, [&] {
        write_image(path, host::require_image(image), options, fileType, colourTable);
    });
}

ZqError ZQ_CALL ZqWriteFileByName(const char* path, ZqImageHandle image,
                                  const ZqWriteOptions* options, const char* typeName,
                                  ZqArrayU32Handle* colourTable) {
    return host::run_core([&] { write_image(path, image, options, typeName, colourTable); });
}

ZqError ZQ_CALL ZqWriteFileByCode(const char* path, ZqImageHandle image,
                                  const ZqWriteOptions* options, int32_t typeCode,
                                  ZqArrayU32Handle* colourTable) {
    return host::run_core([&] { write_image(path, image, options, typeCode, colourTable); });
}

ZqError ZQ_CALL ZqReadFile(ZqImageHandle image, const char* path, const ZqRawParameters* raw,
                           ZqStringHandle* typeName, int32_t* pixelFormat,
                           ZqArrayU32Handle* colourTable) {
    return host::run_core([&] {
        const bool headerless = raw != nullptr && raw->present != 0;
        read_image(image, path, headerless ? raw : nullptr, typeName, pixelFormat, colourTable);
    });
}

ZqError ZQ_CALL ZqConvertImage(ZqImageHandle source, ZqImageHandle destination) {
    return host::run_core([&] {
        const std::array<ImageHandle, 2> images = {source, destination};
        const ImageLock lock(images);
        convert_image(*Image::from_handle(source), *Image::from_handle(destination));
    });
}

ZqError ZQ_CALL Gen_SaveBuffer(const char* path, const void* buffer, int32_t bitsPerPixel,
                               int32_t bufferKind, int32_t width, int32_t height) {
    return host::run_core([&] {
        save_buffer(path, static_cast<const std::uint8_t*>(buffer), bitsPerPixel, bufferKind, width,
                    height);
    });
}

ZqError ZQ_CALL Gen_LoadBuffer(const char* path, int32_t mode, void** outPixels, int32_t* outWidth,
                               int32_t* outHeight, int32_t* outLineWidth, int32_t* outType) {
    return host::run_core([&] {
        if (path == nullptr) throw kBufferNullPath;
        if (outPixels == nullptr) throw kBufferNullBuffer;
        const LoadedBuffer loaded = load_buffer(path, mode);
        *outPixels = loaded.pixels;
        put(outWidth, loaded.width);
        put(outHeight, loaded.height);
        put(outLineWidth, loaded.line_width);
        put(outType, loaded.type);
    });
}

ZqError ZQ_CALL Gen_FreeLoadedBuffer(void* buffer) {
    return host::run_core([buffer] { free_loaded_buffer(buffer); });
}
