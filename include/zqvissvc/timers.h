/* Interval timers: one clock of the process, started and read by the host. */
#ifndef ZQVISSVC_TIMERS_H
#define ZQVISSVC_TIMERS_H

#include "types.h"

ZQ_BEGIN_C

/* All of them: error is borrowed and may be null; an error that it already holds is returned
 * untouched. Threads: safe; all threads share one start, the latest. */

/* Nothing to prepare: both numbers are ignored. Returns 0. */
ZQ_API ZqError ZQ_CALL DF_InitTimer(uint32_t first, uint32_t second, ZqErrorCluster* error);

/* Makes now the start of the interval. Returns 0. */
ZQ_API ZqError ZQ_CALL DF_StartTimer(ZqErrorCluster* error);

/* Writes the microseconds since the start; the interval goes on. Without a start they count from
 * tick 0 of the clock.
 * microseconds  borrowed, written even when error holds an error.
 * Returns 0 or, for a null pointer, ZQ_ERR_NULL_POINTER. */
ZQ_API ZqError ZQ_CALL DF_StopTimer(double* microseconds, ZqErrorCluster* error);

/* Nothing to check: no limit is set. Returns 0. */
ZQ_API ZqError ZQ_CALL DF_CheckTimer(ZqErrorCluster* error);

/* Nothing to release: the clock lives as long as the process. Returns 0. */
ZQ_API ZqError ZQ_CALL DF_DeleteTimer(ZqErrorCluster* error);

ZQ_END_C

#endif
