#include "loops/tags/LoopTagsCopy.h"

#include "loops/tags/LoopTagFields.h"
#include "loops/tags/LoopTagsPatch.h"
#include "loops/tags/WaveLoopTags.h"
#include "loops/tags/bytes/LoopTagsCarrier.h"
#include "media/containers/ContainerHeaders.h"

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

// Indices of the source's chunks that differ from the target's, among the kinds that are copied as they are.
std::vector<std::size_t> differingChunks(const LoopSource& source, VireoLoopChunksManager& target, LoopTagsPlan& plan)
{
    VireoLoopChunkList there = VireoLoopChunks::Empty();
    target.readChunks(there);
    std::vector<std::size_t> differing;
    for (std::size_t i = 0; i < there.size(); ++i) {
        const VireoLoopBaseChunk& chunk = *source.chunks[i];
        if (!isCarried(chunk) || chunk.chunkData().isEmpty())
            continue;
        const std::string name = carriedLoopChunkName(chunk);
        if (!canHold(plan.after.fileType, chunk)) {
            plan.notKept.push_back(name + " is not kept: it belongs to CAF files");
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
                {name, std::to_string(bytes.size()) + " other bytes", std::to_string(bytes.size()) + " bytes"});
    }
    return differing;
}

// AIFF stores 32 bits of a frame, and a transient whose frame was cut would move. Of a type both containers store 16
// bits, with or without a sign.
std::vector<VireoLoopTransient> transientsFor(FourCC fileType, std::vector<VireoLoopTransient> transients,
                                              std::vector<std::string>& notKept)
{
    const std::size_t all = transients.size();
    if (fileType == kAIFF)
        std::erase_if(transients, [](const VireoLoopTransient& transient) {
            return transient.frame() > std::numeric_limits<std::uint32_t>::max();
        });
    if (transients.size() < all)
        notKept.push_back(std::to_string(all - transients.size()) +
                          " transients are not kept: they lie too far for an AIFF file");
    for (VireoLoopTransient& transient : transients)
        transient.setTransientType(fileType == kAIFF
                                       ? std::int32_t{static_cast<std::int16_t>(transient.transientType())}
                                       : std::int32_t{static_cast<std::uint16_t>(transient.transientType())});
    return transients;
}

void carryTransients(const LoopSource& source, const LoopTags& before, LoopTagsPlan& plan)
{
    const auto fields = loopTransientFieldsOf(source.bytes);
    const auto transients = transientsFor(before.fileType, source.tags.transients, plan.notKept);
    if (transients.empty() || !fields)
        return;
    plan.after.transients = transients;
    if (transients != before.transients)
        assignLoopTransients(plan.bytes, transients);
    if (loopTransientFieldsOf(plan.bytes) == fields)
        return;
    assignLoopTransientFields(plan.bytes, *fields);
    if (transients == before.transients)
        plan.changes.push_back({"transients", "other version, detection or division", transients.size()});
}

bool writeCarried(VireoLoopChunksManager& manager, const LoopSource& source, const std::vector<std::size_t>& chunks)
{
    return std::all_of(chunks.begin(), chunks.end(), [&](std::size_t index) {
        return manager.writeChunks(std::span(source.chunks).subspan(index, 1));
    });
}

std::optional<LoopTagsPlan> planCopyToWave(const LoopSource& source, const LoopTags& before,
                                           const platform::URLRef& target, platform::Error* error)
{
    auto manager = openLoopFile(target, platform::AudioFile::Permission::read, LoopFiles::waveToo, error);
    auto chunks = manager ? readRawLoopTags(*manager, error) : std::nullopt;
    if (!chunks)
        return std::nullopt;
    std::optional<LoopTagsPlan> planned(std::in_place);
    LoopTagsPlan& plan = *planned;
    plan.bytes = *chunks;
    if (!assignWaveLoopTags(plan.bytes, source.tags, before, error))
        return std::nullopt;
    if (auto after = loopTagsWithWaveChunks(*manager, before, plan.bytes, error))
        plan.after = std::move(*after);
    else
        return std::nullopt;
    plan.changes = loopTagDifferences(before, plan.after);
    if (plan.changes.empty() && plan.bytes != *chunks)
        plan.changes.push_back({"tags", "other bytes", {}});
    plan.notKept = loopTagsLostInWave(source.tags, plan.after);
    plan.write = [was = std::move(*chunks), after = plan.bytes](VireoLoopChunksManager& file) {
        return writeRawLoopTags(file, was, after);
    };
    return planned;
}

} // namespace

std::shared_ptr<LoopSource> readLoopSource(const platform::URLRef& file, platform::Error* error)
{
    auto source = std::make_shared<LoopSource>();
    auto tags = readOwnLoopTags(file, error);
    if (!tags)
        return nullptr;
    source->tags = std::move(*tags);
    if (source->tags.fileType != kAIFF && source->tags.fileType != kCaff) {
        source->bytes = asLoopChunks(source->tags, source->notKept);
        return source;
    }
    auto manager = openLoopFile(file, platform::AudioFile::Permission::read, LoopFiles::withLoopChunks, error);
    if (!manager)
        return nullptr;
    manager->readChunks(source->chunks);
    auto bytes = readRawLoopTags(*manager, error);
    if (!bytes)
        return nullptr;
    source->bytes = std::move(*bytes);
    return source;
}

std::optional<LoopTagsPlan> planLoopTagsCopy(const std::shared_ptr<const LoopSource>& source, const LoopTags& before,
                                             const platform::URLRef& target, platform::Error* error)
{
    if (before.fileType == kWAVE)
        return planCopyToWave(*source, before, target, error);
    auto manager = openLoopFile(target, platform::AudioFile::Permission::read, LoopFiles::withLoopChunks, error);
    auto bytes = manager ? readRawLoopTags(*manager, error) : std::nullopt;
    if (!bytes)
        return std::nullopt;
    std::optional<LoopTagsPlan> planned(std::in_place);
    LoopTagsPlan& plan = *planned;
    plan.after = before;
    plan.bytes = *bytes;
    plan.notKept = source->notKept;
    LoopTagsCarrier(source->tags, source->bytes, plan.bytes, plan.notKept).carry();
    plan.after.combined = combinedLoopTagsOf(plan.bytes);
    plan.after.info = loopTextsOf(plan.bytes);
    carryTransients(*source, before, plan);
    const auto chunks = differingChunks(*source, *manager, plan);
    const auto changes = loopTagDifferences(before, plan.after);
    plan.changes.insert(plan.changes.begin(), changes.begin(), changes.end());
    if (plan.changes.empty() && plan.bytes != *bytes)
        plan.changes.push_back({"tags", "other bytes", {}});
    plan.write = [source, was = std::move(*bytes), after = plan.bytes, chunks](VireoLoopChunksManager& file) {
        return writeRawLoopTags(file, was, after) && writeCarried(file, *source, chunks);
    };
    return planned;
}
