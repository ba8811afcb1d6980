#include "tool/adm/AdmTree.h"

#include "tool/shared/adm/AdmText.h"

#include <type_traits>

namespace {

// Deeper levels fit no terminal, and there may be as many as objects.
constexpr std::size_t kMostLevels = 24;

constexpr std::string_view kSilentTrack = "ATU_00000000";

template <class Item>
constexpr bool kIsElement = std::is_pointer_v<Item>;

template <class Item>
constexpr bool kIsBlock = std::is_same_v<Item, const ADMAudioBlockFormat*>;

template <class Missing, class Items, class Element>
void addLinks(Items& items, const std::vector<std::string>& ids, const std::vector<Element*>& elements)
{
    for (std::size_t i = 0; i < ids.size(); ++i)
        if (i < elements.size() && elements[i] != nullptr)
            items.emplace_back(static_cast<const Element*>(elements[i]));
        else
            items.emplace_back(Missing{ids[i]});
}

} // namespace

void AdmTree::show(const ADMDocument& document)
{
    for (const ADMAudioObject& object : document.audioObjects())
        noteHeld(object, object.audioObjects());
    for (const ADMAudioPackFormat& pack : document.audioPackFormats())
        noteHeld(pack, pack.audioPackFormats());
    showRoots(document.audioProgrammes());
    writer_.beginSection("In no programme");
    showRoots(document.audioContents());
    showRoots(document.audioObjects());
    showRoots(document.audioPackFormats());
    showRoots(document.audioChannelFormats());
    showRoots(document.audioTrackUIDs());
    showRoots(document.audioTrackFormats());
    showRoots(document.audioStreamFormats());
}

template <class Element>
void AdmTree::noteHeld(const Element& holder, const std::vector<Element*>& elements)
{
    for (const Element* element : elements)
        if (element != nullptr && element != &holder)
            held_.insert(element);
}

template <class Element>
void AdmTree::showRoots(const ADMElementTable<Element>& elements)
{
    // An element that another of its kind holds is shown there, unless they hold each other.
    for (const bool isHeld : {false, true})
        for (const Element& element : elements) {
            if (held_.contains(&element) == isHeld && stateOf(element) == State::untouched)
                showRoot(&element);
            for (; !putOff_.empty(); putOff_.pop_front())
                showRoot(putOff_.front());
            if (writer_.isUseless())
                return;
        }
}

void AdmTree::showRoot(const Item& item)
{
    writer_.beginRoot();
    showItem(item, true, 0);
}

void AdmTree::showItem(const Item& item, bool isLast, std::size_t depth)
{
    const ADMElement* element = std::visit(
        [](const auto& it) -> const ADMElement* {
            using It = std::decay_t<decltype(it)>;
            if constexpr (kIsElement<It> && !kIsBlock<It>)
                return it;
            else
                return nullptr;
        },
        item);
    if (element == nullptr) {
        writer_.add(nodeOf(item), isLast, false);
        return;
    }
    if (const State state = stateOf(*element);
        state == State::open || state == State::shown || (state == State::putOff && depth > 0)) {
        showAgain(item, isLast, state);
        return;
    }
    const Items children = childrenOf(item);
    if (depth == kMostLevels && !children.empty()) {
        stateOf(*element) = State::putOff;
        putOff_.push_back(item);
        showAgain(item, isLast, State::putOff);
        return;
    }
    writer_.add(nodeOf(item), isLast, !children.empty());
    stateOf(*element) = State::open;
    showChildren(children, depth);
    stateOf(*element) = State::shown;
}

void AdmTree::showAgain(const Item& item, bool isLast, State state)
{
    AdmNode node = nodeOf(item);
    node.name = shortened(node.name);
    node.details = {state == State::open     ? "goes round in a circle"
                    : state == State::putOff ? "goes on below"
                                             : "see above"};
    writer_.add(node, isLast, false);
}

