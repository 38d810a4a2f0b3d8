// Entry points: tables and decoding of Bayer mosaics.
#include <zqvissvc/bayer.h>

#include "convert/bayer.h"
#include "host/boundary.h"

using namespace zq;

ZqError ZQ_CALL Gen_CalculateBayerColorLUT(double redGain, double greenGain, double blueGain,
                                           uint32_t* redTable, uint32_t* greenTable,
                                           uint32_t* blueTable, uint32_t bitDepth) {
    return host::run_core([&] {
        calculate_bayer_tables({redGain, greenGain, blueGain}, {redTable, greenTable, blueTable},
                               bitDepth);
    });
}

ZqError ZQ_CALL Gen_BayerColorDecode(uint32_t* pixels, const void* samples, uint32_t rows,
                                     uint32_t columns, uint32_t pixelLineWidth,
                                     uint32_t sampleLineWidth, const uint32_t* redTable,
                                     const uint32_t* greenTable, const uint32_t* blueTable,
                                     uint32_t pattern, uint32_t bitDepth) {
    return host::run_core([&] {
        decode_bayer({samples, rows, columns, sampleLineWidth, pattern, bitDepth},
                     {redTable, greenTable, blueTable}, pixels, pixelLineWidth);
    });
}
