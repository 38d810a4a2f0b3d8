// Entry points: interval timers.
#include <zqvissvc/timers.h>

#include "base/error_codes.h"
#include "host/boundary.h"
#include "timers/interval_clock.h"

using namespace zq;
using host::FunctionId;

ZqError ZQ_CALL DF_InitTimer(uint32_t /*first*/, uint32_t /*second*/, ZqErrorCluster* error) {
    return host::run_entry(error, FunctionId::kInitializeTimedEnvironment, [] {});
}

ZqError ZQ_CALL DF_StartTimer(ZqErrorCluster* error) {
    return host::run_entry(error, FunctionId::kStartTimeLimit, [] {
        if (IntervalClock* clock = IntervalClock::of_process()) clock->start();
    });
}

ZqError ZQ_CALL DF_StopTimer(double* microseconds, ZqErrorCluster* error) {
    return host::run_entry_always(error, FunctionId::kStopTimeLimit, [&] {
        if (microseconds == nullptr) throw kNullPointer;
        const IntervalClock* clock = IntervalClock::of_process();
        *microseconds = clock == nullptr ? 0.0 : clock->elapsed_microseconds();
    });
}

ZqError ZQ_CALL DF_CheckTimer(ZqErrorCluster* error) {
    return host::run_entry(error, FunctionId::kCheckTimeLimit, [] {});
}

ZqError ZQ_CALL DF_DeleteTimer(ZqErrorCluster* error) {
    return host::run_entry(error, FunctionId::kCloseTimedEnvironment, [] {});
}
