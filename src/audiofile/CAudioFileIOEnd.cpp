// CAudioFileIO: the end of a container, looked at before another chunk goes there.
#include "audiofile/ContainerTail.h"

#include <limits>

namespace {

constexpr std::int64_t kCAFOpenEnd = -1;
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
    const std::int64_t size = tail.last.size;
    if (tail.last.offset != 0 && __builtin_add_overflow(tail.last.body + (isCAF ? 0 : size & 1), size, &tail.end))
        tail.end = std::numeric_limits<std::int64_t>::max();
    tail.stray = tail.extent.fileLength - tail.end;
    tail.fault = faultOf(tail);
    return kStatusOK;
}

std::int32_t CAudioFileIO::PrepareToAppend()
{
    if (!IsOpenForWriting())
        return kStatusWritePermission;
    if (const std::int32_t status = PrepareToEdit(); status != kStatusOK)
        return status;
    ContainerTail tail;
    if (const std::int32_t status = ExamineContainerTail(*this, tail); status != kStatusOK)
        return status;
    if (tail.fault != ContainerTail::Fault::none)
        return kStatusParameterError;
    std::int32_t status = kStatusOK;
    if (tail.extent.id == kCaff && tail.last.id == kData)
        status = SettleOpenEnd(tail.last);
    if (status != kStatusOK)
        return status;
    const bool lacksPad = tail.stray == -1 && (tail.last.size & 1) != 0;
    if (tail.stray < 0 && !lacksPad) // a last chunk cut short: AddChunk gives it the size that it has
        return kStatusOK;
    if (lacksPad) {
        const char pad = 0;
        status = Write(&pad, tail.end - 1, sizeof pad);
    } else if (tail.stray > 0) {
        status = SetEOF(tail.end);
    }
    if (status == kStatusOK)
        mInfo.fileLength = tail.end;
    return status;
}

/// Gives a chunk "data" that goes to the end of the file the size that it has there.
std::int32_t CAudioFileIO::SettleOpenEnd(const ChunkEntry& data)
{
    const std::int64_t position = data.offset + std::int64_t{offsetof(CAFChunkHeader, size)};
    std::int64_t stored = 0;
    if (const std::int32_t status = Read(&stored, position, sizeof stored, nullptr); status != kStatusOK)
        return status;
    if (inByteOrder(stored, std::endian::big) != kCAFOpenEnd)
        return kStatusOK;
    stored = inByteOrder(data.size, std::endian::big);
    return Write(&stored, position, sizeof stored);
}
