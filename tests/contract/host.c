/* Host services as another maker would write them. Every resize moves the block, so that an address
 * kept too long is found. Left out on purpose: paths, CToPStr, DrawSBar, TrackSBarEvent. */
#include "host.h"

#include <stdlib.h>
#include <string.h>

enum { kOk = 0, kBadArgument = 1, kOutOfMemory = 2 };
enum { kMostSessions = 64, kMostCleanups = 64 };
enum { kRemove = 0, kRegister = 2 };

typedef struct {
    Byte* block;
    int32_t size;
} Master;
typedef struct {
    void* name;
    void* image;
} Value;
typedef void(__cdecl* Procedure)(void* argument);

static HostState state;
static struct {
    int32_t is_used;
    Byte name[64];
    int32_t name_length;
    void* pointer;
} sessions[kMostSessions + 1]; /* by cookie */
static struct {
    Procedure procedure;
    void* argument;
} cleanups[kMostCleanups];

/* ---- Blocks; both heaps are one here. */

static Handle new_handle(int32_t size) {
    Master* master = size < 0 ? NULL : malloc(sizeof(Master));
    if (master == NULL) return NULL;
    master->block = malloc((size_t)size + 1);
    master->size = size;
    memset(master->block, 0xCD, (size_t)size);
    ++state.blocks;
    return (Handle)master;
}

static int32_t set_size(Handle handle, int32_t size) {
    Master* master = (Master*)handle;
    Byte* moved;
    if (master == NULL || size < 0) return kBadArgument;
    moved = malloc((size_t)size + 1);
    if (moved == NULL) return kOutOfMemory;
    memcpy(moved, master->block, (size_t)(size < master->size ? size : master->size));
    memset(master->block, 0xDD, (size_t)master->size);
    free(master->block);
    master->block = moved;
    master->size = size;
    return kOk;
}

static int32_t dispose(Handle handle) {
    if (handle == NULL) return kBadArgument;
    free(*handle);
    free(handle);
    --state.blocks;
    return kOk;
}

SERVICE(Handle) AZNewHandle(int32_t size) {
    return new_handle(size);
}
SERVICE(Handle) DSNewHandle(int32_t size) {
    return new_handle(size);
}
SERVICE(int32_t) AZSetHandleSize(Handle handle, int32_t size) {
    return set_size(handle, size);
}
SERVICE(int32_t) DSSetHandleSize(Handle handle, int32_t size) {
    return set_size(handle, size);
}
SERVICE(int32_t) AZGetHandleSize(Handle handle) {
    return ((Master*)handle)->size;
}
SERVICE(int32_t) DSGetHandleSize(Handle handle) {
    return ((Master*)handle)->size;
}
SERVICE(int32_t) AZDisposeHandle(Handle handle) {
    return dispose(handle);
}
SERVICE(int32_t) DSDisposeHandle(Handle handle) {
    return dispose(handle);
}
SERVICE(int32_t) DSCheckHandle(Handle handle) {
    return handle == NULL ? kBadArgument : kOk;
}
SERVICE(void*) DSNewPtr(int32_t size) {
    return size < 0 ? NULL : malloc((size_t)size + 1);
}
SERVICE(int32_t) DSDisposePtr(void* block) {
    free(block);
    return kOk;
}

/* Type codes 1 to 10: four signed, four unsigned integers, float, double. */
SERVICE(int32_t) NumericArrayResize(int32_t type, int32_t dimensions, Handle* array, size_t count) {
    static const int32_t bytes[] = {0, 1, 2, 4, 8, 1, 2, 4, 8, 4, 8};
    int32_t size;
    if (type < 1 || type > 10 || dimensions < 1) return kBadArgument;
    size = dimensions * 4 + bytes[type] * (int32_t)count;
    if (*array != NULL) return set_size(*array, size);
    *array = new_handle(size);
    return *array == NULL ? kOutOfMemory : kOk;
}

SERVICE(void) MoveBlock(const void* source, void* destination, int32_t bytes) {
    memmove(destination, source, (size_t)bytes);
}
SERVICE(int32_t) StrLen(const char* text) {
    return (int32_t)strlen(text);
}

/* ---- Sessions */

