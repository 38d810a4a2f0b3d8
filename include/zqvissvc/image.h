/* Creating, finding, locking, shaping and disposing images, the memory they come from, and reading
 * what they are.
 *
 * Image references come in two forms. Sibling libraries use handles (ZqImageHandle, a pointer to
 * the image record). Hosts use image values (ZqImageValue), which are looked up: -1074396155 when
 * the host lacks its session services, -1074396120 when the value names no live image. Functions
 * that end in an error cluster follow one protocol: an error already in the cluster is returned
 * untouched and nothing is done, unless the function says otherwise; the result goes into the
 * cluster and is returned. A null cluster is accepted. Output pointers may be null unless said
 * otherwise.
 *
 * Threads: every function may be called from any thread; each locks the images it works on for the
 * whole call. A private image is not locked: its owner must use it from one thread at a time.
 *
 * Codes that any creation or change of size may give: -1074396080 (type outside 0 to 6),
 * -1074396159 (no memory, or more than 2147483647 bytes), -1074396139 (the enabled pool is
 * exhausted), -1074396065 (the buffer is lent out). */
#ifndef ZQVISSVC_IMAGE_H
#define ZQVISSVC_IMAGE_H

#include "types.h"

ZQ_BEGIN_C

/* ---- Host entry points: life of an image. */

/* Creates an image, or finds and re-initialises the live one of that name (contents, calibration
 * and extra information are lost), and registers it with the host. name    borrowed; empty makes an
 * unnamed image, which is disposed when the host tears the caller down. type    ZQ_TYPE_...;
 * negative border, width or height count as 0; with either side 0 the image is 0 x 0. greedy  not
 * 0: the buffer never shrinks until the image is created again. image   written: the name (its
 * string is resized) and the handle. The registry owns the image. On failure `image` is unchanged
 * and no new image is left. */
ZQ_API ZqError ZQ_CALL DF_Create(ZqStringHandle name, int32_t type, int32_t border, int32_t width,
                                 int32_t height, uint8_t greedy, ZqImageValue* image,
                                 ZqErrorCluster* error);

/* As DF_Create, over the caller's buffer: its first byte is pixel (-border, -border), rows are
 * lineWidth pixels apart (0 or less: the library's own row layout). The buffer stays the caller's
 * and must outlive its use; a later change of size gives the image a buffer of its own. -1074396063
 * unless buffer address, border bytes and row bytes are multiples of 4; -1074395269 for a null
 * buffer. */
ZQ_API ZqError ZQ_CALL DF_CreateFromExternalBuffer(ZqStringHandle name, int32_t type,
                                                   int32_t border, int32_t width, int32_t height,
                                                   uint8_t greedy, void* buffer, int32_t lineWidth,
                                                   ZqImageValue* image, ZqErrorCluster* error);

/* Disposes the image of the value, or with `all` every image. Waits for operations under way on it.
 * A value without image is no error. The work is done first, whatever the incoming error. The value
 * itself is not changed. */
ZQ_API ZqError ZQ_CALL DF_Dispose(const ZqImageValue* image, uint8_t all, ZqErrorCluster* error);

/* Creates an unnamed image of 0 x 0 pixels. Returns its handle, or null; the failure is then the
 * last error, under the name "kemoCreate". */
ZQ_API ZqImageHandle ZQ_CALL kemoCreateImage(int32_t type, int32_t border);

/* Lends the image's buffer to an outside user (mark not 0; *buffer receives the start of the
 * buffer) or takes it back (mark 0; *buffer is the address that was lent). While it is lent the
 * image cannot change its shape; when the image is disposed meanwhile, the buffer lives until its
 * last user has returned it. -1074395269 for a null image or buffer, -1074396120 when neither an
 * image nor a lent buffer is meant. */
ZQ_API ZqError ZQ_CALL Gen_MarkExternalBuffer(const ZqImageValue* image, uint8_t mark,
                                              void** buffer);

/* How many times the image's buffer is lent out now. -1074395269 for null arguments, -1074396120.
 */
ZQ_API ZqError ZQ_CALL Gen_GetExternalCount(const ZqImageValue* image, int32_t* count);

