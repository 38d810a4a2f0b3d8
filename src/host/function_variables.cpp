// The exported function variables through which sibling libraries call this one.
#include <zqvissvc/slots.h>

#include <algorithm>
#include <string_view>

#include "host/boundary.h"
#include "host/c_environment.h"
#include "host/error_report.h"
#include "host/host_string.h"
#include "host/services.h"

namespace {

using zq::host::run_core;

int32_t ZQ_CALL report(int32_t code, ZqErrorCluster* error, int32_t function) {
    return run_core([&] {
        return zq::host::process_result(code, error, static_cast<zq::host::FunctionId>(function));
    });
}

int32_t ZQ_CALL get_function(const char* name, void** function) {
    return run_core([&] {
        if (name == nullptr || function == nullptr) throw kNullPointer;
        *function = zq::host::find_session_service(name);
        if (*function == nullptr) throw kNotInitialized;
    });
}

int32_t ZQ_CALL set_string(ZqStringHandle* target, const void* bytes, int32_t length) {
    return run_core([&] {
        const auto count = static_cast<size_t>(std::max(length, 0));
        if (bytes == nullptr && count > 0) throw kNullPointer;
        zq::host::set_string(target, {static_cast<const char*>(bytes), count});
    });
}

int32_t ZQ_CALL copy_string(ZqStringHandle* target, ZqStringHandle source) {
    return run_core([&] { zq::host::copy_string(target, source); });
}

int32_t ZQ_CALL to_rect(const ZqCoordinates* corners, ZqRect* rect) {
    return run_core([&] {
        if (corners == nullptr || rect == nullptr) throw kNullPointer;
        *rect = zq::host::to_rect(*corners);
    });
}

int32_t ZQ_CALL to_coordinates(const ZqRect* rect, ZqCoordinates* corners) {
    return run_core([&] {
        if (corners == nullptr || rect == nullptr) throw kNullPointer;
        *corners = zq::host::to_coordinates(*rect);
    });
}

int32_t ZQ_CALL to_array_1d(const void* source, int32_t element_size, int32_t count,
                            ZqHandle* array) {
    return run_core([&] { zq::host::copy_to_array_1d(source, element_size, count, array); });
}

int32_t ZQ_CALL to_array_2d(const void* source, int32_t element_size, int32_t rows, int32_t columns,
                            ZqHandle* array) {
    return run_core(
        [&] { zq::host::copy_to_array_2d(source, element_size, rows, columns, array); });
}

}  // namespace

extern "C" {

decltype(DF_ProcessError) DF_ProcessError = report;
decltype(DF_GetFunction) DF_GetFunction = get_function;
decltype(DF_SetString) DF_SetString = set_string;
decltype(DF_StringCopy) DF_StringCopy = copy_string;
decltype(TKR_CoordToRect) TKR_CoordToRect = to_rect;
decltype(TKR_RectToCoord) TKR_RectToCoord = to_coordinates;
decltype(TKR_PtrToArray1D) TKR_PtrToArray1D = to_array_1d;
decltype(TKR_PtrToArray2D) TKR_PtrToArray2D = to_array_2d;

}  // extern "C"
