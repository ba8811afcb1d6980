// The rules by which RIFF, RF64, BW64 and FORM containers are recognised and walked. Everything that walks such a
// container goes through here, so that damaged files are read one way.
#pragma once

#include "media/containers/ContainerHeaders.h"
#include "platform/core/Status.h"

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <span>

class CFileIO;

/// "WAVE", "AIFF" (AIFC too), "REX2", or 0: what the first 16 bytes of a file make it.
FourCC ChunkedContainerKind(std::span<const std::byte, 16> start);

/// The container header, in host order, from the start of `file`; the record is cleared first. 0, or -3 when it cannot
/// be read.
std::int32_t ReadContainerHeader(CFileIO& file, ContainerChkExtended& header);

/// The offset of the chunk after `current`, whose header stands at `position`; `next` receives its header in host
/// order. Position 0 asks for the first chunk. A chunk that runs past the end of the file, a negative size and a failed
/// read give the file's length; the walk is over when the result does not exceed `position`, or reaches the container's
/// end. `error` is the status of reading the header: kStatusParameterError when `current` is all zero. `next` is zero
/// when it could not be read.
std::int64_t NextChunk(CFileIO& file, const ContainerChkExtended& header, std::int64_t position,
                       const ChkHeader& current, ChkHeader& next, std::int32_t& error);

// The same over any source of bytes: `read(void* to, std::int64_t position, std::size_t count)` gives a status.

template <class Read>
std::int32_t ReadContainerHeaderFrom(Read&& read, ContainerChkExtended& header)
{
    constexpr std::int32_t headerUnreadable = -3;
    header = {};
    if (read(&header, 0, ContainerChkExtended::kHeadersSize) != kStatusOK)
        return headerUnreadable;
    const auto* const bytes = reinterpret_cast<const unsigned char*>(&header);
    const auto id = loadBE<FourCC>(bytes);
    const FourCC sizesChunk = id == kRF64 || id == kBW64 ? kDs64 : kJUNK;
    if (loadBE<FourCC>(bytes + 8) == kWAVE && loadBE<FourCC>(bytes + 12) == sizesChunk) {
        const auto size = loadLE<std::uint32_t>(bytes + 16);
        const std::size_t held = std::min<std::size_t>(size, ContainerChkExtended::kBodyCapacity);
        if (read(&header.riffSize, ContainerChkExtended::kHeadersSize, held) != kStatusOK)
            return headerUnreadable;
    }
    header.ByteOrder();
    return kStatusOK;
}

template <class Read>
std::int64_t NextChunkFrom(Read&& read, std::int64_t fileLength, const ContainerChkExtended& header,
                           std::int64_t position, const ChkHeader& current, ChkHeader& next, std::int32_t& error)
{
    const auto readHeader = [&](std::int64_t at) { return read(&next, at, sizeof next); };
    std::int64_t size = 0;
    std::int64_t candidate = sizeof(ContainerChk);
    if (position == 0) {
        error = readHeader(candidate);
    } else if (current.id == 0 && current.size == 0) {
        error = kStatusParameterError;
    } else if (size = current.EffectiveSize(header);
               __builtin_add_overflow(position + std::int64_t{sizeof current}, size, &candidate)) {
        error = kStatusEndOfFile;
    } else {
        error = readHeader(candidate);
        // Some writers leave out the pad byte: what follows an odd chunk is one only when it is zero.
        const auto firstByte = *reinterpret_cast<const unsigned char*>(&next);
        if (error == kStatusOK && (size & 1) != 0 && firstByte == 0)
            error = readHeader(++candidate);
    }
    if (error == kStatusOK)
        next.ByteOrder(header);
    else
        next = {};
    if (position == 0)
        return candidate;
    return error != kStatusOK || size < 0 || candidate > fileLength ? fileLength : candidate;
}
