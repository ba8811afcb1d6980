// Where a loop comes from: title, artist, copyright, comments.
#pragma once

#include "loops/VireoLoopChunkData.h"
#include "loops/VireoLoopFileInfoChunkDataTypes.h"

#include <utility>

/// The four texts as a dictionary.
class KT_EXPORT VireoLoopFileInfoChunkData : public VireoLoopChunkData {
public:
    bool isEmpty() const override { return _dataDictionary.empty(); }
    std::optional<Bytes> aifDataRepresentation() const override;
    std::optional<Bytes> cafDataRepresentation() const override;
    void readFromAIFData(BytesView data) override;
    void readFromCafData(BytesView data) override;

    /// Each the texts under the VireoLoopFileInfoChunkData keys.
    const platform::Dictionary& dataDictionary() const& { return _dataDictionary; }
    platform::Dictionary dataDictionary() && { return std::move(_dataDictionary); }
    void setDataDictionary(platform::Dictionary info) { _dataDictionary = std::move(info); }

private:
    platform::Dictionary _dataDictionary;
};
