// Function ids: the string-table id of the display name under which an entry point reports errors.
#pragma once

#include <cstdint>

namespace zq::host {

enum class FunctionId : std::int32_t {
    kNone = 0,
    kDebugRandomImage = 45,
    kSetImageSize = 108,
    kGetImageSize = 109,
    kImageToArray = 111,
    kConvert = 118,
    kColorImageToArray = 146,
    kWriteFile = 172,
    kWindDraw = 205,
    kDispose = 219,
    kGetImageInfo = 224,
    kGetImagePixelPointer = 226,
    kKemoCreate = 277,
    kCreate = 313,
    kInitializeTimedEnvironment = 384,
    kCloseTimedEnvironment = 387,
    kCheckTimeLimit = 408,
    kStartTimeLimit = 410,
    kStopTimeLimit = 412,
    kWriteCustomData = 466,
    kReadCustomData = 467,
    kRemoveCustomData = 468,
    kOverlayText = 40155,
    kWriteImageAndVisionInfo = 40165,
    kReadImageAndVisionInfo = 40167,
    kPrivate = 40181,
    kCreateFromExternalBuffer = 40217,
    kRemoteCompression = 40221,
    kVideoOutMode = 40233,
    kFlattenImageToString = 40234,
    kUnflattenImageFromString = 40235,
    kReconstruct = 40264,
    kRtVideoOut = 40271,
    kImageBitDepth = 40296,
    kFlattenImageOptions = 40351,
    kRemoteDisplayOptions = 40352,
    kEnumerateCustomKeys = 40380,
};

}  // namespace zq::host
