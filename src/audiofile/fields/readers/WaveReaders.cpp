// Reads the metadata of WAVE, RF64, BW64, RIFX and Wave64.
#include "audiofile/fields/readers/MetaReaders.h"
#include "audiofile/metadata/AcidChunk.h"
#include "audiofile/metadata/AssociatedDataList.h"
#include "audiofile/metadata/BroadcastExtension.h"
#include "audiofile/metadata/CartChunk.h"
#include "audiofile/metadata/CueList.h"
#include "audiofile/metadata/InfoList.h"
#include "audiofile/metadata/InstrumentChunk.h"
#include "audiofile/metadata/PlaylistChunk.h"
#include "audiofile/metadata/SamplerChunk.h"

#include <array>

namespace {

/// Adds the bytes of a "bext" that are reserved in its version: the older it is, the more (EBU Tech 3285).
void addReserved(BytesView body, unsigned version, MetaFields& fields)
{
    const std::size_t begin = version == 0   ? offsetof(BroadcastFields, umid)
                              : version == 1 ? offsetof(BroadcastFields, loudnessValue)
                                             : offsetof(BroadcastFields, reserved);
    const BytesView reserved = body.first(sizeof(BroadcastFields)).subspan(begin);
    if (anySet(reserved))
        fields.preview("reserved", reserved, reserved.size());
}

bool readBroadcast(const MetaChunk& chunk, const MetaSource& source, MetaFields& fields)
{
    const auto bext = BroadcastExtension::read(chunk.body, source.order);
    if (!bext)
        return false;
    fields.text("description", bext->description.text());
    fields.text("originator", bext->originator.text());
    fields.text("originatorReference", bext->originatorReference.text());
    fields.text("originationDate", bext->originationDate.text());
    fields.text("originationTime", bext->originationTime.text());
    fields.frames("timeReference", bext->timeReference());
    fields.number("version", std::uint16_t{bext->version});
    if (bext->hasUMID())
        addUMID("umid", bext->umid, fields);
    if (bext->hasLoudness())
        for (const auto& [name, value, unit] : {std::tuple{"loudnessValue", bext->loudnessValue, "LUFS"},
                                                {"loudnessRange", bext->loudnessRange, "LU"},
                                                {"maxTruePeakLevel", bext->maxTruePeakLevel, "dBTP"},
                                                {"maxMomentaryLoudness", bext->maxMomentaryLoudness, "LUFS"},
                                                {"maxShortTermLoudness", bext->maxShortTermLoudness, "LUFS"}})
            if (value != BroadcastExtension::kNoLoudness)
                fields.number(name, std::int16_t{value} / 100.0, unit);
    addReserved(chunk.body, bext->version, fields);
    const auto history = bext->codingHistoryLines();
    for (std::size_t i = 0; i < history.size(); ++i)
        fields.text("codingHistory[" + std::to_string(i) + "]", history[i]);
    return true;
}

bool readCart(const MetaChunk& chunk, const MetaSource& source, MetaFields& fields)
{
    const auto cart = CartChunk::read(chunk.body, source.order);
    if (!cart)
        return false;
    fields.text("version", cart->version.text());
    fields.text("title", cart->title.text());
    fields.text("artist", cart->artist.text());
    fields.text("cutId", cart->cutId.text());
    fields.text("clientId", cart->clientId.text());
    fields.text("category", cart->category.text());
    fields.text("classification", cart->classification.text());
    fields.text("outCue", cart->outCue.text());
    fields.text("startDate", cart->startDate.text());
    fields.text("startTime", cart->startTime.text());
    fields.text("endDate", cart->endDate.text());
    fields.text("endTime", cart->endTime.text());
    fields.text("producerAppId", cart->producerAppId.text());
    fields.text("producerAppVersion", cart->producerAppVersion.text());
    fields.text("userDef", cart->userDef.text());
    fields.number("levelReference", std::int32_t{cart->levelReference});
    for (std::size_t i = 0; i < cart->postTimers.size(); ++i)
        if (const CartTimer& timer = cart->postTimers[i]; timer.usage != 0 || timer.value != 0) {
            fields.text(itemName("timer", i) + "usage", fourCCText(timer.usage));
            fields.frames(itemName("timer", i) + "position", std::uint64_t{timer.value});
        }
    if (anySet(cart->reserved))
        fields.preview("reserved", cart->reserved, cart->reserved.size());
    fields.text("url", cart->url.text());
    fields.text("tagText", textUpToNUL(cart->tagText));
    return true;
}

std::string acidWords(const AcidChunk& acid)
{
    std::string words = acid.has(AcidChunk::kOneShot) ? "one-shot" : "loop";
    for (const auto& [flag, word] : {std::pair{AcidChunk::kRootNoteSet, ", root note set"},
                                     {AcidChunk::kStretched, ", stretched"},
                                     {AcidChunk::kOnDisk, ", played from the disk"},
                                     {AcidChunk::kHighOctave, ", high octave"}})
        if (acid.has(flag))
            words += word;
    return words;
}

bool readAcid(const MetaChunk& chunk, const MetaSource& source, MetaFields& fields)
{
    const auto acid = AcidChunk::read(chunk.body, source.order);
    if (!acid)
        return false;
    fields.number("flags", std::uint32_t{acid->flags}, acidWords(*acid));
    fields.number("rootNote", std::uint16_t{acid->rootNote});
    fields.number("beats", std::uint32_t{acid->beats});
    fields.number("meterNumerator", std::uint16_t{acid->meterNumerator});
    fields.number("meterDenominator", std::uint16_t{acid->meterDenominator});
    fields.number("tempo", float{acid->tempo}, "BPM");
    fields.number("unknown", std::uint16_t{acid->unknown});
    fields.number("unknown2", float{acid->unknown2});
    fields.behind(acid->behind);
    return true;
}

std::string_view loopWords(std::uint32_t type)
{
    constexpr std::array<std::string_view, 3> words{"forward", "alternating", "backward"};
    return type < words.size() ? words[type] : type < 32 ? "reserved" : "of the maker";
}

bool readSampler(const MetaChunk& chunk, const MetaSource& source, MetaFields& fields)
{
    const auto sampler = SamplerChunk::read(chunk.body, source.order);
    if (!sampler)
        return false;
    const std::uint32_t offset = sampler->smpteOffset;
    fields.number("manufacturer", std::uint32_t{sampler->manufacturer});
    fields.number("product", std::uint32_t{sampler->product});
    fields.number("samplePeriod", std::uint32_t{sampler->samplePeriod}, "ns");
    fields.number("midiUnityNote", std::uint32_t{sampler->midiUnityNote});
    fields.number("midiPitchFraction", std::uint32_t{sampler->midiPitchFraction}, "1/2^32 semitones");
    fields.number("smpteFormat", std::uint32_t{sampler->smpteFormat},
                  sampler->smpteFormat == 0 ? "none" : "frames a second");
    fields.text("smpteOffset",
                clockFields({static_cast<std::int8_t>(offset >> 24), static_cast<int>(offset >> 16 & 0xFF),
                             static_cast<int>(offset >> 8 & 0xFF), static_cast<int>(offset & 0xFF)}));
    for (std::size_t i = 0; i < sampler->loops.size(); ++i) {
        const SamplerLoop& loop = sampler->loops[i];
        const std::string item = itemName("loop", i);
        fields.number(item + "cueId", std::uint32_t{loop.cueId});
        fields.number(item + "type", std::uint32_t{loop.type}, loopWords(loop.type));
        fields.frames(item + "start", std::uint64_t{loop.start});
        fields.frames(item + "end", std::uint64_t{loop.end});
        fields.number(item + "fraction", std::uint32_t{loop.fraction}, "1/2^32 frames");
        fields.number(item + "playCount", std::uint32_t{loop.playCount}, loop.playCount == 0 ? "until released" : "");
    }
    fields.missing(sampler->missingLoops);
    if (!sampler->samplerData.empty())
        fields.preview("samplerData", sampler->samplerData, sampler->samplerData.size());
    fields.behind(sampler->behind);
    return true;
}

bool readInstrument(const MetaChunk& chunk, const MetaSource&, MetaFields& fields)
{
    const auto instrument = InstrumentChunk::read(chunk.body);
    if (!instrument)
        return false;
    fields.number("unshiftedNote", std::uint8_t{instrument->unshiftedNote});
    fields.number("fineTune", std::int8_t{instrument->fineTune}, "cents");
    fields.number("gain", std::int8_t{instrument->gain}, "dB");
    fields.number("lowNote", std::uint8_t{instrument->lowNote});
    fields.number("highNote", std::uint8_t{instrument->highNote});
    fields.number("lowVelocity", std::uint8_t{instrument->lowVelocity});
    fields.number("highVelocity", std::uint8_t{instrument->highVelocity});
    fields.behind(instrument->behind);
    return true;
}

bool readCues(const MetaChunk& chunk, const MetaSource& source, MetaFields& fields)
{
    const auto cues = CueList::read(chunk.body, source.order);
    if (!cues)
        return false;
    for (std::size_t i = 0; i < cues->points.size(); ++i) {
        const CuePoint& point = cues->points[i];
        const std::string item = itemName("", i);
        fields.number(item + "id", std::uint32_t{point.id});
        fields.frames(item + "position", std::uint64_t{point.sampleOffset});
        if (point.dataChunkId != fourCC("data"))
            fields.text(item + "dataChunk", fourCCText(point.dataChunkId));
        if (point.position != point.sampleOffset)
            fields.frames(item + "playlistPosition", std::uint64_t{point.position});
        if (point.chunkStart != 0)
            fields.number(item + "chunkStart", std::uint32_t{point.chunkStart});
        if (point.blockStart != 0)
            fields.number(item + "blockStart", std::uint32_t{point.blockStart});
    }
    fields.missing(cues->missingPoints);
    fields.behind(cues->behind);
    return true;
}

bool readPlaylist(const MetaChunk& chunk, const MetaSource& source, MetaFields& fields)
{
    const auto list = PlaylistChunk::read(chunk.body, source.order);
    if (!list)
        return false;
    for (std::size_t i = 0; i < list->segments.size(); ++i) {
        const PlaylistSegment& segment = list->segments[i];
        const std::string item = itemName("segment", i);
        fields.number(item + "cueId", std::uint32_t{segment.cueId});
        fields.frames(item + "length", std::uint64_t{segment.length});
        fields.number(item + "loops", std::uint32_t{segment.loops});
    }
    fields.missing(list->missingSegments);
    fields.behind(list->behind);
    return true;
}

void addInfo(const InfoList& list, MetaFields& fields)
{
    for (const ListItem& item : list.items())
        fields.text(fourCCText(item.id), textUpToNUL(item.body), InfoList::words(item.id));
}

/// Adds names, remarks and ranges under the index that their point has in "cue ".
void addAssociatedData(const AssociatedDataList& list, const MetaSource& source, MetaFields& fields)
{
    const auto& indices = source.cueIndices();
    const auto itemOf = [&](std::uint32_t cueId) {
        const auto found = indices.find(cueId);
        return found != indices.end() ? itemName("", found->second) : "[id " + std::to_string(cueId) + "].";
    };
    for (const CueText& label : list.labels())
        fields.text(itemOf(label.cueId) + "label", label.text);
    for (const CueText& note : list.notes())
        fields.text(itemOf(note.cueId) + "note", note.text);
    for (const CueRange& range : list.ranges()) {
        const std::string item = itemOf(range.cueId);
        fields.frames(item + "length", std::uint64_t{range.sampleLength});
        fields.text(item + "purpose", fourCCText(range.purpose));
        fields.text(item + "text", range.text);
        for (const auto& [name, code] : {std::pair{"country", range.country},
                                         {"language", range.language},
                                         {"dialect", range.dialect},
                                         {"codePage", range.codePage}})
            if (code != 0)
                fields.number(item + name, std::uint16_t{code});
    }
    for (const ListItem& other : list.items())
        if (other.id != fourCC("labl") && other.id != fourCC("note") && other.id != fourCC("ltxt"))
            fields.preview(fourCCText(other.id), other.body, other.body.size());
}

bool readList(const MetaChunk& chunk, const MetaSource& source, MetaFields& fields)
{
    if (const auto info = InfoList::read(chunk.body, source.order)) {
        fields.enter(chunk, "info");
        addInfo(*info, fields);
        return true;
    }
    if (const auto data = AssociatedDataList::read(chunk.body, source.order)) {
        fields.enterShared(chunk, "cue");
        addAssociatedData(*data, source, fields);
        return true;
    }
    return false;
}

bool readTracks(const MetaChunk& chunk, const MetaSource& source, MetaFields& fields)
{
    constexpr std::size_t entrySize = 40; // ITU-R BS.2088
    ByteReader reader(chunk.body, source.order);
    const auto tracks = reader.read<std::uint16_t>(), count = reader.read<std::uint16_t>();
    if (!reader.ok())
        return false;
    fields.number("tracks", tracks);
    fields.number("uids", count);
    std::size_t read = 0;
    while (read < count && reader.remaining() >= entrySize) {
        const std::string item = itemName("uid", read);
        fields.number(item + "track", reader.read<std::uint16_t>());
        fields.text(item + "uid", textUpToNUL(reader.take(12)));
        fields.text(item + "trackFormat", textUpToNUL(reader.take(14)));
        fields.text(item + "packFormat", textUpToNUL(reader.take(11)));
        reader.skip(1);
        ++read;
    }
    fields.missing(count - read);
    fields.behind(reader.take(reader.remaining()));
    return true;
}

bool readFact(const MetaChunk& chunk, const MetaSource& source, MetaFields& fields)
{
    ByteReader reader(chunk.body, source.order);
    const auto frames = reader.read<std::uint32_t>();
    if (!reader.ok())
        return false;
    fields.frames("frames", std::uint64_t{frames});
    fields.behind(reader.take(reader.remaining()));
    return true;
}

/// Adds the digest in the order in which digests are written, the reverse of how it is stored.
bool readDigest(const MetaChunk& chunk, const MetaSource&, MetaFields& fields)
{
    if (chunk.body.size() != 16)
        return false;
    fields.hex("", Bytes(chunk.body.rbegin(), chunk.body.rend()));
    return true;
}

constexpr MetaReader kWaveReaders[] = {
    {fourCC("bext"), "bext", readBroadcast},
    {fourCC("iXML"), "ixml", readIXML},
    {fourCC("LIST"), "LIST", readList, fourCC("cue ")},
    {fourCC("cue "), "cue", readCues},
    {fourCC("plst"), "plst", readPlaylist},
    {fourCC("smpl"), "smpl", readSampler},
    {fourCC("inst"), "inst", readInstrument},
    {fourCC("acid"), "acid", readAcid},
    {fourCC("strc"), "strc", readPreview},
    {fourCC("cart"), "cart", readCart},
    {fourCC("chna"), "chna", readTracks},
    {fourCC("axml"), "axml", readADM},
    {fourCC("fact"), "fact", readFact},
    {fourCC("PEAK"), "peak", readPeaks},
    {fourCC("LGWV"), "lgwv", readPreview},
    {fourCC("MD5 "), "md5", readDigest},
    {fourCC("UMID"), "umid", readUMID},
    {fourCC("umid"), "umid", readUMID},
    {fourCC("_PMX"), "xmp", readText},
    {fourCC("id3 "), "id3", readID3},
    {fourCC("ID3 "), "id3", readID3},
};

} // namespace

std::span<const MetaReader> waveReaders()
{
    return kWaveReaders;
}
