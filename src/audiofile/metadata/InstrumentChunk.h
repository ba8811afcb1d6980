// The chunk "inst" of WAVE files: where on the keyboard, and how loud, a sampler plays the sound. Page:
// docs/formats/wave-metadata.md.
#pragma once

#include "audiofile/metadata/Records.h"
#include "platform/core/Export.h"

#include <cstddef>

/// These members, top to bottom, are its 7 bytes.
struct InstrumentFields {
    Packed<std::uint8_t> unshiftedNote; // 0  at which the sound plays as recorded; MIDI, 0 to 127, 60 = middle C
    Packed<std::int8_t> fineTune;       // 1  cents, -50 to 50
    Packed<std::int8_t> gain;           // 2  dB, -64 to 64
    Packed<std::uint8_t> lowNote;       // 3  0 to 127
    Packed<std::uint8_t> highNote;      // 4  0 to 127
    Packed<std::uint8_t> lowVelocity;   // 5  1 to 127
    Packed<std::uint8_t> highVelocity;  // 6  1 to 127

    /// Does nothing: no field has more than a byte.
    void byteOrder(std::endian) {}
    friend bool operator==(const InstrumentFields&, const InstrumentFields&) = default;
};
static_assert(sizeof(InstrumentFields) == 7);

/// Published source: Multimedia Data Standards Update, 1994, Instrument chunk.
struct KT_EXPORT InstrumentChunk : InstrumentFields {
    /// Null for fewer than 7 bytes.
    static std::optional<InstrumentChunk> read(BytesView body);
    /// The body of the chunk: what was read, with the changes since.
    Bytes write() const;
    friend bool operator==(const InstrumentChunk&, const InstrumentChunk&) = default;

    Bytes behind; // what follows the 7 bytes
};
