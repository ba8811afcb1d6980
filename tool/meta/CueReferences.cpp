#include "tool/meta/CueReferences.h"

#include "audiofile/metadata/AssociatedDataList.h"
#include "audiofile/metadata/CueList.h"
#include "audiofile/metadata/PlaylistChunk.h"
#include "audiofile/metadata/SamplerChunk.h"
#include "tool/meta/ChunkFields.h"

#include <fmt/format.h>

#include <algorithm>
#include <set>

namespace {

constexpr FourCC kCuePoints = fourCC("cue "), kPlaylist = fourCC("plst"), kSampler = fourCC("smpl");

/// Changes each list "adtl", and removes one without items.
template <class Change>
void changeLists(MetaEdit& edit, Change change)
{
    for (std::size_t i = 0; MetaChunk* const chunk = edit.find(kListId, i, AssociatedDataList::kForm);) {
        auto list = listIn<AssociatedDataList>(chunk);
        change(list);
        i += list.items().empty() ? 0U : 1U;
        putList(edit, chunk, list);
    }
}

/// Reads each chunk with the id; a damaged one refers to no point.
template <class Chunk, class Change>
void changeChunks(MetaEdit& edit, FourCC id, Change change)
{
    for (std::size_t i = 0; MetaChunk* const chunk = edit.find(id, i); ++i)
        if (auto value = Chunk::read(chunk->body)) {
            change(*value);
            if (Bytes body = value->write(); body != chunk->body)
                edit.replace(*chunk, std::move(body));
        }
}

std::set<std::uint32_t> idsSpokenOf(MetaEdit& edit)
{
    std::set<std::uint32_t> ids;
    changeLists(edit, [&](const AssociatedDataList& list) { ids.merge(list.cueIds()); });
    return ids;
}

} // namespace

bool isSpokenOf(MetaEdit& edit, std::uint32_t cueId)
{
    return idsSpokenOf(edit).contains(cueId);
}

std::uint32_t freeCueId(MetaEdit& edit, std::uint32_t least)
{
    std::set<std::uint32_t> used = idsSpokenOf(edit);
    const auto use = [&used](const auto& records, auto id) {
        for (const auto& record : records)
            used.insert(record.*id);
    };
    changeChunks<CueList>(edit, kCuePoints, [&](const CueList& list) { use(list.points, &CuePoint::id); });
    changeChunks<PlaylistChunk>(edit, kPlaylist,
                                [&](const PlaylistChunk& list) { use(list.segments, &PlaylistSegment::cueId); });
    changeChunks<SamplerChunk>(edit, kSampler,
                               [&](const SamplerChunk& sampler) { use(sampler.loops, &SamplerLoop::cueId); });
    while (used.contains(least))
        ++least;
    return least;
}

void renameCue(MetaEdit& edit, std::uint32_t from, std::uint32_t to)
{
    changeLists(edit, [&](AssociatedDataList& list) { list.renameCue(from, to); });
    changeChunks<PlaylistChunk>(edit, kPlaylist, [&](PlaylistChunk& list) {
        for (PlaylistSegment& segment : list.segments)
            if (segment.cueId == from)
                segment.cueId = to;
    });
    changeChunks<SamplerChunk>(edit, kSampler, [&](SamplerChunk& sampler) {
        for (std::size_t i = 0; i < sampler.loops.size(); ++i)
            if (sampler.loops[i].cueId == from && !edit.names(fmt::format("smpl.loop[{}].cueId", i)))
                sampler.loops[i].cueId = to;
    });
}

void eraseAbout(MetaEdit& edit, const std::function<bool(std::uint32_t cueId)>& isGone)
{
    changeLists(edit, [&](AssociatedDataList& list) { list.eraseCues(isGone); });
    changeChunks<PlaylistChunk>(edit, kPlaylist, [&](PlaylistChunk& list) {
        std::erase_if(list.segments, [&](const PlaylistSegment& segment) { return isGone(segment.cueId); });
    });
}
