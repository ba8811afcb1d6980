// All chunks of a container in file order, for edits by the audio-file service and for descriptions.
#pragma once

#include "media/containers/ChunkWalk.h"
#include "media/containers/FileBytes.h"
#include "platform/core/FourCC.h"

#include <array>
#include <cstddef>
#include <cstdint>
#include <vector>

namespace platform {

/// What a scan keeps: 24 bytes per chunk.
struct Chunk {
    std::uint64_t position = 0; // of the header
    std::uint64_t size = 0;     // of the body; at most up to the end of the file
    FourCC id = 0;
    bool padMissing = false;  // odd size, but no pad byte
    bool sizeIsStale = false; // the stated size is open (-1) or runs past the end of the file
};
static_assert(sizeof(Chunk) == 24);

/// A container's chunks and what is needed to change them. Positions count from the start of the file.
struct ContainerLayout {
    static constexpr FourCC filler = fourCC("free"); // in every container

    Container container;
    std::vector<Chunk> chunks;
    std::uint64_t fileLength = 0;
    std::uint64_t end = 0; // where one more chunk would go
    bool isBroken = false; // the scan met bytes that are no chunk, so nothing may be appended

    ContainerKind kind() const { return container.traits->kind; }
    /// Distinguishes AIFF from AIFC.
    FourCC fileType() const
    {
        return container.formType == fourCC("AIFC") ? container.formType : container.traits->fileType;
    }
    /// Whether the first chunk is a "ds64" that is in force.
    bool hasSizes64() const { return container.header.HasValidDs64(); }
    /// Whether the first chunk is a "JUNK" that can become a "ds64".
    bool hasReservation() const { return container.header.HasJunkReservation(); }
    std::uint64_t headerSize() const { return container.traits->chunkHeaderSize; }
    std::uint64_t largestChunk() const { return container.traits->largestChunk; }
    std::uint64_t padOf(std::uint64_t size) const { return container.traits->padOf(size); }
    /// Header, body and pad byte.
    std::uint64_t extentOf(std::uint64_t size) const { return headerSize() + size + padOf(size); }
    std::uint64_t bodyOf(const Chunk& chunk) const { return chunk.position + headerSize(); }
    /// Position of the next chunk.
    std::uint64_t nextOf(const Chunk& chunk) const
    {
        return bodyOf(chunk) + chunk.size + (chunk.padMissing ? 0 : padOf(chunk.size));
    }
    /// A chunk header in file layout, of which the first headerSize() bytes count. For containers that can be edited.
    std::array<std::byte, 12> header(FourCC id, std::uint64_t size) const;
    FourCC audioDataId() const { return container.traits->soundId; }
    /// The first chunk with this id; null if there is none.
    const Chunk* find(FourCC id) const;
};

/// Reads the layout of the whole file in one pass, in time and memory proportional to the number of chunks.
/// kStatusParameterError if the file is of another kind, kStatusOutOfMemory beyond 4,194,304 chunks.
std::int32_t scanChunks(HeaderWindow& window, ContainerLayout& layout);
/// As above, with a window of its own.
std::int32_t scanChunks(const FileBytes& file, ContainerLayout& layout);

} // namespace platform
