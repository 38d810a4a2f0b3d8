// Many threads at the same images through the exported functions. The thread sanitizer runs these
// too; at the end no pixel buffer may be left.
#include <gtest/gtest.h>
#include <zqvissvc/image.h>

#include <atomic>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <string>
#include <thread>
#include <vector>

#include "tests/support/host_image.h"

namespace {

constexpr int kThreads = 8;
#if defined(__SANITIZE_THREAD__)
constexpr int kRounds = 2000;  // each costs ten times as much there
#else
constexpr int kRounds = 30000;
#endif
constexpr ZqError kNotAnImage = -1074396120;
constexpr ZqError kLent = -1074396065;

std::atomic<int> live_buffers = 0;

class CountedBuffers {
  public:
    CountedBuffers() {
        ZqSetMemoryMode(
            1,
            [](size_t bytes) {
                ++live_buffers;
                return std::malloc(bytes);
            },
            [](void* block) {
                --live_buffers;
                std::free(block);
            });
    }
    ~CountedBuffers() { ZqSetMemoryMode(3, nullptr, nullptr); }
    CountedBuffers(const CountedBuffers&) = delete;
    CountedBuffers& operator=(const CountedBuffers&) = delete;
};

// A small generator of its own for each thread.
class Dice {
  public:
    explicit Dice(uint32_t seed) : state_(seed * 2654435761U + 1) {}
    int32_t below(uint32_t limit) {
        state_ = state_ * 1664525U + 1013904223U;
        return static_cast<int32_t>((state_ >> 16) % limit);
    }

  private:
    uint32_t state_;
};

std::string name_of(int32_t which) {
    return "stress " + std::to_string(which);
}

bool is_expected(ZqError code) {
    return code == 0 || code == kNotAnImage || code == kLent;
}

// Writes the first pixel of an image that this thread has locked, and reads it again.
void use_locked(ZqImageHandle image, uint8_t mark) {
    if (image->width == 0) return;
    std::memset(image->firstPixel, mark, static_cast<size_t>(image->width));
    EXPECT_EQ(image->firstPixel[image->width - 1], mark);
}

void lock_pair(ZqImageHandle a, ZqImageHandle b, uint8_t mark) {
    const ZqImageHandle pair[] = {a, b, a};
    const ZqError code = ZqLockImages(pair, 3);
    EXPECT_TRUE(is_expected(code)) << code;
    if (code != 0) return;
    use_locked(a, mark);
    use_locked(b, mark);
    EXPECT_EQ(ZqUnlockImages(pair, 3), 0);
}

void one_step(Dice& dice, uint8_t mark) {
    const std::string name = name_of(dice.below(4));
    const std::string other = name_of(dice.below(4));
    ZqImageHandle image = nullptr;
    ZqImageHandle second = nullptr;
    ZqError code = 0;
    switch (dice.below(6)) {
        case 0:
            code = NewNamedImage(dice.below(7), 1 + dice.below(40), 1 + dice.below(40),
                                 dice.below(4), name.c_str(), 0, &image);
            break;
        case 1:
        case 2:
            ZqFindImage(name.c_str(), &image);
            ZqFindImage(other.c_str(), &second);
            if (image != nullptr && second != nullptr) lock_pair(image, second, mark);
            break;
        case 3:
            ZqFindImage(name.c_str(), &image);
            code =
                ZqResizeImage(image, 1 + dice.below(60), 1 + dice.below(60), 0, 0, dice.below(2));
            break;
        case 4: {
            ZqFindImage(name.c_str(), &image);
            const ZqImageValue value = {nullptr, image};
            void* buffer = nullptr;
            code = Gen_MarkExternalBuffer(&value, 1, &buffer);
            if (code == 0) {
                std::this_thread::yield();
                code = Gen_MarkExternalBuffer(&value, 0, &buffer);
                EXPECT_EQ(code, 0);
            }
            break;
        }
        default:
            ZqFindImage(name.c_str(), &image);
            code = ZqDisposeImage(image);
            break;
    }
    EXPECT_TRUE(is_expected(code)) << code;
}

void run_all(void (*body)(int thread)) {
    std::vector<std::thread> threads;
    threads.reserve(kThreads);
    for (int t = 0; t < kThreads; ++t) {
        threads.emplace_back(body, t);
    }
    for (std::thread& thread : threads) thread.join();
}

TEST(StressTest, FourNamesInEightThreads) {
    const CountedBuffers counted;
    run_all([](int thread) {
        Dice dice(static_cast<uint32_t>(thread));
        for (int i = 0; i < kRounds; ++i) one_step(dice, static_cast<uint8_t>(thread));
    });
    for (int32_t i = 0; i < 4; ++i) {
        ZqImageHandle image = nullptr;
        ZqFindImage(name_of(i).c_str(), &image);
        ZqDisposeImage(image);
    }
    EXPECT_EQ(live_buffers, 0);
}

// Whole host images: sessions and cleanup procedures come and go with them, while one name is
// created by all.
TEST(StressTest, HostImagesInEightThreads) {
    run_all([](int thread) {
        const refhost::String name("shared");
        ZqImageValue shared{};
        for (int i = 0; i < kRounds / 10; ++i) {
            zqtest::HostImage own("own " + std::to_string(thread));
            zqtest::HostImage unnamed("");
            EXPECT_EQ(DF_Create(name.get(), i % 7, 1, 9, 9, 0, &shared, nullptr), 0);
            EXPECT_EQ(DF_SetImageSize(&shared, 5 + i % 7, 5, nullptr), 0);
            EXPECT_EQ(DF_SetImageSize(&own.value, 5, 5, nullptr), 0);
            EXPECT_EQ(own.record().width, 5);
        }
        refhost::dispose(shared.name);
    });
    EXPECT_EQ(refhost::cookies().size(), 1U);
    EXPECT_EQ(refhost::cleanup_procs(), 0U);
    ZqImageHandle shared = nullptr;
    ZqFindImage("shared", &shared);
    ASSERT_NE(shared, nullptr);
    EXPECT_EQ(ZqDisposeImage(shared), 0);
    EXPECT_TRUE(refhost::cookies().empty());
}

}  // namespace
