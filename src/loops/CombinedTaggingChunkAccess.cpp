#include "loops/CombinedTaggingChunkAccess.h"

#include "loops/VireoLoopBaseChunk.h"
#include "loops/VireoLoopCombinedTagsChunkData.h"
#include "loops/VireoLoopUserDataUtils.h"

using Types = VireoLoopCombinedTagsChunkDataTypes;
using UserData = VireoLoopUserDataUtils;

void CombinedTaggingAifChunkReader::readChunk()
{
    const auto basic = UserData::read(file_, tagging::kBasicTagging, 0);
    const auto categories = UserData::read(file_, tagging::kCategories, 0);
    if (!basic && !categories)
        return;
    if (auto* tags = chunk_.chunkDataOfClass<VireoLoopCombinedTagsChunkData>()) // without the detour through an archive
        return tags->setDataDictionary(Types::combinedTagsChunkDataDictionaryFromAifChunks(
            basic ? BytesView(*basic) : BytesView(), categories ? BytesView(*categories) : BytesView()));
    const auto archive = Types::combinedAifChunkDataFrom(basic.value_or(Bytes()), categories.value_or(Bytes()));
    if (archive)
        chunk_.chunkData().setChunkData(*archive, fourCC("AIFF"));
}

bool CombinedTaggingAifChunkWriter::writeChunk()
{
    const auto archive = chunk_.chunkData().chunkDataForAudioFileType(fourCC("AIFF"));
    if (!archive)
        return false;
    const Bytes basic = Types::basicTaggingDataFromCombinedAidChunkData(*archive);
    const Bytes categories = Types::categoryDataFromCombinedAidChunkData(*archive);
    return (basic.empty() || UserData::write(file_, tagging::kBasicTagging, 0, basic)) &&
           (categories.empty() || UserData::write(file_, tagging::kCategories, 0, categories));
}

bool CombinedTaggingAifChunkRemover::removeChunk()
{
    const bool basicGone = UserData::removeAll(file_, tagging::kBasicTagging);
    const bool categoriesGone = UserData::removeAll(file_, tagging::kCategories);
    return basicGone && categoriesGone;
}
