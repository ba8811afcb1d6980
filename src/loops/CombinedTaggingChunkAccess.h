// The combined tags in AIFF: the chunks "basc" and "cate", which the data object sees as one archive.
#pragma once

#include "loops/ChunkAccess.h"

class VireoLoopBaseChunk;

class KT_EXPORT CombinedTaggingAifChunkReader : public ChunkReader {
public:
    CombinedTaggingAifChunkReader(platform::AudioFile& file, VireoLoopBaseChunk& chunk)
        : ChunkReader(file),
          chunk_(chunk)
    {
    }
    void readChunk() override;

private:
    VireoLoopBaseChunk& chunk_;
};

class KT_EXPORT CombinedTaggingAifChunkWriter : public ChunkWriter {
public:
    CombinedTaggingAifChunkWriter(platform::AudioFile& file, VireoLoopBaseChunk& chunk)
        : ChunkWriter(file),
          chunk_(chunk)
    {
    }
    bool writeChunk() override;

private:
    VireoLoopBaseChunk& chunk_;
};

class KT_EXPORT CombinedTaggingAifChunkRemover : public ChunkRemover {
public:
    using ChunkRemover::ChunkRemover;
    bool removeChunk() override;
};
