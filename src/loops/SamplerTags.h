// What the published chunks of WAVE and AIFF files say about a loop: "acid", "smpl", "inst", "cue ", LIST "INFO" and
// "adtl"; "MARK", "INST" and the text chunks of AIFF. Each value with the chunk that it comes from. The layouts are in
// audiofile/metadata/; the loop chunks of this library are not among them (VireoLoopChunksManager).
#pragma once

#include "platform/core/Bytes.h"
#include "platform/core/Export.h"
#include "platform/core/FourCC.h"

#include <bit>
#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <vector>

namespace platform {
class AudioFile;
}

/// The body of one of those chunks.
struct SamplerTagChunk {
    FourCC id = 0;
    Bytes body;
};

/// A value and the chunk that it comes from, by its id; of a LIST by its form.
template <class T>
struct SamplerTagValue {
    T value{};
    FourCC source = 0;
};

struct KT_EXPORT SamplerTags {
    /// A part of the sound that is played again and again; both frames are played.
    struct Loop {
        enum class Kind : std::uint8_t { forward, alternating, backward, other };
        std::uint64_t firstFrame = 0;
        std::uint64_t lastFrame = 0;
        Kind kind = Kind::forward;
        std::uint32_t playCount = 0; // 0: until it is released
        FourCC source = 0;
    };

    /// A point in the sound, ahead of a frame, or the range that begins there.
    struct Marker {
        std::uint64_t frame = 0;
        std::uint64_t frames = 0; // of a range, else 0
        std::string name;         // UTF-8
        FourCC source = 0;
    };

    /// A text about the sound, in UTF-8.
    struct Text {
        enum class Kind : std::uint8_t { title, artist, copyright, comments, genre };
        Kind kind;
        std::string text; // never empty
        FourCC source = 0;
    };

    std::optional<SamplerTagValue<bool>> isLoop;           // false: a sound that is played once
    std::optional<SamplerTagValue<double>> tempo;          // in beats per minute
    std::optional<SamplerTagValue<std::int64_t>> beats;    // above 0
    std::optional<SamplerTagValue<std::int64_t>> rootNote; // MIDI, 1 to 127, 60 = middle C
    std::optional<SamplerTagValue<std::int64_t>> signatureTop;
    std::optional<SamplerTagValue<std::int64_t>> signatureBottom;
    std::vector<Loop> loops;
    std::vector<Marker> markers; // in the order of the file
    std::vector<Text> texts;     // one of a kind

    /// Of an open file: WAVE of every kind, AIFF and AIFC; others have none. 0, or the status of a read that failed.
    /// Costs a read for each of those chunks that does not lie beside the others.
    static std::int32_t read(platform::AudioFile& file, SamplerTags& tags);
    /// Of chunks, as they were found in a file. What is damaged says nothing. Where two disagree, "acid" is heard ahead
    /// of "smpl", that ahead of "inst", and those ahead of texts; of several chunks of a kind the first.
    static SamplerTags of(std::span<const SamplerTagChunk> chunks, std::endian order = std::endian::little);

    /// Whether a sound of so many frames is a loop: what "acid" says, and where there is none, whether a loop of a
    /// sampler spans it from end to end. A loop in its midst is how a held note sounds on.
    bool describeLoop(std::uint64_t frames) const;
};

/// The chunks of an open file that SamplerTags are read from, in the order of their weight. 0, or the status of a read
/// that failed.
KT_EXPORT std::int32_t readSamplerTagChunks(platform::AudioFile& file, std::vector<SamplerTagChunk>& chunks);
