#include "loops/VireoLoopCombinedTagsChunkData.h"

using Types = VireoLoopCombinedTagsChunkDataTypes;

std::optional<Bytes> VireoLoopCombinedTagsChunkData::aifDataRepresentation() const
{
    return Types::aifChunkDataFromCombinedTagsChunkDataDictionary(_dataDictionary);
}

std::optional<Bytes> VireoLoopCombinedTagsChunkData::cafDataRepresentation() const
{
    return Types::cafChunkDataFromCombinedTagsChunkDataDictionary(_dataDictionary);
}

void VireoLoopCombinedTagsChunkData::readFromAIFData(BytesView data)
{
    _dataDictionary = Types::combinedTagsChunkDataDictionaryFromAifChunkData(data).value_or(platform::Dictionary());
}

void VireoLoopCombinedTagsChunkData::readFromCafData(BytesView data)
{
    _dataDictionary = Types::combinedTagsChunkDataDictionaryFromCafChunkData(data);
}
