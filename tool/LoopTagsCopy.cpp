#include "LoopTagsCopy.h"

#include "LoopTagFields.h"
#include "audiofile/ContainerHeaders.h"

#include <algorithm>
#include <limits>

using platform::Dictionary;

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

// The texts of the source in the place of those of the target; what the source does not say stays.
Dictionary merged(const Dictionary& from, Dictionary into)
{
    for (const auto& [key, text] : from)
        into[key] = text;
    return into;
}

void noteLosses(const LoopTags& from, const LoopTags& after, std::vector<std::string>& notKept)
{
    LoopTags kept = from;
    kept.combined = after.combined;
    for (const TagChange& change : differences(from, kept))
        if (!change.from.is_null() && change.key != "loopFileType" && change.key != "tempo")
            notKept.push_back(fmt::format("{} {} is not kept", change.key, change.from.dump()));
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

// AIFF keeps 32 bits of a frame, and a transient whose frame were cut would stand somewhere else.
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
    return transients;
}

bool writeTransients(VireoLoopChunksManager& manager, const LoopSource& source,
                     const std::vector<VireoLoopTransient>& transients)
{
    for (const auto& chunk : source.chunks)
        if (auto* const from = dynamic_cast<VireoLoopTransientChunk*>(chunk.get())) {
            VireoLoopChunkList list;
            list.push_back(std::make_unique<VireoLoopTransientChunk>());
            auto& data = static_cast<VireoLoopTransientChunk&>(*list.front()).transients();
            data = from->transients();
            data.setTransients(transients);
            return manager.writeChunks(list);
        }
    return false;
}

bool writeCarried(VireoLoopChunksManager& manager, const LoopSource& source, const std::vector<std::size_t>& chunks)
{
    return std::all_of(chunks.begin(), chunks.end(), [&](std::size_t index) {
        return manager.writeChunks(std::span(source.chunks).subspan(index, 1));
    });
}

} // namespace

std::shared_ptr<LoopSource> readLoopSource(const std::string& path)
{
    auto source = std::make_shared<LoopSource>();
    source->tags = readLoopTags(path);
    openLoopFile(path, platform::AudioFile::Permission::read).readChunks(source->chunks);
    return source;
}

TagsPlan planTagsCopy(const std::shared_ptr<const LoopSource>& source, const LoopTags& before,
                      const std::string& target)
{
    TagsPlan plan;
    LoopTags& after = plan.after = before;
    const LoopTags& from = source->tags;
    if (!from.combined.empty()) {
        after.combined = keptCombinedTags(from.combined, before.fileType);
        noteLosses(from, after, plan.notKept);
    }
    if (!from.transients.empty())
        after.transients = transientsFor(before.fileType, from.transients, plan.notKept);
    after.info = merged(from.info, before.info);
    const auto chunks = differingChunks(*source, target, plan);
    const auto changes = differences(before, after);
    plan.changes.insert(plan.changes.begin(), changes.begin(), changes.end());
    plan.write = [source, before, after, chunks](VireoLoopChunksManager& manager) {
        return (before.combined == after.combined || writeCombinedTags(manager, after.combined)) &&
               (before.transients == after.transients || writeTransients(manager, *source, after.transients)) &&
               writeFileInfo(manager, before.info, after.info) && writeCarried(manager, *source, chunks);
    };
    return plan;
}
