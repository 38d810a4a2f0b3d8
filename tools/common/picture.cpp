// Pictures over the exported functions.
#include "picture.h"

#include <zqvissvc/custom_data.h>
#include <zqvissvc/errors.h>
#include <zqvissvc/flatten.h>
#include <zqvissvc/image.h>

#include <array>

#include "failure.h"

size_t bytes_per_pixel(int32_t type) {
    constexpr std::array<size_t, 7> kBytes = {1, 2, 4, 8, 4, 4, 8};
    return type >= 0 && type < std::ssize(kBytes) ? kBytes.at(static_cast<size_t>(type)) : 0;
}

Picture::Picture(int32_t type, int32_t width, int32_t height) {
    check(DF_Create(nullptr, type, 0, width, height, 0, &value_, nullptr));
}

Picture::Picture(const std::string& path) : Picture(ZQ_TYPE_U8, 0, 0) {
    refhost::String type_name;
    check(ZqReadFile(value_.image, path.c_str(), nullptr, type_name.out(), nullptr,
                     colour_table_.out()));
    file_type_ = type_name.text();
    file_type_.erase(file_type_.find_last_not_of(' ') + 1);
}

std::unique_ptr<Picture> Picture::with_vision(const std::string& path) {
    auto picture = std::make_unique<Picture>(ZQ_TYPE_U8, 0, 0);
    ZqVisionFile* file = nullptr;
    check(ZqNewVisionFile(nullptr, &file));
    picture->vision_ = {file, [](ZqVisionFile* owned) { ZqDisposeVisionFile(owned); }};
    const ZqError code = ZqReadVisionFile(picture->value_.image, path.c_str(), nullptr,
                                          picture->colour_table_.out(), file);
    if (code == ZQ_ERR_UNSUPPORTED_FILE_TYPE) return std::make_unique<Picture>(path);
    check(code);
    picture->file_type_ = "PNG";
    return picture;
}

Picture::Picture(const Record& record) {
    const refhost::String string(record.bytes);
    check(UnflattenImageFromArray1D(&value_.image, string.get()));
}

void Picture::read_raw(const std::string& path, const ZqRawParameters& raw) {
    check(ZqReadFile(value_.image, path.c_str(), &raw, nullptr, nullptr, nullptr));
}

Picture::~Picture() {
    DF_Dispose(&value_, 0, nullptr);
    refhost::dispose(value_.name);
}

Facts Picture::facts() const {
    Facts facts;
    check(DF_GetImageInfo(&value_, &facts.type, &facts.width, &facts.height, &facts.unit,
                          &facts.x_step, &facts.y_step, nullptr));
    check(DF_ImageBitDepth2(&value_, 0, &facts.bit_depth, nullptr));
    check(ZqGetSampleOffset(value_.image, &facts.sample_offset));
    return facts;
}

std::span<uint8_t> Picture::row(int32_t y) const {
    const Facts now = facts();
    void* pixel = nullptr;
    check(
        DF_GetImagePixelPtr(&value_, 0, y, 0, &pixel, nullptr, nullptr, nullptr, nullptr, nullptr));
    return {static_cast<uint8_t*>(pixel),
            static_cast<size_t>(now.width) * bytes_per_pixel(now.type)};
}

void Picture::draw(ZqWindow window, int32_t zoom, int32_t x_offset, int32_t y_offset,
                   ZqDeviceContext dc) const {
    check(ZqDrawImage(window, value_.image, zoom, x_offset, y_offset, 0, dc));
}

std::unique_ptr<Picture> Picture::with_colours_applied() const {
    const Facts now = facts();
    const std::vector<uint32_t> table = colour_table();
    if (now.type != ZQ_TYPE_U8 || table.size() != 256) throw Failure(ZQ_ERR_PALETTE_SIZE);
    auto result = std::make_unique<Picture>(ZQ_TYPE_RGB, now.width, now.height);
    for (int32_t y = 0; y < now.height; ++y) {
        auto target = result->row(y).begin();
        for (const uint8_t index : row(y))
            for (const int shift : {0, 8, 16, 24})
                *target++ = static_cast<uint8_t>(table[index] >> shift);
    }
    result->copy_attributes(*this);
    return result;
}

std::unique_ptr<Picture> Picture::converted(int32_t type) const {
    auto result = std::make_unique<Picture>(type, 0, 0);
    check(ZqConvertImage(value_.image, result->value_.image));
    result->copy_attributes(*this);
    return result;
}

// The bit depth describes 16-bit samples, so it survives only among those.
void Picture::copy_attributes(const Picture& source) {
    const Facts from = source.facts();
    const auto has_16_bits = [](int32_t type) {
        return type == ZQ_TYPE_I16 || type == ZQ_TYPE_RGBU64;
    };
    check(ZqLockImages(&value_.image, 1));
    value_.image->unit = from.unit;
    value_.image->xStep = from.x_step;
    value_.image->yStep = from.y_step;
    const bool keep_depth = has_16_bits(from.type) && has_16_bits(value_.image->type);
    check(ZqUnlockImages(&value_.image, 1));
    int32_t depth = from.bit_depth;
    if (keep_depth) check(DF_ImageBitDepth2(&value_, 1, &depth, nullptr));
    vision_ = source.vision_;
    for (const std::string& key : source.keys()) set_value(key, source.value(key));
}

std::vector<std::string> Picture::keys() const {
    refhost::Owned<ZqStringArrayHandle> array;
    check(DF_EnumerateCustomKeys(&value_, array.out(), nullptr));
    std::vector<std::string> keys;
    for (int32_t i = 0; i < (*array.get())->count; ++i) {
        ZqStringHandle key = (*array.get())->elements[i];
        keys.push_back(refhost::text(key));
        refhost::dispose(key);
    }
    return keys;
}

std::string Picture::value(const std::string& key) const {
    refhost::Owned<ZqHandle> value;
    uint32_t size = 0;
    check(DF_ReadCustomData(&value_, key.c_str(), value.out(), &size, nullptr));
    return {reinterpret_cast<const char*>(*value.get()), size};
}

void Picture::set_value(const std::string& key, std::string_view value) const {
    check(DF_WriteCustomData(&value_, key.c_str(), value.data(),
                             static_cast<uint32_t>(value.size()), nullptr));
}

void Picture::remove_value(const std::string& key) const {
    check(DF_RemoveCustomData(&value_, key.c_str(), nullptr));
}

size_t Picture::vision_bytes(int32_t part) const {
    uint32_t size = 0;
    if (vision_ != nullptr) check(ZqGetVisionPart(vision_.get(), part, nullptr, &size));
    return size;
}

ZqError Picture::write(const std::string& path, const std::string& file_type,
                       const ZqWriteOptions& options) {
    return DF_WriteFile2(&value_, path.c_str(), file_type.c_str(), colour_table_.out(), &options,
                         nullptr);
}

ZqError Picture::write_with_vision(const std::string& path, const ZqWriteOptions& options) {
    return ZqWriteVisionFile(path.c_str(), value_.image, &options, colour_table_.out(),
                             vision_.get());
}

std::string Picture::flattened(const Flattening& how) const {
    constexpr int32_t kByArguments = 2;
    constexpr int32_t kNewestVersion = -1;
    refhost::String record;
    check(FlattenImageToArray1D2(value_.image, record.out(), kByArguments, how.codec, how.kind,
                                 how.quality, 1, kNewestVersion));
    return record.text();
}
