/* Image files: writing, reading, and plain pixel buffers to and from files.
 *
 * Types by code and name: 0 "BMP" (U8 with or without colour table, RGB without alpha), 1 "AIPD"
 * (the native format: every pixel type, lossless), 2 "TIFF" (U8 with or without colour table, I16,
 * RGB and RGB (U64) without alpha), 3 "JPEG" (U8, RGB without alpha), 4 "PNG" (U8 with or without
 * colour table, I16, RGB, RGB (U64)), 7 "JPEG2000" (as PNG; a path that ends in .j2k, .j2c or .jpc
 * gets the code stream alone, without colour table or alpha). Names are compared without regard to
 * letter case; leading white space is skipped, blanks behind the name and characters after the
 * eighth do not count.
 *
 * Paths are zero-terminated, in the encoding of the C run-time. Writing never leaves a half-written
 * file over a good one: the new file is made beside the old one and takes its place when it is
 * complete. Devices and pipes are written directly. Reading never changes the image unless the
 * whole file proved good.
 *
 * Codes of reading and writing: -1074395995 file not found, -1074395992 access denied, -1074395994
 * too many files open, -1074395983 disk full, -1074395993 any other failure of the system (a file
 * too short to be probed, too), -1074395991 no such type, or a file of a type that nobody
 * recognises, -1074396000 bad file header, -1074395974 and -1074395973 a JPEG 2000 file of colours
 * that nothing here can show, or of more than one quality layer, -1074395989 file cut short or
 * damaged, -1074395988 header not written, -1074396159 no memory, or a picture of more than
 * 2147483647 bytes.
 *
 * Threads: any; an image is locked for the whole call. */
#ifndef ZQVISSVC_FILES_H
#define ZQVISSVC_FILES_H

#include "types.h"

ZQ_BEGIN_C

/* Options of a write; a null pointer, or `present` 0, means the defaults.
 * words[0]  PNG: compression setting, 0 (smallest file, slow) to 100 (not compressed), else
 *           -1074395997. Strength s = 100 - setting: zlib level s / 10, at most 9; the last digit
 *           of s picks the row filter: 0 none, 1 sub, 2 up, 3 average, 4 Paeth, 5 all for strong
 *           compression of colour and else none, 6 to 9 all. The default is level 6 with all.
 *           JPEG: quality, 0 to 1000, else -1074395997; the default is 750. It is libjpeg's scale
 *           of 1 to 100 in tenths, rounded (0 to 14 are 1). Colours have half the resolution in
 * both directions below 900.
 *           JPEG2000: quality, 0 to 1000, else -1074395997; 1000 keeps everything. Without options,
 *           and with a colour table, the file is lossless.
 * words[1]  JPEG2000: 1 lossless whatever the quality, 0 not, else -1074395997. Others: 0.
 * words[2]  JPEG2000: wavelet, 0 chosen, 1 integer, 2 float, else -1074395953; float and lossless
 *           exclude each other (-1074396060).
 *           TIFF: compression. 0 none, 2 JPEG (U8 without colour table and RGB, lossy), 4 PackBits,
 * 5 deflate (tag 32946); of any other value the low 16 bits are the tag itself: 1 none, 5 LZW (as
 * 0x10005), 8 deflate. Another tag, or JPEG of another picture: -1074395986. */
typedef struct ZqWriteOptions {
    int32_t present;
    int32_t words[3];
} ZqWriteOptions;

/* How to read a file without a header (type code 5, "RAW"), as seven words. The picture has the
 * size of the image that it is read into. format  0 to 3 grey of 1, 2, 4, 8 bits (the first pixel
 * in the highest bits; few bits are spread over the whole range); 4 unsigned and 5 signed grey of
 * 16 bits (I16); 6 colour of 5, 6, 5 bits; 7 red, green, blue bytes; 8 the same as three planes,
 * each a third of the data; 9 unsigned and 10 signed integers of 32 bits (Float); 11 RGB, 13 48-bit
 * colour, 15 HSL as images hold them, blue or luminance first; 12 float; 14 complex. Others:
 * -1074396000. layoutMode  2: layout[0] is the bytes from one line to the next (0: no gap; below a
 * line -1074395997), layout[1] not 0 means that the last line comes first. Not for planes.
 * byteOrder  of samples of more than a byte. */
