#include "tool/shared/portable/PortableMarkers.h"

#include "audiofile/metadata/AssociatedDataList.h"
#include "audiofile/metadata/CAFMarkers.h"
#include "audiofile/metadata/CAFStringTable.h"
#include "audiofile/metadata/CueList.h"
#include "audiofile/metadata/MarkerList.h"
#include "media/containers/ContainerHeaders.h"
#include "platform/FileText.h"

#include <algorithm>
#include <limits>
#include <unordered_map>
#include <unordered_set>

using platform::decodeFileText;
using platform::FallbackEncoding;

namespace {

constexpr std::uint64_t kMost32 = std::numeric_limits<std::uint32_t>::max();

/// None for a position that was cut off or exceeds the field.
std::optional<std::uint32_t> place32(const SoundChange& change, std::uint32_t frame)
{
    const auto place = change.placeOf(frame);
    return place && *place <= kMost32 ? std::optional(static_cast<std::uint32_t>(*place)) : std::nullopt;
}

/// In compressed sound the offset counts from the block, and the position from the start.
std::uint32_t frameOf(const CuePoint& point, bool isLinearPCM)
{
    return !isLinearPCM && std::uint32_t{point.blockStart} != 0 ? point.position : point.sampleOffset;
}

/// All bits set.
const CAFTimecode kNoTimecode = [] {
    CAFTimecode none;
    none.hours = none.minutes = none.seconds = none.frames = std::int8_t{-1};
    none.subFrameSampleOffset = std::uint32_t{0xFFFFFFFF};
    return none;
}();

} // namespace

Bytes CueMove::movedCues(BytesView body)
{
    auto cues = CueList::read(body, order_);
    if (!cues || (keepsPlaces() && isLinearPCM_))
        return {body.begin(), body.end()};
    std::vector<CuePoint> kept;
    for (CuePoint point : cues->points) {
        const std::uint32_t frame = frameOf(point, isLinearPCM_);
        const auto place = place32(change_, frame);
        if (!place) {
            dropped_.insert(point.id);
            continue;
        }
        const std::uint32_t position = point.position;
        point.position = position == frame ? *place : place32(change_, position).value_or(*place);
        point.sampleOffset = *place;
        point.blockStart = 0; // refers to other samples
        kept.push_back(point);
    }
    cues->points = std::move(kept);
    cues->missingPoints = 0;
    cues->behind.clear();
    return cues->points.empty() ? Bytes() : cues->write();
}

Bytes CueMove::movedLabels(BytesView body) const
{
    auto list = AssociatedDataList::read(body, order_);
    if (!list || keepsPlaces())
        return {body.begin(), body.end()};
    AssociatedDataList moved;
    if (order_ == std::endian::little) {
        moved = std::move(*list);
    } else { // labels are numbers in the other byte order
        for (const CueText& label : list->labels())
            moved.addLabel(label.cueId, label.text);
        for (const CueText& note : list->notes())
            moved.addNote(note.cueId, note.text);
        for (const CueRange& range : list->ranges())
            moved.setRange(range);
    }
    moved.eraseCues([this](std::uint32_t id) { return dropped_.contains(id); });
    moved.changeRanges([this](CueRangeFields& fields) {
        const std::uint64_t length = std::min(change_.scaled(fields.sampleLength), change_.frames);
        fields.sampleLength = static_cast<std::uint32_t>(std::min(length, kMost32));
    });
    return moved.items().empty() ? Bytes() : moved.write();
}

void PortableMarkers::addFromWAVE(BytesView body, const std::vector<BytesView>& lists, std::endian order,
                                  bool isLinearPCM)
{
    const auto cues = CueList::read(body, order);
    if (!cues)
        return;
    std::unordered_map<std::uint32_t, std::string> names, notes;
    for (const BytesView list : lists)
        if (const auto read = AssociatedDataList::read(list, order)) {
            for (const CueText& label : read->labels())
                names.emplace(label.cueId, label.text);
            for (const CueText& note : read->notes())
                notes.emplace(note.cueId, note.text);
            hasMore = hasMore || !read->ranges().empty();
        }
    for (const CuePoint& point : cues->points) {
        const std::uint32_t id = point.id;
        const auto name = names.find(id), note = notes.find(id);
        hasMore = hasMore || (name != names.end() && note != notes.end());
        const std::string text = name != names.end() ? name->second : note != notes.end() ? note->second : "";
        markers.push_back({id, frameOf(point, isLinearPCM), decodeFileText(text, FallbackEncoding::latin1).utf8});
    }
}

void PortableMarkers::addFromAIFF(BytesView body)
{
    if (const auto list = MarkerList::read(body))
        for (const AIFFMarker& marker : list->markers)
            markers.push_back({static_cast<std::uint32_t>(marker.id), marker.position,
                               decodeFileText(marker.name, FallbackEncoding::macintosh).utf8});
}

