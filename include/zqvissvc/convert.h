/* Conversion: pixels into host arrays, and images into other pixel types.
 *
 * All functions return 0 or an error code, and report it into the error cluster (may be null);
 * an error that is already there is returned at once and nothing happens. Images are locked for the
 * whole call, so calls for the same image from several threads take turns. */
#ifndef ZQVISSVC_CONVERT_H
#define ZQVISSVC_CONVERT_H

#include "types.h"

ZQ_BEGIN_C

/* ---- Image to array. `rectangle` (borrowed, null for the whole image) holds left, top, right,
 * bottom as signed numbers; right and bottom are exclusive, and what it does not hold is 0, 0, the
 * right and the lower edge. Exchanged corners mean the same rectangle; what lies outside the image
 * is left off, and a rectangle wholly outside gives an array without elements.
 *
 * Only the array of the image's type is written, the others are neither read nor changed and may be
 * null: rows x columns elements, one a pixel, the pixel's bytes as stored. It is the caller's; a
 * null handle is given a block. The forms _Bounded never resize it; they only store the counts and
 * the elements in its block.
 *
 * Errors: ZQ_ERR_NOT_AN_IMAGE; ZQ_ERR_INVALID_IMAGE_TYPE for a type that the function has no array
 * for; ZQ_ERR_MEMORY for a null array (bounded: or a null handle); ZQ_ERR_OUTPUT_ARRAY_TOO_SMALL
 * (bounded: its block has not enough room); ZQ_ERR_NOT_ENOUGH_MEMORY. The array of an RGB or HSL
 * image is 0 x 0 after the last two, any other array what it was. */

/* U8, I16 and SGL images. */
ZQ_API ZqError ZQ_CALL DF_ImageToArray(const ZqImageValue* image, ZqArrayI32Handle rectangle,
                                       ZqArray2dU8Handle* u8, ZqArray2dI16Handle* i16,
                                       ZqArray2dSglHandle* sgl, ZqErrorCluster* error);
ZQ_API ZqError ZQ_CALL DF_ImageToArray_Bounded(const ZqImageValue* image,
                                               ZqArrayI32Handle rectangle, ZqArray2dU8Handle* u8,
                                               ZqArray2dI16Handle* i16, ZqArray2dSglHandle* sgl,
                                               ZqErrorCluster* error);

/* RGB and HSL images, as words 0xAARRGGBB and 0xAAHHSSLL. A rectangle without pixels gives 0 x 0.
 */
ZQ_API ZqError ZQ_CALL DF_ColorImageToArray(const ZqImageValue* image, ZqArrayI32Handle rectangle,
                                            ZqArray2dU32Handle* u32, ZqErrorCluster* error);
ZQ_API ZqError ZQ_CALL DF_ColorImageToArray_Bounded(const ZqImageValue* image,
                                                    ZqArrayI32Handle rectangle,
                                                    ZqArray2dU32Handle* u32, ZqErrorCluster* error);

/* The same, and RGB (U64) images as words 0xAAAARRRRGGGGBBBB; for these a rectangle without pixels
 * gives the counts that it has, one or both of them 0. */
ZQ_API ZqError ZQ_CALL DF_ColorImageToArray_v2(const ZqImageValue* image,
                                               ZqArrayI32Handle rectangle, ZqArray2dU32Handle* u32,
                                               ZqArray2dU64Handle* u64, ZqErrorCluster* error);
ZQ_API ZqError ZQ_CALL DF_ColorImageToArray_Bounded_v2(const ZqImageValue* image,
                                                       ZqArrayI32Handle rectangle,
                                                       ZqArray2dU32Handle* u32,
                                                       ZqArray2dU64Handle* u64,
                                                       ZqErrorCluster* error);

/* ---- Image to image */

/* Gives the destination the source's size, border size and picture, in the destination's own pixel
 * type; the border's pixels are copied when the types are the same, else undefined. The same image
 * twice changes nothing. A destination that means no image is looked for by its name, and means the
 * image that is found from then on; without an image of that name, one without an image word
 * becomes a further value of the source, one with a stale word is refused. Null is no destination:
 * nothing happens then.
 *
 * Grey values go into luminance and into all three colours, colours become grey as their mean, and
 * alpha is 0 where the source has none. 16-bit samples become 8 bits by the source's bit depth
 * (DF_ImageBitDepth2), rounding half up, or clamped where none is set; other narrowing clamps and
 * cuts towards zero, NaN giving the lower bound. Complex pixels count by their magnitude; as RGB
 * they are shown as a spectrum: magnitude * 128 / (width * height), at most 255, the quadrants
 * exchanged so that the origin lies in the centre. RGB becomes HSL by the toolkit's colour model in
 * double precision, HSL becomes RGB by its fixed-point form; RGB (U64) becomes HSL by way of 8
 * bits.
 *
 * Errors: ZQ_ERR_NOT_AN_IMAGE, ZQ_ERR_IMAGE_LENT (the destination would have to change its size),
 * ZQ_ERR_NOT_ENOUGH_MEMORY, ZQ_ERR_POOL_EXHAUSTED; the destination then is as it was. */
ZQ_API ZqError ZQ_CALL DF_Convert(const ZqImageValue* source, ZqImageValue* destination,
                                  ZqErrorCluster* error);

ZQ_END_C

#endif
