// Writes that the system stops half-way. A limit on the size of files stands for a full disk: it
// strikes at any byte, and without the privileges that a small disk of its own would need.
#include <gtest/gtest.h>
#include <signal.h>
#include <sys/resource.h>
#include <unistd.h>
#include <zqvissvc/files.h>

#include "support/picture.h"
#include "support/scratch_folder.h"

namespace {

constexpr ZqError kDiskFull = -1074395983, kFileIo = -1074395993, kHeaderNotWritten = -1074395988;

class FileSizeLimit {
  public:
    explicit FileSizeLimit(rlim_t bytes) {
        handler_ = signal(SIGXFSZ, SIG_IGN);
        getrlimit(RLIMIT_FSIZE, &before_);
        const rlimit limit = {bytes, before_.rlim_max};
        setrlimit(RLIMIT_FSIZE, &limit);
    }
    ~FileSizeLimit() {
        setrlimit(RLIMIT_FSIZE, &before_);
        signal(SIGXFSZ, handler_);
    }
    FileSizeLimit(const FileSizeLimit&) = delete;
    FileSizeLimit& operator=(const FileSizeLimit&) = delete;

  private:
    rlimit before_{};
    void (*handler_)(int) = nullptr;
};

TEST(DiskFull, KeepsTheOldFileAndLeavesNoOther) {
    zqtest::Picture picture(ZQ_TYPE_U8, 1300, 1000);
    for (const char* type : {"AIPD", "PNG", "BMP", "JPEG", "TIFF", "JPEG2000"}) {
        for (const rlim_t limit : {0, 100, 511, 512, 513, 70000, 100000}) {
            for (const bool existed : {false, true}) {
                SCOPED_TRACE(testing::Message() << type << ' ' << limit << ' ' << existed);
                const zqtest::ScratchFolder folder;
                const std::string path = folder.path("picture");
                if (existed) zqtest::store_bytes(path, "old");
                const bool header_fails = type[0] == 'A' && limit < 512;
                {
                    const FileSizeLimit full(limit);
                    EXPECT_EQ(
                        ZqWriteFileByName(path.c_str(), picture.handle(), nullptr, type, nullptr),
                        header_fails ? kHeaderNotWritten : kFileIo);
                }
                // Only what was written of a new native file's header stays.
                const bool stays = existed || header_fails;
                EXPECT_EQ(folder.count(), stays ? 1 : 0);
                const std::string left = zqtest::load_bytes(path);
                EXPECT_TRUE(existed ? left == "old" : left.size() == (header_fails ? limit : 0));
            }
        }
    }
}

TEST(DiskFull, ToldByADevice) {
    zqtest::Picture picture(ZQ_TYPE_U8, 600, 500), small(ZQ_TYPE_U8, 2, 2);
    const auto write = [](zqtest::Picture& what, const char* type) {
        return ZqWriteFileByName("/dev/full", what.handle(), nullptr, type, nullptr);
    };
    EXPECT_EQ(write(picture, "AIPD"), kHeaderNotWritten);
    EXPECT_EQ(write(picture, "PNG"), kDiskFull);
    EXPECT_EQ(write(picture, "BMP"), kDiskFull);
    EXPECT_EQ(write(picture, "JPEG"), kDiskFull);
    EXPECT_EQ(write(picture, "TIFF"), kDiskFull);
    EXPECT_EQ(write(picture, "JPEG2000"), kDiskFull);
    EXPECT_EQ(write(small, "PNG"), kDiskFull) << "seen at the end, when the stream is flushed";
    EXPECT_EQ(access("/dev/full", F_OK), 0) << "a device is never removed";
}

}  // namespace
