/* Custom data on images: byte strings by key that ride with an image until it is disposed, whatever
 * becomes of its pixels.
 *
 * A key is zero-terminated bytes, compared byte by byte (so letter case counts); an empty key is
 * one too. A value is 1 to 2147483647 bytes of any kind.
 *
 * image  borrowed; locked for the whole call. No image: ZQ_ERR_NOT_AN_IMAGE.
 * key    borrowed; null: ZQ_ERR_NULL_POINTER.
 * error  as everywhere: a cluster that holds an error already is returned untouched and nothing
 *        happens; null is tolerated.
 * All return 0 or the code of the first fault, found in this order: error, image, null pointers,
 * the size or key; ZQ_ERR_NOT_ENOUGH_MEMORY when the library or the host has none. After a failure
 * the image and what the caller passed in hold what they held before.
 * Threads: any; calls on one image come one after the other. */
#ifndef ZQVISSVC_CUSTOM_DATA_H
#define ZQVISSVC_CUSTOM_DATA_H

#include "types.h"

ZQ_BEGIN_C

/* Stores a copy of a value under a key and replaces the one that was there.
 * data  borrowed; `size` bytes; not looked at when size is 0.
 * size  bytes; 0 and more than 2147483647: ZQ_ERR_CUSTOM_DATA_SIZE. */
ZQ_API ZqError ZQ_CALL DF_WriteCustomData(const ZqImageValue* image, const char* key,
                                          const void* data, uint32_t size, ZqErrorCluster* error);

/* Copies a value out; ZQ_ERR_CUSTOM_DATA_KEY when the image has no such key.
 * value  a DS handle, resized to exactly the value's bytes, without a count; a null handle is given
 *        a block, which belongs to the caller. A null pointer: ZQ_ERR_NULL_POINTER.
 * size   written; the value's bytes; may be null. */
ZQ_API ZqError ZQ_CALL DF_ReadCustomData(const ZqImageValue* image, const char* key,
                                         ZqHandle* value, uint32_t* size, ZqErrorCluster* error);

/* Removes a key and its value; ZQ_ERR_CUSTOM_DATA_KEY when the image has no such key. */
ZQ_API ZqError ZQ_CALL DF_RemoveCustomData(const ZqImageValue* image, const char* key,
                                           ZqErrorCluster* error);

/* Lists the keys, ascending by their bytes; none for an image without custom data.
 * keys  the array is resized and filled with new strings (a null handle for an empty key), which
 *       belong to the caller as the array does; strings that it held are disposed. A null handle is
 *       given a block, a null pointer is ZQ_ERR_NULL_POINTER. */
ZQ_API ZqError ZQ_CALL DF_EnumerateCustomKeys(const ZqImageValue* image, ZqStringArrayHandle* keys,
                                              ZqErrorCluster* error);

ZQ_END_C

#endif
