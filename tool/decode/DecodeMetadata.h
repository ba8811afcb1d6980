// The metadata that a decoded file keeps from its source: who recorded it and when, texts, markers, ADM.
#pragma once

#include "media/containers/ContainerTraits.h"
#include "tool/decode/BroadcastMetadata.h"
#include "tool/shared/portable/PortableTexts.h"

#include <span>
#include <string>
#include <vector>

struct KeptMetadata {
    Bytes chunks;                     // complete, for the output's header
    std::vector<std::string> names;   // of these chunks; of lists their forms
    bool hasTexts = false;            // there are texts about the file
    std::vector<FourCC> sourceIds;    // chunks of the source with nothing left to report
    std::vector<std::string> notKept; // what was dropped from others, in words
};

/// What the loop's tags will add to the output.
struct FollowingTags {
    bool texts = false; // title, artist, copyright and comments
    bool genre = false;
};

/// Reads the chunks of the source while it may be read; a source without chunks yields nothing.
class DecodeMetadata {
public:
    explicit DecodeMetadata(const std::string& path);

    /// For an output of the type, 0 for raw samples.
    KeptMetadata keptIn(FourCC fileType, SoundChange change, const DecodedSound& sound, FollowingTags following) const;

private:
    enum class Family { none, wave, aiff, caf };
    class Keeper;

    static Family familyOf(platform::ContainerKind kind);
    static std::span<const FourCC> chunksOf(Family family); // that are examined

    Family family_ = Family::none;
    std::endian order_ = std::endian::little;
    std::vector<HeldChunk> chunks_;
    std::vector<FourCC> lost_;    // of chunks that are incomplete or too long
    int bits_ = 0, channels_ = 0; // of the source
    bool isFloat_ = false, isLinearPCM_ = false;
};
