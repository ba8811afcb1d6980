#include "tool/decode/DecodeTags.h"

#include "audiofile/CAudioFileIO.h"
#include "loops/tagging/CAFPayloads.h"
#include "loops/tagging/ChunkIDs.h"
#include "loops/tags/LoopTagFields.h"
#include "loops/tags/WaveLoopTags.h"
#include "media/containers/ContainerHeaders.h"
#include "media/containers/ContainerTraits.h"
#include "tool/shared/input/FileLocation.h"
#include "tool/shared/input/InputFile.h"
#include "tool/shared/looptags/LoopTagFiles.h"

#include <fmt/format.h>

#include <algorithm>
#include <cmath>

namespace {

// Padding, and data that can be computed again from the sound.
constexpr FourCC kOfNoUse[] = {fourCC("junk"), fourCC("PAD "), fourCC("FLLR"), fourCC("PEAK"),
                               fourCC("peak"), fourCC("LGWV"), fourCC("ovvw"), fourCC("ovwf")};
// Chunks with loop tags, in files that can hold some. CAF's "uuid" and "info" are examined.
constexpr FourCC kOfTags[] = {tagging::kBasicTagging,  tagging::kCategories,
                              tagging::kTransients,    tagging::kChannelStrip0,
                              tagging::kChannelStrip1, tagging::kChannelStrip2,
                              tagging::kPatch,         tagging::kGenerativeInstrument,
                              tagging::kEventSequence, tagging::kAdditionalLoopData,
                              tagging::kStepSequencer, tagging::kMIDIFile,
                              tagging::kCAFMIDIChunk,  tagging::kCAFUUIDChunk,
                              fourCC("info"),          fourCC("NAME"),
                              fourCC("AUTH"),          fourCC("(c) "),
                              fourCC("COMT")};

bool isOfTheSound(platform::ContainerKind container, FourCC id)
{
    return platform::roleOfChunk(container, id) != platform::ChunkRole::userData ||
           std::ranges::find(kOfNoUse, id) != std::end(kOfNoUse);
}

std::string chunkName(FourCC id)
{
    const std::string text = fourCCText(id);
    return text.substr(0, text.find_last_not_of(' ') + 1);
}

bool hasOtherTexts(const RawLoopTags& tags)
{
    bool hasOthers = false;
    if (const auto info = tags.texts.find(fourCC("info")); tags.fileType == kCaff && info != tags.texts.end())
        tagging::ForEachCAFInfoString(info->second, [&](std::string_view key, std::string_view) {
            hasOthers = hasOthers || std::ranges::none_of(loopTagFields(), [&](const LoopTagField& field) {
                            return field.isFileInfo && field.name == key;
                        });
        });
    return hasOthers;
}

bool hasOtherUUIDs(const std::string& path)
{
    auto manager = openLoopFile(fileLocation(path), platform::AudioFile::Permission::read);
    std::uint32_t count = 0;
    if (!manager || manager->audioFileTypeID() != kCaff ||
        manager->audioFile()->countUserData(tagging::kCAFUUIDChunk, count) != kStatusOK)
        return false;
    for (std::uint32_t index = 0; index < count; ++index) {
        tagging::UUIDBytes uuid{};
        std::uint32_t size = sizeof uuid;
        if (manager->audioFile()->userData(tagging::kCAFUUIDChunk, index, size, uuid) == kStatusOK &&
            cafChunkUUIDToChunkID(&uuid) == 0 && !UUIDIsEqual(uuid, tagging::kSilenceUUID))
            return true;
    }
    return false;
}

// Each id once, in file order.
std::vector<std::string> otherChunks(const std::string& path, bool holdsTags)
{
    std::vector<std::string> others;
    CAudioFileIO file;
    if (file.Open(referenceTo(path), 0) != kStatusOK)
        return others;
    ContainerExtent extent;
    const auto visit = [&](const ChunkEntry& chunk) {
        const bool isTold = isOfTheSound(extent.kind, chunk.id) ||
                            (holdsTags && std::ranges::find(kOfTags, chunk.id) != std::end(kOfTags)) ||
                            std::ranges::find(others, chunkName(chunk.id)) != others.end();
        if (!isTold)
            others.push_back(chunkName(chunk.id));
        return others.size() < 1000;
    };
    file.ForEachChunk(visit, &extent);
    return others;
}

std::string inWords(const std::vector<std::string>& chunks)
{
    constexpr std::size_t most = 12;
    std::string text = fmt::format(
        "{}", fmt::join(chunks.begin(), chunks.begin() + std::min(std::ssize(chunks), std::ptrdiff_t{most}), ", "));
    if (chunks.size() > most)
        text += fmt::format(" and {} other chunks", chunks.size() - most);
    return fmt::format("{} {} not carried over", text, chunks.size() == 1 ? "is" : "are");
}

// Texts and markers are carried over separately, from any source.
void leaveTexts(LoopSource& source)
{
    source.tags.info.clear();
    source.bytes.texts.clear();
    source.tags.sampler.markers.clear();
    std::erase(source.notKept, kLoopMarkersAreLost);
    if (!source.tags.isLoop()) { // a genre alone makes no loop
        source.tags.combined.erase(VireoLoopCombinedTagsChunkDataGenreKey);
        source.bytes.categories.reset();
    }
}

bool isWave(const std::string& container)
{
    return container == "WAVE" || container == "RF64";
}

// Why an output cannot have tags; empty if it can.
std::string obstacleIn(const std::string& container, bool isFile, bool isWhole)
{
    if (container != "AIFF" && container != "CAF" && !isWave(container))
        return (container == "raw" ? "raw sound" : container) + " holds none";
    if (!isFile)
        return "they are put into files only";
    return isWhole ? "" : "they are true of the whole file only";
}

} // namespace

