// The chunk "inst" of CAF files: how a sampler plays the sound. Page: docs/formats/caf.md.
#pragma once

#include "audiofile/metadata/Records.h"
#include "platform/core/Export.h"

#include <cstddef>

/// These members, top to bottom, are its 28 bytes.
struct CAFInstrumentFields {
    Packed<float> baseNote;              //  0  MIDI, with a fraction
    Packed<std::uint8_t> lowNote;        //  4  0 to 127
    Packed<std::uint8_t> highNote;       //  5  0 to 127
    Packed<std::uint8_t> lowVelocity;    //  6  1 to 127
    Packed<std::uint8_t> highVelocity;   //  7  1 to 127
    Packed<float> gain;                  //  8  dB
    Packed<std::uint32_t> startRegion;   // 12  ids of regions of "regn"; 0xFFFFFFFF none
    Packed<std::uint32_t> sustainRegion; // 16  played while the note is held
    Packed<std::uint32_t> releaseRegion; // 20  played afterwards
    Packed<std::uint32_t> instrumentId;  // 24  of its text in "strg"

    /// Turns every number from `order` to the host's order, or back.
    void byteOrder(std::endian order)
    {
        turnFields(order, baseNote, gain, startRegion, sustainRegion, releaseRegion, instrumentId);
    }
    friend bool operator==(const CAFInstrumentFields&, const CAFInstrumentFields&) = default;
};
static_assert(sizeof(CAFInstrumentFields) == 28 && offsetof(CAFInstrumentFields, startRegion) == 12);

/// Published source: the published format description, version 1.0, Instrument chunk. Big-endian.
struct KT_EXPORT CAFInstrumentChunk : CAFInstrumentFields {
    /// Null for fewer than 28 bytes.
    static std::optional<CAFInstrumentChunk> read(BytesView body);
    /// The body of the chunk: what was read, with the changes since.
    Bytes write() const;
    friend bool operator==(const CAFInstrumentChunk&, const CAFInstrumentChunk&) = default;

    Bytes behind; // what follows the 28 bytes
};
