// Title, artist, copyright and comments: the text chunks of AIFF, the information dictionary of CAF.
#pragma once

#include "loops/ChunkAccess.h"

class VireoLoopBaseChunk;

/// Reads the four entries of the information dictionary.
class KT_EXPORT FileInfoCafChunkReader : public ChunkReader {
public:
    /// Borrows both.
    FileInfoCafChunkReader(platform::AudioFile& file, VireoLoopBaseChunk& chunk) : ChunkReader(file), chunk_(chunk) {}
    void readChunk() override;

private:
    VireoLoopBaseChunk& chunk_;
};

/// Writes the four entries; other entries of the file stay, and a value that is absent becomes "".
class KT_EXPORT FileInfoCafChunkWriter : public ChunkWriter {
public:
    /// Borrows both.
    FileInfoCafChunkWriter(platform::AudioFile& file, VireoLoopBaseChunk& chunk) : ChunkWriter(file), chunk_(chunk) {}
    bool writeChunk() override;

private:
    VireoLoopBaseChunk& chunk_;
};

/// Removes the four entries and leaves the others.
class KT_EXPORT FileInfoCafChunkRemover : public ChunkRemover {
public:
    /// Borrows the file.
    using ChunkRemover::ChunkRemover;
    bool removeChunk() override;
};

/// Reads the four text chunks.
class KT_EXPORT FileInfoAifChunkReader : public ChunkReader {
public:
    /// Borrows both.
    FileInfoAifChunkReader(platform::AudioFile& file, VireoLoopBaseChunk& chunk) : ChunkReader(file), chunk_(chunk) {}
    void readChunk() override;

private:
    VireoLoopBaseChunk& chunk_;
};

/// Writes the chunks of the values that are there; a chunk whose value is absent stays in the file.
class KT_EXPORT FileInfoAifChunkWriter : public ChunkWriter {
public:
    /// Borrows both.
    FileInfoAifChunkWriter(platform::AudioFile& file, VireoLoopBaseChunk& chunk) : ChunkWriter(file), chunk_(chunk) {}
    bool writeChunk() override;

private:
    VireoLoopBaseChunk& chunk_;
};

/// Removes the four text chunks.
class KT_EXPORT FileInfoAifChunkRemover : public ChunkRemover {
public:
    /// Borrows the file.
    using ChunkRemover::ChunkRemover;
    bool removeChunk() override;
};
