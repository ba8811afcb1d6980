#include "loops/VireoLoopFileInfoChunkData.h"

using InfoTypes = VireoLoopFileInfoChunkDataTypes;

std::optional<Bytes> VireoLoopFileInfoChunkData::aifDataRepresentation() const
{
    return InfoTypes::aifChunkDataFromFileInfoChunkDataDictionary(_dataDictionary);
}

std::optional<Bytes> VireoLoopFileInfoChunkData::cafDataRepresentation() const
{
    return InfoTypes::cafChunkDataFromFileInfoChunkDataDictionary(_dataDictionary);
}

void VireoLoopFileInfoChunkData::readFromAIFData(BytesView data)
{
    _dataDictionary = InfoTypes::fileInfoChunkDataDictionaryFromAifChunkData(data);
}

void VireoLoopFileInfoChunkData::readFromCafData(BytesView data)
{
    _dataDictionary = InfoTypes::fileInfoChunkDataDictionaryFromCafChunkData(data);
}
