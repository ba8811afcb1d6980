// What `ktfiles overview` is asked for.
#pragma once

#include "tool/overview/Audiowaveform.h"
#include "tool/overview/PictureColors.h"
#include "tool/overview/SoundLanes.h"
#include "tool/overview/WaveformPicture.h"
#include "tool/shared/arguments/CommandLine.h"
#include "tool/shared/output/ClockTime.h"

#include <optional>
#include <string>

struct OverviewArguments {
    FileArguments files;
    std::string png, svg; // where to; empty: none is drawn
    std::string sheet;    // where the pictures of all files go together
    std::optional<int> columns;
    PictureSettings picture;
    PictureColors colors = defaultColors();
    std::string data; // where audiowaveform's data goes; empty: nowhere
    std::int32_t framesPerPoint = 256;
    ChannelChoice channels;
    SoundLength start;
    std::optional<SoundLength> end, frames;
    OutputFile::Existing existing = OutputFile::Existing::refuse;
    bool fromStored = false;
    bool store = false;
    unsigned threads = 0;
    EditOptions edit;

    bool draws() const { return !png.empty() || !svg.empty() || !sheet.empty(); }
    bool writes() const { return draws() || !data.empty(); }
    /// Whether standard output is the picture or the data, and nothing else.
    bool takesOutput() const { return png == "-" || svg == "-" || data == "-"; }
};

/// The options and the files of the verb. The arguments must outlive the parsing.
void declareArguments(Verb& verb, OverviewArguments& arguments);

/// What the parser cannot see: options that make sense only together, or not together. Throws UsageError.
void requireSense(const OverviewArguments& arguments, const Verb& verb, const OutputOptions& output);
