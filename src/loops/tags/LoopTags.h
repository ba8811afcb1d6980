// The loop tags of one file, as the verbs show, compare and change them: of the loop chunks of AIFF and CAF files, and
// of what the chunks of samplers say in WAVE and AIFF.
#pragma once

#include "loops/SamplerTags.h"
#include "loops/VireoLoopChunksManager.h"
#include "platform/core/Value.h"
#include "tool/shared/output/Failure.h"

#include <cstdint>
#include <map>
#include <string>
#include <string_view>
#include <vector>

class JsonWriter;

/// Plain values; nothing of the file stays open.
struct LoopTags {
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

/// What openLoopFile takes.
enum class LoopFiles { withLoopChunks, waveToo };
/// Opens a file that can hold loop chunks, or WAVE where that is asked for; throws Failure, for another OtherKind.
VireoLoopChunksManager openLoopFile(const std::string& path, platform::AudioFile::Permission permission,
                                    LoopFiles kinds = LoopFiles::withLoopChunks);

/// Reads all that is known of a file as a loop, and of the chunks that are not interpreted only the sizes. Throws
/// Failure, for a file of another kind OtherKind.
LoopTags readLoopTags(const std::string& path);
/// The same for edits: of AIFF and CAF files the loop chunks alone, of WAVE what its own chunks say.
LoopTags readOwnLoopTags(const std::string& path);
/// What `sampler` says, where the tags say nothing yet.
void addSamplerTags(LoopTags& tags, SamplerTags sampler);

/// The chunks of an open file that hold loop tags or are carried, whether they can be read or not.
std::vector<LoopTags::Chunk> loopChunksOf(VireoLoopChunksManager& manager);

/// One tag in words: its name, its label for people, and the value.
struct TagLine {
    const char* name;
    const char* label;
    std::string text;   // in one line, as `tags set` takes it back
    std::string brief;  // for people
    std::string source; // the chunk that says it, where that is none of the loop chunks
};
/// What is known of the tags, in a musician's order.
std::vector<TagLine> tagLines(const LoopTags& tags);
using TagText = std::string (*)(const LoopTags& tags);
/// What gives the text of one tag, in one line, by its name, which must be one of theirs.
TagText tagTextCalled(std::string_view name);

/// The root note by its name, in whatever octave, and the mode.
std::string keyWords(const LoopTags& tags);

/// "AIFF", "CAF", "WAVE".
std::string loopContainerName(FourCC fileType);

/// A tag by the name that JSON has for it: a number, a text or a list.
struct TagValue {
    std::string name;
    platform::Value value;
};
/// The value under a key; null when there is none.
platform::Value valueUnder(const platform::Dictionary& values, const char* key);
/// Null and zero, empty texts and empty lists are no tag.
bool isAbsent(const platform::Value& value);
/// All tags that are present, in the order of output; not the transients and the chunks.
std::vector<TagValue> tagValues(const LoopTags& tags);
/// The same as records have them: what is known of the sound first, and words beside the numbers that stand for them.
std::vector<TagValue> tagRecord(const LoopTags& tags);
/// Of all values the chunk that says them: where no sampler's chunk does, a loop chunk. By the AIFF ids in either kind
/// of file, but for the texts of CAF, which stand in "info".
std::map<std::string, std::string, std::less<>> sourcesOf(const LoopTags& tags);
/// The whole JSON object, on one line.
void writeLoopTags(JsonWriter& json, const std::string& path, const LoopTags& tags);
