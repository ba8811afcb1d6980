// The chunks of a container in file order: the service's own scanner, for WAVE (RIFF, RF64, BW64), AIFF, AIFC and CAF,
// and, only to be read, for big-endian WAVE (RIFX), Wave64 and AU. Published sources: EA IFF 85, AIFF 1.3 and AIFC, EBU
// Tech 3306 (RF64), ITU-R BS.2088 (BW64), CAF 1.0, the Wave64 file format (2003), the manual page audio(4) of AU.
#pragma once

#include "media/containers/HeaderWindow.h"
#include "media/containers/StoredFormat.h"
#include "platform/core/FourCC.h"

#include <array>
#include <bit>
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

    ContainerKind kind = ContainerKind::riff;
    bool isBigEndian = false; // RIFX: WAVE whose numbers and samples are
    FourCC fileType = 0;
    std::vector<Chunk> chunks;
    std::uint64_t fileLength = 0;
    std::uint64_t end = 0;       // behind the last chunk: where one more would stand
    bool isBroken = false;       // the scan met bytes that are no chunk: nothing may be put behind the last one
    bool hasSamples = false;     // the chunk of samples is among them
    bool hasSizes64 = false;     // the first chunk is a "ds64" that counts
    bool hasReservation = false; // the first chunk is a "JUNK" that can become a "ds64"

    /// Whether user data can be set and samples written. AU has no chunks: its header (".snd") and its samples ("data")
    /// stand for two.
    bool isEditable() const { return kind <= ContainerKind::caf && !isBigEndian; }
    std::endian order() const
    {
        const bool isLittle = (kind == ContainerKind::riff && !isBigEndian) || kind == ContainerKind::wave64;
        return isLittle ? std::endian::little : std::endian::big;
    }
    std::uint64_t headerSize() const
    {
        return kind == ContainerKind::caf ? 12 : kind == ContainerKind::wave64 ? 24 : kind == ContainerKind::au ? 0 : 8;
    }
    /// The bytes behind a body of this size: RIFF and IFF chunks end at even sizes, those of Wave64 at multiples of 8.
    std::uint64_t padOf(std::uint64_t size) const
    {
        return kind == ContainerKind::wave64                               ? -size & 7
               : kind == ContainerKind::riff || kind == ContainerKind::iff ? size & 1
                                                                           : 0;
    }
    /// Header, body and pad byte.
    std::uint64_t extentOf(std::uint64_t size) const { return headerSize() + size + padOf(size); }
    std::uint64_t bodyOf(const Chunk& chunk) const { return chunk.position + headerSize(); }
    /// Where the next chunk stands.
    std::uint64_t nextOf(const Chunk& chunk) const
    {
        return bodyOf(chunk) + chunk.size + (chunk.padMissing ? 0 : padOf(chunk.size));
    }
    /// The largest body that the header can state.
    std::uint64_t largestChunk() const
    {
        return kind == ContainerKind::riff ? 0xFFFFFFFE : kind == ContainerKind::iff ? 0x7FFFFFFF : INT64_MAX;
    }
    /// A chunk header in the file's form; the first headerSize() bytes count.
    std::array<std::byte, 12> header(FourCC id, std::uint64_t size) const;
    FourCC audioDataId() const { return kind == ContainerKind::iff ? fourCC("SSND") : fourCC("data"); }
    /// The first chunk with this id, or null.
    const Chunk* find(FourCC id) const;
};

/// Reads the layout of the whole file; in one pass, in time and memory in proportion to the number of chunks.
/// kStatusParameterError for a file of another kind, kStatusOutOfMemory beyond 4,194,304 chunks.
std::int32_t scanChunks(HeaderWindow& window, ContainerLayout& layout);
/// The same through a window of its own.
std::int32_t scanChunks(const FileBytes& file, ContainerLayout& layout);

} // namespace platform
