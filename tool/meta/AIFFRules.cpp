// Sets fields of AIFF and AIFC.
#include "audiofile/metadata/AIFFInstrumentChunk.h"
#include "audiofile/metadata/CommentList.h"
#include "audiofile/metadata/MarkerList.h"
#include "tool/meta/ChunkFields.h"

#include <fmt/format.h>

#include <algorithm>
#include <ctime>
#include <limits>

namespace {

constexpr FourCC kAnnotation = fourCC("ANNO"), kCommentList = fourCC("COMT"), kMarkers = fourCC("MARK"),
                 kInstrument = fourCC("INST");
constexpr std::int16_t kMostId = std::numeric_limits<std::int16_t>::max();

Bytes asBytes(const std::string& text)
{
    return {bytesOf(text).begin(), bytesOf(text).end()};
}

/// For chunks that are a text as a whole.
template <FourCC id>
void setText(MetaEdit& edit, const MetaStep& step)
{
    std::size_t count = 0;
    while (edit.find(id, count) != nullptr)
        ++count;
    const bool isFirst = step.name.parts[0].index.empty() && count == 0;
    const auto index = isFirst && !step.isRemoval() ? 0 : edit.itemOf(step, 0, count);
    if (!index)
        return;
    MetaChunk* const chunk = edit.find(id, *index);
    if (chunk == nullptr && count != 0 && id != kAnnotation && !edit.isLenient())
        MetaEdit::refuse(step, "a file has one; --lenient adds another");
    if (chunk == nullptr)
        edit.add(id, asBytes(step.string()));
    else if (!step.isRemoval())
        edit.replace(*chunk, asBytes(step.string()));
    else
        edit.remove(*chunk);
    if (step.isRemoval() && count > 1)
        edit.itemRemoved(step, 0);
}

// "comt":

/// Removes a list without items and without bytes after them.
template <class List>
void putOrRemove(MetaEdit& edit, FourCC id, const List& list, bool isEmpty)
{
    MetaChunk* const chunk = edit.find(id);
    if (isEmpty && chunk != nullptr)
        edit.remove(*chunk);
    else
        putChunk(edit, id, list);
}

CommentList commentsOf(MetaEdit& edit)
{
    return valueOf<CommentList>(edit, kCommentList);
}

template <class Change>
void changeComment(MetaEdit& edit, const MetaStep& step, Change change)
{
    CommentList list = commentsOf(edit);
    const auto index = edit.itemOf(step, 0, list.comments.size());
    if (!index)
        return;
    if (*index == list.comments.size()) {
        if (list.missingComments != 0)
            MetaEdit::refuseDamaged(kCommentList);
        list.lastIsPadded = true;
        list.comments.emplace_back().timeStamp =
            static_cast<std::uint32_t>(std::time(nullptr)) + AIFFComment::kSecondsTo1970;
    }
    change(list, *index);
    putChunk(edit, kCommentList, list);
}

void setCommentText(MetaEdit& edit, const MetaStep& step)
{
    changeComment(edit, step, [&](CommentList& list, std::size_t index) {
        list.comments[index].text = step.string();
        list.lastIsPadded = list.lastIsPadded || index + 1 == list.comments.size();
    });
}

void setCommentTime(MetaEdit& edit, const MetaStep& step)
{
    changeComment(edit, step, [&](CommentList& list, std::size_t index) {
        list.comments[index].timeStamp = static_cast<std::uint32_t>(step.number());
    });
}

MarkerList markersOf(MetaEdit& edit)
{
    return valueOf<MarkerList>(edit, kMarkers);
}

void setCommentMarker(MetaEdit& edit, const MetaStep& step)
{
    const auto id = static_cast<std::int16_t>(step.number());
    if (id != 0 && markersOf(edit).find(id) == nullptr && !edit.isLenient())
        MetaEdit::refuse(step, "there is no marker of this id; --lenient writes it");
    changeComment(edit, step, [&](CommentList& list, std::size_t index) { list.comments[index].marker = id; });
}

void removeComment(MetaEdit& edit, const MetaStep& step)
{
    CommentList list = commentsOf(edit);
    const auto index = edit.itemOf(step, 0, list.comments.size());
    if (!index)
        return;
    if (list.missingComments != 0)
        MetaEdit::refuseDamaged(kCommentList);
    list.comments.erase(list.comments.begin() + static_cast<std::ptrdiff_t>(*index));
    edit.itemRemoved(step, 0);
    putOrRemove(edit, kCommentList, list, list.comments.empty() && list.behind.empty());
}

// "mark":

template <class Change>
void changeMarker(MetaEdit& edit, const MetaStep& step, Change change)
{
    MarkerList list = markersOf(edit);
    const auto index = edit.itemOf(step, 0, list.markers.size());
    if (!index)
        return;
    if (*index == list.markers.size()) {
        if (!edit.names(step.name.upTo(0) + ".position"))
            MetaEdit::refuse(step, "a new marker needs its position");
        if (list.missingMarkers != 0)
            MetaEdit::refuseDamaged(kMarkers);
        std::int16_t id = 0;
        for (const AIFFMarker& marker : list.markers)
            id = std::max(id, marker.id);
        if (id == kMostId || list.markers.size() == MarkerList::kMostMarkers)
            MetaEdit::refuse(step, "there is no id above those of the others");
        list.markers.emplace_back().id = static_cast<std::int16_t>(id + 1);
    }
    change(list, list.markers[*index]);
    putChunk(edit, kMarkers, list);
}

void setMarkerName(MetaEdit& edit, const MetaStep& step)
{
    changeMarker(edit, step, [&](MarkerList&, AIFFMarker& marker) {
        marker.name = step.string();
        marker.pad = std::byte{0};
    });
}

void setMarkerPosition(MetaEdit& edit, const MetaStep& step)
{
    changeMarker(edit, step, [&](MarkerList&, AIFFMarker& marker) {
        marker.position = static_cast<std::uint32_t>(edit.framesWithinSound(step));
    });
}

/// Comments and "INST" loops with marker `from` get marker `to`; 0 means none, and removes the loop.
void renameMarker(MetaEdit& edit, std::int16_t from, std::int16_t to)
{
    if (edit.find(kCommentList) != nullptr) {
        CommentList list = commentsOf(edit);
        for (std::size_t i = 0; i < list.comments.size(); ++i)
            if (list.comments[i].marker == from && !edit.names(fmt::format("comt[{}].marker", i)))
                list.comments[i].marker = to;
        putChunk(edit, kCommentList, list);
    }
    MetaChunk* const chunk = edit.find(kInstrument);
    auto instrument = chunk != nullptr ? AIFFInstrumentChunk::read(chunk->body) : std::nullopt;
    if (!instrument)
        return;
    for (AIFFLoop* const loop : {&instrument->sustainLoop, &instrument->releaseLoop})
        for (Packed<std::int16_t>* const marker : {&loop->beginMarker, &loop->endMarker})
            if (loop->mode != AIFFLoop::kNone && *marker == from) {
                *marker = to;
                if (to == 0)
                    loop->mode = AIFFLoop::kNone;
            }
    edit.replace(*chunk, instrument->write());
}

void setMarkerId(MetaEdit& edit, const MetaStep& step)
{
    const auto id = static_cast<std::int16_t>(step.number());
    changeMarker(edit, step, [&](MarkerList& list, AIFFMarker& marker) {
        const std::int16_t before = marker.id;
        if (id == before)
            return;
        if (list.find(id) != nullptr)
            MetaEdit::refuse(step, "another marker has this id");
        if (list.find(before) == &marker)
            renameMarker(edit, before, id);
        marker.id = id;
    });
}

void removeMarker(MetaEdit& edit, const MetaStep& step)
{
    MarkerList list = markersOf(edit);
    const auto index = edit.itemOf(step, 0, list.markers.size());
    if (!index)
        return;
    if (list.missingMarkers != 0)
        MetaEdit::refuseDamaged(kMarkers);
    const AIFFMarker& marker = list.markers[*index];
    if (list.find(marker.id) == &marker)
        renameMarker(edit, marker.id, 0);
    list.markers.erase(list.markers.begin() + static_cast<std::ptrdiff_t>(*index));
    edit.itemRemoved(step, 0);
    putOrRemove(edit, kMarkers, list, list.markers.empty() && list.behind.empty());
}

void removeMarkers(MetaEdit& edit, const MetaStep&)
{
    const MetaChunk* const chunk = edit.find(kMarkers);
    const auto list = chunk != nullptr ? MarkerList::read(chunk->body) : std::nullopt;
    for (const AIFFMarker& marker : list ? list->markers : std::vector<AIFFMarker>())
        renameMarker(edit, marker.id, 0);
    if (MetaChunk* const left = edit.find(kMarkers))
        edit.remove(*left);
}

using K = MetaKind;

constexpr MetaRule kAIFFRules[] = {
    {"NAME", K::text, kAnyLength, setText<fourCC("NAME")>},
    {"AUTH", K::text, kAnyLength, setText<fourCC("AUTH")>},
    {"(c)", K::text, kAnyLength, setText<fourCC("(c) ")>},
    {"ANNO", K::text, kAnyLength, setText<kAnnotation>},

    {"comt[N].text", K::text, {0, 65535}, setCommentText},
    {"comt[N].timeStamp", K::moment, {}, setCommentTime},
    {"comt[N].marker", K::integer, {0, 32767}, setCommentMarker},
    {"comt[N]", K::none, {}, removeComment},
    {"comt", K::none, {}, removeChunk<kCommentList>},

    {"mark[N].position", K::time, {}, setMarkerPosition, true},
    {"mark[N].name", K::text, {0, 255}, setMarkerName},
    {"mark[N].id", K::integer, {1, 32767}, setMarkerId, true},
    {"mark[N]", K::none, {}, removeMarker},
    {"mark", K::none, {}, removeMarkers},
};

} // namespace

std::span<const MetaRule> aiffRules()
{
    return kAIFFRules;
}
