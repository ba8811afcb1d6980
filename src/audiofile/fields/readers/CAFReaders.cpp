// Reads the metadata of CAF.
#include "audiofile/fields/readers/MetaReaders.h"
#include "audiofile/metadata/CAFInstrumentChunk.h"
#include "audiofile/metadata/CAFMarkers.h"
#include "audiofile/metadata/CAFStringTable.h"
#include "audiofile/metadata/CAFTextPairs.h"

namespace {

bool readTexts(const MetaChunk& chunk, const MetaSource&, MetaFields& fields)
{
    if (chunk.body.size() < sizeof(std::uint32_t))
        return false;
    const CAFTextPairs texts(chunk.body);
    for (const auto& [key, value] : texts.pairs())
        fields.text(key, value);
    return true;
}

bool readStrings(const MetaChunk& chunk, const MetaSource&, MetaFields& fields)
{
    const auto table = CAFStringTable::read(chunk.body);
    if (!table)
        return false;
    std::size_t size = 0; // texts may overlap; at most the size of the chunk
    for (std::size_t i = 0; i < table->entries.size(); ++i) {
        fields.number(itemName("", i) + "id", std::uint32_t{table->entries[i].id});
        const auto text = size < chunk.body.size() ? table->textOf(table->entries[i]) : std::nullopt;
        if (text)
            fields.text(itemName("", i) + "text", *text);
        size += text ? text->size() + 1 : 0;
    }
    fields.missing(table->missingEntries);
    return true;
}

std::string stringOf(const MetaSource& source, std::uint32_t id)
{
    const auto found = source.texts().find(id);
    return found != source.texts().end() ? found->second : "";
}

void addMarkers(const std::string& name, const std::vector<CAFMarker>& markers, const MetaSource& source,
                MetaFields& fields)
{
    for (std::size_t i = 0; i < markers.size(); ++i) {
        const CAFMarker& marker = markers[i];
        const std::string item = itemName(name, i);
        if (marker.type != 0)
            fields.text(item + "type", fourCCText(marker.type));
        fields.frames(item + "position", double{marker.framePosition});
        fields.number(item + "id", std::uint32_t{marker.id});
        fields.text(item + "name", stringOf(source, marker.id));
        if (const CAFTimecode& code = marker.timecode; code.hours >= 0 && code.subFrameSampleOffset != 0xFFFFFFFF)
            fields.text(item + "timecode", clockFields({std::int8_t{code.hours}, std::int8_t{code.minutes},
                                                        std::int8_t{code.seconds}, std::int8_t{code.frames}}) +
                                               "+" + std::to_string(std::uint32_t{code.subFrameSampleOffset}));
        if (marker.channel != 0)
            fields.number(item + "channel", std::uint32_t{marker.channel});
    }
}

bool readCAFMarkers(const MetaChunk& chunk, const MetaSource& source, MetaFields& fields)
{
    const auto list = CAFMarkerList::read(chunk.body);
    if (!list)
        return false;
    fields.number("timecodeType", list->timecodeType);
    addMarkers("", list->markers, source, fields);
    fields.missing(list->missingMarkers);
    fields.behind(list->behind);
    return true;
}

bool readRegions(const MetaChunk& chunk, const MetaSource& source, MetaFields& fields)
{
    const auto list = CAFRegionList::read(chunk.body);
    if (!list)
        return false;
    fields.number("timecodeType", list->timecodeType);
    for (std::size_t i = 0; i < list->regions.size(); ++i) {
        const CAFRegion& region = list->regions[i];
        const std::string item = itemName("", i);
        std::string words;
        for (const auto& [flag, word] : {std::pair{CAFRegion::kLoops, "loops"},
                                         {CAFRegion::kPlaysForward, "forward"},
                                         {CAFRegion::kPlaysBackward, "backward"}})
            if ((region.flags & flag) != 0)
                words += (words.empty() ? "" : ", ") + std::string(word);
        fields.number(item + "id", region.id);
        fields.text(item + "name", stringOf(source, region.id));
        fields.number(item + "flags", region.flags, words);
        addMarkers(item + "marker", region.markers, source, fields);
    }
    fields.missing(list->missingRegions);
    fields.behind(list->behind);
    return true;
}

bool readCAFInstrument(const MetaChunk& chunk, const MetaSource& source, MetaFields& fields)
{
    const auto instrument = CAFInstrumentChunk::read(chunk.body);
    if (!instrument)
        return false;
    fields.number("baseNote", float{instrument->baseNote});
    fields.number("lowNote", std::uint8_t{instrument->lowNote});
    fields.number("highNote", std::uint8_t{instrument->highNote});
    fields.number("lowVelocity", std::uint8_t{instrument->lowVelocity});
    fields.number("highVelocity", std::uint8_t{instrument->highVelocity});
    fields.number("gain", float{instrument->gain}, "dB");
    for (const auto& [name, region] : {std::pair{"startRegion", instrument->startRegion},
                                       {"sustainRegion", instrument->sustainRegion},
                                       {"releaseRegion", instrument->releaseRegion}})
        if (region != 0xFFFFFFFF)
            fields.number(name, std::uint32_t{region});
    fields.number("instrumentId", std::uint32_t{instrument->instrumentId}, stringOf(source, instrument->instrumentId));
    fields.behind(instrument->behind);
    return true;
}

bool readChannels(const MetaChunk& chunk, const MetaSource&, MetaFields& fields)
{
    constexpr std::size_t descriptionSize = 20;
    ByteReader reader(chunk.body);
    const auto tag = reader.read<std::uint32_t>(), bitmap = reader.read<std::uint32_t>(),
               count = reader.read<std::uint32_t>();
    if (!reader.ok())
        return false;
    fields.number("layoutTag", tag);
    fields.number("bitmap", bitmap);
    std::size_t read = 0;
    for (; read < count && reader.remaining() >= descriptionSize; ++read) {
        const std::string item = itemName("channel", read);
        fields.number(item + "label", reader.read<std::uint32_t>());
        fields.number(item + "flags", reader.read<std::uint32_t>());
        for (const char* const coordinate : {"x", "y", "z"})
            fields.number(item + coordinate, reader.read<float>());
    }
    fields.missing(count - read);
    fields.behind(reader.take(reader.remaining()));
    return true;
}

/// "peak": the number of edits for which it is valid, then a value and its frame for each channel.
bool readPeakPositions(const MetaChunk& chunk, const MetaSource&, MetaFields& fields)
{
    constexpr std::size_t peakSize = 12;
    ByteReader reader(chunk.body);
    const auto edits = reader.read<std::uint32_t>();
    if (!reader.ok())
        return false;
    fields.number("editCount", edits);
    for (std::size_t i = 0; reader.remaining() >= peakSize; ++i) {
        fields.number(itemName("channel", i) + "value", reader.read<float>());
        fields.frames(itemName("channel", i) + "position", reader.read<std::uint64_t>());
    }
    fields.behind(reader.take(reader.remaining()));
    return true;
}

bool readEditCount(const MetaChunk& chunk, const MetaSource&, MetaFields& fields)
{
    ByteReader reader(chunk.body);
    const auto count = reader.read<std::uint32_t>();
    if (!reader.ok())
        return false;
    fields.number("editCount", count);
    fields.behind(reader.take(reader.remaining()));
    return true;
}

bool readOwn(const MetaChunk& chunk, const MetaSource&, MetaFields& fields)
{
    constexpr std::size_t uuidSize = 16;
    if (chunk.body.size() < uuidSize)
        return false;
    const BytesView body = chunk.body;
    fields.hex("id", body.first(uuidSize));
    fields.preview("data", body.subspan(uuidSize), static_cast<std::uint64_t>(chunk.size) - uuidSize);
    return true;
}

constexpr MetaReader kCAFReaders[] = {
    {fourCC("info"), "info", readTexts},
    {fourCC("strg"), "strg", readStrings},
    {fourCC("mark"), "mark", readCAFMarkers, fourCC("strg")},
    {fourCC("regn"), "regn", readRegions, fourCC("strg")},
    {fourCC("inst"), "inst", readCAFInstrument, fourCC("strg")},
    {fourCC("chan"), "chan", readChannels},
    {fourCC("midi"), "midi", readPreview},
    {fourCC("umid"), "umid", readUMID},
    {fourCC("ovvw"), "ovvw", readPreview},
    {fourCC("peak"), "peak", readPeakPositions},
    {fourCC("edct"), "edct", readEditCount},
    {fourCC("uuid"), "uuid", readOwn},
};

} // namespace

std::span<const MetaReader> cafReaders()
{
    return kCAFReaders;
}