DecodeTags::DecodeTags(const std::string& path)
{
    bool holdsTags = true;
    try {
        platform::Error error;
        source_ = readLoopSource(fileLocation(path), &error);
        if (source_ == nullptr)
            failForTags(path, error);
    } catch (const OtherKind&) {
        holdsTags = false;
    } catch (const Failure& failure) { // no reason to give up the sound
        problem_ = failure.what();
    }
    if (source_ && source_->tags.fileType != source_->bytes.fileType) { // made from sampler chunks
        leaveTexts(*source_);
        others_ = otherChunks(path, false);
        return;
    }
    others_ = otherChunks(path, holdsTags);
    if (source_ && hasOtherUUIDs(path))
        others_.emplace_back("uuid");
    if (source_ && hasOtherTexts(source_->bytes))
        others_.emplace_back("the rest of info");
    if (source_ && source_->isEmpty())
        source_.reset();
}

void DecodeTags::forget(std::span<const FourCC> ids)
{
    for (const FourCC id : ids) {
        std::erase(others_, chunkName(id));
        if (id == fourCC("info"))
            std::erase(others_, "the rest of info");
    }
}

void DecodeTags::forgetTexts()
{
    const bool mayHoldTexts = source_ && source_->tags.fileType == source_->bytes.fileType;
    if (mayHoldTexts && !source_->tags.isLoop())
        source_.reset();
}

bool DecodeTags::carriesTexts(const std::string& container, bool isWhole) const
{
    return problem_.empty() && source_ != nullptr && !source_->tags.info.empty() && isWhole &&
           (container == "AIFF" || container == "CAF");
}

bool DecodeTags::carriesGenre(const std::string& container, bool isWhole) const
{
    return problem_.empty() && source_ != nullptr && source_->tags.isLoop() &&
           source_->tags.combined.contains(VireoLoopCombinedTagsChunkDataGenreKey) && isWhole &&
           (container == "AIFF" || container == "CAF");
}

CarriedTags DecodeTags::carryTo(const std::string& output, const std::string& container, const DecodedSound& sound,
                                double sourceRate, bool isWhole)
{
    CarriedTags carried;
    leaveWhatMakesNoLoop(container);
    std::string obstacle;
    if (!problem_.empty())
        obstacle = "they " + problem_;
    else if (source_ != nullptr)
        obstacle = obstacleIn(container, !output.empty(), isWhole);
    if (obstacle.empty() && source_ != nullptr)
        for (const char* id : {"acid", "smpl", "INST"})
            std::erase(others_, id);
    if (!obstacle.empty())
        carried.notKept.push_back("its tags are not carried over: " + obstacle);
    if (!others_.empty())
        carried.notKept.push_back(inWords(others_));
    if (!obstacle.empty() || source_ == nullptr)
        return carried;
    if (sound.sampleRate != sourceRate && sourceRate > 0)
        scaleTransients(sound.sampleRate / sourceRate);
    try {
        platform::Error error;
        const auto plan = planLoopTagsCopy(source_, ownLoopTagsOf(output), fileLocation(output), &error);
        if (!plan)
            failForTags(output, error);
        if (!plan->changes.empty())
            writeTags(output, *plan);
        for (const LoopTagChange& change : plan->changes)
            carried.keys.push_back(change.key);
        carried.notKept.insert(carried.notKept.end(), plan->notKept.begin(), plan->notKept.end());
    } catch (const Failure& failure) { // no reason to give up the output
        carried.notKept.push_back(std::string("its tags are not carried over: ") + failure.what());
    }
    return carried;
}

// AIFF and CAF files hold tags of loops only: the root note of a sampler would turn any sound into a loop.
void DecodeTags::leaveWhatMakesNoLoop(const std::string& container)
{
    const bool isOfSamplers = source_ && source_->tags.fileType != source_->bytes.fileType;
    const bool isOfUse = !isOfSamplers || source_->tags.isLoop() ||
                         (isWave(container) && (!source_->tags.isEmpty() || !source_->tags.sampler.loops.empty()));
    if (!isOfUse)
        source_.reset();
}

void DecodeTags::scaleTransients(double factor)
{
    const auto scaled = [factor](std::uint64_t frame) {
        return static_cast<std::uint64_t>(std::round(static_cast<double>(frame) * factor));
    };
    for (SamplerTags::Loop& loop : source_->tags.sampler.loops) {
        loop.firstFrame = scaled(loop.firstFrame);
        loop.lastFrame = std::max<std::uint64_t>(scaled(loop.lastFrame + 1), 1) - 1;
    }
    for (VireoLoopTransient& transient : source_->tags.transients)
        transient.setFrame(
            static_cast<std::uint64_t>(std::min(std::round(static_cast<double>(transient.frame()) * factor), 9e18)));
}
