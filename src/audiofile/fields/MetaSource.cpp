#include "audiofile/fields/MetaSource.h"

#include "audiofile/metadata/CAFStringTable.h"
#include "audiofile/metadata/CueList.h"
#include "audiofile/metadata/MarkerList.h"

#include <algorithm>

const MetaChunk* MetaSource::find(FourCC id) const
{
    const auto found =
        std::ranges::find_if(chunks, [id](const MetaChunk& chunk) { return chunk.id == id && chunk.isHeld; });
    return found == chunks.end() ? nullptr : &*found;
}

const std::map<std::uint32_t, std::size_t>& MetaSource::cueIndices() const
{
    if (cueIndices_)
        return *cueIndices_;
    cueIndices_.emplace();
    const MetaChunk* const chunk = find(fourCC("cue "));
    if (const auto cues = chunk != nullptr ? CueList::read(chunk->body, order) : std::nullopt)
        for (std::size_t i = 0; i < cues->points.size(); ++i)
            cueIndices_->emplace(cues->points[i].id, i);
    return *cueIndices_;
}

const std::map<std::int16_t, std::uint32_t>& MetaSource::markerPositions() const
{
    if (markerPositions_)
        return *markerPositions_;
    markerPositions_.emplace();
    const MetaChunk* const chunk = find(fourCC("MARK"));
    if (const auto list = chunk != nullptr ? MarkerList::read(chunk->body) : std::nullopt)
        for (const AIFFMarker& marker : list->markers)
            markerPositions_->emplace(marker.id, marker.position);
    return *markerPositions_;
}

const std::map<std::uint32_t, std::string>& MetaSource::texts() const
{
    if (texts_)
        return *texts_;
    texts_.emplace();
    const MetaChunk* const chunk = find(fourCC("strg"));
    const auto table = chunk != nullptr ? CAFStringTable::read(chunk->body) : std::nullopt;
    std::size_t size = 0;
    for (std::size_t i = 0; table && i < table->entries.size() && size < chunk->body.size(); ++i)
        if (const auto text = table->textOf(table->entries[i])) {
            size += text->size() + 1;
            texts_->emplace(std::uint32_t{table->entries[i].id}, *text);
        }
    return *texts_;
}
