// The chunks of a whole container in file order, as the audio-file service edits them and descriptions are made of
// them.
#pragma once

#include "media/containers/ChunkWalk.h"
#include "media/containers/FileBytes.h"
#include "platform/core/FourCC.h"

#include <array>
#include <cstddef>
#include <cstdint>
#include <vector>

namespace platform {

/// 24 bytes a chunk: what a scan keeps.
struct Chunk {
    std::uint64_t position = 0; // of the header
    std::uint64_t size = 0;     // of the body; never beyond the end of the file
    FourCC id = 0;
    bool padMissing = false;  // odd, and its writer left the pad byte out
    bool sizeIsStale = false; // the size in the file is open (-1) or goes beyond the end of the file
};
static_assert(sizeof(Chunk) == 24);

/// A container's chunks and what is needed to change them. Positions are from the start of the file.
struct ContainerLayout {
    static constexpr FourCC filler = fourCC("free"); // in every container

    Container container;
    std::vector<Chunk> chunks;
    std::uint64_t fileLength = 0;
    std::uint64_t end = 0; // behind the last chunk: where one more would stand
    bool isBroken = false; // the scan met bytes that are no chunk: nothing may be put behind the last one

    ContainerKind kind() const { return container.traits->kind; }
    /// AIFF and AIFC are told apart.
    FourCC fileType() const
    {
        return container.formType == fourCC("AIFC") ? container.formType : container.traits->fileType;
    }
    /// The first chunk is a "ds64" that counts.
    bool hasSizes64() const { return container.header.HasValidDs64(); }
    /// The first chunk is a "JUNK" that can become a "ds64".
    bool hasReservation() const { return container.header.HasJunkReservation(); }
    std::uint64_t headerSize() const { return container.traits->chunkHeaderSize; }
    std::uint64_t largestChunk() const { return container.traits->largestChunk; }
    std::uint64_t padOf(std::uint64_t size) const { return container.traits->padOf(size); }
    /// Header, body and pad byte.
    std::uint64_t extentOf(std::uint64_t size) const { return headerSize() + size + padOf(size); }
    std::uint64_t bodyOf(const Chunk& chunk) const { return chunk.position + headerSize(); }
    /// Where the next chunk stands.
    std::uint64_t nextOf(const Chunk& chunk) const
    {
        return bodyOf(chunk) + chunk.size + (chunk.padMissing ? 0 : padOf(chunk.size));
    }
    /// A chunk header in the file's form; its first bytes count. Of containers that are edited.
    std::array<std::byte, 12> header(FourCC id, std::uint64_t size) const;
    FourCC audioDataId() const { return container.traits->soundId; }
    /// The first chunk with this id, or null.
    const Chunk* find(FourCC id) const;
};

/// Reads the layout of the whole file; in one pass, in time and memory in proportion to the number of chunks.
/// kStatusParameterError for a file of another kind, kStatusOutOfMemory beyond 4,194,304 chunks.
std::int32_t scanChunks(HeaderWindow& window, ContainerLayout& layout);
/// The same through a window of its own.
std::int32_t scanChunks(const FileBytes& file, ContainerLayout& layout);

} // namespace platform
