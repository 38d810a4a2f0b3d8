// The seam to the operating system, where a mistake would lose a file, a wake-up or a release.
#include <gtest/gtest.h>

#include <array>
#include <cerrno>
#include <climits>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <memory>
#include <mutex>
#include <random>
#include <string>
#include <thread>
#include <vector>

#include "platform/file.h"
#include "platform/module.h"
#include "platform/mutex.h"
#include "platform/row_io.h"
#include "platform/string_resource.h"
#include "platform/thread.h"
#include "support/foreign_slot/foreign_slot.h"

namespace zq::platform {
namespace {

namespace fs = std::filesystem;
using Stream = std::unique_ptr<std::FILE, decltype(&std::fclose)>;

// A mailbox for one item: a lost wake-up leaves it waiting for ever.
class Mailbox {
  public:
    void put(int item) {
        std::unique_lock lock(mutex_);
        while (item_ != 0) taken_.wait(mutex_);
        item_ = item;
        put_.notify_one();
    }

    int take() {
        std::unique_lock lock(mutex_);
        while (item_ == 0) put_.wait(mutex_);
        taken_.notify_one();
        return std::exchange(item_, 0);
    }

  private:
    Mutex mutex_;
    Condition put_;
    Condition taken_;
    int item_ = 0;
};

TEST(PlatformThread, ContendedMailboxLosesNoItemAndNoWakeUp) {
    constexpr int kPairs = 4;
    constexpr int kItems = 2000;
    Mailbox mailbox;
    std::array<long, kPairs> sums{};
    std::vector<std::jthread> threads;
    for (long& sum : sums) {
        threads.emplace_back([&mailbox] {
            for (int item = 1; item <= kItems; ++item) mailbox.put(item);
        });
        threads.emplace_back([&mailbox, &sum] {
            for (int i = 0; i < kItems; ++i) sum += mailbox.take();
        });
    }
    threads.clear();
    long total = 0;
    for (const long sum : sums) total += sum;
    EXPECT_EQ(total, kPairs * 2001000L);
}

TEST(PlatformThread, NotifyAllWakesEveryWaiter) {
    Mutex mutex;
    Condition condition;
    int waiting = 0;
    bool open = false;
    std::vector<std::jthread> threads;
    threads.reserve(4);
    for (int i = 0; i < 4; ++i) {
        threads.emplace_back([&] {
            std::unique_lock lock(mutex);
            ++waiting;
            while (!open) condition.wait(mutex);
        });
    }
    for (bool ready = false; !ready; pause_spin()) {
        const std::lock_guard lock(mutex);
        ready = open = waiting == 4;
    }
    condition.notify_all();
    threads.clear();  // joins, or never returns
    EXPECT_TRUE(mutex.try_lock());
    std::jthread([&mutex] { EXPECT_FALSE(mutex.try_lock()); }).join();
    mutex.unlock();
}

void count_release(void* value) {
    ++*static_cast<int*>(value);
}

TEST(PlatformThread, SlotReleasesAtThreadEndAndWhenDestroyed) {
    int of_thread = 0;
    int of_main = 0;
    int replaced = 0;
    {
        ThreadSlot slot(count_release);
        ASSERT_TRUE(slot.set(&of_main));
        std::jthread([&] {
            EXPECT_EQ(slot.get(), nullptr);
            EXPECT_TRUE(slot.set(&replaced));
            EXPECT_TRUE(slot.set(&of_thread));
        }).join();
        std::jthread([&] { EXPECT_TRUE(slot.set(&replaced) && slot.set(nullptr)); }).join();
        EXPECT_EQ(of_thread, 1);
        EXPECT_EQ(of_main, 0);
    }
    EXPECT_EQ(of_main, 1);
    EXPECT_EQ(replaced, 0);
}

TEST(PlatformThread, ForeignSlotIsReadPerThreadAndBadIndicesGiveNull) {
    int value = 0;
    zqtest::ForeignSlot slot;
    slot.set(&value);
    EXPECT_EQ(foreign_slot_value(slot.index()), &value);
    std::jthread([&] { EXPECT_EQ(foreign_slot_value(slot.index()), nullptr); }).join();
    for (const std::int32_t index : {-1, INT_MIN, INT_MAX, 1000, 1 << 16})
        EXPECT_EQ(foreign_slot_value(index), nullptr) << index;
}

TEST(PlatformModule, LooksUpWithoutLoadingAndRefusesWhatIsNotThere) {
    EXPECT_EQ(loaded_module("dfrt.dll"), nullptr);  // lies beside the library, not loaded here
    EXPECT_EQ(load_library("zq_no_such_library"), nullptr);
    EXPECT_EQ(find_symbol(nullptr, "AZNewHandle"), nullptr);
    EXPECT_NE(find_symbol(main_module(), "AZNewHandle"), nullptr);
    const ModuleHandle sibling = load_library("zqkemomem");
    EXPECT_EQ(loaded_module("zqkemomem.dll"), sibling);
    EXPECT_NE(find_symbol(sibling, "AllocPhysMem32"), nullptr);
    EXPECT_EQ(find_symbol(sibling, "zq_no_such_function"), nullptr);
}

TEST(PlatformStrings, MissingAndCutTexts) {
    const ModuleHandle no_strings = load_library("zqkemomem");
    ASSERT_NE(no_strings, nullptr);
    const struct Case {
        ModuleHandle module;
        unsigned id;
        std::size_t capacity;
        const char* expected;
    } cases[] = {
        {nullptr, 2, 32, "Unknown Error."},
        {nullptr, 2, 15, "Unknown Error."},
        {nullptr, 2, 14, "Unknown Error"},
        {nullptr, 2, 1, ""},
        {nullptr, 0, 32, ""},
        {nullptr, 3, 32, ""},
        {nullptr, 65535, 32, ""},
        {nullptr, 65536 + 2, 32, ""},  // the same as 2 in 16 bits
        {nullptr, UINT_MAX, 32, ""},
        {no_strings, 2, 32, ""},
    };
    for (const Case& c : cases) {
        std::string text(40, '#');
        const std::size_t length = load_string(c.module, c.id, text.data(), c.capacity);
        EXPECT_EQ(text.c_str(), std::string(c.expected)) << c.id << " in " << c.capacity;
        EXPECT_EQ(length, std::string(c.expected).size());
        EXPECT_EQ(text.find_first_not_of('#', length + 1), std::string::npos) << "wrote too far";
    }
    char untouched = '#';
    EXPECT_EQ(load_string(nullptr, 2, &untouched, 0), 0U);
    EXPECT_EQ(untouched, '#');
}

class PlatformFile : public ::testing::Test {
  protected:
    PlatformFile()
        : folder_(fs::temp_directory_path() / ("zqtest" + std::to_string(std::random_device()()))) {
        fs::create_directory(folder_);
    }
    ~PlatformFile() override {
        std::error_code ignored;
        fs::remove_all(folder_, ignored);
    }