/* The pool for time-bounded work: sizeKB above 0 reserves it (-1074396089 when there is one), 0 or
 * less releases it (-1074396092 while reservations are live, -1074396090 while it is enabled), also
 * with an error pending. It is released when the host tears the caller down. While enabled, every
 * pixel buffer is carved from it. Resetting makes it forget its reservations (-1074396090 while
 * enabled), also with an error pending: images that still lie in it then share memory with later
 * ones. Enabling (enable = 1; anything else disables) needs a pool: -1074396091. */
ZQ_API ZqError ZQ_CALL DF_SetMemoryPoolSize(int32_t sizeKB, ZqErrorCluster* error);
ZQ_API ZqError ZQ_CALL DF_EnableMemoryPool(int32_t enable, ZqErrorCluster* error);
ZQ_API ZqError ZQ_CALL DF_ResetMemoryPool(ZqErrorCluster* error);

/* ---- Host entry points: what an image is, and its pixels. */

/* unit is the calibration unit code, xStep and yStep the size of a pixel in that unit. */
ZQ_API ZqError ZQ_CALL DF_GetImageInfo(const ZqImageValue* image, int32_t* type, int32_t* width,
                                       int32_t* height, int32_t* unit, float* xStep, float* yStep,
                                       ZqErrorCluster* error);

/* The same and the image's name (resized; empty for an unnamed image). */
ZQ_API ZqError ZQ_CALL DF_GetImageInfo2(const ZqImageValue* image, int32_t* type, int32_t* width,
                                        int32_t* height, int32_t* unit, float* xStep, float* yStep,
                                        ZqStringHandle* name, ZqErrorCluster* error);

/* Width and height in pixels, without the border. */
ZQ_API ZqError ZQ_CALL DF_GetImageSize(const ZqImageValue* image, int32_t* width, int32_t* height,
                                       ZqErrorCluster* error);

/* Resizes; contents are not kept. What describes the old geometry is removed, also when the resize
 * fails: extra information of kinds 2 and 3, then the two attachments bound to it. */
ZQ_API ZqError ZQ_CALL DF_SetImageSize(const ZqImageValue* image, int32_t width, int32_t height,
                                       ZqErrorCluster* error);

/* Describes the buffer at pixel (x, y): border and line width in pixels, bytes per pixel, and the
 * bytes from that pixel to the end of the image proper. mode 0: (x, y) must lie left of the width
 * and above the height (-1074396074) and in the image or its border (-1074395261), and *pixel
 * receives its address, valid until the image is resized or disposed. Other modes check nothing and
 * leave *pixel alone. */
ZQ_API ZqError ZQ_CALL DF_GetImagePixelPtr(const ZqImageValue* image, int32_t x, int32_t y,
                                           int16_t mode, void** pixel, int32_t* border,
                                           int32_t* lineWidth, int32_t* bytesPerPixel,
                                           int32_t* remainingBytes, ZqErrorCluster* error);

/* Reads an attribute of a handle into *value: 1 the handle itself (ZqImageHandle, not locked or
 * checked), 2 the border (int32_t), 3 width and height (two int32_t), 4 the name (ZqStringHandle),
 * 5 the pixel type (int32_t); others: -1074395713. -1074395269 for a null value, -1074396120 for a
 * handle that is not live. *errorText (may be null) becomes the message of a failure, or empty. */
ZQ_API ZqError ZQ_CALL DF_GetImageAttr(ZqImageHandle image, int32_t attribute, void* value,
                                       ZqStringHandle* errorText);

/* Sets an attribute: 2 the border (the pixels of the image proper stay), 3 width and height as
 * DF_SetImageSize does. */
ZQ_API ZqError ZQ_CALL DF_SetImageAttr(ZqImageHandle image, int32_t attribute, const void* value,
                                       ZqStringHandle* errorText);

/* Bit depth of a 16-bit image: stores *bitDepth when `set` is not 0, then reads it back into
 * *bitDepth. 0 means not set; 8 to 16 are valid for I16 and RGB (U64), anything else is
 * -1074395721. -1074395269 for a null pointer. */
