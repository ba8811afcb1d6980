// Hash tables with open addressing: a power of two of slots, where a collision goes to the next one.
#pragma once

#include <algorithm>
#include <cstddef>
#include <utility>
#include <vector>

/// Makes four times as many slots, at least 64. A slot has the `hash` by which it is placed and a `number`, which is
/// 0 where the slot is free. Throws std::bad_alloc.
template <class Slot>
void growHashSlots(std::vector<Slot>& slots)
{
    constexpr std::size_t first = 64;
    std::vector<Slot> larger(std::max(first, 4 * slots.size()));
    for (const Slot& slot : slots) {
        if (slot.number == 0)
            continue;
        std::size_t i = slot.hash;
        while (larger[i & (larger.size() - 1)].number != 0)
            ++i;
        larger[i & (larger.size() - 1)] = slot;
    }
    slots = std::move(larger);
}
