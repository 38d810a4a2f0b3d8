// The memory layer and the pool: where blocks come from and where they go back to.
#include <gtest/gtest.h>

#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <optional>
#include <vector>

#include "image/image.h"
#include "image/memory.h"
#include "image/memory_pool.h"
#include "tests/support/image_probes.h"

namespace zq {
namespace {

using memory::Mode;
using zqtest::code_of;

// A host's allocator that keeps account and can refuse.
struct Account {
    std::vector<std::size_t> asked;
    std::vector<void*> given;
    std::vector<void*> taken_back;
    bool refuse = false;
};
Account account;

const memory::HostRoutine kRoutine = {[](std::size_t bytes) -> void* {
                                          account.asked.push_back(bytes);
                                          if (account.refuse) return nullptr;
                                          account.given.push_back(std::malloc(bytes));
                                          return account.given.back();
                                      },
                                      [](void* block) {
                                          account.taken_back.push_back(block);
                                          std::free(block);
                                      }};

class MemoryTest : public testing::Test {
  protected:
    void SetUp() override { account = {}; }
    void TearDown() override {
        memory::set_mode(Mode::kHeap, nullptr);
        MemoryPool::instance().abandon();
    }
    MemoryPool& pool = MemoryPool::instance();
};

TEST_F(MemoryTest, BlocksCarryAHeaderAndGoBackToTheirSource) {
    memory::set_mode(Mode::kHostRoutine, &kRoutine);
    auto* block = static_cast<std::uint8_t*>(memory::allocate(100));
    EXPECT_EQ(account.asked, std::vector<std::size_t>{108});
    EXPECT_EQ(account.given, std::vector<void*>{block - 8});
    std::memset(block, 7, 100);
    EXPECT_EQ(memory::resize(block, 100), block);
    block = static_cast<std::uint8_t*>(memory::resize(block, 200));
    EXPECT_EQ(account.asked, (std::vector<std::size_t>{108, 208}));
    EXPECT_EQ(account.taken_back.size(), 1U);
    EXPECT_EQ(std::vector<std::uint8_t>(block, block + 100), std::vector<std::uint8_t>(100, 7));
    // The mode changes, the block stays the routine's.
    memory::set_mode(Mode::kHeap, nullptr);
    block = static_cast<std::uint8_t*>(memory::resize(block, 50));
    EXPECT_EQ(account.taken_back, account.given);
    EXPECT_EQ(std::vector<std::uint8_t>(block, block + 50), std::vector<std::uint8_t>(50, 7));
    memory::release(block);
    EXPECT_EQ(account.asked.size(), 2U);
}

TEST_F(MemoryTest, ARefusingRoutineLeavesTheBlock) {
    memory::set_mode(Mode::kHostRoutine, &kRoutine);
    Image image(Variant::kRegistered, {});
    image.reinitialise({ZQ_TYPE_U8, 5, 5, 0});
    zqtest::fill(image);
    const ImageRecord before = image.record();
    const auto pixels = zqtest::pixels_of(image);
    account.refuse = true;
    for (const auto mode : {ResizeMode::kPlain, ResizeMode::kKeepContents}) {
        EXPECT_EQ(code_of([&] { image.resize(5, 9, ZQ_TYPE_SGL, mode); }), kNotEnoughMemory);
    }
    EXPECT_EQ(code_of([&] { image.set_border(3); }), kNotEnoughMemory);
    EXPECT_TRUE(zqtest::same_record(image.record(), before));
    EXPECT_EQ(zqtest::pixels_of(image), pixels);
}

TEST_F(MemoryTest, UnknownModesAndMissingRoutinesAreRefused) {
    const memory::HostRoutine no_release = {kRoutine.allocate, nullptr};
    struct Case {
        std::int32_t mode;
        const memory::HostRoutine* routine;
    };
    for (const Case& c :
         {Case{0, &kRoutine}, {4, &kRoutine}, {-1, nullptr}, {1, nullptr}, {1, &no_release}}) {
        EXPECT_EQ(code_of([&] { memory::set_mode(static_cast<Mode>(c.mode), c.routine); }),
                  kInvalidParameter);
    }
    memory::release(memory::allocate(16));
    EXPECT_TRUE(account.asked.empty()) << "a refused mode took effect";
    memory::release(nullptr);
    EXPECT_EQ(code_of([] { memory::allocate(SIZE_MAX); }), kNotEnoughMemory);
}

TEST_F(MemoryTest, AnExhaustedPoolIsAsBefore) {
    pool.create(1);
    pool.enable(true);
    void* first = memory::allocate(1000 - 8);
    EXPECT_EQ(code_of([] { memory::allocate(17); }), kPoolExhausted);
    EXPECT_EQ(code_of([] { memory::allocate(SIZE_MAX); }), kNotEnoughMemory);
    EXPECT_EQ(pool.reservations(), 1);
    void* last = memory::allocate(16);  // to the last byte
    std::memset(last, 1, 16);
    EXPECT_EQ(code_of([] { memory::allocate(0); }), kPoolExhausted);
    memory::release(first);
    EXPECT_EQ(code_of([] { memory::allocate(16); }), kPoolExhausted) << "space comes back by reset";
    memory::release(last);
    EXPECT_EQ(pool.reservations(), 0);
    pool.enable(false);
    pool.reset();
    pool.enable(true);
    memory::release(memory::allocate(1024 - 8));
}

// Mode 2 means the pool as well, enabled or not.
TEST_F(MemoryTest, PoolModeNeedsAPool) {
    memory::set_mode(Mode::kPool, nullptr);
    EXPECT_EQ(code_of([] { memory::allocate(16); }), kPoolExhausted);
    pool.create(1);
    void* block = memory::allocate(16);
    EXPECT_EQ(pool.reservations(), 1);
    memory::set_mode(Mode::kHeap, nullptr);
    memory::release(block);
    EXPECT_EQ(pool.reservations(), 0);
}

// What happens to a pool while an image lies in it. Afterwards the image is used, reshaped and
// destroyed; the sanitizer sees memory that went too early.
TEST_F(MemoryTest, ImagesInThePoolSurviveWhateverBecomesOfIt) {
    struct Case {
        const char* name;
        void (*action)(MemoryPool& pool);
    };
    const Case cases[] = {
        {"disabled", [](MemoryPool& p) { p.enable(false); }},
        {"reset", [](MemoryPool& p) { p.enable(false), p.reset(); }},
        {"reset and overwritten",
         [](MemoryPool& p) {
             p.enable(false), p.reset(), p.enable(true);
             void* block = memory::allocate(3000);
             std::memset(block, 0xFF, 3000);
             memory::release(block);
         }},
        {"released after a reset", [](MemoryPool& p) { p.enable(false), p.reset(), p.destroy(); }},
        {"abandoned", [](MemoryPool& p) { p.abandon(); }},
        {"abandoned, and a new one",
         [](MemoryPool& p) { p.abandon(), p.create(8), p.enable(true); }},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        pool.create(16);
        pool.enable(true);
        Image image(Variant::kRegistered, {});
        image.reinitialise({ZQ_TYPE_U8, 20, 20, 1});
        c.action(pool);
        zqtest::fill(image);
        const auto pixels = zqtest::pixels_of(image);
        image.set_border(2);
        EXPECT_EQ(zqtest::pixels_of(image), pixels);
        image.resize(20, 30, std::nullopt, ResizeMode::kKeepContents);
        zqtest::fill(image);
        pool.abandon();
    }
    EXPECT_EQ(pool.reservations(), -1);
}

}  // namespace
}  // namespace zq
