/* All public headers. */
#ifndef ZQVISSVC_ZQVISSVC_H
#define ZQVISSVC_ZQVISSVC_H

#include "bayer.h"
#include "convert.h"
#include "custom_data.h"
#include "display.h"
#include "errors.h"
#include "files.h"
#include "flatten.h"
#include "host.h"
#include "image.h"
#include "slots.h"
#include "timers.h"
#include "types.h"
#include "values.h"

#endif
