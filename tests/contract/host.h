/* The host of the contract client: services over the C heap, exported by name from whichever module
 * this is linked into, and what the client asks it beside them. The client calls all of it by
 * address, as the library does. One thread at a time. */
#ifndef CONTRACT_HOST_H
#define CONTRACT_HOST_H

#include <stdint.h>

typedef unsigned char Byte;
typedef Byte** Handle; /* first the block's address, behind it its size */

#define SERVICE(result) __declspec(dllexport) result __cdecl

/* What the host has seen so far. */
typedef struct {
    int32_t blocks;   /* live, of both heaps */
    int32_t sessions; /* registered */
    int32_t cleanups; /* registered */
    int32_t dialogs;  /* begun and not ended */
    int32_t dialogs_shown;
    int32_t misuses; /* handles that never were, cookies that nobody has */
} HostState;

#endif
