// The process-wide settings of flattening: which codec, which kind, and each codec's quality, for
// strings and for remote transfer.
#pragma once

#include <cstdint>
#include <map>
#include <memory>

#include "platform/mutex.h"
#include "serialize/pixel_codec.h"
#include "serialize/record.h"

namespace zq {

enum class FlattenMode : std::int32_t { kRemote = 0, kSettings = 1, kGiven = 2 };

// What a caller asks for. Codec, kind and quality count in mode kGiven only.
struct FlattenRequest {
    std::int32_t mode = static_cast<std::int32_t>(FlattenMode::kSettings);
    std::int32_t codec_id = 0;
    std::int32_t kind = 0;
    std::int32_t quality = 0;
};

// What a request comes to.
struct FlattenChoice {
    std::int32_t codec_id = 0;
    FlattenKind kind = FlattenKind::kByValue;
    std::shared_ptr<const PixelCodec> codec;
};

// Threads: safe; one lock guards tables, settings and qualities.
class FlattenSettings {
  public:
    static FlattenSettings& instance();
    FlattenSettings();

    // A request with a quality of its own gets a codec of its own, so that nobody else ever sees
    // that quality. Throws kQuality, kFlattenKind, kCompressionType, kSystemError for the mode.
    FlattenChoice choose(const FlattenRequest& request);

    // The codec that decodes pixels; null for an id that does not exist.
    std::shared_ptr<const PixelCodec> decoder(std::int32_t codec_id);

    // Each reads, or with `set` changes, a setting; a quality may be null when reading. They throw
    // kNullPointer, kQuality (not the older form), kCompressionType, kFlattenKind, and have changed
    // nothing then.
    void exchange_flatten(std::int32_t* codec_id, std::int32_t* kind, std::int32_t* quality,
                          bool set);
    void exchange_remote(std::int32_t* codec_id, std::int32_t* quality, bool set);
    // Sets the flatten setting, too.
    void exchange_both(std::int32_t* codec_id, std::int32_t* quality, bool set);

  private:
    struct Setting {
        std::map<std::int32_t, std::shared_ptr<PixelCodec>> table;
        std::int32_t codec_id = 0;

        PixelCodec& codec(std::int32_t id) const;
        void set(std::int32_t id, std::int32_t quality);
        void get(std::int32_t& id, std::int32_t* quality) const;
    };
    static FlattenChoice make_own_choice(const FlattenRequest& request);

    platform::Mutex mutex_;
    Setting remote_, flatten_;
    std::int32_t kind_ = 0;
};

}  // namespace zq
