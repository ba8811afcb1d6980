// The lanes of a waveform: which channels of a sound each of them shows, and what it is called.
#pragma once

#include "audiofile/AudioFileInfo.h"

#include <optional>
#include <string>
#include <vector>

struct SoundLane {
    enum class Kind {
        channel, // one of them
        sum,     // the average of all
        halves,  // of stereo: the peak of the left one upwards, that of the right one downwards, as overviews have them
        folded,  // the lowest and the highest of all, zero included, as overviews have them
    };
    Kind kind = Kind::folded;
    int channel = 0;        // counted from 0
    std::string label;      // "L", "LFE", "Ch 3"; empty: there is nothing to tell apart
    std::string lowerLabel; // of halves
};

/// What is asked for with --channels; the overview's own lane when nothing is.
struct ChannelChoice {
    enum class Kind { overview, split, sum, one };
    Kind kind = Kind::overview;
    int number = 0; // of one, counted from 1
};

/// From "split", "sum" or a number from 1 on; none for another text.
std::optional<ChannelChoice> channelChoiceFromText(const std::string& text);

/// The lanes, top to bottom. Throws Failure for a channel that is not there.
std::vector<SoundLane> lanesOf(ChannelChoice choice, const AudioFileInfo& info);
