// The process-wide settings of flattening.
#include "serialize/flatten_settings.h"

#include <mutex>

#include "base/required.h"

namespace zq {

namespace {

void check_quality(std::int32_t quality) {
    if (quality < kLeastQuality || quality > kBestQuality) throw kQuality;
}

FlattenKind to_kind(std::int32_t kind) {
    if (kind < 0 || kind > static_cast<std::int32_t>(FlattenKind::kByReference)) throw kFlattenKind;
    return static_cast<FlattenKind>(kind);
}

}  // namespace

FlattenSettings& FlattenSettings::instance() {
    static FlattenSettings the_settings;
    return the_settings;
}

FlattenSettings::FlattenSettings() {
    for (std::int32_t id = 0; id < kCodecCount; ++id) {
        remote_.table[id] = make_codec(id);
        flatten_.table[id] = make_codec(id);
    }
}

PixelCodec& FlattenSettings::Setting::codec(std::int32_t id) const {
    const auto found = table.find(id);
    if (found == table.end()) throw kCompressionType;
    return *found->second;
}

void FlattenSettings::Setting::set(std::int32_t id, std::int32_t quality) {
    codec(id).quality(quality, true);
    codec_id = id;
}

// The caller's words are written only: they may be the same.
void FlattenSettings::Setting::get(std::int32_t& id, std::int32_t* quality) const {
    std::int32_t stored = 0;
    codec(codec_id).quality(stored, false);
    id = codec_id;
    if (quality != nullptr) *quality = stored;
}

FlattenChoice FlattenSettings::make_own_choice(const FlattenRequest& request) {
    check_quality(request.quality);
    const FlattenKind kind = to_kind(request.kind);
    std::unique_ptr<PixelCodec> codec = make_codec(request.codec_id);
    if (codec == nullptr) throw kCompressionType;
    std::int32_t quality = request.quality;
    codec->quality(quality, true);
    return {request.codec_id, kind, std::move(codec)};
}

FlattenChoice FlattenSettings::choose(const FlattenRequest& request) {
    const std::lock_guard lock(mutex_);
    switch (static_cast<FlattenMode>(request.mode)) {
        case FlattenMode::kRemote:
            return {remote_.codec_id, FlattenKind::kByValue, remote_.table.at(remote_.codec_id)};
        case FlattenMode::kSettings:
            return {flatten_.codec_id, to_kind(kind_), flatten_.table.at(flatten_.codec_id)};
        case FlattenMode::kGiven:
            return make_own_choice(request);
    }
    throw kSystemError;
}

// The tables never change once they are made.
std::shared_ptr<const PixelCodec> FlattenSettings::decoder(std::int32_t codec_id) {
    const auto found = remote_.table.find(codec_id);
    return found == remote_.table.end() ? nullptr : found->second;
}

void FlattenSettings::exchange_flatten(std::int32_t* codec_id, std::int32_t* kind,
                                       std::int32_t* quality, bool set) {
    const std::lock_guard lock(mutex_);
    if (!set) {
        if (codec_id != nullptr) flatten_.get(*codec_id, quality);
        if (kind != nullptr) *kind = kind_;
        return;
    }
    const std::int32_t id = codec_id == nullptr ? flatten_.codec_id : *codec_id;
    const std::int32_t wanted = codec_id == nullptr ? kLeastQuality : required(quality);
    const std::int32_t new_kind = kind == nullptr ? kind_ : *kind;
    check_quality(wanted);
    flatten_.codec(id);
    to_kind(new_kind);
    if (codec_id != nullptr) flatten_.set(id, wanted);
    kind_ = new_kind;
}

void FlattenSettings::exchange_remote(std::int32_t* codec_id, std::int32_t* quality, bool set) {
    const std::lock_guard lock(mutex_);
    if (!set) return remote_.get(required(codec_id), quality);
    const std::int32_t id = required(codec_id);
    const std::int32_t wanted = required(quality);
    check_quality(wanted);
    remote_.set(id, wanted);
}

void FlattenSettings::exchange_both(std::int32_t* codec_id, std::int32_t* quality, bool set) {
    const std::lock_guard lock(mutex_);
    if (!set) return remote_.get(required(codec_id), quality);
    const std::int32_t id = required(codec_id);
    const std::int32_t wanted = required(quality);
    remote_.set(id, wanted);
    flatten_.set(id, wanted);
}

}  // namespace zq