static int32_t is_known(const char* type, uint32_t cookie) {
    if (strcmp(type, "KEMOImage") == 0 && cookie >= 1 && cookie <= kMostSessions &&
        sessions[cookie].is_used) {
        return 1;
    }
    ++state.misuses;
    return 0;
}

SERVICE(int32_t) UDRegisterSesn(const char* type, const Value* value, uint32_t* cookie) {
    uint32_t free_one = 1;
    while (free_one <= kMostSessions && sessions[free_one].is_used) ++free_one;
    if (strcmp(type, "KEMOImage") != 0 || free_one > kMostSessions) return kBadArgument;
    sessions[free_one].is_used = 1;
    sessions[free_one].pointer = value->image;
    sessions[free_one].name_length = 0;
    if (value->name != NULL) {
        const Byte* text = *(Handle)value->name;
        int32_t length;
        memcpy(&length, text, 4);
        if (length > 64) return kBadArgument;
        memcpy(sessions[free_one].name, text + 4, (size_t)length);
        sessions[free_one].name_length = length;
    }
    ++state.sessions;
    *cookie = free_one;
    return kOk;
}

SERVICE(int32_t) UDRemoveSesn(const char* type, uint32_t cookie) {
    if (!is_known(type, cookie)) return kBadArgument;
    sessions[cookie].is_used = 0;
    --state.sessions;
    return kOk;
}

static uint32_t cookie_of(const void* pointer) {
    uint32_t cookie;
    for (cookie = 1; cookie <= kMostSessions; ++cookie) {
        if (sessions[cookie].is_used && sessions[cookie].pointer == pointer) return cookie;
    }
    return 0;
}

SERVICE(int32_t) UDUnregisterSesn(const char* type, const Value* value) {
    const uint32_t cookie = cookie_of(value->image);
    return cookie == 0 ? kBadArgument : UDRemoveSesn(type, cookie);
}

SERVICE(int32_t) UDCookieToName(const char* type, uint32_t cookie, Handle* name, void** session) {
    if (!is_known(type, cookie)) return kBadArgument;
    if (NumericArrayResize(5, 1, name, (size_t)sessions[cookie].name_length) != kOk) {
        return kOutOfMemory;
    }
    memcpy(**name, &sessions[cookie].name_length, 4);
    memcpy(**name + 4, sessions[cookie].name, (size_t)sessions[cookie].name_length);
    *session = sessions[cookie].pointer;
    return kOk;
}

SERVICE(int32_t) TSCookieToSesn(const char* type, const Value* value, void** session) {
    const uint32_t cookie = value == NULL || value->image == NULL ? 0 : cookie_of(value->image);
    (void)type;
    *session = cookie == 0 ? NULL : sessions[cookie].pointer;
    return kOk;
}

/* ---- Cleanup procedures and dialogs */

SERVICE(int32_t) RTSetCleanupProc(Procedure procedure, void* argument, int32_t mode) {
    int32_t i;
    for (i = 0; i < kMostCleanups; ++i) {
        if (mode == kRegister && cleanups[i].procedure == NULL) {
            cleanups[i].procedure = procedure;
            cleanups[i].argument = argument;
            ++state.cleanups;
            return kOk;
        }
        if (mode == kRemove && cleanups[i].procedure == procedure &&
            cleanups[i].argument == argument) {
            cleanups[i].procedure = NULL;
            --state.cleanups;
            return kOk;
        }
    }
    return kBadArgument;
}

SERVICE(int32_t) WNativeDialogSetup(void) {
    ++state.dialogs;
    ++state.dialogs_shown;
    return kOk;
}
SERVICE(int32_t) WNativeDialogRestore(void) {
    --state.dialogs;
    return kOk;
}

/* ---- Beside the services: the state, and the end of the caller's run. */

SERVICE(const HostState*) ContractHostState(void) {
    return &state;
}

SERVICE(void) ContractHostRunCleanup(void) {
    int32_t i;
    for (i = kMostCleanups - 1; i >= 0; --i) {
        const Procedure procedure = cleanups[i].procedure;
        if (procedure == NULL) continue;
        cleanups[i].procedure = NULL;
        --state.cleanups;
        procedure(cleanups[i].argument);
    }
}
