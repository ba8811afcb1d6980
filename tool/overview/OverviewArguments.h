// The arguments of `ktfiles overview`.
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
    std::string png, svg; // paths of outputs; empty: none
    std::string sheet;    // path for the pictures of all files together
    std::optional<int> columns;
    PictureSettings picture;
    PictureColors colors = defaultColors();
    std::string data; // path of audiowaveform's data; empty: none
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
    /// Whether standard output carries only the picture or the data.
    bool takesOutput() const { return png == "-" || svg == "-" || data == "-"; }
};

/// Declares the verb's options and files. The arguments must outlive the parsing.
void declareArguments(Verb& verb, OverviewArguments& arguments);

/// Checks combinations of options that the parser cannot check. Throws UsageError.
void requireSense(const OverviewArguments& arguments, const Verb& verb, const OutputOptions& output);
