// The timing of a loop, read from its basic tagging chunk: the little that opening an audio file needs.
#pragma once

#include "platform/core/Bytes.h"

#include <cstdint>
#include <optional>
#include <string_view>

namespace tagging {

/// What a basic tagging chunk says of timing.
struct LoopTiming {
    std::int32_t beatCount = 0; // in the whole loop; 0 for none
    bool isLoop = false;        // else a sound that plays once
};

/// A time signature; zeros for none.
struct TimeSignature {
    std::int32_t top = 0;    // beats in a bar
    std::int32_t bottom = 0; // the note that is one beat
};

/// The timing in an AIFF "basc" chunk's body; null when the body is shorter than 82 bytes.
std::optional<LoopTiming> LoopTimingInAIFF(BytesView chunk);
/// The timing in the pairs after the UUID of a CAF basic tagging chunk; null without a count of beats. The pairs do
/// not tell loops: a sound with beats and a time signature is one.
std::optional<LoopTiming> LoopTimingInCAF(BytesView payload);

/// The number at the start of a text; 0 for none, the nearest 32-bit number for a larger one.
std::int32_t NumberAtStartOf(std::string_view text);
/// The same with 64 bits.
std::int64_t LongNumberAtStartOf(std::string_view text);
/// The signature of a text such as "6/8"; zeros when it is none.
TimeSignature TimeSignatureIn(std::string_view text);

} // namespace tagging
