// Exported: error reporting, messages, registration of siblings' code ranges.
#include <zqvissvc/errors.h>

#include <string_view>

#include "base/error_codes.h"
#include "host/boundary.h"
#include "host/error_ranges.h"
#include "host/error_report.h"
#include "host/host_string.h"
#include "platform/message_box.h"

using namespace zq::host;

namespace {

std::string_view text_or_empty(const char* text) {
    return text == nullptr ? "" : text;
}

}  // namespace

int32_t ZQ_CALL ZqProcessResult(int32_t code, ZqErrorCluster* error, int32_t functionId) {
    return run_core(
        [&] { return process_result(code, error, static_cast<FunctionId>(functionId)); });
}

int32_t ZQ_CALL DF_ProcessErrorWithVIName(int32_t code, ZqErrorCluster* error,
                                          const char* callerName) {
    return run_core([&] { return process_result_as(code, error, text_or_empty(callerName)); });
}

int32_t ZQ_CALL DF_CreateErrorCluster(int32_t code, const char* callerName, ZqErrorCluster* error) {
    if (error != nullptr && error->status != 0) return error->code;
    return DF_ProcessErrorWithVIName(code, error, callerName);
}

int32_t ZQ_CALL DF_SetErrorMode(int32_t mode, uint8_t set, int16_t* codeOut,
                                ZqStringHandle* sourceOut) {
    return run_core([&] {
        if (set != 0) {
            set_error_mode(static_cast<uint32_t>(mode));
            if (codeOut != nullptr) *codeOut = 0;
            if (sourceOut != nullptr) set_string(sourceOut, {});
        } else {
            if (codeOut != nullptr) *codeOut = static_cast<int16_t>(last_error().code);
            if (sourceOut != nullptr) set_last_source(sourceOut);
        }
    });
}

int32_t ZQ_CALL DF_ErrorVI(int32_t mode, uint8_t set, int16_t* codeOut, ZqStringHandle* sourceOut) {
    return DF_SetErrorMode(mode, set, codeOut, sourceOut);
}

int32_t ZQ_CALL GetErrorText(int32_t code, ZqStringHandle* text) {
    return run_core([&] { set_error_text(code, text); });
}

int32_t ZQ_CALL TKR_GetErrorText(int32_t number, ZqStringHandle* text) {
    // The C environment counts from 1; far numbers wrap and land outside the table.
    const uint32_t code = number == 0 ? 0U : static_cast<uint32_t>(number) - 1074396161U;
    return GetErrorText(static_cast<int32_t>(code), text);
}

int32_t ZQ_CALL ZqRegisterErrorRange(int32_t first, int32_t last, int32_t baseStringId,
                                     void* module) {
    return run_core([&] {
        register_error_range({.first = first,
                              .last = last,
                              .first_message_id = baseStringId,
                              .source = {.module = module}});
    });
}

int32_t ZQ_CALL ZqRegisterErrorTable(int32_t first, int32_t last, int32_t baseStringId,
                                     ZqLoadTextProc procedure, void* argument) {
    return run_core([&] {
        if (procedure == nullptr) throw kNullPointer;
        register_error_range({.first = first,
                              .last = last,
                              .first_message_id = baseStringId,
                              .source = {.procedure = procedure, .argument = argument}});
    });
}

ZqMessageBoxProc ZQ_CALL ZqSetMessageBoxProcedure(ZqMessageBoxProc procedure) {
    return zq::platform::set_message_box_procedure(procedure);
}
