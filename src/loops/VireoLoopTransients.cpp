#include "loops/VireoLoopTransients.h"

#include "audiofile/CAudioFileIO.h"
#include "loops/tagging/CAFPayloads.h"
#include "loops/tagging/Chunks.h"
#include "platform/core/ByteWriter.h"

#include <new>

namespace {

constexpr std::int64_t kMostRecords =
    (UINT32_MAX - sizeof(tagging::TransientsChunk)) / sizeof(tagging::TransientRecord);
constexpr std::int64_t kMostCAFRecords =
    (UINT32_MAX - tagging::kUUIDSize - sizeof(tagging::CAFTransientsPayload)) / sizeof(tagging::CAFTransientRecord);

/// Builds the chunk from its old bytes up to the count, the new count, and a record for each position.
Bytes transientsChunk(BytesView old, const std::int64_t* positions, std::int64_t count)
{
    ByteWriter writer;
    writer.reserve(sizeof(tagging::TransientsChunk) +
                   static_cast<std::size_t>(count) * sizeof(tagging::TransientRecord));
    writer.write(old.first(offsetof(tagging::TransientsChunk, count)));
    writer.write(static_cast<std::int32_t>(count));
    for (std::int64_t i = 0; i < count; ++i) {
        writer.write(std::uint16_t{1}); // type
        writer.writeZeros(2);
        writer.write(static_cast<std::uint32_t>(positions[i])); // the low 32 bits
        writer.writeZeros(sizeof(tagging::TransientRecord::reserved2));
    }
    return writer.take();
}

} // namespace

bool CAudioFileIO::ReplaceVireoLoopTransients(const std::int64_t* positions, std::int64_t count)
try {
    if (count < 0 || count > kMostRecords || (positions == nullptr && count > 0))
        return false;
    const std::optional<Bytes> old = FindChunk(tagging::kTransients);
    if (!old || old->size() < sizeof(tagging::TransientsChunk))
        return false;
    return AddChunk(tagging::kTransients, transientsChunk(*old, positions, count), true) == 1;
} catch (const std::bad_alloc&) {
    return false;
}

std::int32_t WriteCAFTransientChunk(const CFileRef& file, const std::int64_t* positions, std::int64_t count)
{
    if (count > kMostCAFRecords || (positions == nullptr && count > 0))
        return kStatusParameterError;
    const std::optional<Bytes> chunk = CAFTransientUUIDChunkData(positions, count);
    if (!chunk)
        return kStatusOutOfMemory;
    std::int32_t status = kStatusParameterError;
    const std::int32_t opened = CAudioFileIO::PerformAudioFileOperations(file, [&](platform::AudioFile& audio) {
        if (audio.fileType() == kCaff)
            status = CAudioFileIO::AddCAFChunkToUUIDChunk(audio, *chunkIDToCafChunkUUID(tagging::kTransients),
                                                          static_cast<unsigned int>(chunk->size()), chunk->data());
    });
    return opened != kStatusOK ? opened : status;
}
