// A loop chunk whose content is carried without being interpreted: channel strips, patch, generative instrument, event
// sequence, MIDI file, additional loop data, step sequencer, silence.
#pragma once

#include "loops/VireoLoopChunkData.h"

class KT_EXPORT VireoLoopGenericChunkData : public VireoLoopChunkData {
public:
    bool isEmpty() const override { return !_chunkData; }
    std::optional<Bytes> aifDataRepresentation() const override { return _chunkData; }
    std::optional<Bytes> cafDataRepresentation() const override { return _chunkData; }
    void readFromAIFData(BytesView data) override { _chunkData.emplace(data.begin(), data.end()); }
    void readFromCafData(BytesView data) override { _chunkData.emplace(data.begin(), data.end()); }

private:
    std::optional<Bytes> _chunkData;
};
