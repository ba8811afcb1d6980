// CAudioFileIO: the end of a container, looked at before another chunk goes there.
#include "audiofile/CAudioFileIO.h"

namespace {

constexpr std::int64_t kCAFOpenEnd = -1;
constexpr FourCC kSoundData = fourCC("SSND");

} // namespace

std::int32_t CAudioFileIO::PrepareToAppend()
{
    if (!IsOpenForWriting())
        return kStatusWritePermission;
    if (const std::int32_t status = PrepareToEdit(); status != kStatusOK)
        return status;
    ContainerExtent extent;
    ChunkEntry last;
    const auto keep = [&](const ChunkEntry& chunk) {
        last = chunk;
        return true;
    };
    if (const std::int32_t status = ForEachChunk(keep, &extent); status != kStatusOK)
        return status;
    if (last.offset == 0 || last.size < 0)
        return kStatusParameterError;
    const bool isCAF = extent.id == kCaff;
    const auto headerSize = static_cast<std::int64_t>(isCAF ? sizeof(CAFChunkHeader) : sizeof(ChkHeader));
    if (isCAF && last.id == kData)
        if (const std::int32_t status = SettleOpenEnd(last); status != kStatusOK)
            return status;
    const std::int64_t body = last.offset + headerSize;
    if (last.size > extent.fileLength - body) // AddChunk puts that right, except in CAF
        return isCAF ? std::int32_t{kStatusParameterError} : std::int32_t{kStatusOK};
    const bool isPadded = !isCAF && (last.size & 1) != 0;
    const std::int64_t end = body + last.size + (isPadded ? 1 : 0);
    const std::int64_t stray = extent.fileLength - end;
    // Behind a size that was never filled in, the samples stand.
    const bool isOpenData =
        (last.id == kData && last.size <= (isCAF ? 4 : 0)) || (last.id == kSoundData && last.size <= 8);
    if (stray >= headerSize || (stray > 0 && isOpenData))
        return kStatusParameterError;
    std::int32_t status = kStatusOK;
    if (stray < 0) {
        const char pad = 0;
        status = Write(&pad, end - 1, sizeof pad);
    } else if (stray > 0) {
        status = SetEOF(end);
    }
    if (status == kStatusOK)
        mInfo.fileLength = end;
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
