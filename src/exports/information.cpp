// Entry points: what an image is, its size and attributes, and pointers into its pixels.
#include <zqvissvc/image.h>

#include <optional>
#include <string>

#include "host/boundary.h"
#include "host/error_report.h"
#include "host/host_string.h"
#include "host/image_value.h"
#include "image/image_lock.h"

using namespace zq;
using host::FunctionId;

namespace {

template <class T>
void put(T* target, T value) {
    if (target != nullptr) {
        *target = value;
    }
}

// Where a caller wants the description; any of them may be null.
struct Description {
    std::int32_t* type;
    std::int32_t* width;
    std::int32_t* height;
    std::int32_t* unit;
    float* x_step;
    float* y_step;
};

void describe(const ImageRecord& record, const Description& out) {
    put(out.type, record.type);
    put(out.width, record.width);
    put(out.height, record.height);
    put(out.unit, record.unit);
    put(out.x_step, record.xStep);
    put(out.y_step, record.yStep);
}

// Coordinates are not checked, so the count may not fit its 32 bits; it then wraps.
std::int32_t remaining_bytes(const ImageRecord& record, std::int32_t x, std::int32_t y,
                             std::int32_t pixel_bytes) {
    const auto word = [](std::int32_t value) { return static_cast<std::uint32_t>(value); };
    const std::uint32_t pixels = (word(record.height) - word(y)) * word(record.rowPixels) - word(x);
    return static_cast<std::int32_t>(pixels * word(pixel_bytes));
}

void set_size(Image& image, std::int32_t width, std::int32_t height) {
    GRLIBError_enum result = kSuccess;
    try {
        image.resize(width, height, std::nullopt, ResizeMode::kPlain);
    } catch (GRLIBError_enum code) {
        result = code;
    }
    image.drop_geometry_attachments();
    if (result != kSuccess) {
        throw result;
    }
}

void get_attribute(ZqImageHandle handle, std::int32_t attribute, void* value) {
    if (attribute < 1 || attribute > 5) {
        throw kValueNotInEnumeration;
    }
    if (value == nullptr) {
        throw kNullPointer;
    }
    if (attribute == 1) {
        *static_cast<ZqImageHandle*>(value) = handle;
        return;
    }
    const LockedImage image(handle);
    const ImageRecord& record = image->record();
    auto* numbers = static_cast<std::int32_t*>(value);
    switch (attribute) {
        case 2:
            *numbers = record.border;
            break;
        case 3:
            numbers[0] = record.width;
            numbers[1] = record.height;
            break;
        case 4:
            host::set_string(static_cast<ZqStringHandle*>(value), image->name());
            break;
        default:
            *numbers = record.type;
            break;
    }
}

void set_attribute(ZqImageHandle handle, std::int32_t attribute, const void* value) {
    if (attribute != 2 && attribute != 3) {
        throw kValueNotInEnumeration;
    }
    if (value == nullptr) {
        throw kNullPointer;
    }
    const LockedImage image(handle);
    const auto* numbers = static_cast<const std::int32_t*>(value);
    if (attribute == 2) {
        image->set_border(*numbers);
    } else {
        set_size(*image, numbers[0], numbers[1]);
    }
}

// For entry points that report a message text instead of an error cluster.
ZqError run_with_text(ZqStringHandle* text, host::Body body) {
    const std::int32_t code = host::run_core(body);
    if (text != nullptr) {
        host::run_core([&] {
            host::set_string(text, code == kSuccess ? std::string() : host::message_text(code));
        });
    }
    return code;
}

}  // namespace

ZqError ZQ_CALL DF_GetImageInfo(const ZqImageValue* image, int32_t* type, int32_t* width,
                                int32_t* height, int32_t* unit, float* xStep, float* yStep,
                                ZqErrorCluster* error) {
    return host::run_entry(error, FunctionId::kGetImageInfo, [&] {
        const LockedImage locked(host::require_image(image));
        describe(locked->record(), {type, width, height, unit, xStep, yStep});
    });
}

ZqError ZQ_CALL DF_GetImageInfo2(const ZqImageValue* image, int32_t* type, int32_t* width,
                                 int32_t* height, int32_t* unit, float* xStep, float* yStep,
                                 ZqStringHandle* name, ZqErrorCluster* error) {
    return host::run_entry(error, FunctionId::kGetImageInfo, [&] {
        const LockedImage locked(host::require_image(image));
        if (name != nullptr) {
            host::set_string(name, locked->name());
        }
        describe(locked->record(), {type, width, height, unit, xStep, yStep});
    });
}

ZqError ZQ_CALL DF_GetImageSize(const ZqImageValue* image, int32_t* width, int32_t* height,
                                ZqErrorCluster* error) {
    return host::run_entry(error, FunctionId::kGetImageSize, [&] {
        const LockedImage locked(host::require_image(image));
        put(width, locked->record().width);
        put(height, locked->record().height);
    });
}

ZqError ZQ_CALL DF_SetImageSize(const ZqImageValue* image, int32_t width, int32_t height,
                                ZqErrorCluster* error) {
    return host::run_entry(error, FunctionId::kSetImageSize, [&] {
        set_size(*LockedImage(host::require_image(image)), width, height);
    });
}

ZqError ZQ_CALL DF_GetImagePixelPtr(const ZqImageValue* image, int32_t x, int32_t y, int16_t mode,
                                    void** pixel, int32_t* border, int32_t* lineWidth,
                                    int32_t* bytesPerPixel, int32_t* remainingBytes,
                                    ZqErrorCluster* error) {
    return host::run_entry(error, FunctionId::kGetImagePixelPointer, [&] {
        const LockedImage locked(host::require_image(image));
        const ImageRecord& record = locked->record();
        if (mode == 0) {
            if (x >= record.width || y >= record.height) {
                throw kIncompatibleImageSize;
            }
            put<void*>(pixel, locked->pixel(x, y));
        }
        const std::int32_t pixel_bytes = bytes_per_pixel(locked->type());
        put(border, record.border);
        put(lineWidth, record.rowPixels);
        put(bytesPerPixel, pixel_bytes);
        put(remainingBytes, remaining_bytes(record, x, y, pixel_bytes));
    });
}

ZqError ZQ_CALL DF_GetImageAttr(ZqImageHandle image, int32_t attribute, void* value,
                                ZqStringHandle* errorText) {
    return run_with_text(errorText, [&] { get_attribute(image, attribute, value); });
}

ZqError ZQ_CALL DF_SetImageAttr(ZqImageHandle image, int32_t attribute, const void* value,
                                ZqStringHandle* errorText) {
    return run_with_text(errorText, [&] { set_attribute(image, attribute, value); });
}

ZqError ZQ_CALL DF_ImageBitDepth2(const ZqImageValue* image, uint8_t set, int32_t* bitDepth,
                                  ZqErrorCluster* error) {
    return host::run_entry(error, FunctionId::kImageBitDepth, [&] {
        const LockedImage locked(host::require_image(image));
        if (bitDepth == nullptr) {
            throw kNullPointer;
        }
        if (set != 0) {
            locked->set_bit_depth(*bitDepth);
        }
        *bitDepth = locked->bit_depth();
    });
}

const char* ZQ_CALL Gen_ImageTypeToText(int32_t type) {
    return display_text(type);
}
