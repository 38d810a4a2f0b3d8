// Slots of the registry: which one an object gets, what a search finds, how objects end; and images
// that are found, made and disposed through it.
#include <gtest/gtest.h>

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "image/image_lock.h"
#include "image/lifecycle.h"
#include "image/registry.h"
#include "tests/support/image_probes.h"

namespace zq {
namespace {

using zqtest::code_of;
using Names = std::vector<std::string>;

constexpr std::int32_t kOtherTag = 2;

class Thing final : public Object {
  public:
    explicit Thing(std::string label) : label_(std::move(label)) {}
    const std::shared_ptr<ObjectGate>& gate() const override { return gate_; }
    const std::string& label() const { return label_; }

  private:
    std::string label_;
    std::shared_ptr<ObjectGate> gate_ = std::make_shared<ObjectGate>(true);
};

// Writes down what it is told.
class Witness final : public ObjectHandler {
  public:
    void release_resources(Object& object) noexcept override {
        log.push_back("release " + static_cast<Thing&>(object).label());
    }
    void destroy(Object* object) noexcept override {
        const std::unique_ptr<Object> owner(object);
        log.push_back("destroy " + static_cast<Thing*>(object)->label());
    }
    Names log;
};

class RegistryTest : public testing::Test {
  protected:
    std::uintptr_t add(const std::string& name, const std::string& label,
                       std::int32_t tag = kImageTag) {
        std::unique_ptr<Object> object = std::make_unique<Thing>(label);
        const auto address = reinterpret_cast<std::uintptr_t>(object.get());
        EXPECT_TRUE(registry.add(object, witness, tag, name, false));
        return address;
    }
    std::string find(const std::string& name, std::int32_t tag = kImageTag) {
        const Pin pin = registry.find(name, tag);
        return pin ? static_cast<Thing*>(pin.object)->label() : "";
    }

