// What the tests of TIFF files have in common.
#pragma once

#include <gtest/gtest.h>
#include <zqvissvc/files.h>

#include "support/bare_tiff.h"
#include "support/picture.h"
#include "support/scratch_folder.h"

namespace zqtest {

class TiffFiles : public testing::Test {
  protected:
    ZqError write(Picture& picture, int32_t compression = 0, ZqArrayU32Handle* table = nullptr) {
        const ZqWriteOptions options = {1, {0, 0, compression}};
        return ZqWriteFileByName(path_.c_str(), picture.handle(), &options, "TIFF", table);
    }
    ZqError read(Picture& picture, int32_t* format = nullptr, ZqArrayU32Handle* table = nullptr) {
        return ZqReadFile(picture.handle(), path_.c_str(), nullptr, nullptr, format, table);
    }
    void store(const BareTiff& file) { store_bytes(path_, file.bytes()); }
    int32_t sample_offset(Picture& picture) {
        int32_t offset = 1;
        EXPECT_EQ(ZqGetSampleOffset(picture.handle(), &offset), 0);
        return offset;
    }

    ScratchFolder folder_;
    std::string path_ = folder_.path("picture.tif");
};

}  // namespace zqtest
