// The chunk "smpl" of WAVE files: how a sampler plays the sound. Page: docs/formats/wave-metadata.md.
#pragma once

#include "audiofile/metadata/Records.h"
#include "platform/core/Export.h"

#include <cstddef>

/// One loop of "smpl"; these members, top to bottom, are its 24 bytes.
struct SamplerLoop {
    /// How a loop is played.
    enum Type : std::uint32_t { kForward, kAlternating, kBackward }; // 3 to 31 reserved, from 32 on the makers'

    Packed<std::uint32_t> cueId;     //  0  of a point of "cue "
    Packed<std::uint32_t> type;      //  4  Type
    Packed<std::uint32_t> start;     //  8  first frame played
    Packed<std::uint32_t> end;       // 12  last frame played: inclusive
    Packed<std::uint32_t> fraction;  // 16  of a frame, in 1/2^32
    Packed<std::uint32_t> playCount; // 20  0: until it is released

    /// Turns every number from `order` to the host's order, or back.
    void byteOrder(std::endian order) { turnFields(order, cueId, type, start, end, fraction, playCount); }
    friend bool operator==(const SamplerLoop&, const SamplerLoop&) = default;
};
static_assert(sizeof(SamplerLoop) == 24 && offsetof(SamplerLoop, playCount) == 20);

/// The first 28 bytes of "smpl".
struct SamplerFields {
    Packed<std::uint32_t> manufacturer;      //  0  of the MIDI Manufacturers Association; 0 none in particular
    Packed<std::uint32_t> product;           //  4  of that maker; 0 none in particular
    Packed<std::uint32_t> samplePeriod;      //  8  of a frame, in nanoseconds
    Packed<std::uint32_t> midiUnityNote;     // 12  at which the sound plays as recorded; 0 to 127, 60 = middle C
    Packed<std::uint32_t> midiPitchFraction; // 16  above that note, in 1/2^32 of a semitone
    Packed<std::uint32_t> smpteFormat;       // 20  0 none, 24, 25, 29 (30 drop) or 30 frames a second
    Packed<std::uint32_t> smpteOffset;       // 24  hours (signed), minutes, seconds, frames: a byte each, from the top

    /// Turns every number from `order` to the host's order, or back.
    void byteOrder(std::endian order)
    {
        turnFields(order, manufacturer, product, samplePeriod, midiUnityNote, midiPitchFraction, smpteFormat,
                   smpteOffset);
    }
    friend bool operator==(const SamplerFields&, const SamplerFields&) = default;
};
static_assert(sizeof(SamplerFields) == 28 && offsetof(SamplerFields, smpteOffset) == 24);

/// Published source: Multimedia Data Standards Update, 1994, Sample chunk.
struct KT_EXPORT SamplerChunk : SamplerFields {
    /// Null for fewer than 36 bytes. In RIFX the order is big.
    static std::optional<SamplerChunk> read(BytesView body, std::endian order = std::endian::little);
    /// The body of the chunk: what was read, with the changes since.
    Bytes write(std::endian order = std::endian::little) const;
    friend bool operator==(const SamplerChunk&, const SamplerChunk&) = default;

    std::vector<SamplerLoop> loops;       // those that are there
    Bytes samplerData;                    // of the maker; what is there of it
    std::uint32_t missingLoops = 0;       // stated, and not there: write() states them again
    std::uint32_t missingSamplerData = 0; // likewise, in bytes
    Bytes behind;                         // what nothing counts
};
