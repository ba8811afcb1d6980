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
    FourCC id = 0; // of the chunk; of a LIST its form
    Bytes body;    // as in the file
};

/// A value, and the id of the chunk that it comes from (for a LIST its form).
template <class T>
struct SamplerTagValue {
    T value{};         // the value
    FourCC source = 0; // the chunk's id
};

/// What those chunks say, each value at most once.
struct KT_EXPORT SamplerTags {
    /// A part of the sound that is played again and again; both frames are played.
    struct Loop {
        /// How it is played.
        enum class Kind : std::uint8_t { forward, alternating, backward, other };
        std::uint64_t firstFrame = 0; // of the whole sound
        std::uint64_t lastFrame = 0;  // it is played, too
        Kind kind = Kind::forward;    // how it is played
        std::uint32_t playCount = 0;  // 0: until it is released
        FourCC source = 0;            // the chunk's id
    };

    /// A point in the sound, ahead of a frame, or the range that begins there.
    struct Marker {
        std::uint64_t frame = 0;  // the point is ahead of this frame
        std::uint64_t frames = 0; // of a range, else 0
        std::string name;         // UTF-8
        FourCC source = 0;        // the chunk's id
    };

    /// A text about the sound, in UTF-8.
    struct Text {
        /// What the text is.
        enum class Kind : std::uint8_t { title, artist, copyright, comments, genre };
        Kind kind;         // what the text is
        std::string text;  // never empty
        FourCC source = 0; // the chunk's id
    };

    std::optional<SamplerTagValue<bool>> isLoop;                  // false: a sound that is played once
    std::optional<SamplerTagValue<double>> tempo;                 // in beats per minute
    std::optional<SamplerTagValue<std::int64_t>> beats;           // above 0
    std::optional<SamplerTagValue<std::int64_t>> rootNote;        // MIDI, 1 to 127, 60 = middle C
    std::optional<SamplerTagValue<std::int64_t>> signatureTop;    // beats in a bar
    std::optional<SamplerTagValue<std::int64_t>> signatureBottom; // the note that is one beat
    std::vector<Loop> loops;                                      // in the order of the file
    std::vector<Marker> markers;                                  // in the order of the file
    std::vector<Text> texts;                                      // one of a kind

    /// Reads the chunks of an open file: WAVE of every kind, AIFF and AIFC; others have none. 0, or the status of a
    /// failed read. Takes a read for each of those chunks that does not lie beside the others.
    static std::int32_t read(platform::AudioFile& file, SamplerTags& tags);
    /// Reads chunks as they are in a file; a damaged one says nothing. Where two disagree, "acid" counts before
    /// "smpl", that before "inst", and those before texts; of several chunks of a kind the first counts.
    static SamplerTags of(std::span<const SamplerTagChunk> chunks, std::endian order = std::endian::little);

    /// Whether a sound of so many frames is a loop: as "acid" says or, without it, if a sampler's loop spans it from
    /// end to end. A loop in its midst only sustains a held note.
    bool describeLoop(std::uint64_t frames) const;
};

/// The chunks of an open file that SamplerTags are read from, the most reliable first. 0, or the status of a failed
/// read.
KT_EXPORT std::int32_t readSamplerTagChunks(platform::AudioFile& file, std::vector<SamplerTagChunk>& chunks);
