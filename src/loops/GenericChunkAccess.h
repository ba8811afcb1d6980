// Readers, writers and removers of chunks that are one user-data item: most of them.
#pragma once

#include "loops/ChunkAccess.h"

class VireoLoopBaseChunk;

/// In CAF a "uuid" item of the chunk's UUID, else the first item of the chunk's CAF type.
class KT_EXPORT GenericCafChunkReader : public ChunkReader {
public:
    GenericCafChunkReader(platform::AudioFile& file, VireoLoopBaseChunk& chunk) : ChunkReader(file), chunk_(chunk) {}
    void readChunk() override;

private:
    VireoLoopBaseChunk& chunk_;
};

class KT_EXPORT GenericCafChunkWriter : public ChunkWriter {
public:
    GenericCafChunkWriter(platform::AudioFile& file, VireoLoopBaseChunk& chunk) : ChunkWriter(file), chunk_(chunk) {}
    bool writeChunk() override;

private:
    VireoLoopBaseChunk& chunk_;
};

class KT_EXPORT GenericCafChunkRemover : public ChunkRemover {
public:
    GenericCafChunkRemover(platform::AudioFile& file, VireoLoopBaseChunk& chunk) : ChunkRemover(file), chunk_(chunk) {}
    bool removeChunk() override;

private:
    VireoLoopBaseChunk& chunk_;
};

/// In AIFF the first item of the chunk's AIFF id; a chunk without one has nothing there.
class KT_EXPORT GenericAifChunkReader : public ChunkReader {
public:
    GenericAifChunkReader(platform::AudioFile& file, VireoLoopBaseChunk& chunk) : ChunkReader(file), chunk_(chunk) {}
    void readChunk() override;

private:
    VireoLoopBaseChunk& chunk_;
};

class KT_EXPORT GenericAifChunkWriter : public ChunkWriter {
public:
    GenericAifChunkWriter(platform::AudioFile& file, VireoLoopBaseChunk& chunk) : ChunkWriter(file), chunk_(chunk) {}
    bool writeChunk() override;

private:
    VireoLoopBaseChunk& chunk_;
};

class KT_EXPORT GenericAifChunkRemover : public ChunkRemover {
public:
    GenericAifChunkRemover(platform::AudioFile& file, VireoLoopBaseChunk& chunk) : ChunkRemover(file), chunk_(chunk) {}
    bool removeChunk() override;

private:
    VireoLoopBaseChunk& chunk_;
};
