// The identifiers of the loop chunks, for the classes that move chunks in and out of files.
#pragma once

#include "loops/tagging/ChunkIDs.h"

/// The ids of the loop chunks (loops/tagging/ChunkIDs.h), by the names of their accessors.
class VireoLoopChunkIDHelper {
public:
    /// Each the id of the chunk that it names.
    static constexpr std::uint32_t silenceChunkID() { return tagging::kSilence; }
    static constexpr std::uint32_t basicTaggingChunkID() { return tagging::kBasicTagging; }
    static constexpr std::uint32_t categoriesChunkID() { return tagging::kCategories; }
    static constexpr std::uint32_t transientChunkID() { return tagging::kTransients; }
    static constexpr std::uint32_t channelStrip0ChunkID() { return tagging::kChannelStrip0; }
    static constexpr std::uint32_t channelStrip1ChunkID() { return tagging::kChannelStrip1; }
    static constexpr std::uint32_t channelStrip2ChunkID() { return tagging::kChannelStrip2; }
    static constexpr std::uint32_t patchChunkID() { return tagging::kPatch; }
    static constexpr std::uint32_t genInstChunkID() { return tagging::kGenerativeInstrument; }
    static constexpr std::uint32_t evSeqChunkID() { return tagging::kEventSequence; }
    static constexpr std::uint32_t midiFileID() { return tagging::kMIDIFile; }
    static constexpr std::uint32_t additionalChunkID() { return tagging::kAdditionalLoopData; }
    static constexpr std::uint32_t stepSeqChunkID() { return tagging::kStepSequencer; }
    static constexpr std::uint32_t cafUUIDChunkID() { return tagging::kCAFUUIDChunk; }

    /// The CAF chunk type that carries an AIFF chunk: "midi" for ".mid", "uuid" for every other.
    static constexpr std::uint32_t cafBaseChunkIDForChunkID(std::uint32_t chunkID)
    {
        return chunkID == tagging::kMIDIFile ? tagging::kCAFMIDIChunk : tagging::kCAFUUIDChunk;
    }
    /// The UUID of a chunk in CAF; null for an id without one.
    static const tagging::UUIDBytes* cafUUIDChunkIDForChunkID(std::uint32_t chunkID)
    {
        return chunkIDToCafChunkUUID(chunkID);
    }
    /// The UUID of the silence chunk, which has no id.
    static const tagging::UUIDBytes* cafSilenceUUIDChunkID() { return &tagging::kSilenceUUID; }
    /// `cafUUID:isEqualTo:`: compares all 16 bytes; two nulls are equal.
    static bool cafUUIDIsEqualTo(const std::uint8_t* a, const std::uint8_t* b) { return UUIDIsEqual(a, b); }
};
