// How CAudioFileIO goes through the chunks of the file that it has open: one pass over a window on its headers. What a
// single step does is decided in ChunkWalk.h.
#pragma once

#include "audiofile/ChunkWalk.h"
#include "audiofile/FileWindow.h"
#include "platform/core/Packed.h"

#include <array>
#include <cstdint>

/// A chunk of a RIFF-family or FORM container, its header in host order.
struct WalkedChunk {
    ChkHeader header;
    std::int64_t position = 0; // of the header
    std::int64_t size = 0;     // effective; negative, or beyond the end of the file, for what ends the walk
    std::int64_t next = 0;     // of the following chunk; the file's length when none follows
};

inline constexpr std::int32_t kFirstChunkUnreadable = -3;
inline constexpr std::int32_t kWalkStuck = -8;

/// The same of the file behind a window.
inline FourCC ChunkedContainerKind(FileWindow& file)
{
    std::array<std::byte, 16> start;
    return file.read(start.data(), 0, start.size()) == kStatusOK ? ChunkedContainerKind(start) : 0;
}

/// The container header in host order; 0, or -3.
inline std::int32_t ReadContainerHeader(FileWindow& file, ContainerChkExtended& header)
{
    return ReadContainerHeaderFrom(
        [&](void* to, std::int64_t at, std::size_t count) { return file.read(to, at, count); }, header);
}

/// Where the chunks end: with the container, or with the file when that is shorter.
inline std::int64_t ContainerEnd(const ContainerChkExtended& header, std::int64_t fileLength)
{
    constexpr std::int64_t ahead = 8; // the size counts from here
    const std::int64_t size = header.EffectiveSize();
    return size > fileLength - ahead ? fileLength : size + ahead;
}

/// Calls `visit(const WalkedChunk&)` for each chunk up to `end` until it returns false. 0, also when stopped; -3 when
/// the first header cannot be read; -8 when a step led nowhere; else the status of a read that failed: then nobody
/// knows whether chunks follow, nor where the one ahead ends, and that one is not visited either.
template <class Visit>
std::int32_t WalkChunks(FileWindow& file, const ContainerChkExtended& header, std::int64_t end, Visit&& visit)
{
    const auto read = [&](void* to, std::int64_t at, std::size_t count) { return file.read(to, at, count); };
    std::int32_t error = kStatusOK;
    WalkedChunk chunk;
    chunk.position = NextChunkFrom(read, file.length(), header, 0, chunk.header, chunk.header, error);
    if (error != kStatusOK)
        return kFirstChunkUnreadable;
    for (;;) {
        ChkHeader following;
        chunk.next = NextChunkFrom(read, file.length(), header, chunk.position, chunk.header, following, error);
        const bool readsNothing = chunk.header.id == 0 && chunk.header.size == 0;
        if (error != kStatusOK && error != kStatusEndOfFile && !readsNothing)
            return error;
        if (chunk.next <= chunk.position)
            return kWalkStuck;
        chunk.size = chunk.header.EffectiveSize(header);
        if (!visit(chunk) || chunk.next >= end)
            return kStatusOK;
        chunk.position = chunk.next;
        chunk.header = following;
    }
}

/// Calls `visit(FourCC id, std::int64_t position, std::int64_t size)` for each chunk of a CAF file until it returns
/// false. A negative size is handed on as it is and ends the walk. 0, or the status of a read that failed.
template <class Visit>
std::int32_t WalkCAFChunks(FileWindow& file, Visit&& visit)
{
    constexpr std::int64_t fileHeaderSize = 8;
    std::int64_t position = fileHeaderSize;
    while (position < file.length()) {
        CAFChunkHeader chunk;
        if (const std::int32_t status = file.read(&chunk, position, sizeof chunk); status != kStatusOK)
            return status == kStatusEndOfFile ? std::int32_t{kStatusOK} : status;
        chunk.id.swap();
        chunk.size.swap();
        const std::int64_t size = chunk.size;
        if (!visit(FourCC{chunk.id}, position, size) || size < 0 ||
            __builtin_add_overflow(position + std::int64_t{sizeof chunk}, size, &position))
            break;
    }
    return kStatusOK;
}
