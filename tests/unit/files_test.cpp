// Behind the file entry points: the safe replacement of a target, and the compression rule.
#include <gtest/gtest.h>

#include "files/output_file.h"
#include "files/png_writer.h"
#include "files/stdio_errors.h"
#include "support/scratch_folder.h"

namespace zq {
namespace {

using zqtest::load_bytes;

TEST(OutputFile, TakesItsPlaceOnlyWhenCommitted) {
    enum class End { kCommit, kGiveUp, kAbandon };
    struct Case {
        const char* name;
        bool existed;
        End end;
        const char* left;
    };
    const Case cases[] = {
        {"new", false, End::kCommit, "new"},   {"replaced", true, End::kCommit, "new"},
        {"failed", false, End::kGiveUp, ""},   {"failed over another", true, End::kGiveUp, "old"},
        {"kept", false, End::kAbandon, "new"}, {"kept another", true, End::kAbandon, "old"},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        const zqtest::ScratchFolder folder;
        const std::string path = folder.path("target");
        if (c.existed) zqtest::store_bytes(path, "old");
        {
            OutputFile file(path.c_str());
            file.write("new", 3);
            EXPECT_EQ(load_bytes(path), c.existed ? "old" : "");
            if (c.end == End::kCommit) file.commit();
            if (c.end == End::kAbandon) file.abandon_in_place();
        }
        EXPECT_EQ(load_bytes(path), c.left);
        EXPECT_EQ(folder.count(), *c.left == '\0' ? 0 : 1);
    }
}

TEST(StdioErrors, MapsErrorNumbersOnce) {
    struct Case {
        int number;
        GRLIBError_enum code;
    };
    for (const Case c : {Case{ENOENT, kFileNotFound}, Case{ENOMEM, kNotEnoughMemory},
                         Case{EACCES, kFileAccessDenied}, Case{EINVAL, kInvalidParameter},
                         Case{EMFILE, kTooManyFilesOpen}, Case{ENOSPC, kDiskFull},
                         Case{EISDIR, kFileIo}, Case{0, kFileIo}, Case{-1, kFileIo}}) {
        EXPECT_EQ(code_of_errno(c.number), c.code) << c.number;
    }
}

TEST(PngCompression, FollowsTheSetting) {
    constexpr int kGrey = PNG_COLOR_TYPE_GRAY, kRgb = PNG_COLOR_TYPE_RGB,
                  kPalette = PNG_COLOR_TYPE_PALETTE;
    struct Case {
        int setting, colour_type;
        bool transparency;
        int level, filters;
    };
    const Case cases[] = {
        {0, kRgb, false, 9, PNG_FILTER_NONE},
        {1, kRgb, false, 9, PNG_ALL_FILTERS},
        {5, kRgb, false, 9, PNG_ALL_FILTERS},
        {5, kRgb, true, 9, PNG_FILTER_NONE},
        {5, kGrey, false, 9, PNG_FILTER_NONE},
        {5, kPalette, false, 9, PNG_FILTER_NONE},
        {45, kRgb, false, 5, PNG_ALL_FILTERS},
        {55, kRgb, false, 4, PNG_FILTER_NONE},
        {34, kGrey, false, 6, PNG_ALL_FILTERS},
        {50, kRgb, false, 5, PNG_FILTER_NONE},
        {49, kRgb, false, 5, PNG_FILTER_SUB},
        {48, kRgb, false, 5, PNG_FILTER_UP},
        {47, kRgb, false, 5, PNG_FILTER_AVG},
        {46, kRgb, false, 5, PNG_FILTER_PAETH},
        {91, kPalette, true, 0, PNG_ALL_FILTERS},
        {100, kGrey, false, 0, PNG_FILTER_NONE},
        {45, PNG_COLOR_TYPE_RGB_ALPHA, false, 5, PNG_ALL_FILTERS},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(testing::Message() << c.setting << ' ' << c.colour_type);
        const PngCompression result = png_compression(c.setting, c.colour_type, c.transparency);
        EXPECT_EQ(result.level, c.level);
        EXPECT_EQ(result.filters, c.filters);
    }
}

}  // namespace
}  // namespace zq
