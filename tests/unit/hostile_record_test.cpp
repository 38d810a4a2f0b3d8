// Records that somebody has damaged: always a code, and whatever was there stays.
#include <gtest/gtest.h>
#include <zqvissvc/flatten.h>
#include <zqvissvc/image.h>

#include <bit>
#include <cstdint>
#include <string>
#include <vector>

#include "image/registry.h"
#include "serialize/record.h"
#include "tests/support/image_probes.h"
#include "tests/support/picture.h"
#include "tests/support/record.h"

namespace zq {
namespace {

using zqtest::Picture;

// Small records of every version, kind and codec.
std::vector<std::string> small_records() {
    std::vector<std::string> all;
    for (const int32_t type : {ZQ_TYPE_U8, ZQ_TYPE_SGL, ZQ_TYPE_RGB, ZQ_TYPE_RGBU64}) {
        const Picture picture(type, 3, 2, 1);
        for (const int32_t codec : {0, 1, 2}) {
            for (const std::uint32_t version : {kStringVersion, kNewestVersion}) {
                refhost::String string;
                EXPECT_EQ(FlattenImageToArray1D2(picture.handle(), string.out(), 2, codec, 1, 500,
                                                 1, static_cast<int32_t>(version)),
                          0);
                zqtest::Record record(string.text());
                record.attachment = "object";
                record.name = "n";
                all.push_back(record.bytes());
            }
        }
    }
    all.push_back(zqtest::grey_record(kOldestVersion, 3, 2, 1, 8).bytes());
    return all;
}

class HostileRecordTest : public testing::Test {
  protected:
    // Into an image that is there, then into a new one.
    void try_record(const std::string& bytes) {
        const std::string before = target.state();
        const std::size_t live = Registry::instance().live_count();
        ZqImageHandle image = target.handle();
        const ZqError code = zqtest::unflatten(bytes, &image);
        if (code != 0) {
            ++refused;
            ASSERT_EQ(target.state(), before);
        } else {
            target.state();  // reads every pixel
        }
        ZqImageHandle made = nullptr;
        const ZqError again = zqtest::unflatten(bytes, &made);
        ASSERT_EQ(again, code);
        ASSERT_EQ(made != nullptr, code == 0);
        ZqDisposeImage(made);
        ASSERT_EQ(Registry::instance().live_count(), live);
    }

    Picture target{ZQ_TYPE_I16, 4, 4, 2};
    int refused = 0;
};

TEST_F(HostileRecordTest, EveryTruncationAndEveryAppendixIsRefused) {
    int tried = 0;
    for (const std::string& record : small_records()) {
        for (std::size_t size = 0; size < record.size(); ++size, ++tried) {
            ASSERT_NO_FATAL_FAILURE(try_record(record.substr(0, size)));
        }
        ASSERT_NO_FATAL_FAILURE(try_record(record + '\0'));
        ++tried;
    }
    EXPECT_EQ(refused, tried);
}

TEST_F(HostileRecordTest, EveryChangedByteGivesAnImageOrACode) {
    for (const std::string& record : small_records()) {
        for (std::size_t i = 0; i < record.size(); ++i) {
            for (const int change : {0x01, 0x02, 0x80, 0xFF}) {
                std::string changed = record;
                changed[i] = static_cast<char>(changed[i] ^ change);
                ASSERT_NO_FATAL_FAILURE(try_record(changed)) << "byte " << i;
            }
        }
    }
    EXPECT_GT(refused, 0);
}

TEST(RecordTest, AMachineOfTheOtherByteOrderMeansTheSameRecord) {
    constexpr std::endian kForeign =
        std::endian::native == std::endian::little ? std::endian::big : std::endian::little;
    RecordHeader header(kNewestVersion);
    header[RecordWord::kWidth] = 0x01020304;
    header[RecordWord::kSourceImage] = 0xA1B2C3D4;
    std::vector<std::uint8_t> own(header.size()), foreign(header.size());
    header.write(own);
    header.write(foreign, kForeign);
    EXPECT_EQ(own[40], 4);
    EXPECT_EQ(foreign[40], 1);
    EXPECT_EQ(RecordHeader::read(foreign, kForeign)[RecordWord::kSourceImage], 0xA1B2C3D4U);
    EXPECT_EQ(zqtest::code_of([&] { RecordHeader::read(foreign); }), kInitializationError);
}

}  // namespace
}  // namespace zq
