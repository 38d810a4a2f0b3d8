/* Bayer decoding: the samples of a colour sensor to RGB pixels, in buffers of the caller's. */
#ifndef ZQVISSVC_BAYER_H
#define ZQVISSVC_BAYER_H

#include "types.h"

ZQ_BEGIN_C

/* Fills three white-balance tables. Entry i of each is min(255, i * g >> (bits + 2)), where g is
 * the gain in 1/1024, rounded, and bits the depth, 8 for a depth of 0; it stands in the byte of its
 * colour: red in bits 16 to 23, green in bits 8 to 15, blue in bits 0 to 7.
 * redGain, greenGain, blueGain     at least 0 and below 3.999.
 * redTable, greenTable, blueTable  borrowed, written; 256 entries each for a depth of 8 or less,
 * 65,536 for a greater one.
 * bitDepth                         bits of a sample, 0 to 16.
 * Returns 0; ZQ_ERR_BAYER_RED_GAIN, ZQ_ERR_BAYER_GREEN_GAIN, ZQ_ERR_BAYER_BLUE_GAIN,
 * ZQ_ERR_BAYER_NULL_POINTER or ZQ_ERR_BAYER_BIT_DEPTH, whichever is found first in this order; then
 * nothing is written. Threads: safe. */
ZQ_API ZqError ZQ_CALL Gen_CalculateBayerColorLUT(double redGain, double greenGain, double blueGain,
                                                  uint32_t* redTable, uint32_t* greenTable,
                                                  uint32_t* blueTable, uint32_t bitDepth);

/* Decodes a mosaic by bilinear interpolation. A pixel is the "or" of one entry of each table, whole
 * words as the tables hold them. Beyond the edges samples are mirrored; a single column is its own
 * neighbour.
 * pixels           borrowed, written; rows x columns of them; not overlapping the samples.
 * samples          borrowed; bytes for a depth of 8 or less, 16-bit words for a greater one. For a
 * single row the line that follows it is read too, as the row above and below.
 * rows, columns    at least 1.
 * pixelLineWidth   pixels from one row to the next. Rows are written from the first to the last, so
 * where they overlap the later one stays.
 * sampleLineWidth  samples from one row to the next.
 * redTable, greenTable, blueTable  borrowed; for the same depth, with as many entries as
 * Gen_CalculateBayerColorLUT writes.
 * pattern          0 to 3, the colours of columns 0 and 1 of rows 0 and 1: 0 green blue, red green;
 * 1 green red, blue green; 2 blue green, green red; 3 red green, green blue.
 * bitDepth         0 to 16; tells the kind of samples.
 * Returns 0; ZQ_ERR_BAYER_NULL_POINTER; ZQ_ERR_BAYER_SIZE for no rows or columns and for an area
 * larger than memory; ZQ_ERR_BAYER_PATTERN; ZQ_ERR_BAYER_BIT_DEPTH; whichever is found first in
 * this order; then nothing is written. Threads: safe for different pixels. */
ZQ_API ZqError ZQ_CALL Gen_BayerColorDecode(uint32_t* pixels, const void* samples, uint32_t rows,
                                            uint32_t columns, uint32_t pixelLineWidth,
                                            uint32_t sampleLineWidth, const uint32_t* redTable,
                                            const uint32_t* greenTable, const uint32_t* blueTable,
                                            uint32_t pattern, uint32_t bitDepth);

ZQ_END_C

#endif
