// What is looked at in a JPEG 2000 file before OpenJPEG gets to see it.
#include "files/jpeg2000_layout.h"

#include <gtest/gtest.h>

#include <bit>
#include <string>
#include <vector>

#include "support/bare_jpeg2000.h"
#include "support/scratch_folder.h"

namespace zq {
namespace {

// For each block OpenJPEG takes hundreds of bytes, in a blank picture as well.
TEST(Jpeg2000Layout, SmallCodeBlocksNeedBytes) {
    zqtest::BareJpeg2000 bare{.components = std::vector<zqtest::BareJpeg2000::Component>(3)};
    const std::string stream = bare.encode();
    const zqtest::ScratchFolder folder;
    const auto code_of = [&](unsigned width, unsigned height, std::uint32_t side,
                             std::size_t bytes_behind) {
        std::string bytes = stream;
        const std::size_t style = bytes.find("\xFF\x52") + 2;
        bytes[style + 8] = static_cast<char>(std::countr_zero(width) - 2);
        bytes[style + 9] = static_cast<char>(std::countr_zero(height) - 2);
        for (const std::size_t field : {8, 12, 24, 28})
            bytes.replace(field, 4, zqtest::big_endian(side, 4));
        const std::string path = folder.path("file.j2k");
        zqtest::store_bytes(path, bytes + std::string(bytes_behind, 'x'));
        InputFile file(path.c_str());
        Jpeg2000Layout layout;
        try {
            EXPECT_TRUE(read_jpeg2000_layout(file, layout));
            return kSuccess;
        } catch (GRLIBError_enum code) {
            return code;
        }
    };
    struct Case {
        unsigned width, height;
        std::uint32_t side;
        std::size_t bytes_behind;
        GRLIBError_enum code;
    };
    for (const Case& c : {Case{64, 64, 4000, 0, kSuccess},
                          {16, 16, 4000, 0, kSuccess},
                          {8, 16, 4000, 0, kSuccess},
                          {4, 1024, 4000, 0, kSuccess},
                          {4, 4, 4000, 0, kUnableToReadData},
                          {16, 4, 4000, 0, kSuccess},
                          {4, 8, 4000, 0, kUnableToReadData},
                          {4, 4, 300, 0, kSuccess},
                          {4, 4, 4000, 1 << 20, kSuccess}}) {
        SCOPED_TRACE(testing::Message() << c.width << 'x' << c.height << ' ' << c.side);
        EXPECT_EQ(code_of(c.width, c.height, c.side, c.bytes_behind), c.code);
    }
}

}  // namespace
}  // namespace zq
