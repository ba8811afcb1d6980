// The in-memory form of one loop chunk: filled from the bytes of an AIFF chunk or of a CAF payload, and able to give
// the bytes for either, so that tags move between the two kinds of file by way of these objects.
#pragma once

#include "platform/core/Bytes.h"
#include "platform/core/Export.h"
#include "platform/core/FourCC.h"

#include <optional>

/// The root of the family, empty itself. CAF bytes are always the payload without the 16 bytes of UUID.
class KT_EXPORT VireoLoopChunkData {
public:
    virtual ~VireoLoopChunkData();

    /// setChunkData:forAudioFileType: — "AIFF" or "caff"; any other type does nothing.
    void setChunkData(BytesView data, FourCC audioFileType);
    /// chunkDataForAudioFileType: — none for any other type.
    std::optional<Bytes> chunkDataForAudioFileType(FourCC audioFileType) const;

    virtual bool isEmpty() const { return true; }
    virtual std::optional<Bytes> aifDataRepresentation() const { return std::nullopt; }
    virtual std::optional<Bytes> cafDataRepresentation() const { return std::nullopt; }
    /// readFromAIFData: and readFromCafData: — take what can be read and leave out the rest.
    virtual void readFromAIFData(BytesView) {}
    virtual void readFromCafData(BytesView) {}

protected:
    Bytes _internalChunkData; // Kept: opaque; the classes of the suite have fields of their own
};
