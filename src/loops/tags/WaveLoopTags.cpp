#include "loops/tags/WaveLoopTags.h"

#include "audiofile/metadata/AcidChunk.h"
#include "audiofile/metadata/SamplerChunk.h"
#include "loops/VireoLoopTerms.h"
#include "loops/tags/LoopTagFields.h"
#include "loops/tags/LoopTagsError.h"
#include "loops/tags/LoopTagsPatch.h"
#include "loops/tags/bytes/LoopTagsLayouts.h"
#include "media/containers/ContainerHeaders.h"

#include <algorithm>
#include <charconv>
#include <cmath>
#include <limits>

namespace {

constexpr FourCC kAcid = fourCC("acid");
constexpr FourCC kSampler = fourCC("smpl");
constexpr std::int64_t kLoop = 1, kNoLoop = 2; // of loopFileType

// The existing chunk, or a new one; none if it is cut short.
template <class Chunk>
std::optional<Chunk> chunkIn(const RawLoopTags& tags, FourCC id, const Chunk& fresh, platform::Error* error)
{
    const auto found = tags.texts.find(id);
    if (found == tags.texts.end())
        return fresh;
    auto chunk = Chunk::read(found->second);
    if (!chunk)
        failWith(error, LoopTagsError::damagedChunk,
                 "its chunk \"" + fourCCText(id) + "\" is cut short; chunks remove takes it off");
    return chunk;
}

std::int64_t kindOf(const LoopTags& tags)
{
    const std::int64_t kind = tags.number(VireoLoopCombinedTagsChunkDataFileTypeKey);
    return kind == 0 && tags.number(VireoLoopCombinedTagsChunkDataBeatCountKey) > 0 ? kLoop : kind;
}

// The source's root note in any octave.
std::int64_t rootOf(const LoopTags& tags)
{
    return tags.sampler.rootNote ? tags.sampler.rootNote->value
                                 : tags.number(VireoLoopCombinedTagsChunkDataMidiRootNoteKey);
}

// The stated tempo if the sound has the source's length, else the tempo that its beats have in the target's sound.
float tempoIn(const LoopTags& source, const LoopTags& target)
{
    const double computed =
        VireoLoopTempo(source.number(VireoLoopCombinedTagsChunkDataBeatCountKey), target.frames, target.sampleRate);
    const double seconds = source.sampleRate > 0 ? static_cast<double>(source.frames) / source.sampleRate : 0;
    const double here = target.sampleRate > 0 ? static_cast<double>(target.frames) / target.sampleRate : 0;
    constexpr double nearly = 0.001;
    const bool isAsLong = std::abs(seconds - here) <= nearly * here;
    return static_cast<float>(isAsLong && source.statedTempo > 0 ? source.statedTempo : computed);
}

bool assignAcid(RawLoopTags& chunks, const LoopTags& source, const LoopTags& target, platform::Error* error)
{
    constexpr std::int64_t most = std::numeric_limits<std::uint16_t>::max();
    const std::int64_t beats = source.number(VireoLoopCombinedTagsChunkDataBeatCountKey),
                       top = source.number(VireoLoopCombinedTagsChunkDataSignatureTopKey),
                       bottom = source.number(VireoLoopCombinedTagsChunkDataSignatureBottomKey), root = rootOf(source),
                       kind = kindOf(source);
    const bool hasSignature = top > 0 && bottom > 0 && top <= most && bottom <= most;
    const bool hasRoot = root > 0 && root <= 127;
    // A root note alone needs only "smpl".
    if (beats <= 0 && kind == 0 && !hasSignature && (!hasRoot || !chunks.texts.contains(kAcid)))
        return true;
    AcidChunk fresh;
    fresh.unknown = 0x8000; // as others write it
    fresh.flags = kind == kLoop ? std::uint32_t{AcidChunk::kStretched} : 0U;
    std::optional<AcidChunk> there = chunkIn(chunks, kAcid, fresh, error);
    if (!there)
        return false;
    AcidChunk& acid = *there;
    if (kind != 0)
        acid.flags = (acid.flags & ~std::uint32_t{AcidChunk::kOneShot}) |
                     (kind == kNoLoop ? std::uint32_t{AcidChunk::kOneShot} : 0U);
    if (hasRoot) {
        acid.flags = acid.flags | AcidChunk::kRootNoteSet;
        acid.rootNote = static_cast<std::uint16_t>(root);
    }
    if (beats > 0) {
        acid.beats = static_cast<std::uint32_t>(beats);
        acid.tempo = tempoIn(source, target);
    }
    if (hasSignature) {
        acid.meterNumerator = static_cast<std::uint16_t>(top);
        acid.meterDenominator = static_cast<std::uint16_t>(bottom);
    }
    chunks.texts[kAcid] = acid.write();
    return true;
}

std::vector<SamplerLoop> newLoops(const LoopTags& source, const LoopTags& target)
{
    std::vector<SamplerLoop> loops;
    const auto add = [&](std::uint64_t first, std::uint64_t last, std::uint32_t type, std::uint32_t playCount) {
        if (last < first || last >= target.frames || last > std::numeric_limits<std::uint32_t>::max())
            return;
        SamplerLoop& loop = loops.emplace_back();
        loop.cueId = static_cast<std::uint32_t>(loops.size() - 1);
        loop.type = type;
        loop.start = static_cast<std::uint32_t>(first);
        loop.end = static_cast<std::uint32_t>(last);
        loop.playCount = playCount;
    };
    for (const SamplerTags::Loop& loop : source.sampler.loops)
        if (loop.kind != SamplerTags::Loop::Kind::other)
            add(loop.firstFrame, loop.lastFrame, static_cast<std::uint32_t>(loop.kind), loop.playCount);
    if (source.sampler.loops.empty() && kindOf(source) == kLoop && target.frames > 0)
        add(0, target.frames - 1, SamplerLoop::kForward, 0);
    return loops;
}

bool assignSampler(RawLoopTags& chunks, const LoopTags& source, const LoopTags& target, platform::Error* error)
{
    const std::int64_t root = rootOf(source);
    const bool isNew = !chunks.texts.contains(kSampler);
    if ((root <= 0 || root > 127) && (!isNew || source.sampler.loops.empty()))
        return true;
    constexpr std::uint32_t middleC = 60; // if nobody chose a note
    constexpr double nanoseconds = 1e9;
    SamplerChunk fresh;
    fresh.midiUnityNote = middleC;
    if (target.sampleRate > 0)
        fresh.samplePeriod = static_cast<std::uint32_t>(std::lround(nanoseconds / target.sampleRate));
    if (isNew)
        fresh.loops = newLoops(source, target);
    std::optional<SamplerChunk> there = chunkIn(chunks, kSampler, fresh, error);
    if (!there)
        return false;
    SamplerChunk& sampler = *there;
    if (root > 0 && root <= 127)
        sampler.midiUnityNote = static_cast<std::uint32_t>(root);
    chunks.texts[kSampler] = sampler.write();
    return true;
}

platform::Value presentValue(const LoopTags& tags, const LoopTagField& field)
{
    const platform::Dictionary& values = field.isFileInfo ? tags.info : tags.combined;
    const auto found = field.key != nullptr ? values.find(field.key) : values.end();
    return found != values.end() && !isAbsentLoopTag(found->second) ? found->second : platform::Value();
}

std::string sixDigits(double number)
{
    char text[32];
    constexpr int digits = 6;
    return {text, std::to_chars(text, std::end(text), number, std::chars_format::general, digits).ptr};
}

} // namespace

