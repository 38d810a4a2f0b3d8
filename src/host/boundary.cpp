// The boundary between exported C functions and C++.
#include "host/boundary.h"

#include "base/error_codes.h"
#include "host/error_report.h"
#include "host/thread_record.h"

namespace zq::host {
namespace {

// 0 when the calling thread's entry points work.
std::int32_t check_thread() {
    return run_core([] { return thread_is_active() ? kSuccess : kSystemError; });
}

std::int32_t run_and_report(ZqErrorCluster* error, FunctionId function, Body body) {
    const std::int32_t unusable = check_thread();
    if (unusable != kSuccess) return unusable;
    const std::int32_t code = run_core(body);
    return run_core([&] { return process_result(code, error, function); });
}

bool holds_error(const ZqErrorCluster* error) {
    return error != nullptr && error->status != 0;
}

}  // namespace

std::int32_t run_core(Body body) noexcept {
    try {
        return body();
    } catch (GRLIBError_enum code) {
        return code;
    } catch (...) {
        return kNotEnoughMemory;
    }
}

std::int32_t run_host(Body body) noexcept {
    const std::int32_t unusable = check_thread();
    return unusable != kSuccess ? unusable : run_core(body);
}

std::int32_t run_entry(ZqErrorCluster* error, FunctionId function, Body body) noexcept {
    if (holds_error(error)) return error->code;
    return run_and_report(error, function, body);
}

std::int32_t run_entry_always(ZqErrorCluster* error, FunctionId function, Body body) noexcept {
    if (!holds_error(error)) return run_and_report(error, function, body);
    if (check_thread() == kSuccess) run_core(body);
    return error->code;
}

}  // namespace zq::host
