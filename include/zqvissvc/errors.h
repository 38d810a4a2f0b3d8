/* Error codes, their messages, and how results are reported to a host. */
#ifndef ZQVISSVC_ERRORS_H
#define ZQVISSVC_ERRORS_H

#include "types.h"

ZQ_BEGIN_C

/* Codes that this library returns; GetErrorText gives the message of each. Sibling libraries use
 * further codes of the same range, -1074396160 to -1074395138. */
enum {
    ZQ_ERR_NONE = 0,
    ZQ_ERR_SYSTEM = -1074396160,
    ZQ_ERR_NOT_ENOUGH_MEMORY = -1074396159,
    ZQ_ERR_MEMORY = -1074396158,
    ZQ_ERR_NOT_INITIALIZED = -1074396155,
    ZQ_ERR_IMAGE_TOO_SMALL = -1074396154,
    ZQ_ERR_POOL_EXHAUSTED = -1074396139,
    ZQ_ERR_NOT_AN_IMAGE = -1074396120,
    ZQ_ERR_NOT_AN_OBJECT = -1074396096,
    ZQ_ERR_POOL_IN_USE = -1074396092,
    ZQ_ERR_POOL_MISSING = -1074396091,
    ZQ_ERR_POOL_ENABLED = -1074396090,
    ZQ_ERR_POOL_EXISTS = -1074396089,
    ZQ_ERR_OUTPUT_ARRAY_TOO_SMALL = -1074396088,
    ZQ_ERR_PALETTE_NEEDS_8_BIT = -1074396082,
    ZQ_ERR_INVALID_IMAGE_TYPE = -1074396080,
    ZQ_ERR_INCOMPATIBLE_IMAGE_TYPE = -1074396077,
    ZQ_ERR_INCOMPATIBLE_IMAGE_SIZE = -1074396074,
    ZQ_ERR_IMAGE_LENT = -1074396065,
    ZQ_ERR_EXTERNAL_BUFFER_ALIGNMENT = -1074396063,
    ZQ_ERR_INVALID_FILE_HEADER = -1074396000,
    ZQ_ERR_INVALID_PARAMETER = -1074395997,
    ZQ_ERR_FILE_NOT_FOUND = -1074395995,
    ZQ_ERR_TOO_MANY_FILES_OPEN = -1074395994,
    ZQ_ERR_FILE_IO = -1074395993,
    ZQ_ERR_FILE_ACCESS_DENIED = -1074395992,
    ZQ_ERR_UNSUPPORTED_FILE_TYPE = -1074395991,
    ZQ_ERR_UNABLE_TO_READ_DATA = -1074395989,
    ZQ_ERR_UNABLE_TO_WRITE_DATA = -1074395988,
    ZQ_ERR_DISK_FULL = -1074395983,
    ZQ_ERR_PALETTE_SIZE = -1074395976,
    ZQ_ERR_INITIALIZATION = -1074395960,
    ZQ_ERR_QUALITY = -1074395956,
    ZQ_ERR_CUSTOM_DATA_SIZE = -1074395724,
    ZQ_ERR_CUSTOM_DATA_KEY = -1074395723,
    ZQ_ERR_BIT_DEPTH = -1074395721,
    ZQ_ERR_VALUE_NOT_IN_ENUMERATION = -1074395713,
    ZQ_ERR_COMPRESSION_TYPE = -1074395704,
    ZQ_ERR_FLATTEN_KIND = -1074395703,
    ZQ_ERR_NULL_POINTER = -1074395269,
    ZQ_ERR_INVALID_COORDINATE = -1074395261,
    /* Of the buffer-level file functions; these have no message. */
    ZQ_ERR_BUFFER_NOT_ENOUGH_MEMORY = -1074397181,
    ZQ_ERR_BUFFER_NULL_PATH = -1074397179,
    ZQ_ERR_BUFFER_NULL_BUFFER = -1074397178,
    ZQ_ERR_BUFFER_READ_FAILED = -1074397177,
    ZQ_ERR_BUFFER_KIND = -1074397114,
    ZQ_ERR_BUFFER_EXTENSION = -1074397113,
    ZQ_ERR_BUFFER_MODE = -1074397106,
    ZQ_ERR_BUFFER_WRITE_FAILED = -1074397104,
    /* Of Bayer decoding; these have no message either. */
    ZQ_ERR_BAYER_SIZE = -1074397148,
    ZQ_ERR_BAYER_RED_GAIN = -1074397075,
    ZQ_ERR_BAYER_GREEN_GAIN = -1074397074,
    ZQ_ERR_BAYER_BLUE_GAIN = -1074397073,
    ZQ_ERR_BAYER_BIT_DEPTH = -1074397056,
    ZQ_ERR_BAYER_NULL_POINTER = -1074397027,
    ZQ_ERR_BAYER_PATTERN = -1074396950
};

/* Error modes. */
enum {
    ZQ_ERROR_MODE_SHOW = 0,  /* the error cluster, and a message box after every processed result */
    ZQ_ERROR_MODE_QUIET = 1, /* the error cluster only */
    ZQ_ERROR_MODE_DEFAULT = 2 /* the same */
};

