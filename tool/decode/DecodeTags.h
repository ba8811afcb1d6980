// Carries over the loop tags of a decoded file, and lists what else it holds beside the sound.
#pragma once

#include "loops/tags/LoopTagsCopy.h"
#include "tool/decode/DecodeFormat.h"

#include <memory>
#include <span>
#include <string>
#include <vector>

/// The outcome, in words.
struct CarriedTags {
    std::vector<std::string> keys;    // as named in JSON; empty if there are none
    std::vector<std::string> notKept; // reasons why tags are missing
};

/// Reads the tags while the file may be read.
class DecodeTags {
public:
    explicit DecodeTags(const std::string& path);

    /// Chunks with these ids are not listed, because others carry them over.
    void forget(std::span<const FourCC> ids);
    /// Texts about the file are not listed either, if it is no loop.
    void forgetTexts();
    /// Whether carryTo will write the texts about the file (title, artist and so on) to the output.
    bool carriesTexts(const std::string& container, bool isWhole) const;
    /// As above for the genre, which is a tag of a loop.
    bool carriesGenre(const std::string& container, bool isWhole) const;

    /// Writes the tags to the decoded file, transients at their frames at the new rate. `isWhole` says whether all of
    /// the sound is there; some tags are true only of all of it. An empty path stands for an output that cannot be
    /// rewound.
    CarriedTags carryTo(const std::string& output, const std::string& container, const DecodedSound& sound,
                        double sourceRate, bool isWhole);

private:
    void leaveWhatMakesNoLoop(const std::string& container);
    void scaleTransients(double factor);

    std::shared_ptr<LoopSource> source_; // null if there are no tags
    std::vector<std::string> others_;    // chunks that are neither tags nor sound nor derived from it
    std::string problem_;                // why the tags could not be read
};