typedef struct ZqRawParameters {
    int32_t present; /* not 0: the file is read by these parameters and not probed */
    int32_t format;
    int32_t dataOffset; /* bytes from the start of the file; below 0: -1074395989 */
    int32_t layoutMode;
    int32_t layout[2]; /* used in layout mode 2 only */
    int32_t byteOrder; /* 0 little-endian, 1 big-endian */
} ZqRawParameters;

/* Writes an image under a type name.
 * image        borrowed.
 * path         borrowed; empty or null: -1074395997.
 * fileType     borrowed; a name from above.
 * colourTable  borrowed; null, or an array of 0 or 256 entries 0xAARRGGBB (else -1074395976), 256
 *              for U8 images only (else -1074396082). PNG and JPEG2000 keep it, TIFF all but alpha;
 * AIPD has no place for it. options      borrowed; may be null. -1074396077 when the type cannot
 * hold the image's pixel type, -1074396154 for a BMP, JPEG, PNG, TIFF or JPEG 2000 file without
 * pixels, -1074396074 for a BMP of 4 GiB and more and for a JPEG with a side above 65500 pixels,
 * -1074395986 for a TIFF compression that does not fit and for a colour table of a JPEG 2000 code
 * stream. TIFF holds I16 with negative values as signed samples, and takes its resolution from a
 * calibration in inches (unit 8), centimetres (4) or metres (5). It cannot go to a pipe. After a
 * failure the path holds what it held before; only a new AIPD file whose header could not be
 * written (-1074395988) stays as far as it went. */
ZQ_API ZqError ZQ_CALL DF_WriteFile2(const ZqImageValue* image, const char* path,
                                     const char* fileType, ZqArrayU32Handle* colourTable,
                                     const ZqWriteOptions* options, ZqErrorCluster* error);

/* Writes a plain pixel buffer; the extension of the path (bmp, tif, tiff, png, jpg, jpeg, in any
 * letter case) names the type.
 * buffer        borrowed; height rows, top row first, without padding between them.
 * bitsPerPixel, bufferKind  what a pixel is:
 *     kind 0: 32 bits; kind 4: 24 bits, or 32 for any other number; kind 13: 24 bits;
 *     kind 17: 8 grey; 9 to 16 unsigned grey in 16 bits; 24, else 17 to 32: 32 bits; above 32,
 *     and 1 to 7: 64 bits (16 a channel). 24 bits are blue, green, red; 32 and 64 have alpha
 *     behind them.
 * Returns 0, 0xBFF60005 null path, 0xBFF60006 null buffer, 0xBFF60046 another kind or number of
 * bits, 0xBFF60047 no or another extension, 0xBFF60003 no memory, 0xBFF60050 any other failure (a
 * width or height below 1, too). */
ZQ_API ZqError ZQ_CALL Gen_SaveBuffer(const char* path, const void* buffer, int32_t bitsPerPixel,
                                      int32_t bufferKind, int32_t width, int32_t height);

/* Reads a file of any type into a buffer of its own and converts it.
 * mode           pixel type of the buffer: 0 U8, 4 RGB, with one of the bits 0x78 I16; otherwise
 *                0xBFF6004E. Palette pictures come with their colours in mode 4, else as indices.
 * outPixels      written, not null: pixel (0, 0); the buffer is the caller's until
 *                Gen_FreeLoadedBuffer. Null for a picture without pixels.
 * outWidth, outHeight  in pixels; outLineWidth pixels from one row to the next; outType the pixel
 *                type. Each may be null.
 * Returns 0, 0xBFF60005 null path, 0xBFF60006 null outPixels, 0xBFF60007 the file cannot be read,
 * or not into this type, 0xBFF60003 no memory. On failure the outputs are unchanged. */
ZQ_API ZqError ZQ_CALL Gen_LoadBuffer(const char* path, int32_t mode, void** outPixels,
                                      int32_t* outWidth, int32_t* outHeight, int32_t* outLineWidth,
                                      int32_t* outType);

/* Frees such a buffer. Null, and an address that is no such buffer (any more), are ignored. Returns
 * 0. */
ZQ_API ZqError ZQ_CALL Gen_FreeLoadedBuffer(void* buffer);

