// The string table against the figures of the published table, and the boundary around entry
// points.
#include <gtest/gtest.h>
#include <zlib.h>
#include <zqvissvc/errors.h>
#include <zqvissvc/slots.h>

#include <cstdint>
#include <functional>
#include <new>
#include <stdexcept>
#include <string>

#include "base/error_codes.h"
#include "host/boundary.h"
#include "host/error_report.h"
#include "platform/string_resource.h"
#include "refhost/refhost.h"

namespace zq::host {
namespace {

// Counts and CRC-32 of the lines "number text\n", in order, number being the code of a message and
// the id of any other text. The expected values were taken from the published tables; ids from
// 40380 to 49999 are texts of the library's own.
TEST(ErrorTableTest, HoldsEveryPublishedText) {
    struct Case {
        unsigned first, last;
        std::int64_t offset;  // from id to number
        int count;
        unsigned long checksum;
    };
    const Case cases[] = {
        {1, 40379, 0, 50, 0x8e14be5aUL},
        {50000, 65535, -1074446161, 544, 0x0cd8c4deUL},
    };
    for (const Case& c : cases) {
        int count = 0;
        unsigned long checksum = crc32(0, nullptr, 0);
        for (unsigned id = c.first; id <= c.last; ++id) {
            char text[512];
            if (platform::load_string(nullptr, id, text, sizeof text) == 0) continue;
            ++count;
            const std::int64_t number = id == 50000 ? 0 : id + c.offset;
            const std::string line = std::to_string(number) + ' ' + text + '\n';
            checksum = crc32(checksum, reinterpret_cast<const Bytef*>(line.data()),
                             static_cast<uInt>(line.size()));
        }
        EXPECT_EQ(count, c.count);
        EXPECT_EQ(checksum, c.checksum) << std::hex << checksum;
    }
}

TEST(ErrorBoundaryTest, TurnsWhatIsThrownIntoCodes) {
    struct Case {
        const char* name;
        std::function<std::int32_t()> body;
        std::int32_t code;
    };
    const Case cases[] = {
        {"nothing", [] { return 0; }, 0},
        {"returned code", [] { return -7; }, -7},
        {"error", []() -> std::int32_t { throw kNotAnImage; }, kNotAnImage},
        {"bad_alloc", []() -> std::int32_t { throw std::bad_alloc(); }, kNotEnoughMemory},
        {"exception", []() -> std::int32_t { throw std::logic_error("x"); }, kNotEnoughMemory},
        {"foreign type", []() -> std::int32_t { throw 5; }, kNotEnoughMemory},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        EXPECT_EQ(run_core(c.body), c.code);
        ZqErrorCluster error{};
        EXPECT_EQ(run_entry(&error, FunctionId::kNone, c.body), c.code);
        EXPECT_EQ(error.status, c.code != 0 ? 1 : 0);
        EXPECT_EQ(+error.code, c.code);
        EXPECT_EQ(run_entry(nullptr, FunctionId::kCreate, c.body), c.code);
    }
}

// What an entry point does when an error, or an inactive thread, comes in; the body throws to show
// that it ran.
TEST(ErrorBoundaryTest, PendingErrorAndInactiveThreadStopTheBody) {
    using EntryHelper = std::int32_t (*)(ZqErrorCluster*, FunctionId, Body);
    struct Case {
        const char* name;
        EntryHelper run;
        bool pending;
        int active;
        bool runs;
        std::int32_t result;
    };
    const Case cases[] = {
        {"plain", run_entry, false, 1, true, kNotAnImage},
        {"pending", run_entry, true, 1, false, 17},
        {"inactive", run_entry, false, 0, false, kSystemError},
        {"pending and inactive", run_entry, true, 0, false, 17},
        {"always", run_entry_always, false, 1, true, kNotAnImage},
        {"always, pending", run_entry_always, true, 1, true, 17},
        {"always, inactive", run_entry_always, false, 0, false, kSystemError},
        {"always, pending and inactive", run_entry_always, true, 0, false, 17},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        refhost::String source("before");
        ZqErrorCluster error{.status = c.pending ? uint8_t{1} : uint8_t{0},
                             .code = c.pending ? 17 : 0,
                             .source = source.get()};
        bool ran = false;
        ZqThreadRecord()->active = c.active;
        const std::int32_t result = c.run(&error, FunctionId::kDispose, [&] {
            ran = true;
            throw kNotAnImage;
        });
        ZqThreadRecord()->active = 1;
        EXPECT_EQ(result, c.result);
        EXPECT_EQ(ran, c.runs);
        const bool reported = c.runs && !c.pending;
        EXPECT_EQ(source.text(), reported ? "KEMO Dispose\nNot an image." : "before");
        EXPECT_EQ(error.status, c.pending || reported ? 1 : 0);
    }
}

TEST(ErrorReportTest, RemembersTheMessageId) {
    struct Case {
        std::int32_t code, message_id;
    };
    // Outside the library's own codes the first message stands in.
    const Case cases[] = {{-1074396160, 50001},
                          {-1074396120, 50041},
                          {-1074395138, 51023},
                          {-1074395137, 50001},
                          {-1074396161, 50001},
                          {1, 50001},
                          {0, 50001}};
    for (const Case& c : cases) {
        process_result(c.code, nullptr, FunctionId::kCreate);
        EXPECT_EQ(last_error().code, c.code);
        EXPECT_EQ(last_error().message_id, c.message_id) << c.code;
    }
}

}  // namespace
}  // namespace zq::host
