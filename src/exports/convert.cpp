// Entry points: pixels into host arrays, and images into other pixel types.
#include <zqvissvc/convert.h>

#include <array>

#include "convert/convert_image.h"
#include "convert/image_to_array.h"
#include "host/boundary.h"
#include "host/host_array.h"
#include "host/host_string.h"
#include "host/image_value.h"
#include "image/image_lock.h"
#include "image/registry.h"

using namespace zq;
using host::FunctionId;

namespace {

// The output arrays of a call, by pixel type; null where the function has none.
struct OutputArrays {
    std::array<ZqHandle*, 7> by_type{};

    template <class Handle>
    OutputArrays with(PixelType type, Handle* array) const {
        static_assert(sizeof(Handle) == sizeof(ZqHandle));
        OutputArrays result = *this;
        result.by_type[static_cast<std::size_t>(type)] = reinterpret_cast<ZqHandle*>(array);
        result.accepted |= 1U << static_cast<unsigned>(type);
        return result;
    }
    bool accepts(PixelType type) const {
        return (accepted >> static_cast<unsigned>(type) & 1U) != 0;
    }

    unsigned accepted = 0;
};

OutputArrays grey_arrays(ZqArray2dU8Handle* u8, ZqArray2dI16Handle* i16, ZqArray2dSglHandle* sgl) {
    return OutputArrays()
        .with(PixelType::kU8, u8)
        .with(PixelType::kI16, i16)
        .with(PixelType::kSgl, sgl);
}

OutputArrays colour_arrays(ZqArray2dU32Handle* u32) {
    return OutputArrays().with(PixelType::kRgb, u32).with(PixelType::kHsl, u32);
}

void fill_array(const ZqImageValue* value, ZqArrayI32Handle rectangle, const OutputArrays& arrays,
                ArraySize size) {
    const LockedImage image(host::require_image(value));
    const PixelType type = image->type();
    if (!arrays.accepts(type)) throw kInvalidImageType;
    const bool packed_colour = type == PixelType::kRgb || type == PixelType::kHsl;
    image_to_array(*image, to_rectangle(host::view(rectangle)),
                   packed_colour ? ArrayStart::kEmptied : ArrayStart::kUnchanged, size,
                   arrays.by_type[static_cast<std::size_t>(type)]);
}

// The destination's image; null when the destination is to become a further value of the source.
ImageHandle find_destination(const ZqImageValue* destination) {
    const host::LookUp found = host::look_up(destination);
    if (found.code != kNotAnImage) {
        if (found.code != kSuccess) throw found.code;
        return found.image;
    }
    if (destination == nullptr) throw kNotAnImage;
    const std::string_view name = host::name_of(destination->name);
    if (!name.empty()) {
        const Pin pin = Registry::instance().find(name, kImageTag);
        if (pin) return Image::handle_of(pin.object);
    }
    if (destination->image != nullptr) throw kNotAnImage;
    return nullptr;
}

void make_further_value(const ZqImageValue* source, ImageHandle image, ZqImageValue* destination) {
    const LockedImage locked(image);
    host::copy_string(&destination->name, source == nullptr ? nullptr : source->name);
    destination->image = image;
}

void convert_values(const ZqImageValue* source, ZqImageValue* destination) {
    const std::array<ImageHandle, 2> images = {host::require_image(source),
                                               find_destination(destination)};
    if (images[1] == nullptr) {
        // No value means no image, as an empty one does, but cannot take the source's.
        if (destination != nullptr) make_further_value(source, images[0], destination);
        return;
    }
    const ImageLock lock(images);
    convert_image(*Image::from_handle(images[0]), *Image::from_handle(images[1]));
    if (destination != nullptr) destination->image = images[1];
}

}  // namespace

ZqError ZQ_CALL DF_ImageToArray(const ZqImageValue* image, ZqArrayI32Handle rectangle,
                                ZqArray2dU8Handle* u8, ZqArray2dI16Handle* i16,
                                ZqArray2dSglHandle* sgl, ZqErrorCluster* error) {
    return host::run_entry(error, FunctionId::kImageToArray, [&] {
        fill_array(image, rectangle, grey_arrays(u8, i16, sgl), ArraySize::kGrowable);
    });
}

ZqError ZQ_CALL DF_ImageToArray_Bounded(const ZqImageValue* image, ZqArrayI32Handle rectangle,
                                        ZqArray2dU8Handle* u8, ZqArray2dI16Handle* i16,
                                        ZqArray2dSglHandle* sgl, ZqErrorCluster* error) {
    return host::run_entry(error, FunctionId::kImageToArray, [&] {
        fill_array(image, rectangle, grey_arrays(u8, i16, sgl), ArraySize::kBounded);
    });
}

ZqError ZQ_CALL DF_ColorImageToArray(const ZqImageValue* image, ZqArrayI32Handle rectangle,
                                     ZqArray2dU32Handle* u32, ZqErrorCluster* error) {
    return host::run_entry(error, FunctionId::kColorImageToArray, [&] {
        fill_array(image, rectangle, colour_arrays(u32), ArraySize::kGrowable);
    });
}

ZqError ZQ_CALL DF_ColorImageToArray_Bounded(const ZqImageValue* image, ZqArrayI32Handle rectangle,
                                             ZqArray2dU32Handle* u32, ZqErrorCluster* error) {
    return host::run_entry(error, FunctionId::kColorImageToArray, [&] {
        fill_array(image, rectangle, colour_arrays(u32), ArraySize::kBounded);
    });
}

ZqError ZQ_CALL DF_ColorImageToArray_v2(const ZqImageValue* image, ZqArrayI32Handle rectangle,
                                        ZqArray2dU32Handle* u32, ZqArray2dU64Handle* u64,
                                        ZqErrorCluster* error) {
    return host::run_entry(error, FunctionId::kColorImageToArray, [&] {
        const OutputArrays arrays = colour_arrays(u32).with(PixelType::kRgbU64, u64);
        fill_array(image, rectangle, arrays, ArraySize::kGrowable);
    });
}

ZqError ZQ_CALL DF_ColorImageToArray_Bounded_v2(const ZqImageValue* image,
                                                ZqArrayI32Handle rectangle, ZqArray2dU32Handle* u32,
                                                ZqArray2dU64Handle* u64, ZqErrorCluster* error) {
    return host::run_entry(error, FunctionId::kColorImageToArray, [&] {
        const OutputArrays arrays = colour_arrays(u32).with(PixelType::kRgbU64, u64);
        fill_array(image, rectangle, arrays, ArraySize::kBounded);
    });
}

ZqError ZQ_CALL DF_Convert(const ZqImageValue* source, ZqImageValue* destination,
                           ZqErrorCluster* error) {
    return host::run_entry(error, FunctionId::kConvert,
                           [&] { convert_values(source, destination); });
}
