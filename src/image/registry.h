// The process-wide registry of live objects: owns every image from creation to disposal, finds
// objects by name, and tells whether a handle is live.
//
// Objects sit in slots, 32 to a block, blocks chained. A slot's state word is changed by atomic
// exchange only: 1 free, 2 occupied, 4 being destroyed, 0 held by a thread that examines the slot.
// Beside the chain indexes keep, under their own mutex, where each object sits, which slots hold
// each name and which slots are free (lowest first). So nothing gets dearer with
// the number of live objects, and what is found is what a walk of the chain from its start finds
// first.
#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <optional>
#include <string_view>
#include <vector>

#include "image/object.h"
#include "image/slot_index.h"
#include "platform/mutex.h"

namespace zq {

inline constexpr std::int32_t kAnyTag = 0;
inline constexpr std::int32_t kImageTag = 1;

// How one kind of objects ends. Handlers are never destroyed.
class ObjectHandler {
  public:
    // Called first, while the object still holds its slot and nobody else can lock it.
    virtual void release_resources(Object& object) noexcept = 0;
    virtual void destroy(Object* object) noexcept = 0;

  protected:
    ~ObjectHandler() = default;
};

// A live object as it was found. It may be disposed at any moment; its gate stays and then tells
// so.
struct Pin {
    Object* object = nullptr;
    std::int32_t tag = kAnyTag;
    std::shared_ptr<ObjectGate> gate;

    explicit operator bool() const { return gate != nullptr; }
};

// Threads: safe.
class Registry {
  public:
    static Registry& instance();
    Registry();
    // Destroys what is left, without telling the handlers' first step: hosts are gone by then.
    ~Registry();
    Registry(const Registry&) = delete;
    Registry& operator=(const Registry&) = delete;

    // Takes the object into the first free slot. An empty name means unnamed. Returns false, and
    // leaves the object with the caller, when `unique` is asked and a live object of this tag has
    // the name. Out of memory: throws std::bad_alloc, and nothing has changed.
    bool add(std::unique_ptr<Object>& object, ObjectHandler& handler, std::int32_t tag,
             std::string_view name, bool unique);

    // The first object in chain order with exactly this name; kAnyTag takes any kind. An empty name
    // finds nothing.
    Pin find(std::string_view name, std::int32_t tag);
    // The live object at an address; the address is compared, never followed.
    Pin pin(std::uintptr_t address);
    // The same, also while the object's disposal waits for whoever holds its lock: for unlocking.
    Pin pin_to_unlock(std::uintptr_t address);

    // Waits until nobody else holds the object's lock, then destroys it. False when nothing is
    // registered there (any more), which is no error.
    bool dispose(std::uintptr_t address);
    // Disposes every object of a kind in chain order; objects added meanwhile may stay.
    void dispose_all(std::int32_t tag);

    std::size_t live_count();

  private:
    struct Slot;
    struct Block;
    class SlotHold;
    using Ordinal = SlotIndex::Slot;  // position of a slot in the chain

    Slot& slot_at(Ordinal ordinal);
    void append_block();
    Ordinal take_free_slot();
    void free_slot(Ordinal ordinal);
    Pin examine(Ordinal ordinal, std::int32_t tag);
    Pin find_indexed(std::string_view name, std::int32_t tag);
    std::optional<Ordinal> position_of(std::uintptr_t address);
    // Marks the object as being destroyed, so that nobody finds it any more. Empty for an object
    // that is not there, or already marked.
    Pin begin_disposal(std::uintptr_t address, Ordinal& ordinal);
    bool next_of_kind(std::int32_t tag, Ordinal& from, std::uintptr_t& address);

    platform::Mutex removal_;  // one removal at a time looks for its slot
    platform::Mutex
        index_;  // guards everything below; never held while an object's lock is waited for
    std::vector<std::unique_ptr<Block>> blocks_;
    std::vector<Ordinal> free_;  // a heap, lowest ordinal on top
    SlotIndex positions_;        // by the object's address
    SlotIndex names_;            // by name; unnamed objects are not in it
    std::size_t live_ = 0;
};

}  // namespace zq
