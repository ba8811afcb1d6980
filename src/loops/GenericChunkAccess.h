// Readers, writers and removers of chunks that are one user-data item: most of them.
#pragma once

#include "loops/ChunkAccess.h"

class VireoLoopBaseChunk;

/// Reads the "uuid" item of the chunk's UUID in CAF, or the first item of its CAF type when it has no UUID.
class KT_EXPORT GenericCafChunkReader : public ChunkReader {
public:
    /// Borrows both.
    GenericCafChunkReader(platform::AudioFile& file, VireoLoopBaseChunk& chunk) : ChunkReader(file), chunk_(chunk) {}
    void readChunk() override;

private:
    VireoLoopBaseChunk& chunk_;
};

/// Writes that item.
class KT_EXPORT GenericCafChunkWriter : public ChunkWriter {
public:
    /// Borrows both.
    GenericCafChunkWriter(platform::AudioFile& file, VireoLoopBaseChunk& chunk) : ChunkWriter(file), chunk_(chunk) {}
    bool writeChunk() override;

private:
    VireoLoopBaseChunk& chunk_;
};

/// Removes all such items.
class KT_EXPORT GenericCafChunkRemover : public ChunkRemover {
public:
    /// Borrows both.
    GenericCafChunkRemover(platform::AudioFile& file, VireoLoopBaseChunk& chunk) : ChunkRemover(file), chunk_(chunk) {}
    bool removeChunk() override;

private:
    VireoLoopBaseChunk& chunk_;
};

/// Reads the first item of the chunk's AIFF id; a chunk without an id has nothing in AIFF.
class KT_EXPORT GenericAifChunkReader : public ChunkReader {
public:
    /// Borrows both.
    GenericAifChunkReader(platform::AudioFile& file, VireoLoopBaseChunk& chunk) : ChunkReader(file), chunk_(chunk) {}
    void readChunk() override;

private:
    VireoLoopBaseChunk& chunk_;
};

/// Writes that item.
class KT_EXPORT GenericAifChunkWriter : public ChunkWriter {
public:
    /// Borrows both.
    GenericAifChunkWriter(platform::AudioFile& file, VireoLoopBaseChunk& chunk) : ChunkWriter(file), chunk_(chunk) {}
    bool writeChunk() override;

private:
    VireoLoopBaseChunk& chunk_;
};

/// Removes all such items.
class KT_EXPORT GenericAifChunkRemover : public ChunkRemover {
public:
    /// Borrows both.
    GenericAifChunkRemover(platform::AudioFile& file, VireoLoopBaseChunk& chunk) : ChunkRemover(file), chunk_(chunk) {}
    bool removeChunk() override;

private:
    VireoLoopBaseChunk& chunk_;
};
