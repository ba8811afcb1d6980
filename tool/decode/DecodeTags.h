// The loop tags of a file that is decoded, and what else it holds beside the sound.
#pragma once

#include "loops/tags/LoopTagsCopy.h"
#include "tool/decode/DecodeFormat.h"

#include <memory>
#include <span>
#include <string>
#include <vector>

/// What became of them, in words.
struct CarriedTags {
    std::vector<std::string> keys;    // as they are called in JSON; empty when there are none
    std::vector<std::string> notKept; // why some or all are missing
};

/// Reads them while the file may be read.
class DecodeTags {
public:
    explicit DecodeTags(const std::string& path);

    /// That chunks of these ids are not told of: others carry them over.
    void forget(std::span<const FourCC> ids);
    /// The same of texts about the file, when it is no loop.
    void forgetTexts();
    /// Whether carryTo will put the texts about the file (title, artist and so on) into the output.
    bool carriesTexts(const std::string& container, bool isWhole) const;
    /// The same of the genre, which of a loop is one of its tags.
    bool carriesGenre(const std::string& container, bool isWhole) const;

    /// Puts them into the decoded file, the transients at the frames that they have at another rate; `isWhole` tells
    /// whether all of the sound is there, for what the tags say is true of all of it only. An empty path stands for an
    /// output that cannot be gone back to.
    CarriedTags carryTo(const std::string& output, const std::string& container, const DecodedSound& sound,
                        double sourceRate, bool isWhole);

private:
    void leaveWhatMakesNoLoop(const std::string& container);
    void scaleTransients(double factor);

    std::shared_ptr<LoopSource> source_; // null: no tags
    std::vector<std::string> others_;    // chunks that are neither tags nor sound, nor made from the sound
    std::string problem_;                // why they could not be read
};
