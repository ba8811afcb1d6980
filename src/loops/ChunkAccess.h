// The abstract bases of the readers, writers and removers of one chunk.
#pragma once

#include "media/userdata/AudioFileService.h"

/// Reads a chunk of an open file into a data object. Holds both without owning them; they outlive it. A platform call
/// that fails ends the step and leaves the data object as it was.
class KT_EXPORT ChunkReader {
public:
    /// Borrows the file.
    explicit ChunkReader(platform::AudioFile& file) : file_(file) {}
    virtual ~ChunkReader() = default;
    ChunkReader(const ChunkReader&) = delete;
    ChunkReader& operator=(const ChunkReader&) = delete;
    /// Fills the data object; a chunk that is missing leaves it as it was.
    virtual void readChunk() = 0;

protected:
    platform::AudioFile& file_; // borrowed
};

/// Writes a data object into an open file. Holds both without owning them.
class KT_EXPORT ChunkWriter {
public:
    /// Borrows the file.
    explicit ChunkWriter(platform::AudioFile& file) : file_(file) {}
    virtual ~ChunkWriter() = default;
    ChunkWriter(const ChunkWriter&) = delete;
    ChunkWriter& operator=(const ChunkWriter&) = delete;
    /// Writes the chunk; false when something could not be written.
    virtual bool writeChunk() = 0;

protected:
    platform::AudioFile& file_; // borrowed
};

/// Removes a chunk from an open file, which it does not own.
class KT_EXPORT ChunkRemover {
public:
    /// Borrows the file.
    explicit ChunkRemover(platform::AudioFile& file) : file_(file) {}
    virtual ~ChunkRemover() = default;
    ChunkRemover(const ChunkRemover&) = delete;
    ChunkRemover& operator=(const ChunkRemover&) = delete;
    /// Removes all of the chunk; false when something could not be removed.
    virtual bool removeChunk() = 0;

protected:
    platform::AudioFile& file_; // borrowed
};
