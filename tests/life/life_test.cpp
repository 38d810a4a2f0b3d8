// Loading and unloading: after any use, from any thread, nothing of the library stays behind.
#include <gtest/gtest.h>
#include <zqvissvc/errors.h>

#include <future>
#include <memory>
#include <string>
#include <thread>

#include "calls.h"
#include "process.h"
#include "refhost/refhost.h"
#include "support/scratch_folder.h"

namespace {

// An image in the host, a failure with its text, a PNG there and back.
void work(const zqtest::Calls& calls, const std::string& path) {
    ZqImageValue value{};
    ZqErrorCluster error{};
    ASSERT_EQ(calls.create(nullptr, ZQ_TYPE_RGB, 3, 8, 8, 0, &value, nullptr), 0);
    EXPECT_EQ(calls.create(nullptr, 7, 0, 1, 1, 0, &value, &error), ZQ_ERR_INVALID_IMAGE_TYPE);
    const refhost::Owned<ZqStringHandle> source(error.source);
    EXPECT_EQ(refhost::text(source.get()), "KEMO Create\nInvalid image type.");
    EXPECT_EQ(calls.write(path.c_str(), value.image, nullptr, "PNG", nullptr), 0);
    EXPECT_EQ(calls.set_size(&value, 5, 5, nullptr), 0);
    EXPECT_EQ(calls.read(value.image, path.c_str(), nullptr, nullptr, nullptr, nullptr), 0);
    EXPECT_EQ(value.image->width, 8);
    EXPECT_EQ(calls.dispose(&value, 0, nullptr), 0);
    refhost::dispose(value.name);
}

// Works, locks an image that then stays locked, and ends when it is let go.
class LingeringThread {
  public:
    LingeringThread(const zqtest::Calls& calls, const std::string& path)
        : thread_([&calls, &path, this] {
              work(calls, path);
              ZqImageHandle image = nullptr;
              EXPECT_EQ(calls.new_named(ZQ_TYPE_U8, 9, 9, 0, "locked", 0, &image), 0);
              EXPECT_EQ(calls.lock(&image, 1), 0);
              ready_.set_value();
              go_on_.get_future().wait();
          }) {
        ready_.get_future().wait();
    }
    ~LingeringThread() {
        go_on_.set_value();
        thread_.join();
    }
    LingeringThread(const LingeringThread&) = delete;
    LingeringThread& operator=(const LingeringThread&) = delete;

  private:
    std::promise<void> ready_, go_on_;
    std::thread thread_;
};

void leave_images(const zqtest::Calls& calls) {
    ZqImageHandle image = nullptr;
    EXPECT_EQ(calls.new_named(ZQ_TYPE_I16, 20, 10, 2, "left", 1, &image), 0);
    EXPECT_EQ(calls.new_named(ZQ_TYPE_RGB, 7, 7, 2, nullptr, 0, &image), 0);
}

// One life of the library. Every kind of use comes up within six rounds.
void one_life(int round, const std::string& path) {
    std::unique_ptr<LingeringThread> lingering;
    {
        const zqtest::LoadedLibrary library;
        const zqtest::Calls calls(library);
        if (round % 2 == 0) work(calls, path);
        if (round % 2 == 1) std::thread([&] { work(calls, path); }).join();
        if (round % 3 == 1) leave_images(calls);
        if (round % 3 == 2 && zqtest::kReachesOtherThreads)
            lingering = std::make_unique<LingeringThread>(calls, path);
    }
    EXPECT_FALSE(zqtest::library_is_loaded());
}

// The host remembers handles for a while after their end; now as many as it ever will, so that what
// it holds no longer grows.
void settle_host() {
    refhost::set_strict(false);
    for (int i = 0; i < 5000; ++i) refhost::dispose(refhost::new_string(""));
}

// What grew in the course of two hundred lives; empty when nothing did.
std::string growth_in_two_hundred_lives(const std::string& path) {
    const auto before = zqtest::holdings();
    for (int round = 0; round < 200; ++round) one_life(round, path);
    const auto after = zqtest::holdings();
    std::string grown;
    for (size_t i = 0; i < before.size(); ++i) {
        if (after[i].amount <= before[i].amount + before[i].slack) continue;
        grown += before[i].name + std::string(": ") + std::to_string(before[i].amount) + " to " +
                 std::to_string(after[i].amount) + "\n";
    }
    return grown;
}

// What a life leaves behind shows every time. The tables of the system's loader grow at first, the
// more so the more libraries come along with this one.
TEST(LifeTest, TwoHundredLivesLeaveNothing) {
    settle_host();
    const zqtest::ScratchFolder folder;
    const std::string path = folder.path("life.png");
    for (int round = 0; round < 12; ++round) one_life(round, path);
    std::string grown;
    for (int attempt = 0; attempt < 6; ++attempt) {
        grown = growth_in_two_hundred_lives(path);
        if (grown.empty() || HasFailure()) break;
    }
    EXPECT_EQ(grown, "");
}

// Threads that come and go while the library stays loaded.
TEST(LifeTest, ThreadsTakeTheirStorageWithThem) {
    settle_host();
    const zqtest::ScratchFolder folder;
    const std::string path = folder.path("life.png");
    const zqtest::LoadedLibrary library;
    const zqtest::Calls calls(library);
    const auto run_threads = [&](int count) {
        for (int i = 0; i < count; ++i) std::thread([&] { work(calls, path); }).join();
    };
    run_threads(4);
    const auto before = zqtest::holdings();
    run_threads(50);
    const auto after = zqtest::holdings();
    for (size_t i = 0; i < before.size(); ++i) {
        EXPECT_LE(after[i].amount, before[i].amount + before[i].slack) << before[i].name;
    }
}

}  // namespace
