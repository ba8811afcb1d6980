#include "audiofile/ChunkWalk.h"

#include "files/CFileIO.h"

namespace {

auto readerOf(CFileIO& file)
{
    return [&file](void* to, std::int64_t position, std::size_t count) {
        return file.Read(to, position, static_cast<long>(count), nullptr);
    };
}

} // namespace

FourCC ChunkedContainerKind(std::span<const std::byte, 16> start)
{
    const auto code = [&](std::size_t offset) { return loadBE<FourCC>(start.data() + offset); };
    switch (const FourCC id = code(0)) {
    case kRIFF:
    case kRF64:
    case kBW64:
        return code(8) == kWAVE ? kWAVE : 0;
    case kFORM: // the last character is not examined: "AIFF" and "AIFC"
        return code(8) >> 8 == kAIFF >> 8 ? kAIFF : 0;
    default: // nor is that of "CAT "
        return id >> 8 == kCAT >> 8 && code(8) == kREX2 && code(12) == fourCC("HEAD") ? kREX2 : 0;
    }
}

std::int32_t ReadContainerHeader(CFileIO& file, ContainerChkExtended& header)
{
    return ReadContainerHeaderFrom(readerOf(file), header);
}

std::int64_t NextChunk(CFileIO& file, const ContainerChkExtended& header, std::int64_t position,
                       const ChkHeader& current, ChkHeader& next, std::int32_t& error)
{
    return NextChunkFrom(readerOf(file), file.GetEOF(), header, position, current, next, error);
}
