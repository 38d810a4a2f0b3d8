/* The host's side of the contract: the services that the library binds by name from the host
 * module, the exported callback slots, and the calls by which a host introduces itself. */
#ifndef ZQVISSVC_HOST_H
#define ZQVISSVC_HOST_H

#include "types.h"

ZQ_BEGIN_C

/* ---- Services bound by name. A host exports them from its main program (or from dfrt.dll) with C
 * linkage. Status results are 0 on success, a host error number (1 bad argument, 2 out of memory,
 * ...) otherwise. AZ blocks and DS blocks are two heaps; a handle is freed in the heap it came
 * from. */
typedef ZqHandle(ZQ_CALL* ZqNewHandleProc)(
    int32_t size); /* AZNewHandle, DSNewHandle; null when out of memory */
typedef int32_t(ZQ_CALL* ZqSetHandleSizeProc)(ZqHandle handle,
                                              int32_t size); /* AZSetHandleSize, DSSetHandleSize */
typedef int32_t(ZQ_CALL* ZqGetHandleSizeProc)(
    ZqHandle handle); /* AZGetHandleSize, DSGetHandleSize */
typedef int32_t(ZQ_CALL* ZqDisposeHandleProc)(
    ZqHandle handle); /* AZDisposeHandle, DSDisposeHandle */
typedef int32_t(ZQ_CALL* ZqCheckHandleProc)(
    ZqHandle handle);                                    /* DSCheckHandle: 0 for a live handle */
typedef void*(ZQ_CALL* ZqNewPtrProc)(int32_t size);      /* DSNewPtr */
typedef int32_t(ZQ_CALL* ZqDisposePtrProc)(void* block); /* DSDisposePtr */

/* NumericArrayResize: gives *array room for `elements` elements of the coded type behind
 * `dimensions` 32-bit counts, making the handle when *array is null. Contents up to the smaller
 * size are kept; the counts are the caller's to store. Type codes: 1 to 4 signed and 5 to 8
 * unsigned integers of 8, 16, 32, 64 bits, 9 float, 10 double. */
typedef int32_t(ZQ_CALL* ZqNumericArrayResizeProc)(int32_t typeCode, int32_t dimensions,
                                                   ZqHandle* array, size_t elements);
typedef void(ZQ_CALL* ZqMoveBlockProc)(const void* source, void* destination,
                                       int32_t bytes);    /* MoveBlock; may overlap */
typedef int32_t(ZQ_CALL* ZqStrLenProc)(const char* text); /* StrLen */
typedef int32_t(ZQ_CALL* ZqCToPStrProc)(
    const char* text, uint8_t* counted); /* CToPStr: length byte, then at most 255 bytes */

/* Paths are opaque to the library. */
typedef void* ZqPath;
typedef int32_t(ZQ_CALL* ZqTextToPathProc)(const char* text, int32_t length,
                                           ZqPath* path); /* FTextToPath */
typedef ZqPath(ZQ_CALL* ZqEmptyPathProc)(ZqPath path);    /* FEmptyPath */
typedef int32_t(ZQ_CALL* ZqAddPathProc)(ZqPath base, ZqPath relative, ZqPath result); /* FAddPath */

/* Sessions: the host keeps, for each cookie, the session type, a copy of the name and the session
 * pointer. The library uses the type "KEMOImage" and the image handle as the session pointer. A
 * cookie is never 0. UDRegisterSesn writes the new cookie. UDRegisterSesnFlatten and
 * UDRegisterSesnFlatten2 do the same for a value rebuilt from `flattened` (a counted string,
 * borrowed; may be null); the 2 variant is told the record version. UDRemoveSesn forgets a cookie;
 * UDUnregisterSesn forgets whatever is registered for a value. UDCookieToName writes the name into
 * *name (resized) and the session pointer into *session. TSCookieToSesn writes the session
 * registered for a value, or null when there is none. */
typedef int32_t(ZQ_CALL* ZqRegisterSessionProc)(const char* type, const ZqImageValue* value,
                                                uint32_t* cookie);
typedef int32_t(ZQ_CALL* ZqRegisterSessionFlattenProc)(const char* type, const ZqImageValue* value,
                                                       ZqStringHandle flattened, uint32_t* cookie);
typedef int32_t(ZQ_CALL* ZqRegisterSessionFlatten2Proc)(const char* type, const ZqImageValue* value,
                                                        ZqStringHandle flattened, uint32_t version,
                                                        uint32_t* cookie);
typedef int32_t(ZQ_CALL* ZqRemoveSessionProc)(const char* type, uint32_t cookie);
typedef int32_t(ZQ_CALL* ZqUnregisterSessionProc)(const char* type, const ZqImageValue* value);
typedef int32_t(ZQ_CALL* ZqCookieToNameProc)(const char* type, uint32_t cookie,
                                             ZqStringHandle* name, void** session);
typedef int32_t(ZQ_CALL* ZqCookieToSessionProc)(const char* type, const ZqImageValue* value,
                                                void** session);

/* RTSetCleanupProc: mode 2 registers, 0 removes the pair (procedure, argument). The host runs each
 * registered procedure once, with its argument, when it tears the caller down. */
typedef void(ZQ_CALL* ZqCleanupProc)(void* argument);
typedef int32_t(ZQ_CALL* ZqSetCleanupProcProc)(ZqCleanupProc procedure, void* argument,
                                               int32_t mode);
typedef int32_t(ZQ_CALL* ZqNativeDialogProc)(void); /* WNativeDialogSetup, WNativeDialogRestore */

/* ---- A host introduces itself. */

/* Stores the module (a library or program handle of the system) that exports the services.
 * Borrowed; null clears it. The second name does the same. Threads: call before others enter the
 * library. */
ZQ_API void ZQ_CALL SetDFRTModule(void* module);
ZQ_API void ZQ_CALL SetZqVisSvcDFRTModule(void* module);

/* Stores the index of a thread-local slot whose value is the calling thread's host module; it goes
 * before the module of SetDFRTModule. -1 clears it. */
ZQ_API void ZQ_CALL SetDFRTTLSIndex(int32_t index);
ZQ_API void ZQ_CALL SetZqVisSvcDFRTTLSIndex(int32_t index);

ZQ_END_C

#endif
