// Every allocation on the way to an image, or to another shape of it, fails once: nothing may be
// left behind, and what was there stays as it was.
#include <gtest/gtest.h>
#include <zqvissvc/custom_data.h>
#include <zqvissvc/image.h>

#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <functional>
#include <memory>
#include <new>
#include <string>
#include <tuple>
#include <utility>
#include <vector>

#include "host/boundary.h"
#include "image/image_lock.h"
#include "image/lifecycle.h"
#include "image/memory.h"
#include "image/registry.h"
#include "refhost/refhost.h"
#include "serialize/custom_data.h"
#include "tests/support/image_probes.h"
#include "tests/support/record.h"

namespace {

// Armed in one thread only: how many allocations still succeed (-1: all), and whether one fails or
// all from there on.
thread_local int left = -1;
thread_local bool only_once = true;
thread_local bool hit = false;

bool fails_now() noexcept {
    if (left != 0) {
        left -= left > 0 ? 1 : 0;
        return false;
    }
    hit = true;
    left = only_once ? -1 : 0;
    return true;
}

void* allocate(std::size_t bytes) noexcept {
    return fails_now() ? nullptr : std::malloc(bytes == 0 ? 1 : bytes);
}

void* allocate_or_throw(std::size_t bytes) {
    void* block = allocate(bytes);
    if (block == nullptr) throw std::bad_alloc();
    return block;
}

// Never inlined: the compiler would take it for a mistake that what `new` gave goes to free().
[[gnu::noinline]] void release(void* block) noexcept {
    std::free(block);
}

}  // namespace

// For the whole program; unarmed they are the ordinary ones.
void* operator new(std::size_t bytes) {
    return allocate_or_throw(bytes);
}
void* operator new[](std::size_t bytes) {
    return allocate_or_throw(bytes);
}
void* operator new(std::size_t bytes, const std::nothrow_t& /*tag*/) noexcept {
    return allocate(bytes);
}
void* operator new[](std::size_t bytes, const std::nothrow_t& /*tag*/) noexcept {
    return allocate(bytes);
}
void operator delete(void* block) noexcept {
    release(block);
}
void operator delete[](void* block) noexcept {
    release(block);
}
void operator delete(void* block, std::size_t /*bytes*/) noexcept {
    release(block);
}
void operator delete[](void* block, std::size_t /*bytes*/) noexcept {
    release(block);
}
void operator delete(void* block, const std::nothrow_t& /*tag*/) noexcept {
    release(block);
}
void operator delete[](void* block, const std::nothrow_t& /*tag*/) noexcept {
    release(block);
}

namespace zq {
namespace {

int live_buffers = 0;

// Pixel buffers fail like everything else.
const memory::HostRoutine kRoutine = {[](std::size_t bytes) -> void* {
                                          void* block = allocate(bytes);
                                          live_buffers += block == nullptr ? 0 : 1;
                                          return block;
                                      },
                                      [](void* block) {
                                          --live_buffers;
                                          release(block);
                                      }};

class AllocationFailureTest : public testing::Test {
  protected:
    void SetUp() override {
        memory::set_mode(memory::Mode::kHostRoutine, &kRoutine);
        target = new_named_image({ZQ_TYPE_I16, 9, 5, 2}, "target", {}).image;
        image().record().unit = 3;
        zqtest::fill(image());
    }
    void TearDown() override {
        dispose_all_images();
        EXPECT_EQ(live_buffers, 0);
        memory::set_mode(memory::Mode::kHeap, nullptr);
    }
    Image& image() { return *Image::from_handle(target); }

    // What a failure must not change.
    auto state() {
        const auto* bytes = reinterpret_cast<const char*>(target);
        return std::tuple(Registry::instance().live_count(), live_buffers,
                          refhost::cookies().size(), refhost::cleanup_procs(),
                          refhost::live_handles(), std::string(bytes, sizeof *target),
                          zqtest::pixels_of(image()), image().external_count(), custom_data());
    }

    // One empty store is not the same as none.
    std::vector<std::uint8_t> custom_data() {
        const CustomData* store = CustomData::find(image());
        return store == nullptr ? std::vector<std::uint8_t>() : serialise(*store);
    }

