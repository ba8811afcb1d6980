// The identifiers of the suite's loop chunks: four-character codes in AIFF, 16-byte UUIDs within CAF "uuid" chunks.
#pragma once

#include "platform/core/Export.h"
#include "platform/core/FourCC.h"

#include <cstdint>

namespace tagging {

using UUIDBytes = std::uint8_t[16];
inline constexpr std::size_t kUUIDSize = sizeof(UUIDBytes);

inline constexpr FourCC kBasicTagging = fourCC("basc");
inline constexpr FourCC kCategories = fourCC("cate"); // in CAF part of the basic tagging dictionary
inline constexpr FourCC kTransients = fourCC("trns");
inline constexpr FourCC kChannelStrip0 = fourCC("CHST");
inline constexpr FourCC kChannelStrip1 = fourCC("CHSU");
inline constexpr FourCC kChannelStrip2 = fourCC("CHSV");
inline constexpr FourCC kPatch = fourCC("PTCH");
inline constexpr FourCC kGenerativeInstrument = fourCC("genI");
inline constexpr FourCC kEventSequence = fourCC("Sequ");
inline constexpr FourCC kAdditionalLoopData = fourCC("adLD");
inline constexpr FourCC kStepSequencer = fourCC("StSq");
inline constexpr FourCC kMIDIFile = fourCC(".mid");
inline constexpr FourCC kSilence = 0; // in CAF only
inline constexpr FourCC kCAFMIDIChunk = fourCC("midi");
inline constexpr FourCC kCAFUUIDChunk = fourCC("uuid");

/// The UUID of the silence chunk, which has no AIFF identifier.
KT_EXPORT extern const UUIDBytes kSilenceUUID;

} // namespace tagging

/// The UUID under which the chunk travels in CAF; null for an id without one ("cate", ".mid" and 0 among them).
KT_EXPORT const tagging::UUIDBytes* chunkIDToCafChunkUUID(std::uint32_t chunkID);
/// The AIFF id of a UUID; 0 for null, for an unknown UUID, and for that of the silence chunk.
KT_EXPORT std::uint32_t cafChunkUUIDToChunkID(const tagging::UUIDBytes* uuid);
/// All 16 bytes; two nulls are equal, one is not.
KT_EXPORT bool UUIDIsEqual(const std::uint8_t* a, const std::uint8_t* b);
