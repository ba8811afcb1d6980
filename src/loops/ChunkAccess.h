// The abstract bases of what moves one chunk between an open audio file and its data object.
#pragma once

#include "media/userdata/AudioFileService.h"

/// Each holds, without owning them, the open file and the chunk that made it; both outlive it. A platform call that
/// fails ends the step and leaves the data object as it was.
class KT_EXPORT ChunkReader {
public:
    explicit ChunkReader(platform::AudioFile& file) : file_(file) {}
    virtual ~ChunkReader() = default;
    ChunkReader(const ChunkReader&) = delete;
    ChunkReader& operator=(const ChunkReader&) = delete;
    virtual void readChunk() = 0;

protected:
    platform::AudioFile& file_;
};

class KT_EXPORT ChunkWriter {
public:
    explicit ChunkWriter(platform::AudioFile& file) : file_(file) {}
    virtual ~ChunkWriter() = default;
    ChunkWriter(const ChunkWriter&) = delete;
    ChunkWriter& operator=(const ChunkWriter&) = delete;
    /// False when something could not be written.
    virtual bool writeChunk() = 0;

protected:
    platform::AudioFile& file_;
};

class KT_EXPORT ChunkRemover {
public:
    explicit ChunkRemover(platform::AudioFile& file) : file_(file) {}
    virtual ~ChunkRemover() = default;
    ChunkRemover(const ChunkRemover&) = delete;
    ChunkRemover& operator=(const ChunkRemover&) = delete;
    /// Leaves nothing of the chunk behind; false when something could not be removed.
    virtual bool removeChunk() = 0;

protected:
    platform::AudioFile& file_;
};
