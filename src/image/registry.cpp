// Slots, their state protocol and the index beside them.
#include "image/registry.h"

#include <algorithm>
#include <array>
#include <atomic>
#include <functional>
#include <mutex>
#include <string>
#include <utility>

#include "image/lent_buffers.h"
#include "platform/thread.h"

namespace zq {

namespace {

constexpr std::uint32_t kSlotsPerBlock = 32;

constexpr std::uint32_t kHeld = 0;
constexpr std::uint32_t kFree = 1;
constexpr std::uint32_t kOccupied = 2;
constexpr std::uint32_t kDestroying = 4;

std::uint32_t hash_of(std::uintptr_t address) {
    // Addresses differ in their middle bits; the multiplication spreads them over the upper half.
    return static_cast<std::uint32_t>((std::uint64_t{address} * 0x9E3779B97F4A7C15U) >> 32);
}

std::uint32_t hash_of(std::string_view name) {
    return static_cast<std::uint32_t>(std::hash<std::string_view>()(name));
}

}  // namespace

struct Registry::Slot {
    Object* object = nullptr;
    ObjectHandler* handler = nullptr;
    std::int32_t tag = kAnyTag;
    std::uint32_t word = 0;
    std::atomic<std::uint32_t> state = kFree;
    std::string name;  // empty for an unnamed object
};

struct Registry::Block {
    std::array<Slot, kSlotsPerBlock> slots;
    Block* next = nullptr;
};

// Holds a slot for examination and puts a state back at the end: the one found, or the one set
// meanwhile.
class Registry::SlotHold {
  public:
    explicit SlotHold(Slot& slot) : slot_(slot) {
        while ((state_ = slot_.state.exchange(kHeld)) == kHeld) {
            platform::pause_spin();
        }
    }
    ~SlotHold() { slot_.state.exchange(state_); }
    SlotHold(const SlotHold&) = delete;
    SlotHold& operator=(const SlotHold&) = delete;

    std::uint32_t state() const { return state_; }
    void set_state(std::uint32_t state) { state_ = state; }

