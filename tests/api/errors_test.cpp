// How results reach the host: source texts, modes, the last error, message texts, siblings' code
// ranges.
#include <gtest/gtest.h>
#include <zqvissvc/errors.h>

#include <algorithm>
#include <climits>
#include <cstring>
#include <string>
#include <thread>
#include <vector>

#include "refhost/refhost.h"
#include "support/message_boxes.h"

namespace {

// A cluster with a source string of its own.
class Cluster {
  public:
    explicit Cluster(std::string_view source = {}) { error.source = refhost::new_string(source); }
    ~Cluster() { refhost::dispose(error.source); }
    Cluster(const Cluster&) = delete;
    Cluster& operator=(const Cluster&) = delete;
    std::string source() const { return refhost::text(error.source); }

    ZqErrorCluster error{};
};

class ErrorsTest : public testing::Test {
  protected:
    ~ErrorsTest() override { DF_SetErrorMode(ZQ_ERROR_MODE_DEFAULT, 1, nullptr, nullptr); }
    zqtest::MessageBoxes boxes_;
};

constexpr int32_t kCreate = 313;

TEST_F(ErrorsTest, ComposesNameAndMessage) {
    struct Case {
        int32_t code, function;
        const char* source;
    };
    const Case cases[] = {
        {-1074396160, kCreate, "KEMO Create\nSystem error."},
        {-1074396120, 40217, "KEMO Create From External Buffer\nNot an image."},
        {-1074395138, 172,
         "KEMO WriteFile\nThe OCR region provided was too small to have contained any characters."},
        {-1074396157, 224, "KEMO Get Image Info\nUnknown Error."},  // a gap in the table
        {-1074395137, kCreate, "KEMO Create\nUnknown Error."},
        {-1074396161, kCreate, "KEMO Create\nUnknown Error."},
        {7, 219, "KEMO Dispose\nUnknown Error."},
        {INT_MAX, 219, "KEMO Dispose\nUnknown Error."},
        {INT_MIN, 219, "KEMO Dispose\nUnknown Error."},
        {-1074396120, 7, "\nNot an image."},  // no such name
        {-1074396120, -1, "\nNot an image."},
        {-1074396120, 65536 + kCreate, "\nNot an image."},
        {-1074396120, 0, "before"},  // no function, no text
        {0, kCreate, ""},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.code);
        Cluster cluster("before");
        cluster.error.status = 1;
        EXPECT_EQ(ZqProcessResult(c.code, &cluster.error, c.function), c.code);
        EXPECT_EQ(cluster.error.status, c.code != 0 ? 1 : 0);
        EXPECT_EQ(+cluster.error.code, c.code);
        EXPECT_EQ(cluster.source(), c.source);
        EXPECT_EQ(ZqProcessResult(c.code, nullptr, c.function), c.code);
    }
    EXPECT_TRUE(boxes_.take().empty());
}

TEST_F(ErrorsTest, GivesANullSourceABlock) {
    ZqErrorCluster error{};
    EXPECT_EQ(ZqProcessResult(0, &error, kCreate), 0);
    EXPECT_EQ(+error.source, nullptr) << "a null handle is empty as it is";
    ZqProcessResult(-1074396120, &error, kCreate);
    const refhost::Owned<ZqStringHandle> source(error.source);
    EXPECT_EQ(refhost::text(source.get()), "KEMO Create\nNot an image.");
}

TEST_F(ErrorsTest, CallersNameIsCutAt64) {
    const std::string name(70, 'n');
    Cluster cluster;
    EXPECT_EQ(DF_ProcessErrorWithVIName(-1074396120, &cluster.error, name.c_str()), -1074396120);
    EXPECT_EQ(cluster.source(), std::string(64, 'n') + "\nNot an image.");
    EXPECT_EQ(DF_CreateErrorCluster(-5, "x", &cluster.error), -1074396120) << "holds an error";
    EXPECT_EQ(cluster.source(), std::string(64, 'n') + "\nNot an image.");
    EXPECT_EQ(DF_ProcessErrorWithVIName(0, &cluster.error, "x"), 0);
    EXPECT_EQ(cluster.source(), "");
    EXPECT_EQ(DF_CreateErrorCluster(-5, nullptr, &cluster.error), -5);
    EXPECT_EQ(cluster.source(), "\nUnknown Error.");
    EXPECT_EQ(DF_CreateErrorCluster(-5, "x", nullptr), -5);
}

