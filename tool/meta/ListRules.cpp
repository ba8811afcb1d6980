// How fields of LIST "INFO", and of "cue " with LIST "adtl", are set.
#include "audiofile/metadata/AssociatedDataList.h"
#include "audiofile/metadata/CueList.h"
#include "audiofile/metadata/InfoList.h"
#include "tool/meta/MetaEdit.h"
#include "tool/shared/arguments/Nearest.h"

#include <fmt/format.h>

#include <algorithm>
#include <limits>

namespace {

constexpr FourCC kList = fourCC("LIST"), kCue = fourCC("cue ");
constexpr FourCC kLabel = fourCC("labl"), kNote = fourCC("note"), kRange = fourCC("ltxt");
constexpr double kMost16 = 65535, kMost32 = 4294967295.0, kNoLimit = 1e9;

/// A list without items goes.
template <class List>
void put(MetaEdit& edit, MetaChunk* chunk, const List& list)
{
    if (list.items().empty() && chunk != nullptr)
        edit.remove(*chunk);
    else if (chunk == nullptr && !list.items().empty())
        edit.add(kList, list.write());
    else if (chunk != nullptr)
        if (Bytes body = list.write(); body != chunk->body)
            edit.replace(*chunk, std::move(body));
}

template <class List>
List listIn(const MetaChunk* chunk)
{
    auto list = chunk != nullptr ? List::read(chunk->body) : std::nullopt;
    return list ? std::move(*list) : List();
}

// "info":

/// Ids that are in no list of them are taken where they stand already, so that none comes of a slip.
void requireKnown(const MetaEdit& edit, const MetaStep& step, const std::string& id, bool stands)
{
    std::vector<std::string> names;
    for (const FourCC known : InfoList::knownIds())
        names.push_back(fourCCText(known));
    if (stands || edit.isLenient() || std::ranges::find(names, id) != names.end())
        return;
    const std::vector<std::string_view> known(names.begin(), names.end());
    MetaEdit::refuse(step, fmt::format("\"{}\" is no registered id{}{}", id, didYouMean(id, known),
                                       id.size() == 4 ? "; --lenient writes it" : ""));
}

void setInfo(MetaEdit& edit, const MetaStep& step)
{
    const MetaName::Part& part = step.name.parts[1];
    const std::string& text = part.name;
    if (step.name.parts.size() != 2 || text.size() != sizeof(FourCC)) {
        requireKnown(edit, step, step.name.rest, false);
        MetaEdit::refuse(step, "an id has four characters");
    }
    const FourCC id = fourCC(text[0], text[1], text[2], text[3]);
    MetaChunk* const chunk = edit.chunkOf(step, kList, InfoList::kForm);
    auto list = listIn<InfoList>(chunk);
    const auto count = static_cast<std::size_t>(std::ranges::count(list.items(), id, &ListItem::id));
    if (step.isRemoval()) {
        if (const auto index = part.number(); index && list.eraseAt(id, *index)) {
            if (count > 1)
                edit.itemRemoved(step, 1);
            put(edit, chunk, list);
        }
        return;
    }
    requireKnown(edit, step, text, count != 0);
    const bool isFirst = part.index.empty() && count == 0;
    list.setAt(id, isFirst ? 0 : *edit.itemOf(step, 1, count), step.string());
    put(edit, chunk, list);
}

void removeInfo(MetaEdit& edit, const MetaStep& step)
{
    if (MetaChunk* const chunk = edit.chunkOf(step, kList, InfoList::kForm))
        edit.remove(*chunk);
}

// "cue":

CueList cuesOf(MetaEdit& edit)
{
    const MetaChunk* const chunk = edit.find(kCue);
    auto cues = chunk != nullptr ? CueList::read(chunk->body) : CueList();
    if (!cues)
        MetaEdit::refuseDamaged(kCue);
    return *cues;
}

void putCues(MetaEdit& edit, const CueList& cues)
{
    MetaChunk* const chunk = edit.find(kCue);
    if (chunk == nullptr)
        edit.add(kCue, cues.write());
    else if (cues.points.empty() && cues.behind.empty())
        edit.remove(*chunk);
    else
        edit.replace(*chunk, cues.write());
}

/// The point that a step is about, made where it is a new one; none of a removal of what is not there.
std::optional<std::size_t> pointOf(MetaEdit& edit, const MetaStep& step, CueList& cues)
{
    const auto index = edit.itemOf(step, 0, cues.points.size());
    if (!index || *index < cues.points.size())
        return index;
    if (!edit.names(step.name.upTo(0) + ".position"))
        MetaEdit::refuse(step, "a new point needs its position");
    if (cues.missingPoints != 0)
        MetaEdit::refuseDamaged(kCue);
    std::uint32_t id = 0;
    for (const CuePoint& point : cues.points)
        id = std::max<std::uint32_t>(id, point.id);
    if (id == std::numeric_limits<std::uint32_t>::max())
        MetaEdit::refuse(step, "there is no id above those of the others");
    cues.points.emplace_back().id = id + 1;
    putCues(edit, cues);
    return index;
}

/// "cue[id 7]" says of which point by its id, though "cue " has none.
std::optional<std::uint32_t> cueIdOf(MetaEdit& edit, const MetaStep& step)
{
    constexpr std::string_view byId = "id ";
    const std::string& index = step.name.parts[0].index;
    if (index.starts_with(byId))
        if (const auto id = MetaName::Part{"", index.substr(byId.size())}.number())
            return static_cast<std::uint32_t>(*id);
    CueList cues = cuesOf(edit);
    const auto point = pointOf(edit, step, cues);
    return point ? std::optional<std::uint32_t>(cues.points[*point].id) : std::nullopt;
}

template <auto member>
void setPoint(MetaEdit& edit, const MetaStep& step)
{
    CueList cues = cuesOf(edit);
    const auto index = pointOf(edit, step, cues);
    if (!index)
        return;
    CuePoint& point = cues.points[*index];
    const bool isTime = std::holds_alternative<MetaTime>(step.value);
    const auto number =
        isTime ? static_cast<std::uint32_t>(edit.framesWithinSound(step)) : static_cast<std::uint32_t>(step.number());
    if (member == &CuePoint::id &&
        std::ranges::any_of(cues.points, [&](const CuePoint& each) { return &each != &point && each.id == number; }))
        MetaEdit::refuse(step, "another point has this id");
    // Mostly both say the same, and then go on to.
    if (member == &CuePoint::sampleOffset && point.position == point.sampleOffset)
        point.position = number;
    point.*member = number;
    putCues(edit, cues);
}

/// The list that speaks of the point so, else the first.
MetaChunk* listAbout(MetaEdit& edit, FourCC id, std::uint32_t cueId)
{
    for (std::size_t i = 0;; ++i) {
        MetaChunk* const chunk = edit.find(kList, i, AssociatedDataList::kForm);
        if (chunk == nullptr)
            return edit.find(kList, 0, AssociatedDataList::kForm);
        auto list = listIn<AssociatedDataList>(chunk);
        if (list.eraseFirst(id, cueId))
            return chunk;
    }
}

template <FourCC id>
void setCueText(MetaEdit& edit, const MetaStep& step)
{
    const auto cueId = cueIdOf(edit, step);
    if (!cueId)
        return;
    MetaChunk* const chunk = listAbout(edit, id, *cueId);
    auto list = listIn<AssociatedDataList>(chunk);
    if (step.isRemoval())
        list.eraseFirst(id, *cueId);
    else if (id == kLabel)
        list.setLabel(*cueId, step.string());
    else
        list.setNote(*cueId, step.string());
    put(edit, chunk, list);
}

void assign(std::string& text, const MetaEdit&, const MetaStep& step)
{
    text = step.string();
}

template <class T>
void assign(Packed<T>& field, const MetaEdit& edit, const MetaStep& step)
{
    const bool isTime = std::holds_alternative<MetaTime>(step.value);
    field = isTime ? static_cast<T>(edit.framesWithinSound(step)) : static_cast<T>(step.number());
}

template <auto member>
void setRange(MetaEdit& edit, const MetaStep& step)
{
    const auto cueId = cueIdOf(edit, step);
    if (!cueId)
        return;
    MetaChunk* const chunk = listAbout(edit, kRange, *cueId);
    auto list = listIn<AssociatedDataList>(chunk);
    const auto ranges = list.ranges();
    const auto found = std::ranges::find_if(ranges, [&](const CueRange& each) { return each.cueId == *cueId; });
    CueRange range;
    if (found != ranges.end())
        range = *found;
    else if (step.isRemoval())
        return;
    else
        range.purpose = fourCC("rgn ");
    range.cueId = *cueId;
    assign(range.*member, edit, step);
    list.setRange(range);
    put(edit, chunk, list);
}

/// A range without a length is none.
void setLength(MetaEdit& edit, const MetaStep& step)
{
    if (!step.isRemoval())
        return setRange<&CueRange::sampleLength>(edit, step);
    const auto cueId = cueIdOf(edit, step);
    if (!cueId)
        return;
    MetaChunk* const chunk = listAbout(edit, kRange, *cueId);
    auto list = listIn<AssociatedDataList>(chunk);
    list.eraseFirst(kRange, *cueId);
    put(edit, chunk, list);
}

/// All that is said of the points that `isGone` says yes to.
void eraseAbout(MetaEdit& edit, const std::function<bool(std::uint32_t cueId)>& isGone)
{
    for (std::size_t i = 0; MetaChunk* const chunk = edit.find(kList, i, AssociatedDataList::kForm);) {
        auto list = listIn<AssociatedDataList>(chunk);
        list.eraseCues(isGone);
        i += list.items().empty() ? 0U : 1U; // one without items goes
        put(edit, chunk, list);
    }
}

void removePoint(MetaEdit& edit, const MetaStep& step)
{
    const auto cueId = cueIdOf(edit, step);
    if (!cueId)
        return;
    eraseAbout(edit, [cueId](std::uint32_t each) { return each == *cueId; });
    edit.itemRemoved(step, 0);
    CueList cues = cuesOf(edit);
    const auto index = step.name.parts[0].number();
    if (!index)
        return;
    if (cues.missingPoints != 0)
        MetaEdit::refuseDamaged(kCue);
    cues.points.erase(cues.points.begin() + static_cast<std::ptrdiff_t>(*index));
    putCues(edit, cues);
}

/// All points, with all that is said of them.
void removeCues(MetaEdit& edit, const MetaStep&)
{
    for (MetaChunk* chunk = edit.find(kCue); chunk != nullptr; chunk = edit.find(kCue))
        edit.remove(*chunk);
    eraseAbout(edit, [](std::uint32_t) { return true; });
}

using K = MetaKind;

constexpr MetaRule kRules[] = {
    {"info", K::none, {}, removeInfo},
    {"info.*", K::text, {0, kNoLimit}, setInfo},

    {"cue[N].position", K::time, {}, setPoint<&CuePoint::sampleOffset>},
    {"cue[N].id", K::integer, {0, kMost32}, setPoint<&CuePoint::id>},
    {"cue[N].playlistPosition", K::time, {}, setPoint<&CuePoint::position>},
    {"cue[N].chunkStart", K::integer, {0, kMost32}, setPoint<&CuePoint::chunkStart>},
    {"cue[N].blockStart", K::integer, {0, kMost32}, setPoint<&CuePoint::blockStart>},
    {"cue[N].label", K::text, {0, kNoLimit}, setCueText<kLabel>},
    {"cue[N].note", K::text, {0, kNoLimit}, setCueText<kNote>},
    {"cue[N].length", K::time, {}, setLength},
    {"cue[N].purpose", K::id, {}, setRange<&CueRange::purpose>},
    {"cue[N].text", K::text, {0, kNoLimit}, setRange<&CueRange::text>},
    {"cue[N].country", K::integer, {0, kMost16}, setRange<&CueRange::country>},
    {"cue[N].language", K::integer, {0, kMost16}, setRange<&CueRange::language>},
    {"cue[N].dialect", K::integer, {0, kMost16}, setRange<&CueRange::dialect>},
    {"cue[N].codePage", K::integer, {0, kMost16}, setRange<&CueRange::codePage>},
    {"cue[N]", K::none, {}, removePoint},
    {"cue", K::none, {}, removeCues},
};

} // namespace

std::span<const MetaRule> listRules()
{
    return kRules;
}
