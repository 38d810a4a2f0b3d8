/* Images as bytes: flattening into a host string and rebuilding from one, the settings of both, the
 * hooks by which the host flattens its values, and reshaping images for a transport that fills them
 * itself.
 *
 * A flattened image is one record: a header of little-endian 32-bit words, the pixels as a pixel
 * codec encoded them, an attachment, the name and, in version 0x00080000, the properties
 * (docs/flattened-image.md has the layout). Codecs: 0 plain (the pixel buffer, border included),
 * 1 quality (compressed with losses; docs/quality-codec.md), 2 packed (one bit a pixel: not 0).
 * Kinds: 0 by value, 1 by value with properties, 2 by reference (only for this process).
 *
 * Host strings are counted; a record is appended at the string's old length, which is 0 in a block
 * too small for its count. Protocol of error clusters, image references and threads as in image.h.
 * Any function may also give -1074396159 (no memory); a string that could not grow is what it was,
 * and an image that could not be rebuilt too. Lines of a caller's buffer that are shorter than its
 * rows can not be flattened plain (-1074395960).
 *
 * Codes: -1074395960 a record or version that is not valid, -1074395956 a quality outside 0 to
 * 1000, -1074395704 a codec id that does not exist, -1074395703 a kind outside 0 to 2. */
#ifndef ZQVISSVC_FLATTEN_H
#define ZQVISSVC_FLATTEN_H

#include "types.h"

ZQ_BEGIN_C

/* What lies between an image and a record. Blocks are borrowed. In a 32-bit process all fields have
 * 32 bits. */
typedef struct ZqFlattenContext {
    uint32_t unit; /* these three are not part of a record */
    float xStep;
    float yStep;
    uint32_t type;          /* ZQ_TYPE_... */
    uint32_t width;         /* pixels */
    uint32_t height;        /* rows */
    uint32_t imageWords[2]; /* the record's reserved words */
    uint32_t border;        /* pixels on each side */
    uint32_t lineWidth;     /* pixels from one row to the next */
    uint32_t codecId;
    uint32_t sourceImage; /* reference of the image that was flattened */
    uint32_t pixelBlockSize;
    const void* pixelBlock;
    uint32_t attachmentBlockSize;
    const void* attachmentBlock;
    uint32_t imageSetting; /* the bit depth, for types that have one */
    uint32_t propertyBlockSize;
    const void* propertyBlock;
    uint32_t kind;
    uint32_t referencedImage; /* not 0: the image itself is meant, and nothing else counts */
    uint32_t keepName;        /* not 0: the rebuilt image takes the name */
} ZqFlattenContext;

/* Declared lengths, in bytes, from which on a context has geometry, codec, pixels and attachment;
 * the image setting; everything. 64, 68 and 88 in a 32-bit process. */
#define ZQ_FLATTEN_CONTEXT_BASE offsetof(ZqFlattenContext, imageSetting)
#define ZQ_FLATTEN_CONTEXT_SETTING offsetof(ZqFlattenContext, propertyBlockSize)
#define ZQ_FLATTEN_CONTEXT_FULL sizeof(ZqFlattenContext)

#if UINTPTR_MAX == 0xFFFFFFFFu
ZQ_ASSERT_OFFSET(ZqFlattenContext, border, 32);
ZQ_ASSERT_OFFSET(ZqFlattenContext, pixelBlock, 52);
ZQ_ASSERT_OFFSET(ZqFlattenContext, imageSetting, 64);
ZQ_ASSERT_OFFSET(ZqFlattenContext, propertyBlockSize, 68);
ZQ_STATIC_ASSERT(sizeof(ZqFlattenContext) == 88, "flatten context changed");
#endif

/* ---- Host entry points. */

/* Appends a record of version 0x00070100 to *string (a null handle is given a block), by the
 * flatten settings. */
ZQ_API ZqError ZQ_CALL DF_FlattenImageToString(const ZqImageValue* image, ZqStringHandle* string,
                                               ZqErrorCluster* error);

/* Rebuilds the image from the one record that the string holds. A record by reference makes the
 * value mean the image that was flattened (its name and image word are written). Else the image
 * takes size, border, type and pixels of the record; extra information is dropped. A record whose
 * codec does not exist, or that holds no pixels, does not write any: they are undefined when the
 * shape changes, and zeros in a new image. -1074395960 also for a record that asks for far more
 * pixels than its own length can explain, unless the image has that shape already. */
ZQ_API ZqError ZQ_CALL DF_UnflattenImageFromString(ZqImageValue* image, ZqStringHandle string,
                                                   ZqErrorCluster* error);

/* Reads (set 0) or changes the flatten settings, for all callers. codecId, when it is not null, is
 * the codec and goes with *quality (0 to 1000; the codec may keep it within narrower bounds; may be
 * null when reading); kind, when it is not null, is the kind. A refused change changes nothing. */
ZQ_API ZqError ZQ_CALL DF_FlattenImageCompression(int32_t* codecId, int32_t* kind, int32_t* quality,
                                                  uint8_t set, ZqErrorCluster* error);

