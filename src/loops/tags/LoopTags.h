// The loop tags of one file: what its loop chunks say in AIFF and CAF, and what the chunks of samplers say in WAVE
// and AIFF. LoopTagsEdit.h changes them.
#pragma once

#include "loops/SamplerTags.h"
#include "loops/VireoLoopChunksManager.h"
#include "platform/core/Error.h"
#include "platform/core/Value.h"

#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

class CAudioFileIO;

/// All tags as plain values; nothing of the file stays open.
struct KT_EXPORT LoopTags {
    /// A chunk that is carried uninterpreted.
    struct Chunk {
        std::string id;         // the AIFF id in both kinds of file; "silence" for the chunk without one
        std::uint32_t size = 0; // of its body, without a UUID, in bytes
    };

    FourCC fileType = 0;                        // "AIFF", "AIFC", "caff", "WAVE", "RIFX" or "W64f"
    double sampleRate = 0;                      // in Hz
    std::uint64_t frames = 0;                   // of the sound
    platform::Dictionary combined;              // under the VireoLoopCombinedTagsChunkData keys
    platform::Dictionary info;                  // under the VireoLoopFileInfoChunkData keys
    std::vector<VireoLoopTransient> transients; // in the order of the file
    std::vector<Chunk> chunks;                  // the chunks that are carried uninterpreted
    bool hasLoopChunks = false;                 // of this library's kind
    SamplerTags sampler;    // its values are in the dictionaries too, where the loop chunks have none
    double statedTempo = 0; // in beats per minute, if a chunk states it; else 0
    /// of the values of `sampler`: chunks by the names of tags
    std::map<std::string, std::string, std::less<>> sources;

    /// Each the number or text under a key of either dictionary; 0 or "" for none.
    std::int64_t number(std::string_view key) const;
    std::string text(std::string_view key) const;
    /// Beats per minute, as stated or from the beats; 0 when neither is known.
    double tempo() const;
    /// Whether there is a loop chunk, or the chunks of samplers describe a loop. Texts such as a title, which any
    /// file may have, make no loop.
    bool isLoop() const { return hasLoopChunks || sampler.describeLoop(frames); }
    bool isEmpty() const { return combined.empty() && info.empty() && transients.empty() && chunks.empty(); }
};

/// Reads everything known of a file as a loop, and only the sizes of chunks that are not interpreted. Null for a file
/// that cannot be read, and for one of another kind (LoopTagsError.h).
KT_EXPORT std::optional<LoopTags> readLoopTags(const platform::URLRef& file, platform::Error* error = nullptr);
/// The same of a file that is open and described (CAudioFileIO::Open), through its read cache.
KT_EXPORT std::optional<LoopTags> readLoopTags(CAudioFileIO& file, platform::Error* error = nullptr);
/// The same for edits: of AIFF and CAF files the loop chunks alone, of WAVE its own chunks.
KT_EXPORT std::optional<LoopTags> readOwnLoopTags(const platform::URLRef& file, platform::Error* error = nullptr);
/// Adds the values of `sampler` where the tags have none.
KT_EXPORT void addSamplerTags(LoopTags& tags, SamplerTags sampler);

/// Which files openLoopFile takes.
enum class LoopFiles { withLoopChunks, waveToo };
/// Opens a file that can hold loop chunks, or WAVE if that is wanted; null for others.
KT_EXPORT std::optional<VireoLoopChunksManager> openLoopFile(const platform::URLRef& file,
                                                             platform::AudioFile::Permission permission,
                                                             LoopFiles kinds = LoopFiles::withLoopChunks,
                                                             platform::Error* error = nullptr);
/// The chunks of an open file that hold loop tags or are carried, readable or not.
KT_EXPORT std::vector<LoopTags::Chunk> loopChunksOf(VireoLoopChunksManager& manager);

/// "AIFF", "CAF", "WAVE".
KT_EXPORT std::string loopContainerName(FourCC fileType);
/// "4/4"; empty unless both parts are there.
KT_EXPORT std::string loopSignature(const LoopTags& tags);

/// A tag by its name (LoopTagFields.h).
struct LoopTagValue {
    std::string name;      // as in LoopTagField
    platform::Value value; // a number, a text or a list
};
/// Whether a value means no tag: null, zero, an empty text, an empty list.
KT_EXPORT bool isAbsentLoopTag(const platform::Value& value);
/// All tags that are present, in the order of loopTagFields, then "tempo", which follows from others; without the
/// transients and the chunks.
KT_EXPORT std::vector<LoopTagValue> loopTagValues(const LoopTags& tags);
/// The same, after facts of the sound ("fileType", "containerName", "sampleRate", "frames", "durationSeconds"), and
/// with words for the numbers that have some ("key", "mode", "signature").
KT_EXPORT std::vector<LoopTagValue> loopTagRecord(const LoopTags& tags);
/// The chunk of each value: a sampler's chunk or else a loop chunk, by AIFF ids in both kinds of file; the texts of
/// CAF are in "info".
KT_EXPORT std::map<std::string, std::string, std::less<>> loopTagSources(const LoopTags& tags);
/// "forward", "alternating", "backward" or "other".
KT_EXPORT const char* loopKindName(SamplerTags::Loop::Kind kind);