  private:
    Slot& slot_;
    std::uint32_t state_;
};

Registry& Registry::instance() {
    static Registry the_registry;
    return the_registry;
}

Registry::Registry() {
    // Made before the registry, they and what they need outlive it: the images that are left at the
    // end still give back their buffers.
    LentBuffers::instance();
}

Registry::~Registry() {
    for (const auto& block : blocks_) {
        for (Slot& slot : block->slots) {
            if (slot.object != nullptr) {
                slot.handler->destroy(std::exchange(slot.object, nullptr));
            }
        }
    }
}

Registry::Slot& Registry::slot_at(Ordinal ordinal) {
    return blocks_[ordinal / kSlotsPerBlock]->slots[ordinal % kSlotsPerBlock];
}

void Registry::append_block() {
    const auto first = static_cast<Ordinal>(blocks_.size()) * kSlotsPerBlock;
    // Room for every slot, so that only this step needs memory.
    free_.reserve(first + kSlotsPerBlock);
    positions_.reserve(first + kSlotsPerBlock);
    names_.reserve(first + kSlotsPerBlock);
    blocks_.push_back(std::make_unique<Block>());
    if (blocks_.size() > 1) {
        blocks_[blocks_.size() - 2]->next = blocks_.back().get();
    }
    for (Ordinal ordinal = first; ordinal < first + kSlotsPerBlock; ++ordinal) {
        free_slot(ordinal);
    }
}

Registry::Ordinal Registry::take_free_slot() {
    std::pop_heap(free_.begin(), free_.end(), std::greater<>());
    const Ordinal ordinal = free_.back();
    free_.pop_back();
    return ordinal;
}

void Registry::free_slot(Ordinal ordinal) {
    free_.push_back(ordinal);
    std::push_heap(free_.begin(), free_.end(), std::greater<>());
}

bool Registry::add(std::unique_ptr<Object>& object, ObjectHandler& handler, std::int32_t tag,
                   std::string_view name, bool unique) {
    std::string name_copy(name);
    const std::lock_guard lock(index_);
    if (unique && find_indexed(name, tag)) {
        return false;
    }
    if (free_.empty()) {
        append_block();
    }
    const Ordinal ordinal = take_free_slot();
    positions_.insert(hash_of(reinterpret_cast<std::uintptr_t>(object.get())), ordinal);
    if (!name.empty()) {
        names_.insert(hash_of(name), ordinal);
    }
    ++live_;
    Slot& slot = slot_at(ordinal);
    SlotHold hold(slot);
    slot.object = object.release();
    slot.handler = &handler;
    slot.tag = tag;
    slot.word = 0;
    slot.name = std::move(name_copy);
    hold.set_state(kOccupied);
    return true;
}

std::optional<Registry::Ordinal> Registry::position_of(std::uintptr_t address) {
    std::optional<Ordinal> position;
    positions_.for_each(hash_of(address), [&](Ordinal ordinal) {
        if (reinterpret_cast<std::uintptr_t>(slot_at(ordinal).object) == address) {
            position = ordinal;
        }
    });
    return position;
}

Pin Registry::examine(Ordinal ordinal, std::int32_t tag) {
    Slot& slot = slot_at(ordinal);
    const SlotHold hold(slot);
    if (hold.state() != kOccupied || (tag != kAnyTag && slot.tag != tag)) {
        return {};
    }
    return {slot.object, slot.tag, slot.object->gate()};
}

Pin Registry::find_indexed(std::string_view name, std::int32_t tag) {
    Pin first;
    std::optional<Ordinal> lowest;
    names_.for_each(hash_of(name), [&](Ordinal ordinal) {
        if ((!lowest || ordinal < *lowest) && slot_at(ordinal).name == name) {
            if (Pin pin = examine(ordinal, tag)) {
                first = std::move(pin);
                lowest = ordinal;
            }
        }
    });
    return first;
}

Pin Registry::find(std::string_view name, std::int32_t tag) {
    const std::lock_guard lock(index_);
    return find_indexed(name, tag);
}

Pin Registry::pin(std::uintptr_t address) {
    const std::lock_guard lock(index_);
    const auto position = position_of(address);
    return position ? examine(*position, kAnyTag) : Pin{};
}

Pin Registry::pin_to_unlock(std::uintptr_t address) {
    const std::lock_guard lock(index_);
    const auto position = position_of(address);
    if (!position) {
        return {};
    }
    const Slot& slot = slot_at(*position);
    return {slot.object, slot.tag, slot.object->gate()};
}

Pin Registry::begin_disposal(std::uintptr_t address, Ordinal& ordinal) {
    const std::lock_guard removal(removal_);
    const std::lock_guard lock(index_);
    const auto position = position_of(address);
    if (!position) {
        return {};
    }
    ordinal = *position;
    Pin pin = examine(ordinal, kAnyTag);
    if (pin) {
        Slot& slot = slot_at(ordinal);
        SlotHold(slot).set_state(kDestroying);
        if (!slot.name.empty()) {
            names_.erase(ordinal);
        }
    }
    return pin;
}

bool Registry::dispose(std::uintptr_t address) {
    Ordinal ordinal = 0;
    const Pin pin = begin_disposal(address, ordinal);
    if (pin.object == nullptr) {
        return false;
    }
    // Those who found the object before wait at the gate, or hold it and still find it to unlock.
    pin.gate->close();
    Slot* slot = nullptr;
    {
        const std::lock_guard lock(index_);
        positions_.erase(ordinal);
        --live_;
        slot = &slot_at(ordinal);
    }
    slot->handler->release_resources(*pin.object);
    slot->object = nullptr;
    slot->handler->destroy(pin.object);
    slot->name.clear();
    const std::lock_guard lock(index_);
    SlotHold(*slot).set_state(kFree);
    free_slot(ordinal);
    return true;
}

bool Registry::next_of_kind(std::int32_t tag, Ordinal& from, std::uintptr_t& address) {
    const std::lock_guard lock(index_);
    const auto end = static_cast<Ordinal>(blocks_.size()) * kSlotsPerBlock;
    for (; from < end; ++from) {
        if (const Pin pin = examine(from, tag)) {
            address = reinterpret_cast<std::uintptr_t>(pin.object);
            ++from;
            return true;
        }
    }
    return false;
}

void Registry::dispose_all(std::int32_t tag) {
    Ordinal from = 0;
    std::uintptr_t address = 0;
    while (next_of_kind(tag, from, address)) {
        dispose(address);
    }
}

std::size_t Registry::live_count() {
    const std::lock_guard lock(index_);
    return live_;
}

}  // namespace zq
