// The chunk "bext" of WAVE files: who recorded what, and when. Page: docs/formats/wave-metadata.md.
#pragma once

#include "audiofile/metadata/FixedText.h"
#include "audiofile/metadata/Records.h"
#include "platform/core/Export.h"

#include <cstddef>

/// The first 602 bytes of "bext", top to bottom. Texts are ASCII by the source.
struct BroadcastFields {
    static constexpr std::int16_t kNoLoudness = 0x7FFF; // a value of the five loudness fields: unknown

    FixedText<256> description;                //   0  of the recording, free text
    FixedText<32> originator;                  // 256  who made the recording
    FixedText<32> originatorReference;         // 288  the originator's number of the recording
    FixedText<10> originationDate;             // 320  yyyy-mm-dd; other separators occur too
    FixedText<8> originationTime;              // 330  hh:mm:ss
    Packed<std::uint32_t> timeReferenceLow;    // 338  see BroadcastExtension::timeReference
    Packed<std::uint32_t> timeReferenceHigh;   // 342  the upper half
    Packed<std::uint16_t> version;             // 346  0 to 2
    std::array<std::byte, 64> umid{};          // 348  SMPTE ST 330, from version 1 on; of 32 bytes, zeros follow
    Packed<std::int16_t> loudnessValue;        // 412  integrated, 1/100 LUFS; this and the next four from version 2 on
    Packed<std::int16_t> loudnessRange;        // 414  1/100 LU
    Packed<std::int16_t> maxTruePeakLevel;     // 416  1/100 dBTP
    Packed<std::int16_t> maxMomentaryLoudness; // 418  1/100 LUFS
    Packed<std::int16_t> maxShortTermLoudness; // 420  1/100 LUFS
    std::array<std::byte, 180> reserved{};     // 422  zeros; kept as they are

    /// Turns every number from `order` to the host's order, or back.
    void byteOrder(std::endian order)
    {
        turnFields(order, timeReferenceLow, timeReferenceHigh, version, loudnessValue, loudnessRange, maxTruePeakLevel,
                   maxMomentaryLoudness, maxShortTermLoudness);
    }
    friend bool operator==(const BroadcastFields&, const BroadcastFields&) = default;
};
static_assert(sizeof(BroadcastFields) == 602 && offsetof(BroadcastFields, timeReferenceLow) == 338 &&
              offsetof(BroadcastFields, umid) == 348 && offsetof(BroadcastFields, reserved) == 422);

/// Published source: EBU Tech 3285, versions 0 to 2.
struct KT_EXPORT BroadcastExtension : BroadcastFields {
    /// Null for fewer than 602 bytes. In RIFX the order is big.
    static std::optional<BroadcastExtension> read(BytesView body, std::endian order = std::endian::little);
    /// The body of the chunk: what was read, with the changes since.
    Bytes write(std::endian order = std::endian::little) const;

    /// The distance of the first frame from midnight, in frames.
    std::uint64_t timeReference() const
    {
        return std::uint64_t{timeReferenceHigh} << 32 | std::uint64_t{timeReferenceLow};
    }
    /// Sets timeReference().
    void setTimeReference(std::uint64_t frames)
    {
        timeReferenceLow = static_cast<std::uint32_t>(frames);
        timeReferenceHigh = static_cast<std::uint32_t>(frames >> 32);
    }
    /// Whether the version has a UMID, and it is not all zeros.
    bool hasUMID() const { return version >= 1 && umid != decltype(umid){}; }
    /// Whether the version has the five loudness fields.
    bool hasLoudness() const { return version >= 2; }
    /// The lines of the history that are not empty, up to a NUL, the first coding first
    /// ("A=PCM,F=48000,W=24,M=stereo").
    std::vector<std::string> codingHistoryLines() const;
    friend bool operator==(const BroadcastExtension&, const BroadcastExtension&) = default;

    Bytes codingHistory; // what follows the 602 bytes: lines that end with CR LF
};
