// What containers say of their samples: "fmt ", "COMM" and "desc", and how long a chunk of samples is whose size was
// never filled in. Whoever describes a file asks here, so that what one tells of is what the other reads. Published
// sources: RIFF as published in August 1991, RFC 2361 (format tags), AIFF 1.3, the AIFF-C
// draft of 1991-08-26, of CAF the published format description, version 1.0, and of AU the manual page audio(4).
#pragma once

#include "media/containers/ContainerTraits.h"
#include "media/samples/StreamDescription.h"
#include "platform/core/Bytes.h"

#include <bit>
#include <cstdint>
#include <optional>

namespace platform {

struct StoredFormat {
    /// Of linear PCM bytesPerFrame is what a frame takes, 0 where that cannot be; samples fill their bytes from the
    /// top. Of other codings packets and their frames, 0 where they differ.
    StreamDescription stream;
    /// As the file has it: "lpcm", AIFC's compression type, CAF's format id, "ms" and the tag in WAVE. An extensible
    /// format has the tag that its GUID stands for, 0xFFFE where it stands for none.
    FourCC coding = 0;
    std::uint64_t countedPackets = 0;      // in AIFF; 0 also where nobody filled it in
    std::optional<std::uint32_t> speakers; // in extensible WAVE and CAF: a bit for each, 0 where it does not say
    std::uint32_t validBits = 0; // in extensible WAVE: of a sample's those that count; 0 where it does not say
};

/// How many bytes of a format chunk are of use, at most.
inline constexpr std::size_t kMostOfStoredFormat = 40;

// Each takes the body of the format chunk, as far as it is there; none when it is too short.

/// Big-endian in RIFX, samples too.
std::optional<StoredFormat> storedFormatOfWAVE(BytesView format, std::endian order = std::endian::little);
std::optional<StoredFormat> storedFormatOfAIFF(BytesView common, bool isAIFC);
std::optional<StoredFormat> storedFormatOfCAF(BytesView description);
/// The 24 bytes that an AU file begins with.
std::optional<StoredFormat> storedFormatOfAU(BytesView header);

/// What is said of how long the chunk of samples is.
struct SoundChunk {
    std::uint64_t body = 0;         // where it begins
    std::int64_t size = 0;          // that is in force: of the header, or of the "ds64"
    bool isOpen = false;            // the size is all ones, and no "ds64" resolves it
    std::int64_t containerSize = 0; // from offset 8 on, as the container says; 0 when that is open
};

/// A recording that was never finished says nothing of its length, and what is behind the header are its samples, to
/// the end of the file: its size is open, or none in a container that ends ahead of the samples. In CAF every finished
/// one has a size.
bool isUnfinished(ContainerKind kind, const SoundChunk& chunk);

/// The bytes ahead of the samples in the body of "SSND", of which `size` are there: 8, and as many more as the first
/// four of these, `start`, say. An offset beyond the chunk is ignored.
std::uint64_t soundDataLead(std::uint64_t size, BytesView start);

} // namespace platform
