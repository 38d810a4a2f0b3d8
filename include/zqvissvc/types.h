/* Types shared by all families of the C interface: handles, host strings and arrays, the error
 * cluster, the image value and the image record. The layouts are a binary contract with hosts and
 * sibling libraries: never change them. */
#ifndef ZQVISSVC_TYPES_H
#define ZQVISSVC_TYPES_H

#include <stddef.h>
#include <stdint.h>

#if defined(_WIN32)
#define ZQ_CALL __cdecl
#if defined(ZQVISSVC_BUILD)
#define ZQ_DATA
#define ZQ_API
#else
#define ZQ_DATA __declspec(dllimport)
#define ZQ_API __declspec(dllimport)
#endif
#else
#define ZQ_CALL
#define ZQ_DATA __attribute__((visibility("default")))
#define ZQ_API __attribute__((visibility("default")))
#endif

#ifdef __cplusplus
#define ZQ_BEGIN_C extern "C" {
#define ZQ_END_C }
#define ZQ_STATIC_ASSERT(condition, text) static_assert(condition, text)
#else
#define ZQ_BEGIN_C
#define ZQ_END_C
#define ZQ_STATIC_ASSERT(condition, text) _Static_assert(condition, text)
#endif

ZQ_BEGIN_C

/* 0 is success; the library's own codes run from -1074396160 to -1074395138 (see errors.h). */
typedef int32_t ZqError;

/* A relocatable host block: a pointer to the block's address. Any host call may move the block;
 * fetch the address again after each one. */
typedef uint8_t** ZqHandle;

/* A counted host string: `length` bytes follow, without a terminator. A null handle is an empty
 * string. */
typedef struct ZqString {
    int32_t length;
    uint8_t bytes[1];
} ZqString;
typedef ZqString** ZqStringHandle;

/* A one-dimensional host array of 32-bit elements; the same shape holds for every element width. */
typedef struct ZqArrayU32 {
    int32_t count;
    uint32_t elements[1];
} ZqArrayU32;
typedef ZqArrayU32** ZqArrayU32Handle;
typedef struct ZqArrayI32 {
    int32_t count;
    int32_t elements[1];
} ZqArrayI32;
typedef ZqArrayI32** ZqArrayI32Handle;

/* A one-dimensional host array of strings, which belong to the array; a null element is an empty
 * string. Packed: the elements follow the count at once, as in every host array. */
#pragma pack(push, 4)
typedef struct ZqStringArray {
    int32_t count;
    ZqStringHandle elements[1];
} ZqStringArray;
#pragma pack(pop)
typedef ZqStringArray** ZqStringArrayHandle;

/* Two-dimensional host arrays: rows * columns elements, row by row. */
typedef struct ZqArray2dU8 {
    int32_t rows, columns;
    uint8_t elements[1];
} ZqArray2dU8;
typedef ZqArray2dU8** ZqArray2dU8Handle;
typedef struct ZqArray2dI16 {
    int32_t rows, columns;
    int16_t elements[1];
} ZqArray2dI16;
typedef ZqArray2dI16** ZqArray2dI16Handle;
typedef struct ZqArray2dSgl {
    int32_t rows, columns;
    float elements[1];
} ZqArray2dSgl;
typedef ZqArray2dSgl** ZqArray2dSglHandle;
typedef struct ZqArray2dU32 {
    int32_t rows, columns;
    uint32_t elements[1];
} ZqArray2dU32;
typedef ZqArray2dU32** ZqArray2dU32Handle;
typedef struct ZqArray2dU64 {
    int32_t rows, columns;
    uint64_t elements[1];
} ZqArray2dU64;
typedef ZqArray2dU64** ZqArray2dU64Handle;

/* The host's error record, packed: status (1 error, 0 none) at byte 0, code at byte 1, source text
 * at byte 5. */
#pragma pack(push, 1)
typedef struct ZqErrorCluster {
    uint8_t status;
    int32_t code;
    ZqStringHandle source;
} ZqErrorCluster;
#pragma pack(pop)

/* Pixel type codes. */
enum {
    ZQ_TYPE_U8 = 0,      /* unsigned 8-bit grey, 1 byte */
    ZQ_TYPE_I16 = 1,     /* signed 16-bit grey, 2 bytes */
    ZQ_TYPE_SGL = 2,     /* 32-bit float grey, 4 bytes */
    ZQ_TYPE_COMPLEX = 3, /* two 32-bit floats: real, imaginary; 8 bytes */
    ZQ_TYPE_RGB = 4,     /* bytes blue, green, red, alpha; 4 bytes */
    ZQ_TYPE_HSL = 5,     /* bytes luminance, saturation, hue, alpha; 4 bytes */
    ZQ_TYPE_RGBU64 = 6   /* unsigned 16-bit blue, green, red, alpha; 8 bytes */
};

/* Bookkeeping of an image's buffer. */
typedef struct ZqMemoryRecord {
    uint32_t words[3];
    uint8_t physical; /* 1: the buffer came from the physical-memory allocator */
    uint8_t padding[3];
} ZqMemoryRecord;

