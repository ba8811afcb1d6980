// What containers say about their samples ("fmt ", "COMM" and "desc"), and how long a chunk of samples is whose size
// was never filled in. Every description of a file asks here, so that all agree with what is read. Published sources:
// RIFF as published in August 1991, RFC 2361 (format tags), AIFF 1.3, the AIFF-C draft of 1991-08-26, the published
// format description of CAF, version 1.0, and for AU the manual page audio(4).
#pragma once

#include "media/containers/ContainerTraits.h"
#include "media/samples/StreamDescription.h"
#include "platform/core/Bytes.h"

#include <bit>
#include <cstdint>
#include <optional>

namespace platform {

/// The format of the samples, as the container has it.
struct StoredFormat {
    /// How samples are coded. For linear PCM bytesPerFrame is what a frame takes, 0 where that cannot be, and samples
    /// fill their bytes from the top. For other codings the sizes of packets and their frames, 0 where they differ.
    StreamDescription stream;
    /// As the file has it: "lpcm", AIFC's compression type, CAF's format id, "ms" and the tag in WAVE. An extensible
    /// format has the tag that its GUID stands for, 0xFFFE where it stands for none.
    FourCC coding = 0;
    std::uint64_t countedPackets = 0; // in AIFF; 0 also where it was never filled in
    /// in extensible WAVE and CAF: a bit for each, 0 where the file does not say
    std::optional<std::uint32_t> speakers;
    std::uint32_t validBits = 0; // in extensible WAVE: the bits of a sample that count; 0 where the file does not say
};

/// How many bytes of a format chunk are used, at most.
inline constexpr std::size_t kMostOfStoredFormat = 40;

// Each takes those bytes of the format chunk's body that are there; null when they are too few.

/// The format in "fmt "; in RIFX header and samples are big-endian.
std::optional<StoredFormat> storedFormatOfWAVE(BytesView format, std::endian order = std::endian::little);
/// The format in "COMM".
std::optional<StoredFormat> storedFormatOfAIFF(BytesView common, bool isAIFC);
/// The format in "desc".
std::optional<StoredFormat> storedFormatOfCAF(BytesView description);
/// The format in the first 24 bytes of an AU file.
std::optional<StoredFormat> storedFormatOfAU(BytesView header);

/// What a container says about the length of its samples.
struct SoundChunk {
    std::uint64_t body = 0;         // where it begins
    std::int64_t size = 0;          // the size in force: of the header, or of the "ds64"
    bool isOpen = false;            // the size is all ones, and no "ds64" resolves it
    std::int64_t containerSize = 0; // from offset 8 on, as the container states it; 0 when that is open
};

/// Whether the recording was never finished, so that its samples go on to the end of the file: its size is open, or
/// none in a container that ends ahead of the samples. In CAF every finished recording has a size.
bool isUnfinished(ContainerKind kind, const SoundChunk& chunk);

/// How many bytes lie ahead of the samples in the body of "SSND", of which `size` are there: 8, plus as many as the
/// first four, `start`, say. An offset beyond the chunk is ignored.
std::uint64_t soundDataLead(std::uint64_t size, BytesView start);

} // namespace platform