/* Writes an image as PNG with its vision information: the objects that hang on it and can be
 * flattened (ZqRegisterAttachmentClass) and its custom data, besides pixels, calibration, sample
 * offset and bit depth, which every PNG has. HSL is written as RGB; the image stays HSL.
 * image        borrowed.
 * path         borrowed; empty or null: -1074395997.
 * colourTable  as for DF_WriteFile2.
 * -1074396077 for Float and Complex, -1074395988 for more than 1000 objects, 256 MiB of them or a
 * value of custom data that no text chunk can hold; the code of an object that refuses to be
 * flattened; the codes of DF_WriteFile2. After a failure the path holds what it held before. */
ZQ_API ZqError ZQ_CALL DF_WriteImageAndVisionInfo(const ZqImageValue* image, const char* path,
                                                  ZqArrayU32Handle* colourTable,
                                                  ZqErrorCluster* error);

/* Reads a PNG into an image, as ZqReadFile does, with the vision information that the file holds,
 * or none. The image then has these objects and this custom data alone; what hung on it before is
 * destroyed. Information that is damaged is left out without an error.
 * wantColourTable  0: the table is not touched.
 * colourTable      written when wanted, unless null: as by ZqReadFile.
 * -1074395989 for an empty or null path, -1074395991 for a file that is no PNG; the codes of
 * ZqReadFile. On failure the image and what hangs on it are what they were. */
ZQ_API ZqError ZQ_CALL DF_ReadImageAndVisionInfo(const ZqImageValue* image, const char* path,
                                                 uint8_t wantColourTable,
                                                 ZqArrayU32Handle* colourTable,
                                                 ZqErrorCluster* error);

/* ---- Core functions for sibling libraries (by ordinal on Windows). They return a code and report
 * nowhere. */

/* As DF_WriteFile2, for an image handle, with the type by name or by code. */
ZQ_API ZqError ZQ_CALL ZqWriteFileByName(const char* path, ZqImageHandle image,
                                         const ZqWriteOptions* options, const char* typeName,
                                         ZqArrayU32Handle* colourTable);
ZQ_API ZqError ZQ_CALL ZqWriteFileByCode(const char* path, ZqImageHandle image,
                                         const ZqWriteOptions* options, int32_t typeCode,
                                         ZqArrayU32Handle* colourTable);

/* Reads a file into an image, which takes the type and size that the file holds and keeps its
 * border. Palette pictures become U8 indices; a BMP whose palette is the ramp of greys becomes the
 * greys. A BMP with a resolution sets the image's calibration (unit 5, metre), and a write of an
 * image calibrated in metres, centimetres or inches (5, 4, 8) stores it. A JPEG with a JFIF density
 * sets the calibration, too: its numbers, as they are, become the steps, its unit 8 (inch), 4 (cm)
 * or 0; a write does the reverse with the steps rounded and kept within 1 to 65535. PNG and TIFF of
 * 16-bit grey become I16; unsigned samples above 32767 come through with all samples moved down by
 * 32768 (see ZqGetSampleOffset); a write to TIFF or lossless JPEG 2000 gives the file's samples
 * back, one to PNG keeps the values: when some are negative, the samples begin at 0 and the file
 * says where the values do. Of a TIFF the first page is read and turned as its orientation says;
 * grey of 9 to 15 bits becomes I16 with that bit depth, grey of 32 and 64 bits float; CMYK, YCbCr
 * and CIE L*a*b* become RGB; a resolution becomes the calibration (unit 8 inch, 4 centimetre).
 * path         borrowed; empty or null: -1074395989.
 * raw          borrowed; may be null. With parameters present the file is read by them:
 *              -1074396074 for an image without pixels.
 * typeName     written unless null: the type's name, padded with blanks to 8 characters; "xxx" when
 *              nobody recognises the file.
 * pixelFormat  written unless null: how the file holds its pixels: 0, 1, 2, 3 grey or indices of 1,
 *              2, 4, 8 bits; 6 grey of 9 to 16 bits; 8, 12, 14, 18, 19 colour of 24, 32, 48 (the
 *              machine's byte order), 48, 64 bits; 13 float, and any other grey of 32 or 64 bits;
 *              15 complex; 17 HSL.
 * colourTable  written unless null: 256 entries 0xAARRGGBB when the file has a palette (alpha 0
 *              when it has no transparency, missing entries 0), else none.
 * On failure the image is what it was. */