/* ---- Reporting. In all of these `error` is borrowed and written; null is tolerated. Its source
 * string is a host string: a null handle is given a block, which belongs to the caller. When the
 * host is out of memory the source stays what it was; status and code are set. In a thread whose
 * record is inactive nothing is done and ZQ_ERR_SYSTEM is returned. Threads: safe; the last error
 * is that of whichever thread reported last. */

/* Reports a result under a name of the caller's.
 * code        result; 0 clears the cluster.
 * error       overwritten, also when it holds an error.
 * callerName  borrowed; zero-terminated; first line of the source text, cut to 64 bytes; null is an
 * empty name. Returns code. */
ZQ_API int32_t ZQ_CALL DF_ProcessErrorWithVIName(int32_t code, ZqErrorCluster* error,
                                                 const char* callerName);

/* The same, unless the cluster holds an error already: then it is untouched and its code is
 * returned. */
ZQ_API int32_t ZQ_CALL DF_CreateErrorCluster(int32_t code, const char* callerName,
                                             ZqErrorCluster* error);

/* Sets the process-wide error mode, or tells the last error.
 * mode       a ZQ_ERROR_MODE_ value; any other becomes ZQ_ERROR_MODE_DEFAULT. Used when `set` is
 * true. set        true: set the mode; *codeOut becomes 0 and *sourceOut empty. False: read.
 * codeOut    written, may be null; the low 16 bits of the last code.
 * sourceOut  written, may be null; source text of the last error, empty when there is none or when
 * it was not reported under a display name. Returns 0 or ZQ_ERR_NOT_ENOUGH_MEMORY (*sourceOut is
 * then what it was). Threads: safe; not synchronised with results that other threads report
 * meanwhile. */
ZQ_API int32_t ZQ_CALL DF_SetErrorMode(int32_t mode, uint8_t set, int16_t* codeOut,
                                       ZqStringHandle* sourceOut);

/* The same under another name. */
ZQ_API int32_t ZQ_CALL DF_ErrorVI(int32_t mode, uint8_t set, int16_t* codeOut,
                                  ZqStringHandle* sourceOut);

/* Message text of an error code, or "Unknown Error.".
 * text  written; the string's last byte is a terminating zero, counted in its length; at most 127
 * bytes before it. Returns 0, ZQ_ERR_NULL_POINTER, or ZQ_ERR_NOT_ENOUGH_MEMORY (*text is then what
 * it was). Threads: safe. */
ZQ_API int32_t ZQ_CALL GetErrorText(int32_t code, ZqStringHandle* text);

/* The same for the C environment's numbers: 0 is success, n stands for n - 1074396161. */
ZQ_API int32_t ZQ_CALL TKR_GetErrorText(int32_t number, ZqStringHandle* text);

/* ---- For sibling libraries (by ordinal only on Windows). */

/* Reports a result under the display name `functionId`, 0 for no source text. Parameters and result
 * as DF_ProcessErrorWithVIName. */
ZQ_API int32_t ZQ_CALL ZqProcessResult(int32_t code, ZqErrorCluster* error, int32_t functionId);

/* Registers the codes first to last of a sibling library, both inclusive. The message of code c is
 * string baseStringId + c - first of the module's string table; display names are strings of that
 * table too. module  borrowed; a module handle of the system; must stay loaded. Null: this
 * library's own table. Modules have string tables on Windows only. Returns 0;
 * ZQ_ERR_INVALID_PARAMETER for a reversed range, one that overlaps a registered one, or string ids
 * outside 1 to 65535; ZQ_ERR_NOT_ENOUGH_MEMORY. Ranges stay registered for the life of the process.
 * Threads: safe. */
ZQ_API int32_t ZQ_CALL ZqRegisterErrorRange(int32_t first, int32_t last, int32_t baseStringId,
                                            void* module);

/* Copies text `id` into `text` (at most capacity - 1 bytes and a terminating zero). Returns the
 * number of bytes before the terminator, 0 when there is no such text. Called from any thread. */
typedef int32_t(ZQ_CALL* ZqLoadTextProc)(void* argument, int32_t id, char* text, int32_t capacity);

/* The same for a library that brings its texts by a procedure. `argument` is handed to it at each
 * call. Also returns ZQ_ERR_NULL_POINTER for a null procedure. */
ZQ_API int32_t ZQ_CALL ZqRegisterErrorTable(int32_t first, int32_t last, int32_t baseStringId,
                                            ZqLoadTextProc procedure, void* argument);

/* Shows a message box; both texts are zero-terminated and borrowed for the call. */
typedef void (*ZqMessageBoxProc)(const char* caption, const char* text);

/* Makes a procedure get every message box of the library; null restores the system's own box.
 * Returns the procedure installed before, or null. Threads: safe. */
ZQ_API ZqMessageBoxProc ZQ_CALL ZqSetMessageBoxProcedure(ZqMessageBoxProc procedure);

ZQ_END_C

#endif