ZQ_API ZqError ZQ_CALL DF_ImageBitDepth2(const ZqImageValue* image, uint8_t set, int32_t* bitDepth,
                                         ZqErrorCluster* error);

/* "8 bits", "16 bits", "Float", "Complex", "RGB", "HSL", "RGB (U64)"; "Unknown" for any other code.
 * Never freed. */
ZQ_API const char* ZQ_CALL Gen_ImageTypeToText(int32_t type);

/* ---- Core functions for sibling libraries (by ordinal on Windows). They return a code and report
 * nowhere. */

/* Each writes the new image's handle to *image (not null), which stays unchanged on failure. Names
 * are zero-terminated; a null or empty name makes an unnamed image. The named ones find or create,
 * as DF_Create does. */
ZQ_API ZqError ZQ_CALL NewImage(int32_t type, int32_t width, int32_t height, int32_t border,
                                ZqImageHandle* image);
ZQ_API ZqError ZQ_CALL NewGreedyImage(int32_t type, int32_t width, int32_t height, int32_t border,
                                      ZqImageHandle* image);
ZQ_API ZqError ZQ_CALL NewNamedImage(int32_t type, int32_t width, int32_t height, int32_t border,
                                     const char* name, uint8_t greedy, ZqImageHandle* image);
ZQ_API ZqError ZQ_CALL NewPrivateNamedImage(int32_t type, int32_t width, int32_t height,
                                            int32_t border, const char* name, uint8_t greedy,
                                            ZqImageHandle* image);
ZQ_API ZqError ZQ_CALL NewExternalImage(int32_t type, int32_t width, int32_t height, int32_t border,
                                        void* buffer, int32_t rowPixels, const char* name,
                                        ZqImageHandle* image);

/* Disposes an image; null, and a handle that is not live (any more), are no error. */
ZQ_API ZqError ZQ_CALL ZqDisposeImage(ZqImageHandle image);

/* The first live image with exactly this name; *image is null when there is none. */
ZQ_API ZqError ZQ_CALL ZqFindImage(const char* name, ZqImageHandle* image);

/* Locks all images of a request, in an order that no other request can cross, each once however
 * often it is listed; locks are recursive. -1074396120 when one is not live, also when it is
 * disposed during the wait; nothing is locked then. Unlocking undoes one request for the same
 * images; images that are gone are skipped. */
ZQ_API ZqError ZQ_CALL ZqLockImages(const ZqImageHandle* images, int32_t count);
ZQ_API ZqError ZQ_CALL ZqUnlockImages(const ZqImageHandle* images, int32_t count);

/* Resizes, to `type` when changeType is not 0. mode 0 plain; 1 keeps the rows when only the height
 * changes; 2 takes the buffer from physically contiguous memory: -1074396158 when its allocator is
 * missing (the image stays as it was) or has none left (the image then has no pixels). -1074395997
 * for another mode. Any other failed resize leaves the image as it was. */
ZQ_API ZqError ZQ_CALL ZqResizeImage(ZqImageHandle image, int32_t width, int32_t height,
                                     uint8_t changeType, int32_t type, int32_t mode);

/* Re-lays the buffer for another border; the pixels of the image proper stay. */
ZQ_API ZqError ZQ_CALL ZqSetImageBorder(ZqImageHandle image, int32_t border);

/* Address of a pixel of the image or its border: -1074396154 without pixels, -1074395261 outside.
 */
ZQ_API ZqError ZQ_CALL ZqGetPixelAddress(ZqImageHandle image, int32_t x, int32_t y, void** address);

/* The bit depth by handle, as DF_ImageBitDepth2. */
ZQ_API ZqError ZQ_CALL ZqSetBitDepth(ZqImageHandle image, int32_t bitDepth);
ZQ_API ZqError ZQ_CALL ZqGetBitDepth(ZqImageHandle image, int32_t* bitDepth);

/* What reading a file added to its 16-bit samples: value = sample + offset. */
ZQ_API ZqError ZQ_CALL ZqGetSampleOffset(ZqImageHandle image, int32_t* offset);

