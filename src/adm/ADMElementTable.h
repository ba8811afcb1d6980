// A dictionary of the elements of one kind: from ID to element, which it owns, in the order of the document.
#pragma once

#include <algorithm>
#include <array>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <functional>
#include <iterator>
#include <limits>
#include <memory>
#include <new>
#include <optional>
#include <string>
#include <string_view>
#include <unordered_map>
#include <utility>
#include <vector>

/// A lookup waits for memory once: the ID and the element's address lie side by side, two of them in a cache line, and
/// the element itself is not touched.
template <class Element>
class ADMElementTable {
    using Owners = std::vector<std::unique_ptr<Element>>;

public:
    std::size_t size() const { return elements_.size(); }
    bool empty() const { return elements_.empty(); }

    /// The element stored under `id`, spelt exactly so; null when there is none.
    Element* find(std::string_view id) const
    {
        if (id.size() > kShortID) {
            const auto found = longIDs_.find(id);
            return found == longIDs_.end() ? nullptr : elements_[found->second].get();
        }
        return slots_.empty() ? nullptr : slots_[slotOf(id)].element;
    }

    /// One that is already there under this ID is replaced, and the new one takes its place in the order. It lives on
    /// until the table goes, since others may link to it.
    void insert(std::string_view id, std::unique_ptr<Element> element)
    {
        if (elements_.size() == std::numeric_limits<std::uint32_t>::max())
            throw std::bad_alloc();
        if (id.size() <= kShortID && slots_.size() < 2 * (elements_.size() + 1))
            grow();
        Element* const address = element.get();
        if (const std::optional<std::uint32_t> entry = entryOf(id)) {
            replaced_.push_back(std::move(elements_[*entry]));
            elements_[*entry] = std::move(element);
            if (id.size() <= kShortID)
                slots_[slotOf(id)].element = address;
            return;
        }
        const auto entry = static_cast<std::uint32_t>(elements_.size());
        elements_.push_back(std::move(element));
        if (id.size() <= kShortID)
            slots_[slotOf(id)] = Slot(id, entry, address);
        else
            longIDs_.emplace(id, entry);
    }

    /// Goes over the elements themselves.
    class Iterator {
    public:
        using value_type = Element;
        using difference_type = std::ptrdiff_t;
        using iterator_category = std::forward_iterator_tag;
        using pointer = Element*;
        using reference = Element&;

        Iterator() = default;
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
    // All IDs that follow the standard are shorter.
    static constexpr std::size_t kShortID = 19;

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
        std::uint32_t entry = 0;    // where it stands in the order
        Element* element = nullptr; // null: the slot is free
    };
    static_assert(sizeof(Slot) == 32);

    struct Hash : std::hash<std::string_view> {
        using is_transparent = void;
    };

    std::optional<std::uint32_t> entryOf(std::string_view id) const
    {
        if (id.size() > kShortID) {
            const auto found = longIDs_.find(id);
            return found == longIDs_.end() ? std::nullopt : std::optional(found->second);
        }
        const Slot& slot = slots_[slotOf(id)];
        return slot.element == nullptr ? std::nullopt : std::optional(slot.entry);
    }
    /// The slot that holds this ID, or the free one where it belongs.
    std::size_t slotOf(std::string_view id) const
    {
        const std::size_t mask = slots_.size() - 1;
        std::size_t at = Hash()(id) & mask;
        while (slots_[at].element != nullptr && !slots_[at].holds(id))
            at = (at + 1) & mask;
        return at;
    }
    void grow()
    {
        const std::vector<Slot> before =
            std::exchange(slots_, std::vector<Slot>(std::max<std::size_t>(16, 2 * slots_.size())));
        for (const Slot& slot : before)
            if (slot.element != nullptr)
                slots_[slotOf(slot.text())] = slot;
    }

    Owners elements_;
    std::vector<Slot> slots_; // a power of two, at most half of them taken
    std::unordered_map<std::string, std::uint32_t, Hash, std::equal_to<>> longIDs_;
    Owners replaced_;
};
