// Sets fields of "cue " and of LIST "adtl".
#include "audiofile/metadata/AssociatedDataList.h"
#include "audiofile/metadata/CueList.h"
#include "tool/meta/ChunkFields.h"
#include "tool/meta/CueReferences.h"
#include "tool/meta/MetaEdit.h"

#include <fmt/format.h>

#include <algorithm>
#include <limits>

namespace {

constexpr FourCC kCue = fourCC("cue ");
constexpr FourCC kLabel = fourCC("labl"), kNote = fourCC("note"), kRange = fourCC("ltxt");

CueList cuesOf(MetaEdit& edit)
{
    return valueOf<CueList>(edit, kCue);
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

/// The number in "[id 7]", the name that `meta` gives to a point missing in "cue ".
std::optional<std::uint32_t> idNamedBy(const MetaStep& step)
{
    const auto id = step.name.parts.front().id();
    return id && *id <= std::numeric_limits<std::uint32_t>::max() ? std::optional(static_cast<std::uint32_t>(*id))
                                                                  : std::nullopt;
}

/// The point of a step, created if the step says so; none when removing a point that does not exist.
std::optional<std::size_t> pointOf(MetaEdit& edit, const MetaStep& step, CueList& cues)
{
    if (const auto id = idNamedBy(step)) {
        if (const CuePoint* const point = cues.find(*id))
            return point - cues.points.data();
        if (step.isRemoval())
            return std::nullopt;
        MetaEdit::refuse(step, "\"cue \" has no point of this id");
    }
    const auto index = edit.itemOf(step, 0, cues.points.size());
    if (!index || *index < cues.points.size())
        return index;
    if (!edit.names(step.name.upTo(0) + ".position"))
        MetaEdit::refuse(step, "a new point needs its position");
    if (cues.missingPoints != 0)
        MetaEdit::refuseDamaged(kCue);
    std::uint32_t most = 0;
    for (const CuePoint& point : cues.points)
        most = std::max<std::uint32_t>(most, point.id);
    cues.points.emplace_back().id = freeCueId(edit, most + 1); // from 0 on if there is none above
    putCues(edit, cues);
    return index;
}

/// Names and remarks may belong to a point missing in "cue ".
std::optional<std::uint32_t> cueIdOf(MetaEdit& edit, const MetaStep& step)
{
    if (const auto id = idNamedBy(step); id && isSpokenOf(edit, *id))
        return id;
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
    // Both fields usually agree, and then stay equal.
    if (member == &CuePoint::sampleOffset && point.position == point.sampleOffset)
        point.position = number;
    point.*member = number;
    putCues(edit, cues);
}

/// What refers to the point follows it: of several points with one id only the first, as `meta` shows it.
void setPointId(MetaEdit& edit, const MetaStep& step)
{
    CueList cues = cuesOf(edit);
    const auto index = pointOf(edit, step, cues);
    if (!index)
        return;
    CuePoint& point = cues.points[*index];
    const std::uint32_t before = point.id;
    const auto id = static_cast<std::uint32_t>(step.number());
    if (id == before)
        return;
    if (cues.find(id) != nullptr)
        MetaEdit::refuse(step, "another point has this id");
    if (cues.find(before) == &point) {
        if (isSpokenOf(edit, before) && isSpokenOf(edit, id))
            MetaEdit::refuse(step, fmt::format("something is said of this id already: remove cue[id {}] first", id));
        renameCue(edit, before, id);
    }
    point.id = id;
    putCues(edit, cues);
}

/// The list that already describes the point, else the first.
MetaChunk* listAbout(MetaEdit& edit, FourCC id, std::uint32_t cueId)
{
    for (std::size_t i = 0;; ++i) {
        MetaChunk* const chunk = edit.find(kListId, i, AssociatedDataList::kForm);
        if (chunk == nullptr)
            return edit.find(kListId, 0, AssociatedDataList::kForm);
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
    putList(edit, chunk, list);
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
    putList(edit, chunk, list);
}

/// A range needs a length.
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
    putList(edit, chunk, list);
}

/// Removes a point with everything that refers to it, unless an earlier point has the same id.
void removePoint(MetaEdit& edit, const MetaStep& step)
{
    CueList cues = cuesOf(edit);
    const auto index = pointOf(edit, step, cues);
    const auto id = index ? std::optional<std::uint32_t>(cues.points[*index].id) : idNamedBy(step);
    if (!id)
        return;
    if (!index || cues.find(*id) == &cues.points[*index])
        eraseAbout(edit, [id](std::uint32_t each) { return each == *id; });
    if (!index)
        return;
    if (cues.missingPoints != 0)
        MetaEdit::refuseDamaged(kCue);
    edit.itemRemoved(step, 0);
    cues.points.erase(cues.points.begin() + static_cast<std::ptrdiff_t>(*index));
    putCues(edit, cues);
}

/// Removes all points with everything that refers to them.
void removeCues(MetaEdit& edit, const MetaStep&)
{
    for (MetaChunk* chunk = edit.find(kCue); chunk != nullptr; chunk = edit.find(kCue))
        edit.remove(*chunk);
    eraseAbout(edit, [](std::uint32_t) { return true; });
}

using K = MetaKind;

constexpr MetaRule kCueRules[] = {
    {"cue[N].position", K::time, {}, setPoint<&CuePoint::sampleOffset>, true},
    {"cue[N].id", K::integer, kUnsigned32, setPointId, true},
    {"cue[N].playlistPosition", K::time, {}, setPoint<&CuePoint::position>},
    {"cue[N].chunkStart", K::integer, kUnsigned32, setPoint<&CuePoint::chunkStart>},
    {"cue[N].blockStart", K::integer, kUnsigned32, setPoint<&CuePoint::blockStart>},
    {"cue[N].label", K::text, kAnyLength, setCueText<kLabel>},
    {"cue[N].note", K::text, kAnyLength, setCueText<kNote>},
    {"cue[N].length", K::time, {}, setLength},
    {"cue[N].purpose", K::id, {}, setRange<&CueRange::purpose>},
    {"cue[N].text", K::text, kAnyLength, setRange<&CueRange::text>},
    {"cue[N].country", K::integer, kUnsigned16, setRange<&CueRange::country>},
    {"cue[N].language", K::integer, kUnsigned16, setRange<&CueRange::language>},
    {"cue[N].dialect", K::integer, kUnsigned16, setRange<&CueRange::dialect>},
    {"cue[N].codePage", K::integer, kUnsigned16, setRange<&CueRange::codePage>},
    {"cue[N]", K::none, {}, removePoint},
    {"cue", K::none, {}, removeCues},
};

} // namespace

std::span<const MetaRule> cueRules()
{
    return kCueRules;
}
