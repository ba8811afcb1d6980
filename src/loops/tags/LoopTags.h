// The loop tags of one file: what its loop chunks say, if it is AIFF or CAF, and what the chunks of samplers say in
// WAVE and AIFF. LoopTagsEdit.h changes them.
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

/// Plain values; nothing of the file stays open.
struct KT_EXPORT LoopTags {
    /// A chunk that is carried without being interpreted. `size` is that of its body, without a UUID.
    struct Chunk {
        std::string id; // the AIFF id in either kind of file; "silence" for the chunk that has none
        std::uint32_t size = 0;
    };

    FourCC fileType = 0; // "AIFF", "AIFC", "caff", "WAVE", "RIFX" or "W64f"
    double sampleRate = 0;
    std::uint64_t frames = 0;
    platform::Dictionary combined; // under the VireoLoopCombinedTagsChunkData keys
    platform::Dictionary info;     // under the VireoLoopFileInfoChunkData keys
    std::vector<VireoLoopTransient> transients;
    std::vector<Chunk> chunks;
    bool hasLoopChunks = false; // of this library's kind
    SamplerTags sampler;        // what it says stands in the dictionaries too, where the loop chunks say nothing
    double statedTempo = 0;     // in beats per minute, of a chunk that says it
    std::map<std::string, std::string, std::less<>> sources; // of what it said: by the names of tags, its chunks

    /// The number or text under a key of either dictionary; 0 or "" when there is none.
    std::int64_t number(std::string_view key) const;
    std::string text(std::string_view key) const;
    /// Beats per minute, as stated, or from the beats; 0 when neither is known.
    double tempo() const;
    /// Whether any loop chunk is there, or the chunks of samplers describe a loop; texts such as a title, which any
    /// file may have, do not make one.
    bool isLoop() const { return hasLoopChunks || sampler.describeLoop(frames); }
    bool isEmpty() const { return combined.empty() && info.empty() && transients.empty() && chunks.empty(); }
};

/// Reads all that is known of a file as a loop, and of the chunks that are not interpreted only the sizes. None for a
/// file that cannot be read, and for one of another kind (LoopTagsError.h).
KT_EXPORT std::optional<LoopTags> readLoopTags(const platform::URLRef& file, platform::Error* error = nullptr);
/// The same for edits: of AIFF and CAF files the loop chunks alone, of WAVE what its own chunks say.
KT_EXPORT std::optional<LoopTags> readOwnLoopTags(const platform::URLRef& file, platform::Error* error = nullptr);
/// What `sampler` says, where the tags say nothing yet.
KT_EXPORT void addSamplerTags(LoopTags& tags, SamplerTags sampler);

/// What openLoopFile takes.
enum class LoopFiles { withLoopChunks, waveToo };
/// Opens a file that can hold loop chunks, or WAVE where that is asked for; none for another.
KT_EXPORT std::optional<VireoLoopChunksManager> openLoopFile(const platform::URLRef& file,
                                                             platform::AudioFile::Permission permission,
                                                             LoopFiles kinds = LoopFiles::withLoopChunks,
                                                             platform::Error* error = nullptr);
/// The chunks of an open file that hold loop tags or are carried, whether they can be read or not.
KT_EXPORT std::vector<LoopTags::Chunk> loopChunksOf(VireoLoopChunksManager& manager);

/// "AIFF", "CAF", "WAVE".
KT_EXPORT std::string loopContainerName(FourCC fileType);
/// "4/4"; empty unless both parts are there.
KT_EXPORT std::string loopSignature(const LoopTags& tags);

/// A tag by its name (LoopTagFields.h): a number, a text or a list.
struct LoopTagValue {
    std::string name;
    platform::Value value;
};
/// Null and zero, empty texts and empty lists are no tag.
KT_EXPORT bool isAbsentLoopTag(const platform::Value& value);
/// All tags that are present, in the order of loopTagFields, then "tempo", which follows from others; not the
/// transients and the chunks.
KT_EXPORT std::vector<LoopTagValue> loopTagValues(const LoopTags& tags);
/// The same with what is known of the sound first ("fileType", "containerName", "sampleRate", "frames",
/// "durationSeconds"), and words behind the numbers that stand for them ("key", "mode", "signature").
KT_EXPORT std::vector<LoopTagValue> loopTagRecord(const LoopTags& tags);
/// Of all values the chunk that says them: where no sampler's chunk does, a loop chunk. By the AIFF ids in either kind
/// of file, but for the texts of CAF, which stand in "info".
KT_EXPORT std::map<std::string, std::string, std::less<>> loopTagSources(const LoopTags& tags);
/// "forward", "alternating", "backward" or "other".
KT_EXPORT const char* loopKindName(SamplerTags::Loop::Kind kind);
