// The content of one loop chunk in memory: read from an AIFF chunk or a CAF payload, and written as either, so that
// tags move between the two kinds of file.
#pragma once

#include "platform/core/Bytes.h"
#include "platform/core/Export.h"
#include "platform/core/FourCC.h"

#include <optional>

/// The root of the family, empty itself. CAF bytes are always the payload without the 16 bytes of UUID.
class KT_EXPORT VireoLoopChunkData {
public:
    virtual ~VireoLoopChunkData();

    /// `setChunkData:forAudioFileType:`: reads the bytes of a chunk, "AIFF" or "caff"; any other type does nothing.
    void setChunkData(BytesView data, FourCC audioFileType);
    /// `chunkDataForAudioFileType:`: the bytes of a chunk; null for any other type, and when there is nothing to
    /// write.
    std::optional<Bytes> chunkDataForAudioFileType(FourCC audioFileType) const;

    /// Whether there is nothing to write.
    virtual bool isEmpty() const { return true; }
    /// The bytes of the AIFF chunk; null when empty.
    virtual std::optional<Bytes> aifDataRepresentation() const { return std::nullopt; }
    /// The payload in CAF; null when empty.
    virtual std::optional<Bytes> cafDataRepresentation() const { return std::nullopt; }
    /// `readFromAIFData:`, `readFromCafData:`: each takes what can be read, and leaves out the rest.
    virtual void readFromAIFData(BytesView) {}
    virtual void readFromCafData(BytesView) {}

protected:
    Bytes _internalChunkData; // Kept: opaque; the classes of the suite have fields of their own
};
