// The lanes of a waveform: which channels each one shows, and its name.
#pragma once

#include "audiofile/AudioFileInfo.h"

#include <optional>
#include <string>
#include <vector>

struct SoundLane {
    enum class Kind {
        channel, // one channel
        sum,     // average of all
        halves,  // stereo as in overviews: peaks of the left channel upwards, of the right one downwards
        folded,  // as in overviews: lowest and highest of all channels, zero included
    };
    Kind kind = Kind::folded;
    int channel = 0;        // counted from 0
    std::string label;      // "L", "LFE", "Ch 3"; empty for a single lane
    std::string lowerLabel; // of halves
};

/// The choice made with --channels; the default is the overview's own lane.
struct ChannelChoice {
    enum class Kind { overview, split, sum, one };
    Kind kind = Kind::overview;
    int number = 0; // of one channel, counted from 1
};

/// Parses "split", "sum" or a number from 1 on; none for any other text.
std::optional<ChannelChoice> channelChoiceFromText(const std::string& text);

/// The lanes from top to bottom. Throws Failure for a channel that does not exist.
std::vector<SoundLane> lanesOf(ChannelChoice choice, const AudioFileInfo& info);
