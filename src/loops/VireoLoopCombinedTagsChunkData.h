// The musical tags of a loop: beats, key, signature, category, genre, descriptors.
#pragma once

#include "loops/VireoLoopCombinedTagsChunkDataTypes.h"
#include "loops/VireoLoopGenericChunkData.h"

#include <utility>

/// The musical tags as a dictionary. A value without a key is not known.
class KT_EXPORT VireoLoopCombinedTagsChunkData : public VireoLoopGenericChunkData {
public:
    bool isEmpty() const override { return _dataDictionary.empty(); }
    std::optional<Bytes> aifDataRepresentation() const override;
    std::optional<Bytes> cafDataRepresentation() const override;
    void readFromAIFData(BytesView data) override;
    void readFromCafData(BytesView data) override;

    /// Each the tags under the VireoLoopCombinedTagsChunkData keys.
    const platform::Dictionary& dataDictionary() const& { return _dataDictionary; }
    platform::Dictionary dataDictionary() && { return std::move(_dataDictionary); }
    void setDataDictionary(platform::Dictionary tags) { _dataDictionary = std::move(tags); }

private:
    platform::Dictionary _dataDictionary;
};