    std::string path(const std::string& name) const { return (folder_ / name).string(); }

    std::string write(const std::string& name, const std::string& text) const {
        std::ofstream(path(name), std::ios::binary) << text;
        return path(name);
    }

    static std::string read(const std::string& path) {
        std::ifstream stream(path, std::ios::binary);
        return {std::istreambuf_iterator<char>(stream), {}};
    }

    std::ptrdiff_t files() const {
        return std::distance(fs::directory_iterator(folder_), fs::directory_iterator());
    }

    fs::path folder_;
};

TEST_F(PlatformFile, SiblingLeavesTheTargetAloneUntilItReplacesIt) {
    const std::string target = write("target", "old");
    fs::permissions(target, fs::perms::owner_read | fs::perms::owner_write | fs::perms::group_read);
    const fs::perms before = fs::status(target).permissions();
    std::string name;
    Stream stream(create_sibling(target, name), std::fclose);
    ASSERT_NE(stream, nullptr);
    std::fputs("new\n", stream.get());
    stream.reset();
    EXPECT_EQ(read(target), "old");
    EXPECT_EQ(read(name), "new\n");  // binary: no carriage return
    EXPECT_TRUE(replace_file(name, target));
    EXPECT_EQ(read(target), "new\n");
    EXPECT_EQ(fs::status(target).permissions(), before);
    EXPECT_EQ(files(), 1);
}

TEST_F(PlatformFile, SiblingOfANewFileHasTheUsualPermissionsAndAFreshName) {
    const fs::perms usual = fs::status(write("usual", "")).permissions();
    const std::string longest(255 - path("").size(), 'n');
    for (const std::string& target : {path("absent"), path(longest)}) {
        std::array<std::string, 2> names;
        for (std::string& name : names) {
            const Stream stream(create_sibling(target, name), std::fclose);
            ASSERT_NE(stream, nullptr) << target;
            EXPECT_EQ(fs::status(name).permissions(), usual);
            EXPECT_EQ(fs::path(name).parent_path(), folder_);
            EXPECT_LE(name.size(), 255U);
        }
        EXPECT_NE(names[0], names[1]);
        EXPECT_FALSE(fs::exists(target));
        for (const std::string& name : names) remove_file(name);
    }
    EXPECT_EQ(files(), 1);
}

TEST_F(PlatformFile, SiblingIsRefusedWhereTheTargetCouldNotBeWritten) {
    std::string name = "stale";
    EXPECT_EQ(create_sibling(path("no/folder"), name), nullptr);
    EXPECT_EQ(errno, ENOENT);
    EXPECT_EQ(name, "");
    const std::string target = write("protected", "old");
    fs::permissions(target, fs::perms::owner_read);
    // A privileged user may write all the same.
    const bool writable = Stream(std::fopen(target.c_str(), "r+b"), std::fclose) != nullptr;
    const bool made = Stream(create_sibling(target, name), std::fclose) != nullptr;
    EXPECT_EQ(made, writable);
    fs::permissions(target, fs::perms::owner_all);
}

TEST_F(PlatformFile, FailedReplacementKeepsBothFilesAndSaysWhy) {
    const std::string from = write("from", "new");
    fs::create_directory(path("folder"));
    write("folder/kept", "old");
    errno = 0;
    EXPECT_FALSE(replace_file(from, path("folder")));
    EXPECT_NE(errno, 0);
    EXPECT_FALSE(replace_file(path("absent"), from));
    EXPECT_EQ(errno, ENOENT);
    EXPECT_EQ(read(from), "new");
    EXPECT_EQ(read(path("folder/kept")), "old");
}

TEST_F(PlatformFile, OnlyRegularFilesCountAsSuch) {
    EXPECT_EQ(path_kind(write("file", "text").c_str()), PathKind::kRegular);
    EXPECT_EQ(path_kind(folder_.string().c_str()), PathKind::kOther);
    EXPECT_EQ(path_kind(path("absent").c_str()), PathKind::kAbsent);
    for (const char* device : {"/dev/null", "NUL"})  // whichever the system has
        EXPECT_NE(path_kind(device), PathKind::kRegular) << device;
}

TEST_F(PlatformFile, SizeOfAnOpenFileLeavesThePosition) {
    const Stream stream(open_file(write("file", "12345").c_str(), "rb"), std::fclose);
    ASSERT_NE(stream, nullptr);
    EXPECT_EQ(std::fgetc(stream.get()), '1');
    EXPECT_EQ(regular_size(stream.get()), 5);
    EXPECT_EQ(std::fgetc(stream.get()), '2');
    EXPECT_EQ(open_file(path("absent").c_str(), "rb"), nullptr);
    EXPECT_EQ(errno, ENOENT);
}

TEST_F(PlatformFile, StreamsSeekBeyondWhatALongHolds) {
    constexpr std::int64_t kFar = std::int64_t{5} << 30;
    const Stream stream(open_file(write("file", "0123456789").c_str(), "rb"), std::fclose);
    ASSERT_NE(stream, nullptr);
    EXPECT_TRUE(seek_to(stream.get(), kFar));
    EXPECT_EQ(position_of(stream.get()), kFar);
    EXPECT_EQ(std::fgetc(stream.get()), EOF);
    EXPECT_TRUE(seek_to(stream.get(), 3));
    EXPECT_EQ(std::fgetc(stream.get()), '3');
    EXPECT_FALSE(seek_to(stream.get(), -1));
}

TEST_F(PlatformFile, RowsFromAnOffsetLeaveTheStreamWhereItIs) {
    const Stream stream(open_file(write("file", "0123456789").c_str(), "rb"), std::fclose);
    ASSERT_NE(stream, nullptr);
    EXPECT_EQ(std::fgetc(stream.get()), '0');
    std::array<std::uint8_t, 6> rows{};
    rows.fill('-');
    EXPECT_TRUE(read_rows(stream.get(), 5, {rows.data(), 3, 2, 2}));
    EXPECT_EQ(std::string(rows.begin(), rows.end()), "56-78-");
    EXPECT_EQ(std::fgetc(stream.get()), '1');
    EXPECT_TRUE(read_rows(stream.get(), 1, {rows.data() + 3, -3, 1, 2}));
    EXPECT_EQ(std::string(rows.begin(), rows.end()), "26-18-");
    EXPECT_FALSE(read_rows(stream.get(), 8, {rows.data(), 3, 3, 1}));
    EXPECT_EQ(position_of(stream.get()), 2);
    EXPECT_EQ(std::fgetc(stream.get()), '2');
}

TEST_F(PlatformFile, AfterRowsAStreamSeeksAndGoesOn) {
    const std::string name = path("file");
    Stream stream(open_file(name.c_str(), "wb"), std::fclose);
    ASSERT_NE(stream, nullptr);
    const std::array<std::uint8_t, 6> bytes = {'a', 'b', '-', 'c', 'd', '-'};
    std::fputs("0123", stream.get());
    EXPECT_TRUE(write_rows(stream.get(), {bytes.data(), 3, 2, 2}));
    EXPECT_TRUE(write_rows(stream.get(), {bytes.data() + 3, -3, 1, 2}));
    EXPECT_EQ(std::fseek(stream.get(), 10, SEEK_SET), 0);
    std::fputs("end", stream.get());
    EXPECT_EQ(std::fseek(stream.get(), 2, SEEK_SET), 0);
    std::fputs("xy", stream.get());
    stream.reset();
    std::ifstream file(name, std::ios::binary);
    EXPECT_EQ(std::string(std::istreambuf_iterator<char>(file), {}), "01xyabcdcaend");
}

TEST_F(PlatformFile, ResolvesLinksSoThatTheirTargetIsReplaced) {
    const std::string target = fs::canonical(write("target", "old")).string();
    std::error_code no_links;
    fs::create_symlink(target, path("link"), no_links);
    EXPECT_EQ(resolve_path(path("link").c_str()), no_links ? path("link") : target);
    EXPECT_EQ(resolve_path(path("absent").c_str()), path("absent"));
}

}  // namespace
}  // namespace zq::platform
