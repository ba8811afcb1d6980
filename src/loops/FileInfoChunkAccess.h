// Title, artist, copyright and comments: the text chunks of AIFF, the information dictionary of CAF.
#pragma once

#include "loops/ChunkAccess.h"

class VireoLoopBaseChunk;

class KT_EXPORT FileInfoCafChunkReader : public ChunkReader {
public:
    FileInfoCafChunkReader(platform::AudioFile& file, VireoLoopBaseChunk& chunk) : ChunkReader(file), chunk_(chunk) {}
    void readChunk() override;

private:
    VireoLoopBaseChunk& chunk_;
};

/// Merges: other entries of the file's information stay; a value that is absent becomes "".
class KT_EXPORT FileInfoCafChunkWriter : public ChunkWriter {
public:
    FileInfoCafChunkWriter(platform::AudioFile& file, VireoLoopBaseChunk& chunk) : ChunkWriter(file), chunk_(chunk) {}
    bool writeChunk() override;

private:
    VireoLoopBaseChunk& chunk_;
};

/// Takes the four entries out of the file's information and leaves the others.
class KT_EXPORT FileInfoCafChunkRemover : public ChunkRemover {
public:
    using ChunkRemover::ChunkRemover;
    bool removeChunk() override;
};

class KT_EXPORT FileInfoAifChunkReader : public ChunkReader {
public:
    FileInfoAifChunkReader(platform::AudioFile& file, VireoLoopBaseChunk& chunk) : ChunkReader(file), chunk_(chunk) {}
    void readChunk() override;

private:
    VireoLoopBaseChunk& chunk_;
};

/// Writes the chunks of the values that are there; of a value that is absent the file keeps what it has.
class KT_EXPORT FileInfoAifChunkWriter : public ChunkWriter {
public:
    FileInfoAifChunkWriter(platform::AudioFile& file, VireoLoopBaseChunk& chunk) : ChunkWriter(file), chunk_(chunk) {}
    bool writeChunk() override;

private:
    VireoLoopBaseChunk& chunk_;
};

class KT_EXPORT FileInfoAifChunkRemover : public ChunkRemover {
public:
    using ChunkRemover::ChunkRemover;
    bool removeChunk() override;
};
