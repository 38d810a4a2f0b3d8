/* A stand-in for the sibling library that hands out physically contiguous buffers, with hooks for
 * tests. Threads: every call is safe.
 */
#ifndef ZQKEMOMEM_H
#define ZQKEMOMEM_H

#include <stdint.h>

#ifdef __cplusplus
extern "C" {
#endif

/* A buffer that begins a page, filled with 0xCD; null when there is no memory. */
void* AllocPhysMem32(uint32_t bytes);

/* Null is ignored. */
void FreePhysMem(void* buffer);

/* The next `count` allocations fail. */
void zqkemomem_fail_next(int count);

/* Buffers handed out and not yet given back. */
int zqkemomem_live(void);

#ifdef __cplusplus
}
#endif

#endif
