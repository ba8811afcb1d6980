// What a file's basic tagging chunk says of the loop's timing: the little that opening an audio file asks for.
#pragma once

#include "platform/core/Bytes.h"

#include <cstdint>
#include <optional>
#include <string_view>

namespace tagging {

struct LoopTiming {
    std::int32_t beatCount = 0;
    bool isLoop = false;
};

struct TimeSignature {
    std::int32_t top = 0;
    std::int32_t bottom = 0;
};

/// From the body of an AIFF "basc" chunk; none when that is shorter than 82 bytes.
std::optional<LoopTiming> LoopTimingInAIFF(BytesView chunk);
/// From the pairs behind the UUID of a CAF basic tagging chunk; none without a count. The pairs do not say whether it
/// is a loop: one that has beats and a time signature is.
std::optional<LoopTiming> LoopTimingInCAF(BytesView payload);

/// The number that a text begins with; 0 when it begins with none, the nearest 32-bit number when it is larger.
std::int32_t NumberAtStartOf(std::string_view text);
/// The same with 64 bits.
std::int64_t LongNumberAtStartOf(std::string_view text);
/// Of a text such as "6/8"; zeros when it is none.
TimeSignature TimeSignatureIn(std::string_view text);

} // namespace tagging
