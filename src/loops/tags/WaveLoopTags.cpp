#include "tool/shared/looptags/WaveLoopTags.h"

#include "audiofile/metadata/AcidChunk.h"
#include "audiofile/metadata/SamplerChunk.h"
#include "loops/VireoLoopTerms.h"
#include "media/containers/ContainerHeaders.h"
#include "tool/shared/looptags/LoopTagFields.h"
#include "tool/shared/looptags/LoopTagsPatch.h"

#include <fmt/format.h>

#include <algorithm>
#include <cmath>
#include <limits>

namespace {

constexpr FourCC kAcid = fourCC("acid");
constexpr FourCC kSampler = fourCC("smpl");
constexpr std::int64_t kLoop = 1, kNoLoop = 2; // of loopFileType

// The chunk that is there, or a new one.
template <class Chunk>
Chunk chunkIn(const RawLoopTags& tags, FourCC id, const Chunk& fresh)
{
    const auto found = tags.texts.find(id);
    if (found == tags.texts.end())
        return fresh;
    auto chunk = Chunk::read(found->second);
    if (!chunk)
        throw Failure(fmt::format("its chunk \"{}\" is cut short; chunks remove takes it off", fourCCText(id)));
    return *chunk;
}

std::int64_t kindOf(const LoopTags& tags)
{
    const std::int64_t kind = tags.number(VireoLoopCombinedTagsChunkDataFileTypeKey);
    return kind == 0 && tags.number(VireoLoopCombinedTagsChunkDataBeatCountKey) > 0 ? kLoop : kind;
}

// That of the source, in whatever octave.
std::int64_t rootOf(const LoopTags& tags)
{
    return tags.sampler.rootNote ? tags.sampler.rootNote->value
                                 : tags.number(VireoLoopCombinedTagsChunkDataMidiRootNoteKey);
}

// As stated where the sound is as long; else what the beats make in the sound that is there.
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

void assignAcid(RawLoopTags& chunks, const LoopTags& source, const LoopTags& target)
{
    constexpr std::int64_t most = std::numeric_limits<std::uint16_t>::max();
    const std::int64_t beats = source.number(VireoLoopCombinedTagsChunkDataBeatCountKey),
                       top = source.number(VireoLoopCombinedTagsChunkDataSignatureTopKey),
                       bottom = source.number(VireoLoopCombinedTagsChunkDataSignatureBottomKey), root = rootOf(source),
                       kind = kindOf(source);
    const bool hasSignature = top > 0 && bottom > 0 && top <= most && bottom <= most;
    const bool hasRoot = root > 0 && root <= 127;
    // For a root note alone "smpl" is enough.
    if (beats <= 0 && kind == 0 && !hasSignature && (!hasRoot || !chunks.texts.contains(kAcid)))
        return;
    AcidChunk fresh;
    fresh.unknown = 0x8000; // as others write it
    fresh.flags = kind == kLoop ? std::uint32_t{AcidChunk::kStretched} : 0U;
    AcidChunk acid = chunkIn(chunks, kAcid, fresh);
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

void assignSampler(RawLoopTags& chunks, const LoopTags& source, const LoopTags& target)
{
    const std::int64_t root = rootOf(source);
    const bool isNew = !chunks.texts.contains(kSampler);
    if ((root <= 0 || root > 127) && (!isNew || source.sampler.loops.empty()))
        return;
    constexpr std::uint32_t middleC = 60; // where nobody chose a note
    constexpr double nanoseconds = 1e9;
    SamplerChunk fresh;
    fresh.midiUnityNote = middleC;
    if (target.sampleRate > 0)
        fresh.samplePeriod = static_cast<std::uint32_t>(std::lround(nanoseconds / target.sampleRate));
    if (isNew)
        fresh.loops = newLoops(source, target);
    SamplerChunk sampler = chunkIn(chunks, kSampler, fresh);
    if (root > 0 && root <= 127)
        sampler.midiUnityNote = static_cast<std::uint32_t>(root);
    chunks.texts[kSampler] = sampler.write();
}

platform::Value valueOf(const LoopTags& tags, const TagField& field)
{
    const platform::Dictionary& values = field.isFileInfo ? tags.info : tags.combined;
    const auto found = field.key != nullptr ? values.find(field.key) : values.end();
    return found != values.end() && !isAbsent(found->second) ? found->second : platform::Value();
}

} // namespace

void assignWaveTags(RawLoopTags& chunks, const LoopTags& source, const LoopTags& target)
{
    assignAcid(chunks, source, target);
    assignSampler(chunks, source, target);
}

LoopTags tagsWithWaveChunks(const std::string& path, const LoopTags& before, const RawLoopTags& chunks)
{
    VireoLoopChunksManager manager = openLoopFile(path, platform::AudioFile::Permission::read, LoopFiles::waveToo);
    std::vector<SamplerTagChunk> found;
    requireOK(readSamplerTagChunks(*manager.audioFile(), found));
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

std::vector<std::string> lossesInWave(const LoopTags& source, const LoopTags& after)
{
    std::vector<std::string> lost;
    for (const TagField& field : tagFields()) {
        const platform::Value value = valueOf(source, field);
        const bool isRoot = field.name == std::string_view("midiRootNote"); // in whatever octave
        const bool isKept = isRoot ? rootOf(source) == rootOf(after) : value == valueOf(after, field);
        if (!value.isNull() && !isKept && !field.isFileInfo)
            lost.emplace_back(field.name);
    }
    if (!source.transients.empty())
        lost.emplace_back("transients");
    for (const LoopTags::Chunk& chunk : source.chunks)
        lost.push_back(chunk.id);
    if (lost.empty())
        return {};
    return {fmt::format("{} {} not kept: \"acid\" and \"smpl\" have no room", fmt::join(lost, ", "),
                        lost.size() == 1 ? "is" : "are")};
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
            notKept.push_back(
                fmt::format("the root note {} is kept as the key {}, {}", note, keyName(note), lowest + note % octave));
    }
    for (const TagField& field : tagFields()) {
        const platform::Value value = valueOf(tags, field);
        if (value.isNull())
            continue;
        const TagAssignment assignment{&field, value};
        assignTags(chunks, {&assignment, 1});
        const platform::Dictionary kept = field.isFileInfo ? infoTextsOf(chunks) : combinedTagsOf(chunks);
        if (const auto found = kept.find(field.key); found == kept.end() || found->second != value)
            notKept.push_back(fmt::format("{} is not kept whole", field.name));
    }
    tags.combined = combinedTagsOf(chunks);
    tags.info = infoTextsOf(chunks);
    const double followed =
        VireoLoopTempo(tags.number(VireoLoopCombinedTagsChunkDataBeatCountKey), tags.frames, tags.sampleRate);
    constexpr double nearly = 0.005;
    if (tags.statedTempo > 0 && std::abs(followed - tags.statedTempo) > nearly * tags.statedTempo)
        notKept.push_back(fmt::format("the tempo {:.6g} is not kept: {}", tags.statedTempo,
                                      followed > 0 ? fmt::format("beats and length make {:.6g}", followed)
                                                   : "the number of beats is not known"));
    if (!tags.sampler.loops.empty())
        notKept.emplace_back("loop points are not kept");
    if (!tags.sampler.markers.empty())
        notKept.emplace_back(kMarkersAreLost);
    return chunks;
}