/* Reads or changes the codec and its quality for remote transfer. The older one takes any quality,
 * and what it sets also becomes the flatten setting. -1074395269 for a null codecId, or a null
 * quality when setting. */
ZQ_API ZqError ZQ_CALL DF_RPCImageCompression2(int32_t* codecId, int32_t* quality, uint8_t set,
                                               ZqErrorCluster* error);
ZQ_API ZqError ZQ_CALL DF_RPCImageCompression3(int32_t* codecId, int32_t* quality, uint8_t set,
                                               ZqErrorCluster* error);

/* Makes the image one of that type, size and border, as if it had been created so: calibration and
 * extra information are lost, the pixels are undefined. flag not 0: a greedy image. -1074396080,
 * -1074396065 while the buffer is lent out. */
ZQ_API ZqError ZQ_CALL DF_ReconstructImage(const ZqImageValue* image, int32_t type, int32_t width,
                                           int32_t height, int32_t border, int32_t flag,
                                           ZqErrorCluster* error);

/* The same for a transport that writes the pixels itself: lends the buffer out as
 * Gen_MarkExternalBuffer does (which also takes it back) and writes the address of pixel (0, 0) and
 * the pixels from one row to the next. Until the buffer is given back the image can not be
 * reshaped again (-1074396065). A negative border keeps the image's. secondFlag not 0:
 * physically contiguous memory; the other form has 0 there. imageSetting as in the flatten context.
 * -1074395269 for a null image, pixel or lineWidth. */
ZQ_API ZqError ZQ_CALL Gen_ReconstructImageAndMarkAsExternal2(
    const ZqImageValue* image, int32_t type, int32_t width, int32_t height, int32_t border,
    int32_t flag, int32_t imageSetting, int32_t secondFlag, void** pixel, int32_t* lineWidth);
ZQ_API ZqError ZQ_CALL Gen_ReconstructImageAndMarkAsExternal(const ZqImageValue* image,
                                                             int32_t type, int32_t width,
                                                             int32_t height, int32_t border,
                                                             int32_t flag, int32_t imageSetting,
                                                             void** pixel, int32_t* lineWidth);

/* ---- Hooks of the host's image data type. They report nowhere. */

/* Flattens the value's image for the host to keep (the first form, by the flatten settings) or,
 * when `remote` is not 0, to send (by the remote setting); record version 0x00080000 for -1, else
 * the one asked for. *flattened receives a string that stays the library's and must not be resized
 * or disposed: it holds until the next call for that image in that mode, by any thread, or until
 * the image is disposed. */
ZQ_API ZqError ZQ_CALL DF_ImageDTFlatten(const ZqImageValue* value, ZqStringHandle* flattened);
ZQ_API ZqError ZQ_CALL DF_ImageDTFlatten2(const ZqImageValue* value, uint8_t remote,
                                          int32_t version, ZqStringHandle* flattened);

/* Makes a value of a record: of the live image that the record's session cookie and name mean,
 * which is then refilled, or of a new image, which is registered with the host. *value is
 * written at the end; its name string is resized. When the host then has no memory for the name, or
 * refuses the registration, a new image is disposed again; one that was refilled stays so. */
ZQ_API ZqError ZQ_CALL DF_ImageDTUnFlatten(ZqStringHandle flattened, ZqImageValue* value);

/* ---- Functions for sibling libraries, by handle. They lock the image and return a code. */

/* Appends one record to *string. mode: 0 the remote setting, by value; 1 the flatten settings; 2
 * the arguments codecId, kind and quality (0 to 1000), which count for this call alone. Other
 * modes: -1074396160. version -1 (which is 0x00080000), 0x00070100 or 0x00080000. */
ZQ_API ZqError ZQ_CALL FlattenImageToArray1D2(ZqImageHandle image, ZqStringHandle* string,
                                              int32_t mode, int32_t codecId, int32_t kind,
                                              int32_t quality, uint8_t keepName, int32_t version);
/* Mode 1, version 0x00070100. */
ZQ_API ZqError ZQ_CALL FlattenImageToArray1D(ZqImageHandle image, ZqStringHandle* string);

/* Rebuilds *image from the one record that the string holds. *image may be null or stale; then a
 * new image is made. Afterwards it is the image that was rebuilt (unchanged on failure): the one
 * referred to, the one that the record's session cookie and name mean, the given one, or the new
 * one. */
ZQ_API ZqError ZQ_CALL UnflattenImageFromArray1D(ZqImageHandle* image, ZqStringHandle string);

/* The same from a context of the declared length (one of the above; in between, the smaller one
 * counts; below the first: -1074395960). A new image takes the name
 * (zero-terminated, may be null) when keepName says so, and is then a private one; else it is
 * called "remote image " and the source image's reference. A live image of that name is re-shaped
 * instead of making another. */
ZQ_API ZqError ZQ_CALL RpcConvertToGRImage3(ZqImageHandle* image, const ZqFlattenContext* context,
                                            uint32_t contextLength, const char* name);

/* Disposes the strings that the hooks keep for the image, as its disposal does. Returns 0. */
ZQ_API ZqError ZQ_CALL RemoveImageFromFlattenTable(ZqImageHandle image);

ZQ_END_C

#endif