    Witness witness;
    Registry registry;
};

TEST_F(RegistryTest, FindsTheFirstOfANameInChainOrder) {
    add("a", "other kind", kOtherTag);
    const std::uintptr_t first = add("a", "first");
    const std::uintptr_t second = add("a", "second");
    const std::uintptr_t gap = add("", "gap");
    add("a", "third");
    EXPECT_EQ(find("a"), "first");
    EXPECT_EQ(find("a", kAnyTag), "other kind");
    registry.dispose(first);
    EXPECT_EQ(find("a"), "second");
    // It takes the slot in front of the older ones.
    add("a", "newest");
    EXPECT_EQ(find("a"), "newest");
    registry.dispose(gap);
    registry.dispose(second);
    add("", "in the slot of second");
    add("a", "behind the newest");
    EXPECT_EQ(find("a"), "newest");
    EXPECT_EQ(registry.live_count(), 5U);
}

TEST_F(RegistryTest, NamesAreComparedByteForByte) {
    add("Part", "Part");
    add("Part 2", "Part 2");
    add("", "unnamed");
    add("Stück", "umlaut");
    for (const char* name : {"part", "PART", "Par", "Part ", "", "Stueck"}) {
        EXPECT_EQ(find(name), "") << name;
    }
    EXPECT_EQ(find("Part"), "Part");
    EXPECT_EQ(find("Part 2"), "Part 2");
    EXPECT_EQ(find("Stück"), "umlaut");
    EXPECT_EQ(find("Part", kOtherTag), "");
}

TEST_F(RegistryTest, AUniqueNameIsTakenOncePerKind) {
    add("a", "first");
    std::unique_ptr<Object> object = std::make_unique<Thing>("second");
    EXPECT_FALSE(registry.add(object, witness, kImageTag, "a", true));
    ASSERT_NE(object, nullptr) << "a refused object stays the caller's";
    EXPECT_TRUE(registry.add(object, witness, kOtherTag, "a", true));
    EXPECT_EQ(object, nullptr);
}

TEST_F(RegistryTest, FreedSlotsAreTakenAgainLowestFirstAcrossBlocks) {
    std::vector<std::uintptr_t> addresses;
    addresses.reserve(100);
    for (int i = 0; i < 100; ++i) {
        addresses.push_back(add("x", std::to_string(i)));
    }
    for (const std::size_t i : {97, 64, 31, 33, 0}) {
        EXPECT_TRUE(registry.dispose(addresses[i]));
    }
    for (const char* label : {"0", "31", "33", "64", "97", "100"}) {
        add("x", std::string("new ") + label);
    }
    EXPECT_EQ(registry.live_count(), 101U);
    witness.log.clear();
    registry.dispose_all(kImageTag);
    Names expected;
    for (int i = 0; i <= 100; ++i) {
        const bool is_new = i == 0 || i == 31 || i == 33 || i == 64 || i == 97 || i == 100;
        const std::string label = (is_new ? "new " : "") + std::to_string(i);
        expected.push_back("release " + label);
        expected.push_back("destroy " + label);
    }
    EXPECT_EQ(witness.log, expected);
    EXPECT_EQ(registry.live_count(), 0U);
}

TEST_F(RegistryTest, DisposalHappensOnce) {
    const std::uintptr_t a = add("a", "a");
    const std::uintptr_t b = add("b", "b", kOtherTag);
    const Pin pin = registry.pin(a);
    ASSERT_TRUE(pin);
    EXPECT_TRUE(registry.dispose(a));
    EXPECT_FALSE(registry.dispose(a));
    EXPECT_FALSE(registry.dispose(0));
    EXPECT_FALSE(registry.dispose(b + 1));
    EXPECT_FALSE(registry.pin(a));
    EXPECT_FALSE(pin.gate->lock());
    registry.dispose_all(kImageTag);
    EXPECT_EQ(find("b", kOtherTag), "b");
    EXPECT_EQ(witness.log, (Names{"release a", "destroy a"}));
}

TEST(RegistryEndTest, DestroysWhatIsLeftWithoutTellingAnybody) {
    Witness witness;
    {
        Registry registry;
        std::unique_ptr<Object> object = std::make_unique<Thing>("left");
        registry.add(object, witness, kImageTag, "left", true);
    }
    EXPECT_EQ(witness.log, Names{"destroy left"});
}

// ---- Images

constexpr ImageShape kSmall = {ZQ_TYPE_U8, 4, 3, 0};

TEST(RegistryImagesTest, ANameMeansOneImage) {
    const Created first = new_named_image(kSmall, "A", Variant::kRegistered);
    EXPECT_TRUE(first.is_new);
    const Created again = new_named_image({ZQ_TYPE_SGL, 9, 8, 2}, "A", Variant::kPrivate);
    EXPECT_FALSE(again.is_new);
    EXPECT_EQ(again.image, first.image);
    EXPECT_EQ(first.image->type, ZQ_TYPE_SGL);
    EXPECT_EQ(first.image->width, 9);
    EXPECT_STREQ(first.image->name, "A");
    EXPECT_EQ(Image::from_handle(first.image)->variant(), Variant::kRegistered);
    const Created lower = new_named_image(kSmall, "a", Variant::kPrivate);
    EXPECT_NE(lower.image, first.image);
    EXPECT_EQ(Image::from_handle(lower.image)->variant(), Variant::kPrivate);
    alignas(4) std::uint8_t buffer[64];
    const Created external = new_external_image({ZQ_TYPE_U8, 4, 2, 0}, buffer, 32, "a");
    EXPECT_EQ(external.image, lower.image);
    EXPECT_EQ(lower.image->firstPixel, buffer);
    const Created nameless = new_named_image(kSmall, "", Variant::kRegistered);
    EXPECT_NE(nameless.image, new_named_image(kSmall, "", Variant::kRegistered).image);
    dispose_all_images();
    EXPECT_TRUE(new_named_image(kSmall, "A", Variant::kRegistered).is_new);
    dispose_all_images();
    EXPECT_EQ(Registry::instance().live_count(), 0U);
}

TEST(RegistryImagesTest, FailedCreationLeavesNoImage) {
    alignas(4) std::uint8_t buffer[64];
    EXPECT_EQ(code_of([] { new_image({7, 4, 3, 0}); }), kInvalidImageType);
    EXPECT_EQ(code_of([] {
                  new_named_image({-1, 4, 3, 0}, "B", Variant::kPrivate);
              }),
              kInvalidImageType);
    EXPECT_EQ(code_of([] {
                  new_named_image({ZQ_TYPE_U8, 50000, 50000, 0}, "B", {});
              }),
              kNotEnoughMemory);
    EXPECT_EQ(code_of([&] { new_external_image(kSmall, buffer + 1, 0, "B"); }),
              kExternalBufferAlignment);
    EXPECT_EQ(code_of([] { new_external_image(kSmall, nullptr, 0, {}); }), kNullPointer);
    EXPECT_EQ(Registry::instance().live_count(), 0U);
    EXPECT_FALSE(Registry::instance().find("B", kAnyTag));
}

// Another kind of object sits where an image is expected.
TEST(RegistryImagesTest, OtherObjectsAreNoImages) {
    Witness witness;
    Registry& registry = Registry::instance();
    auto* thing = new Thing("thing");
    std::unique_ptr<Object> object(thing);
    registry.add(object, witness, kOtherTag, "A", true);
    const ImageHandle handle = Image::handle_of(thing);
    const ImageHandle image = new_named_image(kSmall, "A", Variant::kRegistered).image;
    const ImageHandle request[] = {image, handle};
    EXPECT_EQ(code_of([&] { lock_images(request); }), kNotAnImage);
    EXPECT_EQ(code_of([&] { const LockedImage locked(handle); }), kNotAnImage);
    unlock_images(request);
    dispose_image(handle);
    EXPECT_FALSE(take_back_buffer(handle, nullptr));
    dispose_all_images();
    EXPECT_TRUE(witness.log.empty());
    EXPECT_EQ(registry.live_count(), 1U);
    registry.dispose(reinterpret_cast<std::uintptr_t>(thing));
}

TEST(RegistryImagesTest, NullAndStaleHandlesAreNoErrorToDispose) {
    const ImageHandle image = new_image(kSmall);
    dispose_image(nullptr);
    dispose_image(image);
    dispose_image(image);
    const ImageHandle handles[] = {image, nullptr};
    unlock_images(handles);
    for (const ImageHandle handle : handles) {
        EXPECT_EQ(code_of([&] { const LockedImage locked(handle); }), kNotAnImage);
    }
}

}  // namespace
}  // namespace zq