void PortableMarkers::addFromCAF(BytesView body, BytesView texts)
{
    const auto list = CAFMarkerList::read(body);
    const auto names = CAFStringTable::read(texts);
    if (!list)
        return;
    for (const CAFMarker& marker : list->markers) {
        const double frame = marker.framePosition;
        if (!(frame >= 0 && frame <= 9e18))
            continue;
        const std::uint32_t id = marker.id;
        markers.push_back({id, static_cast<std::uint64_t>(std::round(frame)),
                           decodeFileText(names ? names->find(id).value_or("") : "", FallbackEncoding::latin1).utf8});
        hasMore = hasMore || FourCC{marker.type} != 0 || std::uint32_t{marker.channel} != 0;
    }
}

std::size_t PortableMarkers::move(const SoundChange& change)
{
    std::vector<PortableMarker> kept;
    for (PortableMarker marker : markers)
        if (const auto place = change.placeOf(marker.frame)) {
            marker.frame = *place;
            kept.push_back(std::move(marker));
        }
    const std::size_t dropped = markers.size() - kept.size();
    markers = std::move(kept);
    return dropped;
}

std::vector<HeldChunk> PortableMarkers::chunksFor(FourCC fileType, std::size_t& left) const
{
    CueList cues;
    AssociatedDataList labels;
    MarkerList marks;
    CAFMarkerList cafMarks;
    CAFStringTable names;
    std::unordered_set<std::uint32_t> ids;
    const bool isAIFF = fileType == kAIFF;
    const std::uint32_t mostId = isAIFF ? 32767 : std::numeric_limits<std::uint32_t>::max();
    for (const PortableMarker& marker : markers) {
        const bool hasRoom = fileType == kCaff || (marker.frame <= kMost32 && (!isAIFF || ids.size() < mostId));
        if (!hasRoom) {
            ++left;
            continue;
        }
        std::uint32_t id = marker.id;
        if (id == 0 || id > mostId || ids.contains(id))
            for (id = static_cast<std::uint32_t>(ids.size()) + 1; ids.contains(id) && id < mostId;)
                ++id;
        ids.insert(id);
        const auto frame = static_cast<std::uint32_t>(marker.frame);
        if (fileType == kWAVE) {
            CuePoint& point = cues.points.emplace_back();
            point.id = id;
            point.position = point.sampleOffset = frame;
            if (!marker.name.empty())
                labels.addLabel(id, marker.name);
        } else if (fileType == kCaff) {
            CAFMarker& moved = cafMarks.markers.emplace_back();
            moved.framePosition = static_cast<double>(marker.frame);
            moved.id = id;
            moved.timecode = kNoTimecode;
            CAFStringEntry& entry = names.entries.emplace_back();
            entry.id = id;
            entry.offset = std::ssize(names.texts);
            const Bytes text = textAndNUL(marker.name);
            names.texts.insert(names.texts.end(), text.begin(), text.end());
        } else {
            marks.markers.push_back({.id = static_cast<std::int16_t>(id), .position = frame, .name = marker.name});
        }
    }
    std::vector<HeldChunk> chunks;
    if (!cues.points.empty())
        chunks.push_back({fourCC("cue "), cues.write()});
    if (!labels.items().empty())
        chunks.push_back({fourCC("LIST"), labels.write()});
    if (!marks.markers.empty())
        chunks.push_back({fourCC("MARK"), marks.write()});
    if (!cafMarks.markers.empty()) {
        chunks.push_back({fourCC("strg"), names.write()});
        chunks.push_back({fourCC("mark"), cafMarks.write()});
    }
    return chunks;
}

Bytes movedMarks(BytesView body, const SoundChange& change, std::size_t& dropped)
{
    auto marks = MarkerList::read(body);
    if (!marks || change.keepsPlaces())
        return Bytes(body.begin(), body.end());
    std::vector<AIFFMarker> kept;
    for (AIFFMarker& marker : marks->markers)
        if (const auto place = place32(change, marker.position)) {
            marker.position = *place;
            kept.push_back(std::move(marker));
        }
    dropped += marks->markers.size() - kept.size();
    marks->markers = std::move(kept);
    marks->missingMarkers = 0;
    marks->behind.clear();
    return marks->markers.empty() ? Bytes() : marks->write();
}

Bytes movedCAFMarkers(BytesView body, const SoundChange& change, std::size_t& dropped)
{
    auto marks = CAFMarkerList::read(body);
    if (!marks || change.keepsPlaces())
        return Bytes(body.begin(), body.end());
    std::vector<CAFMarker> kept;
    for (CAFMarker& marker : marks->markers) {
        const double ratio = change.keepsRate() ? 1 : change.rate / change.sourceRate;
        const double place = marker.framePosition * ratio - static_cast<double>(change.start);
        if (!(place >= 0 && place <= static_cast<double>(change.frames)))
            continue;
        marker.framePosition = place;
        kept.push_back(marker);
    }
    dropped += marks->markers.size() - kept.size();
    marks->markers = std::move(kept);
    marks->missingMarkers = 0;
    marks->behind.clear();
    return marks->markers.empty() ? Bytes() : marks->write();
}
