// What a decoded file keeps of what stands beside the sound in its source: who recorded it and when, texts, markers,
// ADM.
#pragma once

#include "media/containers/ContainerTraits.h"
#include "tool/decode/BroadcastMetadata.h"
#include "tool/shared/portable/PortableTexts.h"

#include <span>
#include <string>
#include <vector>

struct KeptMetadata {
    Bytes chunks;                     // for the header of the output, whole
    std::vector<std::string> names;   // of these: chunks, of lists their forms
    bool hasTexts = false;            // about the file
    std::vector<FourCC> sourceIds;    // chunks of the source of which nothing is left to tell
    std::vector<std::string> notKept; // what of others was left, in words
};

/// What the loop's tags bring into the output.
struct FollowingTags {
    bool texts = false; // title, artist, copyright and comments
    bool genre = false;
};

/// Reads the chunks of the source while that may be read; one that has none gives nothing.
class DecodeMetadata {
public:
    explicit DecodeMetadata(const std::string& path);

    /// For an output of the type, 0 for bare samples.
    KeptMetadata keptIn(FourCC fileType, SoundChange change, const DecodedSound& sound, FollowingTags following) const;

private:
    enum class Family { none, wave, aiff, caf };
    class Keeper;

    static Family familyOf(platform::ContainerKind kind);
    static std::span<const FourCC> chunksOf(Family family); // that are looked at

    Family family_ = Family::none;
    std::endian order_ = std::endian::little;
    std::vector<HeldChunk> chunks_;
    std::vector<FourCC> lost_;    // of those that are not all there, or too long
    int bits_ = 0, channels_ = 0; // of the source
    bool isFloat_ = false, isLinearPCM_ = false;
};
