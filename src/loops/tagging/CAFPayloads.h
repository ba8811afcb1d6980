// Payloads of the suite's chunks in CAF files: string pairs (also read here), transients, and data behind a UUID.
#pragma once

#include "loops/tagging/ChunkIDs.h"
#include "platform/core/Bytes.h"

#include <cstdint>
#include <functional>
#include <map>
#include <optional>
#include <string>
#include <string_view>

namespace tagging {
/// Texts in UTF-8. A text with a NUL ends there, as the pairs on disk do.
using StringPairs = std::map<std::string, std::string>;

/// Calls `visit` for each pair that the payload really holds, whatever its count claims; a text ends at its NUL, or
/// with the data. The texts may be anything without a NUL.
KT_EXPORT void ForEachCAFInfoString(BytesView payload,
                                    const std::function<void(std::string_view key, std::string_view value)>& visit);
} // namespace tagging

// Each returns null when memory is short.

/// Payload of the CAF "info" chunk (published format description, version 1.0, Information chunk): a big-endian
/// uint32 count, then key, NUL, value, NUL for each pair, in the dictionary's order.
KT_EXPORT std::optional<Bytes> CAFInfoStringsData(const tagging::StringPairs& strings);
/// The basic tagging UUID, then count and pairs in the same form.
KT_EXPORT std::optional<Bytes> CAFBasicUUIDChunkData(const tagging::StringPairs& strings);
/// The transients UUID, then 20 + 12 × count bytes: version 1, no percentage, no division, a record of type 1 for
/// each frame position, in the given order. A count below 0 counts as 0.
KT_EXPORT std::optional<Bytes> CAFTransientUUIDChunkData(const std::int64_t* positions, std::int64_t count);
/// The generative-instruments UUID, then the data.
KT_EXPORT std::optional<Bytes> CAFGenerativeInstrumentsUUIDChunkData(BytesView data);
/// The step-sequencer UUID, then the data.
KT_EXPORT std::optional<Bytes> CAFStepSequencerUUIDChunkData(BytesView data);
/// The event-sequence UUID, then the data. Kept: not the UUID of additional loop data, since existing readers rely on
/// it.
KT_EXPORT std::optional<Bytes> CAFAdditionalLoopDataUUIDChunkData(BytesView data);
