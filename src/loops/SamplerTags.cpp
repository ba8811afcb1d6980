#include "loops/SamplerTags.h"

#include "audiofile/metadata/AIFFInstrumentChunk.h"
#include "audiofile/metadata/AcidChunk.h"
#include "audiofile/metadata/AssociatedDataList.h"
#include "audiofile/metadata/CueList.h"
#include "audiofile/metadata/InfoList.h"
#include "audiofile/metadata/InstrumentChunk.h"
#include "audiofile/metadata/MarkerList.h"
#include "audiofile/metadata/SamplerChunk.h"
#include "media/userdata/AudioFileService.h"
#include "platform/FileText.h"
#include "platform/String.h"
#include "platform/core/Status.h"

#include <algorithm>
#include <charconv>
#include <cmath>
#include <map>

namespace {

using Kind = SamplerTags::Text::Kind;

constexpr FourCC kLIST = fourCC("LIST");
constexpr FourCC kWaveIDs[] = {fourCC("acid"), fourCC("smpl"), fourCC("inst"), fourCC("cue "), kLIST};
constexpr FourCC kAIFFIDs[] = {fourCC("MARK"), fourCC("INST"), fourCC("NAME"),
                               fourCC("AUTH"), fourCC("(c) "), fourCC("ANNO")};

struct TextID {
    FourCC id;
    Kind kind;
};
constexpr TextID kInfoTexts[] = {{fourCC("INAM"), Kind::title},
                                 {fourCC("IART"), Kind::artist},
                                 {fourCC("ICOP"), Kind::copyright},
                                 {fourCC("ICMT"), Kind::comments},
                                 {fourCC("IGNR"), Kind::genre}};
constexpr TextID kAIFFTexts[] = {{fourCC("NAME"), Kind::title},
                                 {fourCC("AUTH"), Kind::artist},
                                 {fourCC("(c) "), Kind::copyright},
                                 {fourCC("ANNO"), Kind::comments}};

std::span<const FourCC> idsIn(FourCC fileType)
{
    if (fileType == fourCC("WAVE") || fileType == fourCC("RIFX") || fileType == fourCC("W64f"))
        return kWaveIDs;
    return fileType == fourCC("AIFF") || fileType == fourCC("AIFC") ? std::span(kAIFFIDs) : std::span<const FourCC>();
}

std::string inUTF8(std::string_view bytes, bool isAIFF)
{
    using platform::FallbackEncoding;
    return platform::decodeFileText(bytes, isAIFF ? FallbackEncoding::macintosh : FallbackEncoding::latin1).utf8;
}

std::string_view withoutBlanks(std::string_view text)
{
    constexpr const char* kWhite = " \t\r\n\v\f";
    const std::size_t start = text.find_first_not_of(kWhite);
    return start == text.npos ? std::string_view() : text.substr(start, text.find_last_not_of(kWhite) + 1 - start);
}

template <class T, class From>
void setFirst(std::optional<SamplerTagValue<T>>& value, From from, FourCC source)
{
    if (!value)
        value = SamplerTagValue<T>{static_cast<T>(from), source};
}

/// Collects tags from one chunk after another.
class Collector {
public:
    explicit Collector(std::endian order) : order_(order) {}

    void add(FourCC id, BytesView body)
    {
        if (id != kLIST && std::ranges::find(seen_, id) != seen_.end())
            return;
        seen_.push_back(id);
        if (id == fourCC("acid"))
            addAcid(AcidChunk::read(body, order_));
        else if (id == fourCC("smpl"))
            addSampler(SamplerChunk::read(body, order_));
        else if (id == fourCC("inst"))
            addInstrument(InstrumentChunk::read(body));
        else if (id == fourCC("cue "))
            cues_ = CueList::read(body, order_);
        else if (id == kLIST)
            addList(body);
        else if (id == fourCC("MARK"))
            addMarkers(MarkerList::read(body));
        else if (id == fourCC("INST"))
            instrument_ = AIFFInstrumentChunk::read(body);
        else
            addText(kAIFFTexts, id, textUpToNUL(body), id, true);
    }

