// A hash index over numbered slots: says which slots hold a hash, the caller compares the rest.
// Entries lie in arrays by slot, so taking one in and out needs no memory, and finding one touches
// little of it however many there are.
#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

namespace zq {

// Threads: the caller's lock.
class SlotIndex {
  public:
    using Slot = std::uint32_t;

    // Room for the slots 0 to count - 1. Throws std::bad_alloc; everything then is as it was.
    void reserve(std::size_t count);
    // The slot must not be in the index.
    void insert(std::uint32_t hash, Slot slot) noexcept;
    // The slot must be in the index.
    void erase(Slot slot) noexcept;

    // Calls visit(slot) for each slot of this hash, in no particular order.
    template <class Visit>
    void for_each(std::uint32_t hash, Visit visit) const {
        if (heads_.empty()) {
            return;
        }
        for (Slot slot = heads_[hash & (heads_.size() - 1)]; slot != kNone;) {
            const Link& link = links_[slot];
            if (link.hash == hash) {
                visit(slot);
            }
            slot = link.next;
        }
    }

  private:
    static constexpr Slot kNone = 0xFFFFFFFF;
    struct Link {
        std::uint32_t hash;
        Slot next;
    };
    Slot& head_of(std::uint32_t hash) { return heads_[hash & (heads_.size() - 1)]; }

    std::vector<Slot> heads_;  // a power of two of them, at least two a slot: chains are short
    std::vector<Link> links_;  // by slot
};

}  // namespace zq
