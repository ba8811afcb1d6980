// The identifiers of the suite's loop chunks: four-character codes in AIFF, 16-byte UUIDs within CAF "uuid" chunks.
#pragma once

#include "platform/core/Export.h"
#include "platform/core/FourCC.h"

#include <cstdint>

namespace tagging {

/// The 16 bytes of a UUID, in the order of its text.
using UUIDBytes = std::uint8_t[16];
inline constexpr std::size_t kUUIDSize = sizeof(UUIDBytes); // in bytes

inline constexpr FourCC kBasicTagging = fourCC("basc"); // tempo, key, signature, kind
/// instrument, genre, descriptors; in CAF part of the basic tagging dictionary
inline constexpr FourCC kCategories = fourCC("cate");
inline constexpr FourCC kTransients = fourCC("trns");           // positions of beats
inline constexpr FourCC kChannelStrip0 = fourCC("CHST");        // settings of the first channel strip
inline constexpr FourCC kChannelStrip1 = fourCC("CHSU");        // settings of the second
inline constexpr FourCC kChannelStrip2 = fourCC("CHSV");        // settings of the third
inline constexpr FourCC kPatch = fourCC("PTCH");                // an instrument's settings
inline constexpr FourCC kGenerativeInstrument = fourCC("genI"); // a generative instrument
inline constexpr FourCC kEventSequence = fourCC("Sequ");        // recorded events
inline constexpr FourCC kAdditionalLoopData = fourCC("adLD");   // additional loop data
inline constexpr FourCC kStepSequencer = fourCC("StSq");        // a step sequence
inline constexpr FourCC kMIDIFile = fourCC(".mid");             // a standard MIDI file
inline constexpr FourCC kSilence = 0;                           // in CAF only
inline constexpr FourCC kCAFMIDIChunk = fourCC("midi");         // carries a MIDI file in CAF
inline constexpr FourCC kCAFUUIDChunk = fourCC("uuid");         // carries every other chunk in CAF, behind its UUID

/// The UUID of the silence chunk, which has no AIFF identifier.
KT_EXPORT extern const UUIDBytes kSilenceUUID;

} // namespace tagging

/// The UUID of a chunk in CAF; null for an id without one ("cate", ".mid" and 0 among them).
KT_EXPORT const tagging::UUIDBytes* chunkIDToCafChunkUUID(std::uint32_t chunkID);
/// The AIFF id of a UUID; 0 for null, for an unknown UUID, and for that of the silence chunk.
KT_EXPORT std::uint32_t cafChunkUUIDToChunkID(const tagging::UUIDBytes* uuid);
/// Compares all 16 bytes; two nulls are equal, one is not.
KT_EXPORT bool UUIDIsEqual(const std::uint8_t* a, const std::uint8_t* b);