    SamplerTags take()
    {
        addCues();
        addAIFFInstrument();
        return std::move(tags_);
    }

private:
    void addAcid(const std::optional<AcidChunk>& acid)
    {
        constexpr FourCC source = fourCC("acid");
        if (!acid)
            return;
        const bool isOnce = acid->has(AcidChunk::kOneShot);
        if (isOnce || acid->beats > 0)
            setFirst(tags_.isLoop, !isOnce, source);
        rootIsOpen_ = !acid->has(AcidChunk::kRootNoteSet);
        if (!rootIsOpen_)
            addRoot(acid->rootNote, source);
        if (isOnce) // the rest of a one-shot's chunk is never filled in on purpose
            return;
        if (acid->beats > 0)
            setFirst(tags_.beats, std::uint32_t{acid->beats}, source);
        if (const float tempo = acid->tempo; std::isfinite(tempo) && tempo > 0)
            setFirst(tags_.tempo, tempo, source);
        if (acid->meterNumerator > 0 && acid->meterDenominator > 0) {
            setFirst(tags_.signatureTop, std::uint16_t{acid->meterNumerator}, source);
            setFirst(tags_.signatureBottom, std::uint16_t{acid->meterDenominator}, source);
        }
    }

    void addSampler(const std::optional<SamplerChunk>& sampler)
    {
        constexpr FourCC source = fourCC("smpl");
        if (!sampler)
            return;
        addRoot(sampler->midiUnityNote, source);
        for (const SamplerLoop& loop : sampler->loops) {
            constexpr SamplerTags::Loop::Kind kinds[] = {SamplerTags::Loop::Kind::forward,
                                                         SamplerTags::Loop::Kind::alternating,
                                                         SamplerTags::Loop::Kind::backward};
            const std::uint32_t type = loop.type;
            if (loop.start <= loop.end)
                tags_.loops.push_back({loop.start, loop.end,
                                       type < std::size(kinds) ? kinds[type] : SamplerTags::Loop::Kind::other,
                                       loop.playCount, source});
        }
    }

    void addInstrument(const std::optional<InstrumentChunk>& instrument)
    {
        if (instrument)
            addRoot(instrument->unshiftedNote, fourCC("inst"));
    }

    // Samplers write middle C if nobody chose a note, so that value is ignored beside an "acid" chunk without a root
    // note.
    void addRoot(std::uint32_t note, FourCC source)
    {
        constexpr std::uint32_t middleC = 60;
        const bool isChosen = !rootIsOpen_ || note != middleC;
        if (note > 0 && note <= 127 && isChosen)
            setFirst(tags_.rootNote, note, source);
    }

    void addList(BytesView body)
    {
        if (const auto info = InfoList::read(body, order_)) {
            for (const auto& [id, kind] : kInfoTexts)
                if (const auto text = info->find(id))
                    addText(kInfoTexts, id, *text, InfoList::kForm, false);
            if (const auto text = info->find(fourCC("IBPM")))
                addTempo(withoutBlanks(*text));
        } else if (auto names = AssociatedDataList::read(body, order_); names && !names_) {
            names_ = std::move(names);
        }
    }

    void addTempo(std::string_view text)
    {
        double tempo = 0;
        const auto result = std::from_chars(text.data(), text.data() + text.size(), tempo);
        if (result.ec == std::errc() && result.ptr == text.data() + text.size() && std::isfinite(tempo) && tempo > 0)
            setFirst(tags_.tempo, tempo, InfoList::kForm);
    }

    void addText(std::span<const TextID> ids, FourCC id, std::string_view bytes, FourCC source, bool isAIFF)
    {
        const auto known = std::ranges::find(ids, id, &TextID::id);
        if (known == ids.end() || bytes.empty())
            return;
        const std::string decoded = inUTF8(bytes, isAIFF);
        const std::string_view text = withoutBlanks(decoded);
        if (!text.empty() && std::ranges::find(tags_.texts, known->kind, &SamplerTags::Text::kind) == tags_.texts.end())
            tags_.texts.push_back({known->kind, std::string(text), source});
    }

    // Adds the points that "adtl" names. Maps find them, since a file may have millions.
    void addCues()
    {
        if (!cues_)
            return;
        std::map<std::uint32_t, std::string> names;
        std::map<std::uint32_t, CueRange> ranges;
        if (names_) {
            for (CueText& label : names_->labels())
                names.emplace(label.cueId, std::move(label.text));
            for (CueRange& range : names_->ranges())
                ranges.emplace(range.cueId, std::move(range));
            for (const CueText& note : names_->notes())
                names.emplace(note.cueId, note.text);
        }
        for (const CuePoint& point : cues_->points) {
            SamplerTags::Marker marker{point.sampleOffset, 0, {}, fourCC("cue ")};
            if (const auto range = ranges.find(point.id); range != ranges.end()) {
                marker.frames = range->second.sampleLength;
                marker.name = inUTF8(textUpToNUL(asBytes(range->second.text)), false);
            }
            if (const auto name = names.find(point.id); name != names.end() && !name->second.empty())
                marker.name = inUTF8(name->second, false);
            tags_.markers.push_back(std::move(marker));
        }
    }

