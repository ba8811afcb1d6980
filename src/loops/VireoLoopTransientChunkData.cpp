#include "loops/VireoLoopTransientChunkData.h"

#include "loops/tagging/Chunks.h"
#include "platform/core/ByteReader.h"
#include "platform/core/ByteWriter.h"

#include <algorithm>
#include <cstring>
#include <ctime>
#include <new>

using tagging::CAFTransientRecord;
using tagging::CAFTransientsPayload;
using tagging::TransientRecord;
using tagging::TransientsChunk;

namespace {

/// The number of records of `recordSize` bytes after a head of `headSize` bytes: at most `claimed`, and at most what
/// fits.
std::size_t recordsThere(std::int64_t claimed, std::size_t dataSize, std::size_t headSize, std::size_t recordSize)
{
    const auto room = static_cast<std::int64_t>((dataSize - headSize) / recordSize);
    return static_cast<std::size_t>(std::clamp<std::int64_t>(claimed, 0, room));
}

std::int16_t field16(std::optional<std::int32_t> value)
{
    return static_cast<std::int16_t>(value.value_or(0));
}

} // namespace

void VireoLoopTransientChunkData::readFromAIFData(BytesView data)
{
    if (data.size() < sizeof(TransientsChunk))
        return;
    // The count is bounded first, because the byte swap trusts it.
    const std::size_t count = recordsThere(loadBE<std::int32_t>(data.data() + offsetof(TransientsChunk, count)),
                                           data.size(), sizeof(TransientsChunk), sizeof(TransientRecord));
    Bytes copy(data.begin(),
               data.begin() + static_cast<std::ptrdiff_t>(sizeof(TransientsChunk) + count * sizeof(TransientRecord)));
    storeBE(copy.data() + offsetof(TransientsChunk, count), static_cast<std::int32_t>(count));
    auto* chunk = reinterpret_cast<TransientsChunk*>(copy.data());
    SwapBasicTransientsChunkToHost(chunk);

    _version = chunk->version;
    _transientDetectionPercentage = chunk->detectionPercentage;
    _forceDivisionValue = chunk->forceDivision;
    _transients.clear();
    _transients.reserve(count);
    for (const auto& record : std::span(reinterpret_cast<const TransientRecord*>(chunk + 1), count))
        _transients.emplace_back(record.type, record.frame);
}

std::optional<Bytes> VireoLoopTransientChunkData::aifDataRepresentation() const
try {
    Bytes bytes(sizeof(TransientsChunk) + _transients.size() * sizeof(TransientRecord));
    auto* chunk = reinterpret_cast<TransientsChunk*>(bytes.data());
    chunk->version = field16(_version);
    chunk->detectionPercentage = field16(_transientDetectionPercentage);
    chunk->forceDivision = field16(_forceDivisionValue);
    chunk->writeTime = static_cast<std::uint32_t>(std::time(nullptr));
    chunk->count = static_cast<std::int32_t>(_transients.size());
    auto* record = reinterpret_cast<TransientRecord*>(chunk + 1);
    for (const VireoLoopTransient& transient : _transients) {
        record->type = static_cast<std::int16_t>(transient.transientType());
        record->frame = static_cast<std::uint32_t>(transient.frame()); // AIFF holds only the low 32 bits
        ++record;
    }
    tagging::SwapBasicTransientsChunkToBig(chunk);
    return bytes;
} catch (const std::bad_alloc&) {
    return std::nullopt;
}

void VireoLoopTransientChunkData::readFromCafData(BytesView data)
{
    if (data.size() < sizeof(CAFTransientsPayload))
        return;
    ByteReader reader(data);
    reader.skip(4);
    _version = reader.read<std::uint16_t>();
    reader.skip(2);
    _transientDetectionPercentage = reader.read<std::uint16_t>();
    _forceDivisionValue = reader.read<std::int16_t>();
    const std::size_t count = recordsThere(reader.read<std::int64_t>(), data.size(), sizeof(CAFTransientsPayload),
                                           sizeof(CAFTransientRecord));
    _transients.clear();
    _transients.reserve(count);
    for (std::size_t i = 0; i < count; ++i) {
        const auto type = reader.read<std::uint16_t>();
        reader.skip(2);
        _transients.emplace_back(type, reader.read<std::uint64_t>());
    }
}

std::optional<Bytes> VireoLoopTransientChunkData::cafDataRepresentation() const
try {
    ByteWriter writer;
    writer.reserve(sizeof(CAFTransientsPayload) + _transients.size() * sizeof(CAFTransientRecord));
    writer.writeZeros(4);
    writer.write(field16(_version));
    writer.writeZeros(2);
    writer.write(field16(_transientDetectionPercentage));
    writer.write(field16(_forceDivisionValue));
    writer.write(static_cast<std::int64_t>(_transients.size()));
    for (const VireoLoopTransient& transient : _transients) {
        writer.write(static_cast<std::uint16_t>(transient.transientType()));
        writer.writeZeros(2);
        writer.write(transient.frame());
    }
    return writer.take();
} catch (const std::bad_alloc&) {
    return std::nullopt;
}
