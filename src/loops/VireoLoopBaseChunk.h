// VireoLoopBaseChunk: one kind of loop chunk. It knows how AIFF and CAF name the chunk, owns its data object, and
// makes its readers, writers and removers for either kind of file. The derived classes are the suite's kinds.
#pragma once

#include "loops/ChunkAccess.h"
#include "loops/VireoLoopChunkData.h"
#include "loops/tagging/ChunkIDs.h"

#include <memory>
#include <optional>
#include <typeinfo>

/// One kind of loop chunk, and its content.
class KT_EXPORT VireoLoopBaseChunk {
public:
    /// Values that are not given follow from the AIFF id: the CAF type and the UUID that carry it. Without a data
    /// object it gets an empty VireoLoopGenericChunkData.
    explicit VireoLoopBaseChunk(std::optional<FourCC> aifChunkID = {}, std::optional<FourCC> cafChunkID = {},
                                const tagging::UUIDBytes* cafChunkUUID = nullptr,
                                std::unique_ptr<VireoLoopChunkData> chunkData = nullptr);
    virtual ~VireoLoopBaseChunk();
    VireoLoopBaseChunk(const VireoLoopBaseChunk&) = delete;
    VireoLoopBaseChunk& operator=(const VireoLoopBaseChunk&) = delete;

    FourCC aifChunkID() const { return aifChunkID_; }                        // 0: none
    FourCC cafChunkID() const { return cafChunkID_; }                        // 0: none
    const tagging::UUIDBytes* cafChunkUUID() const { return cafChunkUUID_; } // null: none
    /// Whether CAF carries it as a "uuid" item.
    bool cafChunkIsUUIDChunk() const { return cafChunkUUID_ != nullptr; }
    /// Each the content, owned by the chunk.
    VireoLoopChunkData& chunkData() { return *chunkData_; }
    const VireoLoopChunkData& chunkData() const { return *chunkData_; }
    /// The data object if it is of exactly that class; null for a derived class, which may read archives in its own
    /// way.
    template <class Data>
    Data* chunkDataOfClass()
    {
        VireoLoopChunkData& data = *chunkData_;
        return typeid(data) == typeid(Data) ? static_cast<Data*>(&data) : nullptr;
    }

    /// Each a new object for an open file, which is borrowed; overridden where one item is not enough.
    virtual std::unique_ptr<ChunkReader> cafChunkReader(platform::AudioFile& file);
    virtual std::unique_ptr<ChunkReader> aifChunkReader(platform::AudioFile& file);
    virtual std::unique_ptr<ChunkWriter> cafChunkWriter(platform::AudioFile& file);
    virtual std::unique_ptr<ChunkWriter> aifChunkWriter(platform::AudioFile& file);
    virtual std::unique_ptr<ChunkRemover> cafChunkRemover(platform::AudioFile& file);
    virtual std::unique_ptr<ChunkRemover> aifChunkRemover(platform::AudioFile& file);

    /// Each a new object by file type, "caff" or "AIFF"; null for any other.
    std::unique_ptr<ChunkReader> chunkReader(platform::AudioFile& file, FourCC fileType);
    std::unique_ptr<ChunkWriter> chunkWriter(platform::AudioFile& file, FourCC fileType);
    std::unique_ptr<ChunkRemover> chunkRemover(platform::AudioFile& file, FourCC fileType);

private:
    FourCC aifChunkID_;
    FourCC cafChunkID_;
    const tagging::UUIDBytes* cafChunkUUID_;
    std::unique_ptr<VireoLoopChunkData> chunkData_;
};
