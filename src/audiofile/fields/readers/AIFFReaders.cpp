// Reads the metadata of AIFF and AIFC.
#include "audiofile/fields/readers/MetaReaders.h"
#include "audiofile/metadata/AIFFInstrumentChunk.h"
#include "audiofile/metadata/CommentList.h"
#include "audiofile/metadata/MarkerList.h"
#include "platform/core/DateText.h"

#include <array>

namespace {

constexpr double kSecondsFrom1970To2001 = 978'307'200; // where the library's dates begin

bool readComments(const MetaChunk& chunk, const MetaSource&, MetaFields& fields)
{
    const auto list = CommentList::read(chunk.body);
    if (!list)
        return false;
    for (std::size_t i = 0; i < list->comments.size(); ++i) {
        const AIFFComment& comment = list->comments[i];
        const std::string item = itemName("", i);
        const platform::Date date{static_cast<double>(comment.timeStamp) - AIFFComment::kSecondsTo1970 -
                                  kSecondsFrom1970To2001};
        fields.number(item + "timeStamp", comment.timeStamp, comment.timeStamp == 0 ? "" : platform::dateText(date));
        if (comment.marker != 0)
            fields.number(item + "marker", comment.marker);
        fields.text(item + "text", comment.text);
    }
    fields.missing(list->missingComments);
    fields.behind(list->behind);
    return true;
}

bool readMarkers(const MetaChunk& chunk, const MetaSource&, MetaFields& fields)
{
    const auto list = MarkerList::read(chunk.body);
    if (!list)
        return false;
    for (std::size_t i = 0; i < list->markers.size(); ++i) {
        const AIFFMarker& marker = list->markers[i];
        const std::string item = itemName("", i);
        fields.number(item + "id", marker.id);
        fields.frames(item + "position", std::uint64_t{marker.position});
        fields.text(item + "name", marker.name);
    }
    fields.missing(list->missingMarkers);
    fields.behind(list->behind);
    return true;
}

/// Adds a loop with the positions of its markers.
void addLoop(const std::string& name, const AIFFLoop& loop, const MetaSource& source, MetaFields& fields)
{
    constexpr std::array<std::string_view, 3> words{"none", "forward", "forward and backward"};
    const std::int16_t mode = loop.mode;
    fields.number(name + ".mode", mode,
                  mode >= 0 && mode < std::ssize(words) ? words[static_cast<std::size_t>(mode)] : "");
    if (mode == AIFFLoop::kNone)
        return;
    const auto& positions = source.markerPositions();
    for (const auto& [end, id] : {std::pair{"begin", loop.beginMarker}, {"end", loop.endMarker}}) {
        fields.number(name + "." + end + "Marker", std::int16_t{id});
        if (const auto found = positions.find(id); found != positions.end())
            fields.frames(name + "." + end, std::uint64_t{found->second});
    }
}

bool readAIFFInstrument(const MetaChunk& chunk, const MetaSource& source, MetaFields& fields)
{
    const auto instrument = AIFFInstrumentChunk::read(chunk.body);
    if (!instrument)
        return false;
    fields.number("baseNote", std::int8_t{instrument->baseNote});
    fields.number("detune", std::int8_t{instrument->detune}, "cents");
    fields.number("lowNote", std::int8_t{instrument->lowNote});
    fields.number("highNote", std::int8_t{instrument->highNote});
    fields.number("lowVelocity", std::int8_t{instrument->lowVelocity});
    fields.number("highVelocity", std::int8_t{instrument->highVelocity});
    fields.number("gain", std::int16_t{instrument->gain}, "dB");
    addLoop("sustainLoop", instrument->sustainLoop, source, fields);
    addLoop("releaseLoop", instrument->releaseLoop, source, fields);
    fields.behind(instrument->behind);
    return true;
}

bool readApplication(const MetaChunk& chunk, const MetaSource&, MetaFields& fields)
{
    if (chunk.body.size() < sizeof(FourCC))
        return false;
    fields.text("signature", fourCCText(loadBE<FourCC>(chunk.body.data())));
    fields.preview("data", BytesView(chunk.body).subspan(sizeof(FourCC)), chunk.body.size() - sizeof(FourCC));
    return true;
}

constexpr MetaReader kAIFFReaders[] = {
    {fourCC("NAME"), "NAME", readText},
    {fourCC("AUTH"), "AUTH", readText},
    {fourCC("(c) "), "(c)", readText},
    {fourCC("ANNO"), "ANNO", readText},
    {fourCC("COMT"), "comt", readComments},
    {fourCC("MARK"), "mark", readMarkers},
    {fourCC("INST"), "inst", readAIFFInstrument, fourCC("MARK")},
    {fourCC("MIDI"), "midi", readPreview},
    {fourCC("AESD"), "aesd", readHex},
    {fourCC("APPL"), "appl", readApplication},
    {fourCC("ID3 "), "id3", readID3},
    {fourCC("PEAK"), "peak", readPeaks},
    {fourCC("LGWV"), "lgwv", readPreview},
};

} // namespace

std::span<const MetaReader> aiffReaders()
{
    return kAIFFReaders;
}
