// The chunk "INST" of AIFF and AIFC files: how a sampler plays the sound, with loops between markers of "MARK". Page:
// docs/formats/aiff-metadata.md.
#pragma once

#include "audiofile/metadata/Records.h"
#include "platform/core/Export.h"

#include <cstddef>

/// A loop of "INST": 6 bytes.
struct AIFFLoop {
    /// How a loop is played.
    enum Mode : std::int16_t { kNone, kForward, kForwardBackward };

    Packed<std::int16_t> mode;        // 0  Mode
    Packed<std::int16_t> beginMarker; // 2  id of a marker: the first frame played follows it
    Packed<std::int16_t> endMarker;   // 4  id of a marker: the last frame played precedes it

    /// Turns every number from `order` to the host's order, or back.
    void byteOrder(std::endian order) { turnFields(order, mode, beginMarker, endMarker); }
    friend bool operator==(const AIFFLoop&, const AIFFLoop&) = default;
};
static_assert(sizeof(AIFFLoop) == 6);

/// These members, top to bottom, are the 20 bytes of "INST".
struct AIFFInstrumentFields {
    Packed<std::int8_t> baseNote;     //  0  at which the sound plays as recorded; MIDI, 0 to 127, 60 = middle C
    Packed<std::int8_t> detune;       //  1  cents, -50 to 50
    Packed<std::int8_t> lowNote;      //  2  0 to 127
    Packed<std::int8_t> highNote;     //  3  0 to 127
    Packed<std::int8_t> lowVelocity;  //  4  1 to 127
    Packed<std::int8_t> highVelocity; //  5  1 to 127
    Packed<std::int16_t> gain;        //  6  dB
    AIFFLoop sustainLoop;             //  8  while the note is held
    AIFFLoop releaseLoop;             // 14  afterwards

    /// Turns every number from `order` to the host's order, or back.
    void byteOrder(std::endian order)
    {
        turnFields(order, gain);
        sustainLoop.byteOrder(order);
        releaseLoop.byteOrder(order);
    }
    friend bool operator==(const AIFFInstrumentFields&, const AIFFInstrumentFields&) = default;
};
static_assert(sizeof(AIFFInstrumentFields) == 20 && offsetof(AIFFInstrumentFields, releaseLoop) == 14);

/// Published source: Audio Interchange File Format AIFF-C, Instrument Chunk. Big-endian.
struct KT_EXPORT AIFFInstrumentChunk : AIFFInstrumentFields {
    /// Null for fewer than 20 bytes.
    static std::optional<AIFFInstrumentChunk> read(BytesView body);
    /// The body of the chunk: what was read, with the changes since.
    Bytes write() const;
    friend bool operator==(const AIFFInstrumentChunk&, const AIFFInstrumentChunk&) = default;

    Bytes behind; // what follows the 20 bytes
};
