#include "audiofile/ContainerTail.h"

#include "media/containers/ContainerHeaders.h"

#include <algorithm>
#include <limits>

namespace {

constexpr FourCC kSoundData = fourCC("SSND");

bool looksLikeAnId(FourCC id)
{
    return id != 0 && fourCCText(id).size() == sizeof id;
}

/// Whether samples follow a size that was never filled in.
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
    if (isCutShort) // AddChunk repairs that, except in CAF
        return isCAF ? Fault::cutShort : Fault::none;
    if (tail.stray >= headerSize || (tail.stray > 0 && isOpenData(last, isCAF)))
        return Fault::stray;
    return Fault::none;
}

/// Whether the file ends as an in-place edit leaves it that is killed while it makes room after the chunks: with the
/// header of a filler chunk that no size counts yet, and zeros; in CAF, where the header counts at once, with a filler
/// chunk that is cut short.
bool isUnfinishedRoom(CAudioFileIO& file, const ContainerTail& tail)
{
    constexpr std::int64_t most = 16 << 20; // larger than the room that an edit makes
    if (tail.fault == ContainerTail::Fault::cutShort)
        return tail.last.id == kFree && tail.last.size >= 0;
    if (tail.extent.id == kCaff || tail.fault != ContainerTail::Fault::stray || isOpenData(tail.last, false))
        return false;
    ChkHeader header;
    constexpr std::int64_t headerSize = sizeof header;
    if (tail.stray > most || file.Read(&header, tail.end, headerSize, nullptr) != kStatusOK)
        return false;
    const std::endian order = tail.extent.id == kFORM ? std::endian::big : std::endian::little;
    if (inByteOrder<FourCC>(header.id, std::endian::big) != kFree ||
        (tail.stray != headerSize && tail.stray != headerSize + inByteOrder<std::uint32_t>(header.size, order)))
        return false;
    Bytes bytes(static_cast<std::size_t>(tail.stray - headerSize));
    return (bytes.empty() || file.Read(bytes.data(), tail.end + headerSize, std::ssize(bytes), nullptr) == kStatusOK) &&
           std::ranges::all_of(bytes, [](std::byte byte) { return byte == std::byte{0}; });
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
    if (!isUnfinishedRoom(file, tail))
        return kStatusOK;
    if (tail.fault == ContainerTail::Fault::cutShort) {
        tail.end = tail.last.offset;
        tail.stray = tail.extent.fileLength - tail.end;
    }
    tail.fault = ContainerTail::Fault::none;
    return kStatusOK;
}
