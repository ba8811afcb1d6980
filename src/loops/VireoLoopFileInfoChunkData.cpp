#include "loops/VireoLoopFileInfoChunkData.h"

using Types = VireoLoopFileInfoChunkDataTypes;

std::optional<Bytes> VireoLoopFileInfoChunkData::aifDataRepresentation() const
{
    return Types::aifChunkDataFromFileInfoChunkDataDictionary(_dataDictionary);
}

std::optional<Bytes> VireoLoopFileInfoChunkData::cafDataRepresentation() const
{
    return Types::cafChunkDataFromFileInfoChunkDataDictionary(_dataDictionary);
}

void VireoLoopFileInfoChunkData::readFromAIFData(BytesView data)
{
    _dataDictionary = Types::fileInfoChunkDataDictionaryFromAifChunkData(data);
}

void VireoLoopFileInfoChunkData::readFromCafData(BytesView data)
{
    _dataDictionary = Types::fileInfoChunkDataDictionaryFromCafChunkData(data);
}