void AdmTree::showChildren(const Items& children, std::size_t depth)
{
    if (children.empty())
        return;
    writer_.enter();
    for (const Item& child : children) {
        showItem(child, &child == &children.back(), depth + 1);
        if (writer_.isUseless())
            break;
    }
    writer_.leave();
}

AdmNode AdmTree::nodeOf(const Item& item) const
{
    return std::visit(
        [](const auto& it) -> AdmNode {
            using It = std::decay_t<decltype(it)>;
            if constexpr (std::is_same_v<It, Missing>) {
                const bool isSilent = it.id == kSilentTrack;
                return {isSilent ? "silent track" : "missing", "", std::string(it.id), {}};
            } else if constexpr (std::is_same_v<It, More>) {
                return {"more", "", "", {countText(it.count, "more")}};
            } else {
                return describe(*it);
            }
        },
        item);
}

AdmTree::Items AdmTree::childrenOf(const Item& item)
{
    Items items;
    std::visit(
        [&](const auto& it) {
            using It = std::decay_t<decltype(it)>;
            if constexpr (kIsElement<It> && !kIsBlock<It>)
                addChildren(items, *it);
        },
        item);
    return items;
}

void AdmTree::addChildren(Items& items, const ADMAudioProgramme& programme) const
{
    addLinks<Missing>(items, programme.audioContentIDs(), programme.audioContents());
}

void AdmTree::addChildren(Items& items, const ADMAudioContent& content) const
{
    addLinks<Missing>(items, content.audioObjectIDRefs(), content.audioObjects());
}

void AdmTree::addChildren(Items& items, const ADMAudioObject& object) const
{
    addLinks<Missing>(items, object.audioPackFormatIDRefs(), object.audioPackFormats());
    addLinks<Missing>(items, object.audioTrackUIDRefs(), object.audioTrackUIDs());
    addLinks<Missing>(items, object.audioObjectIDRefs(), object.audioObjects());
}

void AdmTree::addChildren(Items& items, const ADMAudioPackFormat& pack) const
{
    addLinks<Missing>(items, pack.audioChannelFormatIDRefs(), pack.audioChannelFormats());
    addLinks<Missing>(items, pack.audioPackFormatIDRefs(), pack.audioPackFormats());
}

void AdmTree::addChildren(Items& items, const ADMAudioChannelFormat& channel) const
{
    const ADMAudioChannelFormat::Blocks& blocks = channel.audioBlockFormat();
    // A line "1 more" would take as much room as the block itself.
    const std::size_t count = blocks.size() <= mostBlocks_ + 1 ? blocks.size() : mostBlocks_;
    items.reserve(count + 1);
    for (std::size_t i = 0; i < count; ++i)
        items.emplace_back(static_cast<const ADMAudioBlockFormat*>(blocks[i].get()));
    if (count < blocks.size())
        items.emplace_back(More{blocks.size() - count});
}

// A track is one line with its format and stream. These nearly always lead to the object's pack and channel, which are
// shown already.
void AdmTree::addChildren(Items& items, const ADMAudioTrackUID& track)
{
    addIfNew(items, track.audioPackFormat());
    addIfNew(items, track.audioChannelFormat());
    if (track.audioTrackFormat() == nullptr)
        return;
    stateOf(*track.audioTrackFormat()) = State::shown;
    addChildren(items, *track.audioTrackFormat());
}

void AdmTree::addChildren(Items& items, const ADMAudioTrackFormat& track)
{
    const ADMAudioStreamFormat* stream = track.audioStreamFormat();
    if (stream == nullptr || stateOf(*stream) != State::untouched)
        return;
    stateOf(*stream) = State::shown;
    addIfNew(items, stream->audioPackFormat());
    addIfNew(items, stream->audioChannelFormat());
}

void AdmTree::addChildren(Items& items, const ADMAudioStreamFormat& stream)
{
    addIfNew(items, stream.audioPackFormat());
    addIfNew(items, stream.audioChannelFormat());
}

template <class Element>
void AdmTree::addIfNew(Items& items, const Element* element)
{
    if (element != nullptr && stateOf(*element) == State::untouched)
        items.emplace_back(element);
}