bool assignWaveLoopTags(RawLoopTags& chunks, const LoopTags& source, const LoopTags& target, platform::Error* error)
{
    return assignAcid(chunks, source, target, error) && assignSampler(chunks, source, target, error);
}

std::optional<LoopTags> loopTagsWithWaveChunks(VireoLoopChunksManager& file, const LoopTags& before,
                                               const RawLoopTags& chunks, platform::Error* error)
{
    std::vector<SamplerTagChunk> found;
    if (!succeeded(readSamplerTagChunks(*file.audioFile(), found), error))
        return std::nullopt;
    std::erase_if(found, [](const SamplerTagChunk& chunk) { return chunk.id == kAcid || chunk.id == kSampler; });
    for (const auto& [id, body] : chunks.texts)
        found.push_back({id, body});
    LoopTags after;
    after.fileType = before.fileType;
    after.sampleRate = before.sampleRate;
    after.frames = before.frames;
    addSamplerTags(after, SamplerTags::of(found));
    return after;
}

std::vector<std::string> loopTagsLostInWave(const LoopTags& source, const LoopTags& after)
{
    std::vector<std::string> lost;
    for (const LoopTagField& field : loopTagFields()) {
        const platform::Value value = presentValue(source, field);
        const bool isRoot = field.name == std::string_view("midiRootNote"); // in any octave
        const bool isKept = isRoot ? rootOf(source) == rootOf(after) : value == presentValue(after, field);
        if (!value.isNull() && !isKept && !field.isFileInfo)
            lost.emplace_back(field.name);
    }
    if (!source.transients.empty())
        lost.emplace_back("transients");
    for (const LoopTags::Chunk& chunk : source.chunks)
        lost.push_back(chunk.id);
    if (lost.empty())
        return {};
    std::string names;
    for (const std::string& name : lost)
        names += (names.empty() ? "" : ", ") + name;
    return {names + (lost.size() == 1 ? " is" : " are") + " not kept: \"acid\" and \"smpl\" have no room"};
}

