// Locks on images: several in one request, recursion, and disposal under a waiter's or a holder's
// hands.
#include <gtest/gtest.h>

#include <atomic>
#include <cstdint>
#include <cstring>
#include <functional>
#include <thread>
#include <vector>

#include "image/image_lock.h"
#include "image/lifecycle.h"
#include "image/registry.h"
#include "tests/support/image_probes.h"

namespace zq {
namespace {

using zqtest::code_of;

constexpr ImageShape kSmall = {ZQ_TYPE_U8, 4, 4, 0};

struct Pair {
    ImageHandle a = new_image(kSmall);
    ImageHandle b = new_image(kSmall);
    ~Pair() {
        dispose_image(a);
        dispose_image(b);
    }
};

void run_in_thread(const std::function<void()>& work) {
    std::thread(work).join();
}

// Plain counters under the locks: lost counts or a report of the thread sanitizer mean that a lock
// does not lock; requests in opposite orders that block each other never end.
TEST(RegistryLockTest, RequestsInAnyOrderExcludeEachOtherAndEnd) {
    const Pair images;
    const std::vector<std::vector<ImageHandle>> requests = {
        {images.a, images.b}, {images.b, images.a}, {images.a, images.b, images.a}, {images.a}};
    constexpr int kRounds = 3000;
    int count_a = 0;
    int count_b = 0;
    std::vector<std::thread> threads;
    threads.reserve(requests.size());
    for (const auto& request : requests) {
        threads.emplace_back([&] {
            for (int i = 0; i < kRounds; ++i) {
                const ImageLock lock(request);
                ++count_a;
                if (request.size() > 1) ++count_b;
            }
        });
    }
    for (std::thread& thread : threads) thread.join();
    EXPECT_EQ(count_a, 4 * kRounds);
    EXPECT_EQ(count_b, 3 * kRounds);
}

// An image that is listed twice in one request is unlocked by one request.
TEST(RegistryLockTest, UnpairedRequestsNestAndSkipImagesThatAreGone) {
    Pair images;
    const ImageHandle twice[] = {images.a, images.b, images.a};
    const ImageHandle once[] = {images.a};
    lock_images(once);
    lock_images(twice);
    std::atomic<bool> waiting = false;
    std::atomic<bool> released = false;
    std::thread waiter([&] {
        waiting = true;
        const LockedImage locked(images.a);
        EXPECT_TRUE(released.load());
    });
    dispose_image(images.b);
    unlock_images(twice);
    while (!waiting) std::this_thread::yield();
    for (int i = 0; i < 200; ++i) std::this_thread::yield();  // time for a wrong entry
    released = true;
    unlock_images(once);
    waiter.join();
    unlock_images(once);  // not held: nothing happens
    run_in_thread([&] {
        lock_images(once);
        unlock_images(once);
    });
    const ImageLock still_usable(once);
}

TEST(RegistryLockTest, AFailedRequestHoldsNothing) {
    Pair images;
    dispose_image(images.b);
    const ImageHandle request[] = {images.a, images.b};
    EXPECT_EQ(code_of([&] { const ImageLock lock(request); }), kNotAnImage);
    run_in_thread([&] { const LockedImage locked(images.a); });
    EXPECT_EQ(code_of([] { const ImageLock nothing({}); }), kSuccess);
}

TEST(RegistryLockTest, WaitersLearnThatTheImageIsGone) {
    for (int round = 0; round < 50; ++round) {
        Pair images;
        const ImageHandle request[] = {images.b, images.a};
        const ImageHandle held[] = {images.a};
        lock_images(held);
        std::vector<std::thread> waiters;
        waiters.reserve(3);
        std::atomic<int> started = 0;
        for (int i = 0; i < 3; ++i) {
            waiters.emplace_back([&] {
                ++started;
                EXPECT_EQ(code_of([&] { const ImageLock lock(request); }), kNotAnImage);
            });
        }
        while (started < 3) std::this_thread::yield();
        dispose_image(images.a);  // what one holds oneself may be disposed
        for (std::thread& waiter : waiters) waiter.join();
        unlock_images(held);
        run_in_thread([&] { const LockedImage locked(images.b); });
    }
}

// The holder goes on with pixels and record until it lets go, by the handle that nobody finds any
// more; a second disposal does not wait.
TEST(RegistryLockTest, DisposalWaitsForTheHolder) {
    for (int round = 0; round < 50; ++round) {
        const ImageHandle image = new_image(kSmall);
        std::atomic<bool> locked = false;
        std::atomic<bool> done = false;
        std::thread holder([&] {
            lock_images({&image, 1});
            locked = true;
            while (Registry::instance().pin(Image::object_address(image))) {
                std::this_thread::yield();
            }
            dispose_image(image);
            Image& held = *Image::from_handle(image);
            held.resize(40, 40, std::nullopt, ResizeMode::kPlain);
            std::memset(held.row(0), 1, 40);
            done = true;
            unlock_images({&image, 1});
        });
        while (!locked) std::this_thread::yield();
        dispose_image(image);
        EXPECT_TRUE(done.load());
        holder.join();
    }
}

TEST(RegistryLockTest, PrivateImagesAreNotLocked) {
    const ImageHandle image = new_named_image(kSmall, "private", Variant::kPrivate).image;
    const ImageHandle request[] = {image};
    const ImageLock lock(request);
    run_in_thread([&] { const ImageLock second(request); });
    run_in_thread([&] { dispose_image(image); });
    EXPECT_EQ(code_of([&] { const ImageLock gone(request); }), kNotAnImage);
}

// Many threads that create and dispose one name: each creation hands out a live image or a code,
// and in the end none is left.
TEST(RegistryLockTest, OneNameCreatedAndDisposedByMany) {
    std::vector<std::thread> threads;
    threads.reserve(4);
    for (int t = 0; t < 4; ++t) {
        threads.emplace_back([t] {
            for (int i = 0; i < 500; ++i) {
                const ImageShape shape = {ZQ_TYPE_U8, 1 + (i + t) % 9, 3, 0};
                const ImageHandle image = new_named_image(shape, "shared", {}).image;
                const GRLIBError_enum code = code_of([&] {
                    const LockedImage locked(image);
                    std::memset(locked->row(0), t,
                                static_cast<std::size_t>(locked->record().width));
                });
                EXPECT_TRUE(code == kSuccess || code == kNotAnImage) << code;
                if (i % 2 == t % 2) dispose_image(image);
            }
        });
    }
    for (std::thread& thread : threads) thread.join();
    dispose_all_images();
    EXPECT_EQ(Registry::instance().live_count(), 0U);
}

}  // namespace
}  // namespace zq
