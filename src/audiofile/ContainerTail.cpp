#include "audiofile/ContainerTail.h"

#include <algorithm>
#include <limits>

namespace {

constexpr FourCC kSoundData = fourCC("SSND");

bool looksLikeAnId(FourCC id)
{
    return id != 0 && fourCCText(id).size() == sizeof id;
}

/// Behind a size that was never filled in, the samples stand.
bool isOpenData(const ChunkEntry& chunk, bool isCAF)
{
    constexpr std::int64_t editCountSize = 4, soundDataHeaderSize = 8;
    return (chunk.id == kData && chunk.size <= (isCAF ? editCountSize : 0)) ||
           (chunk.id == kSoundData && chunk.size <= soundDataHeaderSize);
}

ContainerTail::Fault faultOf(const ContainerTail& tail)
{
    using Fault = ContainerTail::Fault;
    const ChunkEntry& last = tail.last;
    if (last.offset == 0)
        return Fault::noChunk;
    const bool isCAF = tail.extent.id == kCaff;
    if (last.size < 0)
        return Fault::cutShort;
    const std::int64_t headerSize = last.body - last.offset;
    const bool isCutShort = last.size > tail.extent.fileLength - last.body;
    if ((isCutShort || tail.stray > 0) && !isCAF && !looksLikeAnId(last.id))
        return Fault::noId;
    if (isCutShort) // AddChunk puts that right, except in CAF
        return isCAF ? Fault::cutShort : Fault::none;
    if (tail.stray >= headerSize || (tail.stray > 0 && isOpenData(last, isCAF)))
        return Fault::stray;
    return Fault::none;
}

} // namespace

std::int32_t ExamineContainerTail(CAudioFileIO& file, ContainerTail& tail)
{
    tail = {};
    const auto keep = [&](const ChunkEntry& chunk) {
        tail.last = chunk;
        return true;
    };
    if (const std::int32_t status = file.ForEachChunk(keep, &tail.extent); status != kStatusOK)
        return status;
    const bool isCAF = tail.extent.id == kCaff;
    const std::int64_t size = std::max<std::int64_t>(tail.last.size, 0);
    if (tail.last.offset != 0 && __builtin_add_overflow(tail.last.body + (isCAF ? 0 : size & 1), size, &tail.end))
        tail.end = std::numeric_limits<std::int64_t>::max();
    tail.stray = tail.extent.fileLength - tail.end;
    tail.fault = faultOf(tail);
    return kStatusOK;
}
