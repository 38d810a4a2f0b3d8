/* The stand-in's buffers: pages inside larger blocks of the ordinary heap. */
#include "zqkemomem.h"

#include <stdatomic.h>
#include <stddef.h>
#include <stdint.h>
#include <stdlib.h>
#include <string.h>

enum { kPage = 4096 };

static atomic_int failures;
static atomic_int live;

static int must_fail(void) {
    int left = atomic_load(&failures);
    while (left > 0)
        if (atomic_compare_exchange_weak(&failures, &left, left - 1)) return 1;
    return 0;
}

void* AllocPhysMem32(uint32_t bytes) {
    const size_t extra = kPage + sizeof(void*);
    if (must_fail() || bytes > SIZE_MAX - extra) return NULL;
    char* block = malloc(bytes + extra);
    if (block == NULL) return NULL;
    char* buffer = block + sizeof(void*);
    buffer += (kPage - (uintptr_t)buffer % kPage) % kPage;
    memcpy(buffer - sizeof(void*), &block, sizeof(void*));
    memset(buffer, 0xCD, bytes);
    atomic_fetch_add(&live, 1);
    return buffer;
}

void FreePhysMem(void* buffer) {
    if (buffer == NULL) return;
    char* block;
    memcpy(&block, (char*)buffer - sizeof(void*), sizeof(void*));
    free(block);
    atomic_fetch_sub(&live, 1);
}

void zqkemomem_fail_next(int count) {
    atomic_store(&failures, count);
}

int zqkemomem_live(void) {
    return atomic_load(&live);
}