/* The image record. A handle points at it; the object's table of operations lies in front of it.
 * Fields may be read while the image is locked; only the library writes them, except unit, xStep
 * and yStep, which a client may set. */
typedef struct ZqImageRecord {
    int32_t unit;        /* calibration unit code */
    float xStep;         /* width of one pixel in that unit */
    float yStep;         /* height of one pixel in that unit */
    int32_t type;        /* ZQ_TYPE_... */
    int32_t width;       /* pixels per row, without border */
    int32_t height;      /* rows, without border */
    int32_t reserved[2]; /* 0 */
    int32_t border;      /* pixels on each of the four sides */
    int32_t rowPixels;   /* pixels from one row to the next, border and padding included */
    uint8_t* buffer;     /* start of the allocation, or the caller's external buffer */
    void* extraInfo;     /* owned attachment, or null */
    uint8_t* firstPixel; /* pixel (0, 0); null when there are no pixels */
    char* name;          /* owned, zero-terminated; null when unnamed */
    uint32_t reserved2;  /* 0 */
    uint32_t greedySize; /* largest size asked of a greedy image's buffer; 0xFFFFFFFF: not greedy */
    uint32_t words[2];   /* 0 */
    void* customData;    /* owned keyed collection of attachments */
    uint32_t hostCookie; /* cookie of the host session; 0: none */
    ZqMemoryRecord* memoryInfo;
} ZqImageRecord;
typedef ZqImageRecord* ZqImageHandle;

/* The host's image value. Hosts copy it freely; all copies mean the same image. */
typedef struct ZqImageValue {
    ZqStringHandle name; /* empty for an unnamed image */
    ZqImageHandle image;
} ZqImageValue;

/* Rectangles of the C environment, in pixels. */
typedef struct ZqRect {
    int32_t left, top, width, height;
} ZqRect;
typedef struct ZqCoordinates {
    int32_t left, top, right, bottom; /* right and bottom exclusive */
} ZqCoordinates;

/* A 16-byte class identifier in memory order. */
typedef struct ZqClassId {
    uint32_t data1;
    uint16_t data2;
    uint16_t data3;
    uint8_t data4[8];
} ZqClassId;

#define ZQ_ASSERT_OFFSET(type, field, offset) \
    ZQ_STATIC_ASSERT(offsetof(type, field) == (offset), #type "." #field " moved")

ZQ_ASSERT_OFFSET(ZqErrorCluster, status, 0);
ZQ_ASSERT_OFFSET(ZqErrorCluster, code, 1);
ZQ_ASSERT_OFFSET(ZqErrorCluster, source, 5);
ZQ_ASSERT_OFFSET(ZqStringArray, elements, 4);
ZQ_STATIC_ASSERT(sizeof(ZqMemoryRecord) == 16, "memory record changed");
ZQ_STATIC_ASSERT(sizeof(ZqClassId) == 16, "class identifier changed");
#if UINTPTR_MAX == 0xFFFFFFFFu
ZQ_ASSERT_OFFSET(ZqImageRecord, unit, 0);
ZQ_ASSERT_OFFSET(ZqImageRecord, xStep, 4);
ZQ_ASSERT_OFFSET(ZqImageRecord, yStep, 8);
ZQ_ASSERT_OFFSET(ZqImageRecord, type, 12);
ZQ_ASSERT_OFFSET(ZqImageRecord, width, 16);
ZQ_ASSERT_OFFSET(ZqImageRecord, height, 20);
ZQ_ASSERT_OFFSET(ZqImageRecord, reserved, 24);
ZQ_ASSERT_OFFSET(ZqImageRecord, border, 32);
ZQ_ASSERT_OFFSET(ZqImageRecord, rowPixels, 36);
ZQ_ASSERT_OFFSET(ZqImageRecord, buffer, 40);
ZQ_ASSERT_OFFSET(ZqImageRecord, extraInfo, 44);
ZQ_ASSERT_OFFSET(ZqImageRecord, firstPixel, 48);
ZQ_ASSERT_OFFSET(ZqImageRecord, name, 52);
ZQ_ASSERT_OFFSET(ZqImageRecord, reserved2, 56);
ZQ_ASSERT_OFFSET(ZqImageRecord, greedySize, 60);
ZQ_ASSERT_OFFSET(ZqImageRecord, words, 64);
ZQ_ASSERT_OFFSET(ZqImageRecord, customData, 72);
ZQ_ASSERT_OFFSET(ZqImageRecord, hostCookie, 76);
ZQ_ASSERT_OFFSET(ZqImageRecord, memoryInfo, 80);
ZQ_STATIC_ASSERT(sizeof(ZqImageRecord) == 84, "image record changed");
ZQ_ASSERT_OFFSET(ZqImageValue, name, 0);
ZQ_ASSERT_OFFSET(ZqImageValue, image, 4);
ZQ_STATIC_ASSERT(sizeof(ZqErrorCluster) == 9, "error cluster changed");
#endif

ZQ_END_C

#endif
