// An ADM document as a tree: programmes, their contents, objects, packs, channels and blocks, followed by what no
// programme contains.
#pragma once

#include "adm/ADMDocument.h"
#include "tool/adm/AdmTreeWriter.h"

#include <cstddef>
#include <deque>
#include <string_view>
#include <unordered_map>
#include <unordered_set>
#include <variant>
#include <vector>

/// Shows every element with its content once, and marks further references to it. So circles end, and the tree is never
/// larger than the document.
class AdmTree {
public:
    /// Shows `mostBlocks` blocks of each channel.
    AdmTree(AdmTreeWriter& writer, std::size_t mostBlocks) : writer_(writer), mostBlocks_(mostBlocks) {}
    void show(const ADMDocument& document);

private:
    struct Missing {
        std::string_view id;
    };
    struct More {
        std::size_t count;
    };
    using Item =
        std::variant<const ADMAudioProgramme*, const ADMAudioContent*, const ADMAudioObject*, const ADMAudioPackFormat*,
                     const ADMAudioChannelFormat*, const ADMAudioTrackUID*, const ADMAudioTrackFormat*,
                     const ADMAudioStreamFormat*, const ADMAudioBlockFormat*, Missing, More>;
    using Items = std::vector<Item>;
    enum class State { untouched, open, shown, putOff };

    template <class Element>
    void noteHeld(const Element& holder, const std::vector<Element*>& elements);
    template <class Element>
    void showRoots(const ADMElementTable<Element>& elements);
    void showRoot(const Item& item);
    void showItem(const Item& item, bool isLast, std::size_t depth);
    void showAgain(const Item& item, bool isLast, State state);
    void showChildren(const Items& children, std::size_t depth);
    AdmNode nodeOf(const Item& item) const;

    Items childrenOf(const Item& item);
    void addChildren(Items& items, const ADMAudioProgramme& programme) const;
    void addChildren(Items& items, const ADMAudioContent& content) const;
    void addChildren(Items& items, const ADMAudioObject& object) const;
    void addChildren(Items& items, const ADMAudioPackFormat& pack) const;
    void addChildren(Items& items, const ADMAudioChannelFormat& channel) const;
    void addChildren(Items& items, const ADMAudioTrackUID& track);
    void addChildren(Items& items, const ADMAudioTrackFormat& track);
    void addChildren(Items& items, const ADMAudioStreamFormat& stream);
    template <class Element>
    void addIfNew(Items& items, const Element* element);
    State& stateOf(const ADMElement& element) { return states_[&element]; }

    AdmTreeWriter& writer_;
    std::size_t mostBlocks_;
    std::unordered_map<const ADMElement*, State> states_;
    std::unordered_set<const ADMElement*> held_; // by another of the same kind
    std::deque<Item> putOff_;                    // too deep for the current tree
};