TEST_F(ErrorsTest, StatusAndCodeSurviveAHostWithoutMemory) {
    Cluster cluster("before");
    refhost::refuse("NumericArrayResize", 2);
    EXPECT_EQ(ZqProcessResult(-1074396120, &cluster.error, kCreate), -1074396120);
    EXPECT_EQ(cluster.error.status, 1);
    EXPECT_EQ(+cluster.error.code, -1074396120);
    EXPECT_EQ(cluster.source(), "before");
    EXPECT_EQ(ZqProcessResult(0, &cluster.error, kCreate), 0);
    EXPECT_EQ(cluster.error.status, 0);
}

TEST_F(ErrorsTest, ModeDecidesWhetherABoxIsShown) {
    struct Case {
        int32_t mode;
        bool shows;
    };
    for (const Case& c : {Case{0, true}, {1, false}, {2, false}, {7, false}, {-1, false}}) {
        SCOPED_TRACE(c.mode);
        refhost::String source("before");
        int16_t code = 5;
        EXPECT_EQ(DF_ErrorVI(c.mode, 1, &code, source.out()), 0);
        EXPECT_EQ(code, 0);
        EXPECT_EQ(source.text(), "");
        Cluster cluster(std::string(600, 's'));
        ZqProcessResult(-1074396120, &cluster.error, 0);
        ZqProcessResult(-1074396120, &cluster.error, kCreate);
        ZqProcessResult(0, &cluster.error, kCreate);
        DF_ProcessErrorWithVIName(-1074396120, &cluster.error, "caller");
        DF_ProcessErrorWithVIName(0, &cluster.error, "caller");
        const auto boxes = boxes_.take();
        if (!c.shows) {
            EXPECT_TRUE(boxes.empty());
            continue;
        }
        ASSERT_EQ(boxes.size(), 4U) << "a success under a caller's name is not shown";
        const std::string texts[] = {std::string(512, 's'), "KEMO Create\nNot an image.", "",
                                     "caller\nNot an image."};
        for (size_t i = 0; i < 4; ++i) {
            EXPECT_EQ(boxes[i].first, "KEMO Vision");
            EXPECT_EQ(boxes[i].second, texts[i]);
        }
    }
}

TEST_F(ErrorsTest, LastErrorIsCutTo16Bits) {
    struct Case {
        int32_t code, function;
        int16_t low;
        const char* source;
    };
    const Case cases[] = {
        {-1074396120, kCreate, 1064, "KEMO Create\nNot an image."},
        {-1074396160, 219, 1024, "KEMO Dispose\nSystem error."},
        {0x12348000, 219, -32768, "KEMO Dispose\nUnknown Error."},
        {0, kCreate, 0, ""},
        {-1074396120, 0, 1064, ""},
    };
    for (const Case& c : cases) {
        refhost::String source("before");
        int16_t code = 5;
        ZqProcessResult(c.code, nullptr, c.function);
        EXPECT_EQ(DF_SetErrorMode(9, 0, &code, source.out()), 0);
        EXPECT_EQ(code, c.low);
        EXPECT_EQ(source.text(), c.source);
        EXPECT_EQ(DF_SetErrorMode(9, 0, nullptr, nullptr), 0);
    }
    refhost::String source("before");
    int16_t code = 5;
    DF_ProcessErrorWithVIName(-1074396120, nullptr, "caller");
    EXPECT_EQ(DF_SetErrorMode(0, 0, &code, source.out()), 0);
    EXPECT_EQ(code, 1064);
    EXPECT_EQ(source.text(), "") << "there is no display name to compose it from";
}

TEST_F(ErrorsTest, ErrorTextCountsItsTerminator) {
    const int32_t same = INT_MIN;  // no number of the C environment stands for this code
    struct Case {
        int32_t code, number;
        std::string text;
    };
    const Case cases[] = {
        {-1074396160, 1, "System error."},
        {-1074395138, 1023,
         "The OCR region provided was too small to have contained any characters."},
        {0, 0, "No error."},
        {-1074395137, 1024, "Unknown Error."},
        {-1074396157, 4, "Unknown Error."},
        {-1074445848, -49687, "Unknown Error."},  // a display name would sit there
        {5, same, "Unknown Error."},
        {INT_MIN, same, "Unknown Error."},
        {INT_MAX, INT_MAX, "Unknown Error."},
        // The longest that is handed out: 127 bytes of a longer message.
        {-1074396082, 79,
         "Only 8-bit images support the use of palettes.  Either do not use a palette, or convert "
         "your image to an 8-bit image before usi"},
    };
    for (const Case& c : cases) {
        refhost::String text("before");
        EXPECT_EQ(GetErrorText(c.code, text.out()), 0);
        EXPECT_EQ(text.text(), std::string(c.text.c_str(), c.text.size() + 1)) << c.code;
        EXPECT_EQ(TKR_GetErrorText(c.number, text.out()), 0);
        EXPECT_EQ(text.text(), std::string(c.text.c_str(), c.text.size() + 1)) << c.number;
    }
    refhost::String text("before");
    EXPECT_EQ(GetErrorText(0, nullptr), ZQ_ERR_NULL_POINTER);
    refhost::refuse("NumericArrayResize");
    EXPECT_EQ(GetErrorText(-1074396120, text.out()), ZQ_ERR_NOT_ENOUGH_MEMORY);
    EXPECT_EQ(text.text(), "before");
}

