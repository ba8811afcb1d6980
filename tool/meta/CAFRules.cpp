// Sets fields of CAF.
#include "audiofile/metadata/CAFMarkers.h"
#include "audiofile/metadata/CAFStringTable.h"
#include "audiofile/metadata/CAFTextPairs.h"
#include "tool/meta/ChunkFields.h"
#include "tool/shared/arguments/Nearest.h"
#include "tool/shared/output/Terminal.h"

#include <fmt/format.h>

#include <algorithm>
#include <array>
#include <limits>

namespace {

constexpr FourCC kInfo = fourCC("info"), kStrings = fourCC("strg"), kMarkersOfCAF = fourCC("mark");

// "info".

// Keys of the published format description.
constexpr std::array<std::string_view, 19> kKeys{"tempo",
                                                 "key signature",
                                                 "time signature",
                                                 "artist",
                                                 "album",
                                                 "genre",
                                                 "track number",
                                                 "year",
                                                 "composer",
                                                 "lyricist",
                                                 "title",
                                                 "recorded date",
                                                 "comments",
                                                 "copyright",
                                                 "source encoder",
                                                 "source",
                                                 "encoding application",
                                                 "nominal bit rate",
                                                 "channel layout"};

void setCAFInfo(MetaEdit& edit, const MetaStep& step)
{
    const std::string& key = step.name.rest;
    MetaChunk* const chunk = edit.find(kInfo);
    if (chunk != nullptr && chunk->body.size() < sizeof(std::uint32_t))
        MetaEdit::refuseDamaged(kInfo);
    CAFTextPairs texts = chunk != nullptr ? CAFTextPairs(chunk->body) : CAFTextPairs();
    const bool stands = texts.find(key) != nullptr;
    if (step.isRemoval() && !stands)
        return;
    if (!stands && !edit.isLenient() && std::ranges::find(kKeys, key) == kKeys.end())
        MetaEdit::refuse(step, fmt::format("\"{}\" is no published key (--lenient writes it){}", printable(key),
                                           didYouMean(key, kKeys)));
    if (step.isRemoval())
        texts.erase(key);
    else
        texts.set(key, step.string());
    if (texts.isEmpty())
        edit.remove(*chunk);
    else if (chunk != nullptr)
        edit.replace(*chunk, texts.payload());
    else
        edit.add(kInfo, texts.payload());
}

// "strg" and "mark".

CAFStringTable stringsOf(MetaEdit& edit)
{
    return valueOf<CAFStringTable>(edit, kStrings);
}

std::uint32_t freeTextId(MetaEdit& edit, const CAFStringTable& table)
{
    std::uint32_t most = 0;
    for (const CAFStringEntry& entry : table.entries)
        most = std::max<std::uint32_t>(most, entry.id);
    // Markers and regions may have ids without a text.
    if (const MetaChunk* const chunk = edit.find(kMarkersOfCAF))
        if (const auto list = CAFMarkerList::read(chunk->body))
            for (const CAFMarker& marker : list->markers)
                most = std::max<std::uint32_t>(most, marker.id);
    if (const MetaChunk* const chunk = edit.find(fourCC("regn")))
        if (const auto list = CAFRegionList::read(chunk->body))
            for (const CAFRegion& region : list->regions)
                most = std::max(most, region.id);
    return most + 1;
}

/// Replaces the entry's text in place if it fits and no other entry shares it; otherwise appends it after all texts.
void setTextOf(CAFStringTable& table, CAFStringEntry& entry, const std::string& text)
{
    const std::string old = table.textOf(entry).value_or("");
    const std::int64_t begin = entry.offset;
    const bool isAlone = table.textOf(entry) && std::ranges::none_of(table.entries, [&](const CAFStringEntry& each) {
                             return &each != &entry && each.offset >= begin && each.offset <= begin + std::ssize(old);
                         });
    const auto at = static_cast<std::ptrdiff_t>(begin);
    const bool hasRoom = isAlone && text.size() <= old.size() && at + std::ssize(old) < std::ssize(table.texts);
    if (!hasRoom && table.missingEntries != 0) // bytes after the entries would become an entry
        MetaEdit::refuseDamaged(kStrings);
    if (isAlone)
        std::fill_n(table.texts.begin() + at, old.size(), std::byte{0});
    if (hasRoom) {
        std::ranges::copy(bytesOf(text), table.texts.begin() + at);
        return;
    }
    if (!table.texts.empty() && table.texts.back() != std::byte{0})
        table.texts.push_back(std::byte{0});
    entry.offset = static_cast<std::int64_t>(table.texts.size());
    table.texts.insert(table.texts.end(), bytesOf(text).begin(), bytesOf(text).end());
    table.texts.push_back(std::byte{0});
}

CAFStringEntry& addText(CAFStringTable& table, std::uint32_t id)
{
    if (table.missingEntries != 0)
        MetaEdit::refuseDamaged(kStrings);
    CAFStringEntry& entry = table.entries.emplace_back();
    entry.id = id;
    entry.offset = -1;
    return entry;
}

void setString(MetaEdit& edit, const MetaStep& step)
{
    CAFStringTable table = stringsOf(edit);
    const auto index = edit.itemOf(step, 0, table.entries.size());
    if (!index)
        return;
    if (*index == table.entries.size())
        addText(table, freeTextId(edit, table));
    setTextOf(table, table.entries[*index], step.string());
    putChunk(edit, kStrings, table);
}

CAFMarkerList cafMarkersOf(MetaEdit& edit)
{
    return valueOf<CAFMarkerList>(edit, kMarkersOfCAF);
}

template <class Change>
void changeCAFMarker(MetaEdit& edit, const MetaStep& step, Change change)
{
    CAFMarkerList list = cafMarkersOf(edit);
    const auto index = edit.itemOf(step, 0, list.markers.size());
    if (!index)
        return;
    if (*index == list.markers.size()) {
        if (!edit.names(step.name.upTo(0) + ".position"))
            MetaEdit::refuse(step, "a new marker needs its position");
        if (list.missingMarkers != 0)
            MetaEdit::refuseDamaged(kMarkersOfCAF);
        CAFMarker& marker = list.markers.emplace_back();
        CAFTimecode& none = marker.timecode;
        none.hours = none.minutes = none.seconds = none.frames = std::int8_t{-1};
        none.subFrameSampleOffset = 0xFFFFFFFF;
    }
    change(list, list.markers[*index]);
    putChunk(edit, kMarkersOfCAF, list);
}

void setCAFPosition(MetaEdit& edit, const MetaStep& step)
{
    constexpr std::uint64_t most = std::uint64_t{1} << 53; // whole numbers that a double can hold
    changeCAFMarker(edit, step, [&](CAFMarkerList&, CAFMarker& marker) {
        const std::uint64_t frames = edit.framesOf(step, most);
        if (edit.file().frames >= 0 && frames > static_cast<std::uint64_t>(edit.file().frames) && !edit.isLenient())
            MetaEdit::refuse(step, fmt::format("frame {}, but the sound ends at frame {}; --lenient writes it", frames,
                                               edit.file().frames));
        marker.framePosition = static_cast<double>(frames);
    });
}

template <auto member>
void setNumber(MetaEdit& edit, const MetaStep& step)
{
    changeCAFMarker(edit, step, [&](CAFMarkerList&, CAFMarker& marker) {
        marker.*member = static_cast<std::uint32_t>(step.number());
    });
}

/// Gives the marker a text of its own; a shared text stays with the other markers.
void setCAFMarkerName(MetaEdit& edit, const MetaStep& step)
{
    changeCAFMarker(edit, step, [&](CAFMarkerList& list, CAFMarker& marker) {
        CAFStringTable table = stringsOf(edit);
        const std::uint32_t before = marker.id;
        auto entry = std::ranges::find_if(table.entries, [&](const CAFStringEntry& each) { return each.id == before; });
        if (step.isRemoval()) {
            marker.id = 0U;
            return;
        }
        const bool isShared =
            std::ranges::count_if(list.markers, [&](const CAFMarker& each) { return each.id == before; }) > 1;
        if (entry == table.entries.end() || isShared) {
            const std::uint32_t id = before != 0 && !isShared ? before : freeTextId(edit, table);
            addText(table, id);
            entry = table.entries.end() - 1;
            marker.id = id;
        }
        setTextOf(table, *entry, step.string());
        putChunk(edit, kStrings, table);
    });
}

void removeCAFMarker(MetaEdit& edit, const MetaStep& step)
{
    CAFMarkerList list = cafMarkersOf(edit);
    const auto index = edit.itemOf(step, 0, list.markers.size());
    if (!index)
        return;
    if (list.missingMarkers != 0)
        MetaEdit::refuseDamaged(kMarkersOfCAF);
    list.markers.erase(list.markers.begin() + static_cast<std::ptrdiff_t>(*index));
    edit.itemRemoved(step, 0);
    if (list.markers.empty() && list.behind.empty())
        edit.remove(*edit.find(kMarkersOfCAF));
    else
        putChunk(edit, kMarkersOfCAF, list);
}

using K = MetaKind;

constexpr MetaRule kCAFRules[] = {
    {"info", K::none, {}, removeChunk<kInfo>},
    {"info.*", K::text, kAnyLength, setCAFInfo},

    {"strg[N].text", K::text, kAnyLength, setString},

    {"mark[N].position", K::time, {}, setCAFPosition, true},
    {"mark[N].name", K::text, kAnyLength, setCAFMarkerName},
    {"mark[N].type", K::id, {}, setNumber<&CAFMarker::type>},
    {"mark[N].id", K::integer, kUnsigned32, setNumber<&CAFMarker::id>},
    {"mark[N].channel", K::integer, kUnsigned32, setNumber<&CAFMarker::channel>},
    {"mark[N]", K::none, {}, removeCAFMarker},
    {"mark", K::none, {}, removeChunk<kMarkersOfCAF>},
};

} // namespace

std::span<const MetaRule> cafRules()
{
    return kCAFRules;
}
