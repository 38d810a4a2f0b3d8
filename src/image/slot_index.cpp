// Growing and changing the chains of a slot index.
#include "image/slot_index.h"

#include <bit>
#include <utility>

namespace zq {

void SlotIndex::reserve(std::size_t count) {
    if (count > links_.size()) {
        links_.resize(count);
    }
    if (2 * count <= heads_.size()) {
        return;
    }
    const std::vector<Slot> old_heads =
        std::exchange(heads_, std::vector<Slot>(std::bit_ceil(2 * count), kNone));
    for (const Slot head : old_heads) {
        for (Slot slot = head; slot != kNone;) {
            const Slot next = links_[slot].next;
            insert(links_[slot].hash, slot);
            slot = next;
        }
    }
}

void SlotIndex::insert(std::uint32_t hash, Slot slot) noexcept {
    Slot& head = head_of(hash);
    links_[slot] = {hash, head};
    head = slot;
}

void SlotIndex::erase(Slot slot) noexcept {
    Slot* place = &head_of(links_[slot].hash);
    while (*place != slot) {
        place = &links_[*place].next;
    }
    *place = links_[slot].next;
}

}  // namespace zq