// A sibling with messages 100 to 109 for its codes 5000 to 5009: 100 is fine, 101 is missing, 102
// fills all the room and claims more, and a display name of 70 bytes as text 7.
int32_t ZQ_CALL sibling_text(void* argument, int32_t id, char* text, int32_t capacity) {
    ++*static_cast<int*>(argument);
    std::memset(text, 'x', static_cast<size_t>(capacity));
    if (id == 100) std::copy_n("fine", 4, text);
    return id == 100 ? 4 : id == 101 ? 0 : id == 7 ? capacity - 1 : capacity + 50;
}

TEST_F(ErrorsTest, SiblingsReportTheirOwnCodes) {
    static int asked = 0;
    ASSERT_EQ(ZqRegisterErrorTable(5000, 5009, 100, sibling_text, &asked), 0);
    const std::string name(64, 'x');
    struct Case {
        int32_t code, function;
        std::string source;
    };
    const Case cases[] = {
        {5000, 7, name + "\nfine"},
        {5001, kCreate, "KEMO Create\nUnknown Error."},
        {5002, 7, name + '\n' + std::string(256, 'x')},
        {4999, kCreate, "KEMO Create\nUnknown Error."},
        {5010, kCreate, "KEMO Create\nUnknown Error."},
        {-1074396120, kCreate, "KEMO Create\nNot an image."},
    };
    for (const Case& c : cases) {
        Cluster cluster;
        ZqProcessResult(c.code, &cluster.error, c.function);
        EXPECT_EQ(cluster.source(), c.source);
    }
    EXPECT_GT(asked, 0);
}

TEST_F(ErrorsTest, RefusesRangesThatCannotBe) {
    static int asked = 0;
    ASSERT_EQ(ZqRegisterErrorTable(6000, 6009, 100, sibling_text, &asked), 0);
    struct Case {
        int32_t first, last, base;
    };
    const Case cases[] = {
        {6000, 6009, 100},     {6009, 6020, 100},     {5990, 6000, 100},
        {5990, 6020, 100},     {6004, 6005, 100},     {6101, 6100, 100},
        {6100, 6101, 0},       {6100, 6101, -1},      {6100, 6101, 65535},
        {INT_MIN, INT_MAX, 1}, {6100, 6101, INT_MAX}, {-1074395138, -1074395000, 1},
    };
    for (const Case& c : cases) {
        EXPECT_EQ(ZqRegisterErrorRange(c.first, c.last, c.base, nullptr), ZQ_ERR_INVALID_PARAMETER);
        EXPECT_EQ(ZqRegisterErrorTable(c.first, c.last, c.base, sibling_text, &asked),
                  ZQ_ERR_INVALID_PARAMETER);
    }
    EXPECT_EQ(ZqRegisterErrorTable(6100, 6101, 1, nullptr, nullptr), ZQ_ERR_NULL_POINTER);
    // This library's own table: text 140 and the one after it.
    EXPECT_EQ(ZqRegisterErrorRange(6100, 6101, 140, nullptr), 0);
    Cluster cluster;
    ZqProcessResult(6101, &cluster.error, kCreate);
    EXPECT_EQ(cluster.source(), "KEMO Create\nAIPD");
    EXPECT_EQ(asked, 0);
}

TEST_F(ErrorsTest, RegistrationIsSafeWhileOtherThreadsReport) {
    static int asked = 0;
    std::vector<std::thread> threads;
    threads.reserve(4);
    for (int i = 0; i < 4; ++i) {
        threads.emplace_back([i] {
            for (int n = 0; n < 200; ++n) {
                const int32_t code = 100000 + 1000 * i + n;
                EXPECT_EQ(ZqRegisterErrorTable(code, code, 101, sibling_text, &asked), 0);
                ZqProcessResult(-1074396120, nullptr, kCreate);
            }
        });
    }
    for (std::thread& thread : threads) thread.join();
}

}  // namespace
