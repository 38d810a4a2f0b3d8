// A device without room: what libtiff is told of it, and for how long.
#include "files/tiff_session.h"

#include <gtest/gtest.h>

#include <vector>

namespace zq {
namespace {

// The end of the rows is written by a seek, whose result libtiff does not look at. What it writes
// next would go into the stream's buffer without a failure.
TEST(TiffStream, AFailureOfRowsThatWaitedIsNotForgotten) {
    OutputFile file("/dev/full");
    TiffStream stream;
    stream.output = &file;
    const std::vector<std::uint8_t> pixels(2000, 7);
    EXPECT_EQ(stream.write("II*\0\0\0\0", 8), 8);
    stream.rows = {pixels.data(), 100, 90, 20};
    EXPECT_EQ(stream.write(pixels.data(), 1800), 1800);
    stream.rows = {};
    EXPECT_FALSE(stream.seek(4));
    EXPECT_EQ(stream.write("abcd", 4), 0);
    EXPECT_FALSE(stream.write_waiting());
    EXPECT_EQ(file.last_error(), kDiskFull);
}

}  // namespace
}  // namespace zq
