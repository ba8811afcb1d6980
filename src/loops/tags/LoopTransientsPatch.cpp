// The transients' side of LoopTagsPatch.
#include "loops/tagging/Chunks.h"
#include "loops/tags/LoopTagsPatch.h"
#include "media/containers/ContainerHeaders.h"

#include <algorithm>
#include <cstring>
#include <ctime>

using tagging::CAFTransientRecord;
using tagging::CAFTransientsPayload;
using tagging::TransientRecord;
using tagging::TransientsChunk;

namespace {

// Both layouts have a head that ends with the count, and records that begin with a type.
struct Layout {
    std::size_t headSize, recordSize;
    std::size_t versionAt, detectionAt, divisionAt, frameAt;
    bool isAIFF;

    std::int64_t count(BytesView chunk) const
    {
        return isAIFF ? loadBE<std::int32_t>(chunk.data() + offsetof(TransientsChunk, count))
                      : loadBE<std::int64_t>(chunk.data() + offsetof(CAFTransientsPayload, count));
    }
    void setCount(Bytes& chunk, std::size_t count) const
    {
        if (isAIFF)
            storeBE(chunk.data() + offsetof(TransientsChunk, count), static_cast<std::int32_t>(count));
        else
            storeBE(chunk.data() + offsetof(CAFTransientsPayload, count), static_cast<std::int64_t>(count));
    }
    std::uint64_t frame(const std::byte* record) const
    {
        return isAIFF ? loadBE<std::uint32_t>(record + frameAt) : loadBE<std::uint64_t>(record + frameAt);
    }
    void set(std::byte* record, const VireoLoopTransient& transient) const
    {
        storeBE(record, static_cast<std::uint16_t>(transient.transientType()));
        if (isAIFF)
            storeBE(record + frameAt, static_cast<std::uint32_t>(transient.frame()));
        else
            storeBE(record + frameAt, transient.frame());
    }
};

const Layout& layoutOf(FourCC fileType)
{
    static constexpr Layout aiff{sizeof(TransientsChunk),
                                 sizeof(TransientRecord),
                                 offsetof(TransientsChunk, version),
                                 offsetof(TransientsChunk, detectionPercentage),
                                 offsetof(TransientsChunk, forceDivision),
                                 offsetof(TransientRecord, frame),
                                 true};
    static constexpr Layout caf{sizeof(CAFTransientsPayload),
                                sizeof(CAFTransientRecord),
                                offsetof(CAFTransientsPayload, version),
                                offsetof(CAFTransientsPayload, detectionPercentage),
                                offsetof(CAFTransientsPayload, forceDivision),
                                offsetof(CAFTransientRecord, frame),
                                false};
    return fileType == kAIFF ? aiff : caf;
}

bool canBeRead(const RawLoopTags& tags)
{
    return tags.transients && tags.transients->size() >= layoutOf(tags.fileType).headSize;
}

// The time stamp applies to the whole list.
void setTime(Bytes& chunk, const Layout& layout)
{
    if (layout.isAIFF)
        storeBE(chunk.data() + offsetof(TransientsChunk, writeTime), static_cast<std::uint32_t>(std::time(nullptr)));
}

} // namespace

void assignLoopTransients(RawLoopTags& tags, const std::vector<VireoLoopTransient>& transients)
{
    const Layout& layout = layoutOf(tags.fileType);
    Bytes old = canBeRead(tags) ? *tags.transients : Bytes(layout.headSize);
    if (!canBeRead(tags))
        storeBE(old.data() + layout.versionAt, LoopTransientFields().version);
    const auto room = static_cast<std::int64_t>((old.size() - layout.headSize) / layout.recordSize);
    const std::int64_t claimed = std::max<std::int64_t>(layout.count(old), 0);
    const auto records = static_cast<std::size_t>(std::min(claimed, room));
    const std::byte* const firstRecord = old.data() + layout.headSize;
    std::map<std::uint64_t, const std::byte*> byFrame;
    for (std::size_t i = 0; i < records; ++i)
        byFrame.emplace(layout.frame(firstRecord + i * layout.recordSize), firstRecord + i * layout.recordSize);

    Bytes bytes(old.begin(), old.begin() + static_cast<std::ptrdiff_t>(layout.headSize));
    bytes.resize(layout.headSize + transients.size() * layout.recordSize);
    std::byte* record = bytes.data() + layout.headSize;
    for (const VireoLoopTransient& transient : transients) {
        if (const auto there = byFrame.find(transient.frame()); there != byFrame.end())
            std::memcpy(record, there->second, layout.recordSize);
        layout.set(record, transient);
        record += layout.recordSize;
    }
    layout.setCount(bytes, transients.size());
    setTime(bytes, layout);
    if (claimed <= room) // otherwise the last record is cut
        bytes.insert(bytes.end(), firstRecord + records * layout.recordSize,
                     static_cast<const std::byte*>(old.data()) + old.size());
    if (transients.empty())
        tags.transients.reset();
    else
        tags.transients = std::move(bytes);
}

std::optional<LoopTransientFields> loopTransientFieldsOf(const RawLoopTags& tags)
{
    if (!canBeRead(tags))
        return std::nullopt;
    const Layout& layout = layoutOf(tags.fileType);
    const auto at = [&](std::size_t offset) { return loadBE<std::uint16_t>(tags.transients->data() + offset); };
    return LoopTransientFields{at(layout.versionAt), at(layout.detectionAt), at(layout.divisionAt)};
}

void assignLoopTransientFields(RawLoopTags& tags, const LoopTransientFields& fields)
{
    const Layout& layout = layoutOf(tags.fileType);
    const auto set = [&](std::size_t offset, std::uint16_t value) { storeBE(tags.transients->data() + offset, value); };
    set(layout.versionAt, fields.version);
    set(layout.detectionAt, fields.detectionPercentage);
    set(layout.divisionAt, fields.forceDivision);
    setTime(*tags.transients, layout);
}
