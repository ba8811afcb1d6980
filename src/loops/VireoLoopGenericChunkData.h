// A loop chunk that is carried without being interpreted: channel strips, patch, generative instrument, event
// sequence, MIDI file, additional loop data, step sequencer, silence.
#pragma once

#include "loops/VireoLoopChunkData.h"

/// The bytes of a chunk, as they are.
class KT_EXPORT VireoLoopGenericChunkData : public VireoLoopChunkData {
public:
    /// Whether nothing was read; a chunk of no bytes is not empty.
    bool isEmpty() const override { return !_chunkData; }
    std::optional<Bytes> aifDataRepresentation() const override { return _chunkData; }
    std::optional<Bytes> cafDataRepresentation() const override { return _chunkData; }
    void readFromAIFData(BytesView data) override { _chunkData.emplace(data.begin(), data.end()); }
    void readFromCafData(BytesView data) override { _chunkData.emplace(data.begin(), data.end()); }

private:
    std::optional<Bytes> _chunkData;
};