RawLoopTags asLoopChunks(LoopTags& tags, std::vector<std::string>& notKept)
{
    constexpr std::int64_t octave = 12, lowest = 48;
    RawLoopTags chunks;
    chunks.fileType = kAIFF;
    const auto root = tags.combined.find(VireoLoopCombinedTagsChunkDataMidiRootNoteKey);
    if (root != tags.combined.end()) {
        const std::int64_t note = tags.number(VireoLoopCombinedTagsChunkDataMidiRootNoteKey);
        root->second = lowest + note % octave;
        if (note != lowest + note % octave)
            notKept.push_back("the root note " + std::to_string(note) + " is kept as the key " + loopKeyName(note) +
                              ", " + std::to_string(lowest + note % octave));
    }
    for (const LoopTagField& field : loopTagFields()) {
        const platform::Value value = presentValue(tags, field);
        if (value.isNull())
            continue;
        const LoopTagAssignment assignment{&field, value};
        assignLoopTags(chunks, {&assignment, 1});
        const platform::Dictionary kept = field.isFileInfo ? loopTextsOf(chunks) : combinedLoopTagsOf(chunks);
        if (const auto found = kept.find(field.key); found == kept.end() || found->second != value)
            notKept.push_back(std::string(field.name) + " is not kept whole");
    }
    tags.combined = combinedLoopTagsOf(chunks);
    tags.info = loopTextsOf(chunks);
    const double followed =
        VireoLoopTempo(tags.number(VireoLoopCombinedTagsChunkDataBeatCountKey), tags.frames, tags.sampleRate);
    constexpr double nearly = 0.005;
    if (tags.statedTempo > 0 && std::abs(followed - tags.statedTempo) > nearly * tags.statedTempo)
        notKept.push_back("the tempo " + sixDigits(tags.statedTempo) + " is not kept: " +
                          (followed > 0 ? "beats and length make " + sixDigits(followed)
                                        : std::string("the number of beats is not known")));
    if (!tags.sampler.loops.empty())
        notKept.emplace_back("loop points are not kept");
    if (!tags.sampler.markers.empty())
        notKept.emplace_back(kLoopMarkersAreLost);
    return chunks;
}
