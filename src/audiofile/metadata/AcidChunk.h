// The chunk "acid" of WAVE files: what a loop is musically. Page: docs/formats/wave-metadata.md.
#pragma once

#include "audiofile/metadata/Records.h"
#include "platform/core/Export.h"

#include <cstddef>

/// These members, top to bottom, are its 24 bytes; in memory they hold host order.
struct AcidFields {
    Packed<std::uint32_t> flags;            //  0  kOneShot and the following
    Packed<std::uint16_t> rootNote;         //  4  MIDI, 60 = middle C; counts when kRootNoteSet
    Packed<std::uint16_t> unknown;          //  6  0x8000 as a rule
    Packed<float> unknown2;                 //  8  0 as a rule
    Packed<std::uint32_t> beats;            // 12  number of beats; of no meaning in a one-shot
    Packed<std::uint16_t> meterDenominator; // 16  4 of 3/4
    Packed<std::uint16_t> meterNumerator;   // 18  3 of 3/4
    Packed<float> tempo;                    // 20  beats per minute

    /// Turns every number from `order` to the host's order, or back.
    void byteOrder(std::endian order)
    {
        turnFields(order, flags, rootNote, unknown, unknown2, beats, meterDenominator, meterNumerator, tempo);
    }
    friend bool operator==(const AcidFields&, const AcidFields&) = default;
};
static_assert(sizeof(AcidFields) == 24 && offsetof(AcidFields, beats) == 12 && offsetof(AcidFields, tempo) == 20);

/// Published layout: libsndfile, wavlike.c, wavlike_read_acid; the flags as lists of RIFF tags give them.
struct KT_EXPORT AcidChunk : AcidFields {
    /// Bits of `flags`.
    enum Flags : std::uint32_t { // of `flags`
        kOneShot = 1,            // a sound, not a loop
        kRootNoteSet = 2,        // rootNote counts
        kStretched = 4,          // follows the tempo of a project
        kOnDisk = 8,             // played from the disk, not from memory
        kHighOctave = 16,        // of the sampler
    };

    /// Null for fewer than 24 bytes. In RIFX the order is big.
    static std::optional<AcidChunk> read(BytesView body, std::endian order = std::endian::little);
    /// The body of the chunk: what was read, with the changes since.
    Bytes write(std::endian order = std::endian::little) const;

    /// Whether a bit of `flags` is set.
    bool has(Flags flag) const { return (flags & flag) != 0; }
    friend bool operator==(const AcidChunk&, const AcidChunk&) = default;

    Bytes behind; // what follows the 24 bytes
};