    // Runs the operation with its first, second, ... allocation failing until none is left to fail;
    // `undo` takes back a success. So many failures may go `unnoticed`.
    void check(const char* name, const std::function<std::int32_t()>& run,
               const std::function<void()>& undo, int unnoticed = 0) {
        SCOPED_TRACE(name);
        for (const bool once : {true, false}) {
            int nth = 0;
            int successes = 0;
            do {
                ASSERT_LT(nth, 5000);
                const auto before = state();
                only_once = once;
                hit = false;
                left = nth++;
                const std::int32_t code = host::run_core(run);
                left = -1;
                if (code == kSuccess) {
                    ++successes;
                    undo();
                } else {
                    EXPECT_EQ(code, kNotEnoughMemory) << "allocation " << nth;
                    EXPECT_EQ(state(), before) << "allocation " << nth;
                }
            } while (hit);
            EXPECT_LE(successes, 1 + unnoticed);
            EXPECT_GT(nth, successes) << "no failure was seen";
        }
    }

    ImageHandle target = nullptr;
};

TEST_F(AllocationFailureTest, CreationLeavesNoImage) {
    alignas(32) static std::uint8_t pixels[1024];
    ImageHandle made = nullptr;
    const auto undo = [&] { dispose_image(made); };
    check(
        "unnamed", [&] { return NewImage(ZQ_TYPE_U8, 9, 9, 1, &made); }, undo);
    check(
        "greedy", [&] { return NewGreedyImage(ZQ_TYPE_SGL, 9, 9, 1, &made); }, undo);
    check(
        "named", [&] { return NewNamedImage(ZQ_TYPE_U8, 9, 9, 1, "a longer name", 0, &made); },
        undo);
    check(
        "private", [&] { return NewPrivateNamedImage(ZQ_TYPE_U8, 0, 0, 1, "p", 1, &made); }, undo);
    check(
        "external",
        [&] { return NewExternalImage(ZQ_TYPE_U8, 9, 9, 4, pixels, 20, "external", &made); }, undo);
    struct Deleter final : ObjectHandler {
        void release_resources(Object& /*object*/) noexcept override {}
        void destroy(Object* object) noexcept override { delete object; }
    } deleter;
    check(
        "first block of a registry",
        [&] {
            Registry registry;
            std::unique_ptr<Object> object = std::make_unique<Image>(Variant::kPrivate, "x");
            registry.add(object, deleter, kImageTag, "x", true);
            return kSuccess;
        },
        [] {});
}

TEST_F(AllocationFailureTest, ChangesOfShapeLeaveTheImage) {
    const auto undo = [&] {
        image().reinitialise({ZQ_TYPE_I16, 9, 5, 2});
        image().record().unit = 3;
        zqtest::fill(image());
    };
    check(
        "plain", [&] { return ZqResizeImage(target, 20, 20, 1, ZQ_TYPE_SGL, 0); }, undo);
    check(
        "keep", [&] { return ZqResizeImage(target, 9, 50, 0, 0, 1); }, undo);
    check(
        "border", [&] { return ZqSetImageBorder(target, 7); }, undo);
    ImageHandle same = nullptr;
    check(
        "created again", [&] { return NewNamedImage(ZQ_TYPE_RGB, 30, 4, 0, "target", 1, &same); },
        undo);
}

TEST_F(AllocationFailureTest, HostImagesLeaveNothingWithTheHost) {
    // A host that cannot note the cleanup procedure of an unnamed image is no error.
    const refhost::String names[] = {refhost::String(""), refhost::String("camera")};
    for (const refhost::String& name : names) {
        ZqImageValue value{};
        check(
            "DF_Create",
            [&] {
                ZqErrorCluster error{};
                const auto code = DF_Create(name.get(), ZQ_TYPE_U8, 1, 9, 9, 0, &value, &error);
                refhost::dispose(error.source);
                return code;
            },
            [&] {
                DF_Dispose(&value, 0, nullptr);
                refhost::dispose(value.name);
                value = {};
            },
            1);
        EXPECT_EQ(value.name, nullptr);
    }
}

TEST_F(AllocationFailureTest, CustomDataStaysWithImageAndHost) {
    const ZqImageValue value = {nullptr, target};
    const std::string text(100, 't');
    const std::string first_key(50, 'k');
    const auto write = [&](const std::string& key, uint32_t bytes) {
        return DF_WriteCustomData(&value, key.c_str(), text.data(), bytes, nullptr);
    };
    const auto remove = [&](const std::string& key) {
        DF_RemoveCustomData(&value, key.c_str(), nullptr);
    };
    check(
        "first entry", [&] { return write(first_key, 100); }, [&] { remove(first_key); });
    ASSERT_EQ(write(first_key, 100), 0);
    check(
        "further entry", [&] { return write("second", 99); }, [&] { remove("second"); });
    check(
        "another value", [&] { return write(first_key, 50); }, [&] { write(first_key, 100); });
    ZqHandle block = nullptr;
    check(
        "read",
        [&] { return DF_ReadCustomData(&value, first_key.c_str(), &block, nullptr, nullptr); },
        [&] { refhost::dispose(std::exchange(block, nullptr)); });
    ASSERT_EQ(write("second", 99), 0);
    ZqStringArrayHandle keys = nullptr;
    const auto dispose_keys = [&] {
        for (int i = 0; i < (*keys)->count; ++i) refhost::dispose((*keys)->elements[i]);
        refhost::dispose(std::exchange(keys, nullptr));
    };
    const auto list = [&] { return DF_EnumerateCustomKeys(&value, &keys, nullptr); };
    check("keys", list, dispose_keys);
    EXPECT_EQ(keys, nullptr);
    // Into an array that has other strings already.
    ASSERT_EQ(list(), 0);
    remove("second");
    ZqStringHandle held = (*keys)->elements[1];
    check(
        "fewer keys",
        [&] {
            const std::int32_t code = list();
            if (code != 0) {
                EXPECT_EQ((*keys)->count, 2);
                EXPECT_TRUE((*keys)->elements[1] == held);
            }
            return code;
        },
        [&] {
            write("second", 99);
            list();
            remove("second");
            held = (*keys)->elements[1];
        });
    dispose_keys();
}

TEST_F(AllocationFailureTest, FlatteningAndRebuildingLeaveImageAndString) {
    ImageHandle source = nullptr;
    ASSERT_EQ(NewNamedImage(ZQ_TYPE_SGL, 7, 3, 1, "source", 0, &source), 0);
    const LockedImage locked(source);
    zqtest::fill(*locked);
    CustomData::write(*locked, "key", std::vector<std::uint8_t>(40, 1));
    for (const int32_t codec : {0, 1, 2}) {
        SCOPED_TRACE(codec);
        refhost::String record;
        const auto flatten = [&](ZqStringHandle* string) {
            return FlattenImageToArray1D2(source, string, 2, codec, 1, 500, 1, -1);
        };
        ASSERT_EQ(flatten(record.out()), 0);
        zqtest::Record other(record.text());
        other.name = "other";
        other.attachment = "an object of nobody's class";
        const refhost::String bytes(other.bytes());
        ZqStringHandle string = nullptr;
        // Properties that find no memory are left out.
        check(
            "flatten", [&] { return flatten(&string); },
            [&] { refhost::dispose(std::exchange(string, nullptr)); }, 8);
        ImageHandle made = nullptr;
        check(
            "new image", [&] { return UnflattenImageFromArray1D(&made, bytes.get()); },
            [&] { dispose_image(std::exchange(made, nullptr)); });
        check(
            "into an image", [&] { return UnflattenImageFromArray1D(&target, bytes.get()); },
            [&] {
                image().attachments().clear();
                image().reinitialise({ZQ_TYPE_I16, 9, 5, 2});
                zqtest::fill(image());
            });
    }
}

TEST_F(AllocationFailureTest, OtherRequestsLeaveTheImage) {
    const ImageHandle request[] = {target, target};
    check(
        "lock", [&] { return ZqLockImages(request, 2); }, [&] { ZqUnlockImages(request, 2); });
    const ZqImageValue value = {nullptr, target};
    void* buffer = nullptr;
    check(
        "lend", [&] { return Gen_MarkExternalBuffer(&value, 1, &buffer); },
        [&] { Gen_MarkExternalBuffer(&value, 0, &buffer); });
    static int destroyed = 0;
    int object = 0;
    const ZqClassId id = {1, 2, 3, {4}};
    const auto destroy = [](void* /*object*/) { ++destroyed; };
    check(
        "attachment", [&] { return ZqSetAttachment(target, &id, &object, destroy); },
        [&] { ZqRemoveAttachment(target, &id); });
    EXPECT_EQ(destroyed, 2) << "a failed call destroyed what stayed the client's";
    check(
        "extra information", [&] { return ZqSetExtraInfo(target, &object, nullptr, destroy); },
        [&] { image().set_extra_info(nullptr); });
    EXPECT_EQ(destroyed, 4);
}

}  // namespace
}  // namespace zq
