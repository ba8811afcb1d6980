// The combined tags in AIFF: the chunks "basc" and "cate", which the data object takes as one archive.
#pragma once

#include "loops/ChunkAccess.h"

class VireoLoopBaseChunk;

/// Reads "basc" and "cate".
class KT_EXPORT CombinedTaggingAifChunkReader : public ChunkReader {
public:
    /// Borrows both.
    CombinedTaggingAifChunkReader(platform::AudioFile& file, VireoLoopBaseChunk& chunk)
        : ChunkReader(file),
          chunk_(chunk)
    {
    }
    void readChunk() override;

private:
    VireoLoopBaseChunk& chunk_;
};

/// Writes "basc" and "cate".
class KT_EXPORT CombinedTaggingAifChunkWriter : public ChunkWriter {
public:
    /// Borrows both.
    CombinedTaggingAifChunkWriter(platform::AudioFile& file, VireoLoopBaseChunk& chunk)
        : ChunkWriter(file),
          chunk_(chunk)
    {
    }
    bool writeChunk() override;

private:
    VireoLoopBaseChunk& chunk_;
};

/// Removes "basc" and "cate".
class KT_EXPORT CombinedTaggingAifChunkRemover : public ChunkRemover {
public:
    /// Borrows the file.
    using ChunkRemover::ChunkRemover;
    bool removeChunk() override;
};
