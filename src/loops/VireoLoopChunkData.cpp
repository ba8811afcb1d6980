#include "loops/VireoLoopChunkData.h"

VireoLoopChunkData::~VireoLoopChunkData() = default;

void VireoLoopChunkData::setChunkData(BytesView data, FourCC audioFileType)
{
    if (audioFileType == fourCC("AIFF"))
        readFromAIFData(data);
    else if (audioFileType == fourCC("caff"))
        readFromCafData(data);
}

std::optional<Bytes> VireoLoopChunkData::chunkDataForAudioFileType(FourCC audioFileType) const
{
    if (audioFileType == fourCC("caff"))
        return cafDataRepresentation();
    if (audioFileType == fourCC("AIFF"))
        return aifDataRepresentation();
    return std::nullopt;
}