    void addMarkers(std::optional<MarkerList> markers)
    {
        if (!markers)
            return;
        for (const AIFFMarker& marker : markers->markers)
            tags_.markers.push_back({marker.position, 0, inUTF8(marker.name, true), fourCC("MARK")});
        markers_ = std::move(markers);
    }

    void addAIFFInstrument()
    {
        constexpr FourCC source = fourCC("INST");
        if (!instrument_)
            return;
        addRoot(static_cast<std::uint32_t>(std::max<int>(instrument_->baseNote, 0)), source);
        for (const AIFFLoop& loop : {instrument_->sustainLoop, instrument_->releaseLoop}) {
            const auto* const begin = markers_ ? markers_->find(loop.beginMarker) : nullptr;
            const auto* const end = markers_ ? markers_->find(loop.endMarker) : nullptr;
            if (loop.mode == AIFFLoop::kNone || begin == nullptr || end == nullptr || begin->position >= end->position)
                continue;
            const auto kind = loop.mode == AIFFLoop::kForward           ? SamplerTags::Loop::Kind::forward
                              : loop.mode == AIFFLoop::kForwardBackward ? SamplerTags::Loop::Kind::alternating
                                                                        : SamplerTags::Loop::Kind::other;
            tags_.loops.push_back({begin->position, end->position - 1, kind, 0, source});
        }
    }

    static BytesView asBytes(const std::string& text) { return std::as_bytes(std::span(text)); }

    std::endian order_;
    std::vector<FourCC> seen_; // ids of chunks already added; only a handful
    bool rootIsOpen_ = false;  // "acid" says that there is no root note
    std::optional<CueList> cues_;
    std::optional<AssociatedDataList> names_;
    std::optional<MarkerList> markers_;
    std::optional<AIFFInstrumentChunk> instrument_;
    SamplerTags tags_;
};

} // namespace

std::int32_t readSamplerTagChunks(platform::AudioFile& file, std::vector<SamplerTagChunk>& chunks)
{
    for (const FourCC id : idsIn(file.fileType())) {
        std::uint32_t count = 0;
        std::int32_t status = file.countUserData(id, count);
        for (std::uint32_t index = 0; index < count && status == kStatusOK; ++index) {
            std::uint32_t size = 0;
            status = file.userDataSize(id, index, size);
            SamplerTagChunk chunk{id, Bytes(status == kStatusOK ? size : 0)};
            if (status == kStatusOK)
                status = file.userData(id, index, size, chunk.body.data());
            chunk.body.resize(size);
            chunks.push_back(std::move(chunk));
        }
        if (status != kStatusOK)
            return status;
    }
    return kStatusOK;
}

std::int32_t SamplerTags::read(platform::AudioFile& file, SamplerTags& tags)
{
    std::vector<SamplerTagChunk> chunks;
    const std::int32_t status = readSamplerTagChunks(file, chunks);
    tags = of(chunks, file.fileType() == fourCC("RIFX") ? std::endian::big : std::endian::little);
    return status;
}

SamplerTags SamplerTags::of(std::span<const SamplerTagChunk> chunks, std::endian order)
{
    Collector collector(order);
    for (const std::span<const FourCC> ids : {std::span<const FourCC>(kWaveIDs), std::span<const FourCC>(kAIFFIDs)})
        for (const FourCC id : ids)
            for (const SamplerTagChunk& chunk : chunks)
                if (chunk.id == id)
                    collector.add(id, chunk.body);
    return collector.take();
}

bool SamplerTags::describeLoop(std::uint64_t frames) const
{
    if (isLoop)
        return isLoop->value;
    const std::uint64_t slack = frames / 100; // editors may leave this much at either end
    return frames > 0 && std::ranges::any_of(loops, [&](const Loop& loop) {
               return loop.firstFrame <= slack && loop.lastFrame < frames && loop.lastFrame + 1 >= frames - slack;
           });
}