ZQ_API ZqError ZQ_CALL ZqReadFile(ZqImageHandle image, const char* path, const ZqRawParameters* raw,
                                  ZqStringHandle* typeName, int32_t* pixelFormat,
                                  ZqArrayU32Handle* colourTable);

/* What a PNG says beside the image. Zeros are the defaults.
 * background...  colour of the background, in samples of the file: 0 to 255, or 0 to 65535 for the
 *                16-bit types; larger values count as the largest. Every file has it; one with a
 *                palette names the nearest entry.
 * gamma          100000 times the exponent of the samples; 0: not written.
 * chromaticities 100000 times x and y of white, red, green and blue; all 0: not written. Values
 *                that make no colour space are not written either. */
typedef struct ZqPngSettings {
    uint16_t backgroundRed;
    uint16_t backgroundGreen;
    uint16_t backgroundBlue;
    uint16_t reserved;
    int32_t gamma;
    int32_t chromaticities[8];
} ZqPngSettings;

/* A PNG file with vision information, on its way between file and image: settings and what the file
 * carries. Threads: one at a time. */
typedef struct ZqVisionFile ZqVisionFile;

/* Makes such an object; `settings` (copied) may be null. *file, not null, receives it and is
 * unchanged on failure. It belongs to the caller, until ZqDisposeVisionFile frees it with all that
 * it holds; null is ignored there. */
ZQ_API ZqError ZQ_CALL ZqNewVisionFile(const ZqPngSettings* settings, ZqVisionFile** file);
ZQ_API ZqError ZQ_CALL ZqDisposeVisionFile(ZqVisionFile* file);

/* As DF_WriteImageAndVisionInfo, for an image handle and with options.
 * options  borrowed; may be null.
 * file     borrowed; may be null. Otherwise its settings are used, and each part that it holds is
 *          written in place of what the image would give. It does not change. */
ZQ_API ZqError ZQ_CALL ZqWriteVisionFile(const char* path, ZqImageHandle image,
                                         const ZqWriteOptions* options,
                                         ZqArrayU32Handle* colourTable, const ZqVisionFile* file);

/* As DF_ReadImageAndVisionInfo, for an image handle.
 * pixelFormat, colourTable  written unless null, as by ZqReadFile.
 * file  may be null. Otherwise it then holds the parts that the file has, and no others; on failure
 *       it is what it was. */
ZQ_API ZqError ZQ_CALL ZqReadVisionFile(ZqImageHandle image, const char* path, int32_t* pixelFormat,
                                        ZqArrayU32Handle* colourTable, ZqVisionFile* file);

/* The parts of such an object, as bytes. Payloads are those of the chunks before deflating
 * (docs/png-vision.md). */
#define ZQ_VISION_TIMING 0          /* payload of pmTI, whose meaning is its owner's */
#define ZQ_VISION_OBJECTS 1         /* payload of zqEI */
#define ZQ_VISION_PRIVATE_OBJECTS 2 /* payload of zqEi */
#define ZQ_VISION_VERSION 3         /* text of the file's "Version"; written by a read only */

/* Gives a part: *bytes its address, valid until the object changes, *size its bytes; null and 0 for
 * one that is not held. Outputs may be null. -1074395269 for a null object, -1074395997 for another
 * part. */
ZQ_API ZqError ZQ_CALL ZqGetVisionPart(const ZqVisionFile* file, int32_t part, const void** bytes,
                                       uint32_t* size);

/* Sets a payload (copied); size 0 takes it away. -1074395269 for a null object or null bytes,
 * -1074395997 for another part, the version included. */
ZQ_API ZqError ZQ_CALL ZqSetVisionPart(ZqVisionFile* file, int32_t part, const void* bytes,
                                       uint32_t size);

/* Converts a picture into the type of `destination`, which gets the source's size and border; every
 * pair of types by the rules of DF_Convert. An image converted into itself stays as it is. On
 * failure the destination is what it was. */
ZQ_API ZqError ZQ_CALL ZqConvertImage(ZqImageHandle source, ZqImageHandle destination);

ZQ_END_C

#endif
