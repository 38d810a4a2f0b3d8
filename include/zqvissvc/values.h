/* Images as values of the host: the functions that the host calls on its image data type, and the
 * way between values and handles. Protocol and threads as in image.h. */
#ifndef ZQVISSVC_VALUES_H
#define ZQVISSVC_VALUES_H

#include "types.h"

ZQ_BEGIN_C

/* Writes the exported name of the data type's hook for a selector into *name (resized): 0
 * unflatten, 1 flatten, 2 open, 3 close, 4 duplicate, 10 flatten with version; empty for 5 to 9
 * and 11. Above 11 nothing is written. Returns 0. */
ZQ_API ZqError ZQ_CALL DF_ImageDTClassInfo(int32_t selector, ZqStringHandle* name);

/* Opening a value creates nothing: *out becomes null. Closing one never disposes the image. Both
 * return 0. */
ZQ_API ZqError ZQ_CALL DF_ImageDTOpen(const ZqImageValue* value, void** out);
ZQ_API ZqError ZQ_CALL DF_ImageDTClose(const ZqImageValue* value);

/* Copies the value's two words; both values mean the same image and share the name's string. */
ZQ_API ZqError ZQ_CALL DF_ImageDTDuplicate(const ZqImageValue* value, ZqImageValue* out);

/* Cluster to value: when the cluster names a live image, the value gets that image and its name;
 * otherwise only the cluster's name. -1074395269 for a null value; the code of the copy of the
 * name. */
ZQ_API ZqError ZQ_CALL DF_DFDTToImage(ZqImageValue* value, const ZqImageValue* cluster);

/* Cluster to value, registered with the host: a null cluster, or one without image, makes the
 * value's name word null (its string is disposed). A value that names no live image gets the
 * cluster's name and image word. A value that names one loses its old registration and is
 * registered for the cluster's name and image. */
ZQ_API ZqError ZQ_CALL DF_ImageToDFDT(const ZqImageValue* cluster, ZqImageValue* value);

/* ---- Core functions for sibling libraries (by ordinal on Windows). */

/* Records the host session of an image; 0 means none. -1074396120 for a handle that is not live. */
ZQ_API ZqError ZQ_CALL SetImageCookies(ZqImageHandle image, uint32_t cookie);

/* The live image of a value in *image (not null). A null value that the host knows nothing of gives
 * null and 0. When the host lacks its session services *image receives the value's image word
 * unchecked and the result is -1074396155. */
ZQ_API ZqError ZQ_CALL ZqLookUpImage(const ZqImageValue* value, ZqImageHandle* image);

ZQ_END_C

#endif