/* Hangs a client's object on an image under a class; one of that class that was there is destroyed.
 * The image owns the object from a successful call on and calls `destroy` (may be null) with it.
 * Finding writes the object, or null. */
typedef void(ZQ_CALL* ZqDestroyProc)(void* object);
ZQ_API ZqError ZQ_CALL ZqSetAttachment(ZqImageHandle image, const ZqClassId* classId, void* object,
                                       ZqDestroyProc destroy);
ZQ_API ZqError ZQ_CALL ZqFindAttachment(ZqImageHandle image, const ZqClassId* classId,
                                        void** object);
ZQ_API ZqError ZQ_CALL ZqRemoveAttachment(ZqImageHandle image, const ZqClassId* classId);

/* A class of objects whose owner lets them travel with a flattened image or a PNG file with vision
 * information (files.h). flattenedSize gives the
 * bytes that an object takes; flatten writes them into a block that is 4 bytes larger; create makes
 * an object from them, which destroy (may be null) ends. flatten and create return 0 or a code,
 * which becomes the result of the call that wanted the object. All of them may be called from any
 * thread, with the image locked; they must not dispose the image or its attachments. Unregistering
 * does not wait for calls under way; destroy is called as long as one of the objects lives.
 * headerWord (may be null: 0) gives a word that a file keeps beside an object's bytes; classNumber
 * decides the part of the file: 65535 the one of private objects, any other number the common one.
 */
typedef uint32_t(ZQ_CALL* ZqFlattenedSizeProc)(void* object);
typedef ZqError(ZQ_CALL* ZqFlattenObjectProc)(void* object, void* block);
typedef ZqError(ZQ_CALL* ZqCreateObjectProc)(const void* block, uint32_t size, void** object);
typedef uint32_t(ZQ_CALL* ZqHeaderWordProc)(void* object);
typedef struct ZqAttachmentClass {
    ZqClassId classId;
    ZqFlattenedSizeProc flattenedSize;
    ZqFlattenObjectProc flatten;
    ZqCreateObjectProc create;
    ZqDestroyProc destroy;
    ZqHeaderWordProc headerWord;
    uint16_t classNumber;
} ZqAttachmentClass;

/* Registers a class (copied), in place of one with its identifier. Objects of a class that nobody
 * registered are carried as bytes from a flattened image or a file into the next; ZqFindAttachment
 * does not show them. Registering: -1074395269 for a null description or a routine that is missing.
 * Unregistering a class that is not there does nothing. */
ZQ_API ZqError ZQ_CALL ZqRegisterAttachmentClass(const ZqAttachmentClass* description);
ZQ_API ZqError ZQ_CALL ZqUnregisterAttachmentClass(const ZqClassId* classId);

/* Makes a client's object the image's extra information; the one before is destroyed. removeKind
 * (may be null) is told which part to drop when the geometry changes. */
typedef void(ZQ_CALL* ZqRemoveKindProc)(void* object, int32_t kind);
ZQ_API ZqError ZQ_CALL ZqSetExtraInfo(ZqImageHandle image, void* object,
                                      ZqRemoveKindProc removeKind, ZqDestroyProc destroy);

/* Where pixel buffers come from while the pool is not enabled: mode 3 the run-time heap (the
 * default), 2 the pool, 1 the given routines, which must stay callable while one of their blocks
 * lives. -1074395997 for anything else. */
typedef void*(ZQ_CALL* ZqAllocateProc)(size_t bytes);
typedef void(ZQ_CALL* ZqReleaseProc)(void* block);
ZQ_API ZqError ZQ_CALL ZqSetMemoryMode(int32_t mode, ZqAllocateProc allocate,
                                       ZqReleaseProc release);

/* Whether a procedure that disposes the image is registered with the host, so that it is not
 * disposed twice. A handle that is not live reads as 0. */
ZQ_API uint8_t ZQ_CALL GetHaveRegisteredCleanupProc(ZqImageHandle image);
ZQ_API void ZQ_CALL SetHaveRegisteredCleanupProc(ZqImageHandle image);

ZQ_END_C

#endif
