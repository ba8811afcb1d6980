// A dictionary of the elements of one kind, in document order: from ID to element, which it owns.
#pragma once

#include <algorithm>
#include <array>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <functional>
#include <iterator>
#include <limits>
#include <map>
#include <memory>
#include <new>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

/// A dictionary by ID, in document order; it owns the elements. A lookup waits for memory once: the ID and the
/// element's address lie side by side, two of them in a cache line, and the element itself is not touched.
template <class Element>
class ADMElementTable {
    using Owners = std::vector<std::unique_ptr<Element>>;

public:
    std::size_t size() const { return elements_.size(); }
    bool empty() const { return elements_.empty(); }

    /// The element stored under `id`, spelt exactly so; null when there is none.
    Element* find(std::string_view id) const
    {
        if (id.size() <= kShortID && !lines_.empty())
            if (const std::size_t at = slotOf(id); at != kNoSlot && slotAt(at).element != nullptr)
                return slotAt(at).element;
        const auto found = others_.find(id);
        return found == others_.end() ? nullptr : elements_[found->second].get();
    }

    /// Fetches the memory of the slot that find() looks at first.
    void prefetch(std::string_view id) const
    {
        if (id.size() <= kShortID && !lines_.empty())
            __builtin_prefetch(&slotAt(firstSlotOf(id) & (slotCount() - 1)));
    }

    /// Stores an element. One that is already there under this ID is replaced, and the new one takes its place in the
    /// order. The old one lives as long as the table, since others may link to it. Throws std::bad_alloc.
    void insert(std::string_view id, std::unique_ptr<Element> element)
    {
        if (elements_.size() == std::numeric_limits<std::uint32_t>::max())
            throw std::bad_alloc();
        if (id.size() <= kShortID && slotCount() < 2 * (elements_.size() + 1))
            grow();
        const std::size_t at = id.size() <= kShortID ? slotOf(id) : kNoSlot;
        if (at != kNoSlot && slotAt(at).element != nullptr) {
            slotAt(at).element = element.get();
            replace(slotAt(at).entry, std::move(element));
            return;
        }
        if (const auto other = others_.find(id); other != others_.end()) {
            replace(other->second, std::move(element));
            return;
        }
        const auto entry = static_cast<std::uint32_t>(elements_.size());
        elements_.push_back(std::move(element));
        place(id, at, entry);
    }

    /// A forward iterator over the elements themselves.
    class Iterator {
    public:
        using value_type = Element;
        using difference_type = std::ptrdiff_t;
        using iterator_category = std::forward_iterator_tag;
        using pointer = Element*;
        using reference = Element&;

        Iterator() = default;
        /// Made by begin() and end().
        explicit Iterator(typename Owners::const_iterator at) : at_(at) {}
        Element& operator*() const { return **at_; }
        Element* operator->() const { return at_->get(); }
        Iterator& operator++()
        {
            ++at_;
            return *this;
        }
        Iterator operator++(int)
        {
            const Iterator before = *this;
            ++at_;
            return before;
        }
        friend bool operator==(const Iterator&, const Iterator&) = default;

    private:
        typename Owners::const_iterator at_;
    };
    Iterator begin() const { return Iterator(elements_.begin()); }
    Iterator end() const { return Iterator(elements_.end()); }

private:
    // Longer than every ID that follows the standard.
    static constexpr std::size_t kShortID = 19;
    // How many slots an ID may lie away from its first: a document could hold IDs that all hash to one slot.
    static constexpr std::size_t kReach = 64;
    static constexpr std::size_t kNoSlot = std::numeric_limits<std::size_t>::max();

    struct alignas(32) Slot {
        Slot() = default;
        Slot(std::string_view text, std::uint32_t where, Element* what)
            : size(static_cast<std::uint8_t>(text.size())),
              entry(where),
              element(what)
        {
            std::memcpy(id.data(), text.data(), text.size());
        }
        bool holds(std::string_view text) const
        {
            return size == text.size() && std::memcmp(id.data(), text.data(), text.size()) == 0;
        }
        std::string_view text() const { return {id.data(), size}; }

        std::array<char, kShortID> id{};
        std::uint8_t size = 0;
        std::uint32_t entry = 0;    // its index in the order of the document
        Element* element = nullptr; // null: the slot is free
    };
    /// A cache line: reading one of its slots fetches the other.
    struct alignas(64) Line {
        std::array<Slot, 2> slots;
    };
    static_assert(sizeof(Slot) == 32 && sizeof(Line) == 64);

    std::size_t slotCount() const { return 2 * lines_.size(); }
    Slot& slotAt(std::size_t at) { return lines_[at / 2].slots[at % 2]; }
    const Slot& slotAt(std::size_t at) const { return lines_[at / 2].slots[at % 2]; }

    /// The first slot of a line, before the mask.
    static std::size_t firstSlotOf(std::string_view id) { return std::hash<std::string_view>()(id) & ~std::size_t{1}; }
    /// The slot that holds this ID, or the free one where it belongs; `kNoSlot` when other IDs fill all within reach.
    std::size_t slotOf(std::string_view id) const
    {
        const std::size_t mask = slotCount() - 1;
        const std::size_t first = firstSlotOf(id);
        for (std::size_t i = 0; i < kReach; ++i)
            if (const Slot& slot = slotAt((first + i) & mask); slot.element == nullptr || slot.holds(id))
                return (first + i) & mask;
        return kNoSlot;
    }
    void place(std::string_view id, std::size_t slot, std::uint32_t entry)
    {
        if (slot == kNoSlot)
            others_.emplace(id, entry);
        else
            slotAt(slot) = Slot(id, entry, elements_[entry].get());
    }
    void replace(std::uint32_t entry, std::unique_ptr<Element> element)
    {
        replaced_.push_back(std::exchange(elements_[entry], std::move(element)));
    }
    void grow()
    {
        const std::vector<Line> before =
            std::exchange(lines_, std::vector<Line>(std::max<std::size_t>(8, 2 * lines_.size())));
        for (const Line& line : before)
            for (const Slot& slot : line.slots)
                if (slot.element != nullptr)
                    place(slot.text(), slotOf(slot.text()), slot.entry);
    }

    Owners elements_;
    std::vector<Line> lines_;                                  // a power of two, at most half of their slots taken
    std::map<std::string, std::uint32_t, std::less<>> others_; // long IDs, and those that found no slot
    Owners replaced_;
};
