#include "tool/shared/looptags/LoopTagsCopy.h"

#include "media/containers/ContainerHeaders.h"
#include "tool/shared/looptags/LoopTagFields.h"
#include "tool/shared/looptags/LoopTagsPatch.h"
#include "tool/shared/looptags/TagsCarrier.h"
#include "tool/shared/looptags/WaveLoopTags.h"

#include <algorithm>
#include <limits>

namespace {

bool isCarried(const VireoLoopBaseChunk& chunk)
{
    return dynamic_cast<const VireoLoopFileInfoChunk*>(&chunk) == nullptr &&
           dynamic_cast<const VireoLoopCombinedTaggingChunk*>(&chunk) == nullptr &&
           dynamic_cast<const VireoLoopTransientChunk*>(&chunk) == nullptr;
}

bool canHold(FourCC fileType, const VireoLoopBaseChunk& chunk)
{
    return fileType == kCaff || chunk.aifChunkID() != 0;
}

// A list of the source's chunks that differ from what the target has, of the kinds that need no thought.
std::vector<std::size_t> differingChunks(const LoopSource& source, const std::string& target, TagsPlan& plan)
{
    VireoLoopChunkList there = VireoLoopChunks::Empty();
    openLoopFile(target, platform::AudioFile::Permission::read).readChunks(there);
    std::vector<std::size_t> differing;
    for (std::size_t i = 0; i < there.size(); ++i) {
        const VireoLoopBaseChunk& chunk = *source.chunks[i];
        if (!isCarried(chunk) || chunk.chunkData().isEmpty())
            continue;
        const std::string name = carriedChunkName(chunk);
        if (!canHold(plan.after.fileType, chunk)) {
            plan.notKept.push_back(fmt::format("{} is not kept: it belongs to CAF files", name));
            continue;
        }
        const Bytes bytes = *chunk.chunkData().cafDataRepresentation();
        const auto old = there[i]->chunkData().cafDataRepresentation();
        if (old == bytes)
            continue;
        differing.push_back(i);
        std::erase_if(plan.after.chunks, [&](const LoopTags::Chunk& each) { return each.id == name; });
        plan.after.chunks.push_back({name, static_cast<std::uint32_t>(bytes.size())});
        if (old && old->size() == bytes.size())
            plan.changes.push_back(
                {name, fmt::format("{} other bytes", bytes.size()), fmt::format("{} bytes", bytes.size())});
    }
    return differing;
}

// AIFF keeps 32 bits of a frame, and a transient whose frame were cut would stand somewhere else. Of a type either
// keeps 16 bits, with or without a sign.
std::vector<VireoLoopTransient> transientsFor(FourCC fileType, std::vector<VireoLoopTransient> transients,
                                              std::vector<std::string>& notKept)
{
    const std::size_t all = transients.size();
    if (fileType == kAIFF)
        std::erase_if(transients, [](const VireoLoopTransient& transient) {
            return transient.frame() > std::numeric_limits<std::uint32_t>::max();
        });
    if (transients.size() < all)
        notKept.push_back(
            fmt::format("{} transients are not kept: they lie too far for an AIFF file", all - transients.size()));
    for (VireoLoopTransient& transient : transients)
        transient.setTransientType(fileType == kAIFF
                                       ? std::int32_t{static_cast<std::int16_t>(transient.transientType())}
                                       : std::int32_t{static_cast<std::uint16_t>(transient.transientType())});
    return transients;
}

void carryTransients(const LoopSource& source, const LoopTags& before, TagsPlan& plan)
{
    const auto fields = transientFieldsOf(source.bytes);
    const auto transients = transientsFor(before.fileType, source.tags.transients, plan.notKept);
    if (transients.empty() || !fields)
        return;
    plan.after.transients = transients;
    if (transients != before.transients)
        assignTransients(plan.bytes, transients);
    if (transientFieldsOf(plan.bytes) == fields)
        return;
    assignTransientFields(plan.bytes, *fields);
    if (transients == before.transients)
        plan.changes.push_back({"transients", "other version, detection or division", transients.size()});
}

bool writeCarried(VireoLoopChunksManager& manager, const LoopSource& source, const std::vector<std::size_t>& chunks)
{
    return std::all_of(chunks.begin(), chunks.end(), [&](std::size_t index) {
        return manager.writeChunks(std::span(source.chunks).subspan(index, 1));
    });
}

TagsPlan planCopyToWave(const LoopSource& source, const LoopTags& before, const std::string& target)
{
    VireoLoopChunksManager manager = openLoopFile(target, platform::AudioFile::Permission::read, LoopFiles::waveToo);
    const RawLoopTags chunks = readRawLoopTags(manager);
    TagsPlan plan;
    plan.bytes = chunks;
    assignWaveTags(plan.bytes, source.tags, before);
    plan.after = tagsWithWaveChunks(target, before, plan.bytes);
    plan.changes = differences(before, plan.after);
    if (plan.changes.empty() && plan.bytes != chunks)
        plan.changes.push_back({"tags", "other bytes", {}});
    plan.notKept = lossesInWave(source.tags, plan.after);
    plan.write = [chunks, after = plan.bytes](VireoLoopChunksManager& file) {
        return writeRawLoopTags(file, chunks, after);
    };
    return plan;
}

} // namespace

std::shared_ptr<LoopSource> readLoopSource(const std::string& path)
{
    auto source = std::make_shared<LoopSource>();
    source->tags = readOwnLoopTags(path);
    if (source->tags.fileType != kAIFF && source->tags.fileType != kCaff) {
        source->bytes = asLoopChunks(source->tags, source->notKept);
        return source;
    }
    VireoLoopChunksManager manager = openLoopFile(path, platform::AudioFile::Permission::read);
    manager.readChunks(source->chunks);
    source->bytes = readRawLoopTags(manager);
    return source;
}

TagsPlan planTagsCopy(const std::shared_ptr<const LoopSource>& source, const LoopTags& before,
                      const std::string& target)
{
    if (before.fileType == kWAVE)
        return planCopyToWave(*source, before, target);
    VireoLoopChunksManager manager = openLoopFile(target, platform::AudioFile::Permission::read);
    const RawLoopTags bytes = readRawLoopTags(manager);
    TagsPlan plan;
    plan.after = before;
    plan.bytes = bytes;
    plan.notKept = source->notKept;
    TagsCarrier(source->tags, source->bytes, plan.bytes, plan.notKept).carry();
    plan.after.combined = combinedTagsOf(plan.bytes);
    plan.after.info = infoTextsOf(plan.bytes);
    carryTransients(*source, before, plan);
    const auto chunks = differingChunks(*source, target, plan);
    const auto changes = differences(before, plan.after);
    plan.changes.insert(plan.changes.begin(), changes.begin(), changes.end());
    if (plan.changes.empty() && plan.bytes != bytes)
        plan.changes.push_back({"tags", "other bytes", {}});
    plan.write = [source, bytes, after = plan.bytes, chunks](VireoLoopChunksManager& file) {
        return writeRawLoopTags(file, bytes, after) && writeCarried(file, *source, chunks);
    };
    return plan;
}
