// Entry points: reshaping an image in place, for whoever fills it next.
#include <zqvissvc/flatten.h>

#include "host/boundary.h"
#include "host/image_value.h"
#include "image/image_lock.h"

using namespace zq;
using host::FunctionId;

ZqError ZQ_CALL DF_ReconstructImage(const ZqImageValue* image, int32_t type, int32_t width,
                                    int32_t height, int32_t border, int32_t flag,
                                    ZqErrorCluster* error) {
    return host::run_entry(error, FunctionId::kReconstruct, [&] {
        const LockedImage locked(host::require_image(image));
        locked->reinitialise({type, width, height, border, flag != 0});
    });
}

ZqError ZQ_CALL Gen_ReconstructImageAndMarkAsExternal2(const ZqImageValue* image, int32_t type,
                                                       int32_t width, int32_t height,
                                                       int32_t border, int32_t flag,
                                                       int32_t imageSetting, int32_t secondFlag,
                                                       void** pixel, int32_t* lineWidth) {
    return host::run_host([&] {
        if (image == nullptr || pixel == nullptr || lineWidth == nullptr) throw kNullPointer;
        const LockedImage locked(host::require_image(image));
        const std::int32_t kept = locked->record().border;
        locked->reinitialise({type, width, height, border < 0 ? kept : border, flag != 0},
                             secondFlag != 0 ? ResizeMode::kPhysical : ResizeMode::kPlain);
        locked->lend();
        locked->set_setting(imageSetting);
        *pixel = locked->record().firstPixel;
        *lineWidth = locked->record().rowPixels;
    });
}

ZqError ZQ_CALL Gen_ReconstructImageAndMarkAsExternal(const ZqImageValue* image, int32_t type,
                                                      int32_t width, int32_t height, int32_t border,
                                                      int32_t flag, int32_t imageSetting,
                                                      void** pixel, int32_t* lineWidth) {
    return Gen_ReconstructImageAndMarkAsExternal2(image, type, width, height, border, flag,
                                                  imageSetting, 0, pixel, lineWidth);
}
