#include "tool/overview/OverviewArguments.h"

#include "tool/overview/ContactSheet.h"
#include "tool/shared/arguments/SoundRange.h"
#include "tool/shared/arguments/ThreadsOption.h"

#include <charconv>
#include <cmath>
#include <unistd.h>

namespace {

constexpr std::pair kWidths{16, 16384};
constexpr std::pair kHeights{8, 4096};
constexpr std::pair kColumns{1, 1000};
constexpr std::pair kScaleFactors{1, 4};
constexpr double kMostGain = 120; // decibels
constexpr std::pair kFramesPerPoint{1, 1 << 24};

void addSize(Verb& verb, const std::string& name, int& pixels, std::pair<int, int> range)
{
    verb.addNumber(name, pixels, range,
                   fmt::format("Its size in pixels, {} to {}; else {}", range.first, range.second, pixels));
}

// "auto" is a gain to be determined; none for an invalid text.
std::optional<std::optional<double>> gainFromText(const std::string& text)
{
    if (text == "auto")
        return std::optional<double>();
    double gain = 0;
    const std::size_t sign = text.starts_with('+') ? 1 : 0;
    const auto [end, error] = std::from_chars(text.data() + sign, text.data() + text.size(), gain);
    if (error != std::errc() || end != text.data() + text.size() || !(std::abs(gain) <= kMostGain))
        return std::nullopt;
    return std::optional(gain);
}

void addGain(Verb& verb, std::optional<double>& gain)
{
    verb.addText(
            "--gain",
            [&gain](const std::string& text) {
                if (const auto parsed = gainFromText(text))
                    gain = *parsed;
            },
            "Draw the wave higher by so many decibels; auto: so high that its peak is at full scale",
            [](const std::string& text) {
                return gainFromText(text) ? ""
                                          : "\"" + printable(text) + "\" is neither auto nor decibels, -120 to 120";
            })
        .label("DB");
}

void addPictureOptions(Verb& verb, OverviewArguments& arguments)
{
    CommandLine::addPath(verb, "--png", arguments.png, "Draw a PNG; \"-\" is standard output").label("OUT");
    CommandLine::addPath(verb, "--svg", arguments.svg, "Draw an SVG; \"-\" is standard output").label("OUT");
    CommandLine::addPath(
        verb, "--sheet", arguments.sheet,
        "Draw all files on one sheet, a PNG or SVG by its name; --width and --height are those of each")
        .label("OUT");
    verb.addNumber("--columns", arguments.columns, kColumns, "Pictures side by side on the sheet");
    CommandLine::addForceOption(verb, arguments.existing);
    addSize(verb, "--width", arguments.picture.width, kWidths);
    addSize(verb, "--height", arguments.picture.height, kHeights);
    verb.addNumber("--scale-factor", arguments.picture.scaleFactor, kScaleFactors,
                   "So many pixels for each of these: lines and letters are as much larger");
    addSoundRange(verb, {.start = [&arguments](const SoundLength& start) { arguments.start = start; },
                         .end = [&arguments](const SoundLength& end) { arguments.end = end; },
                         .frames = [&arguments](const SoundLength& frames) { arguments.frames = frames; }});
    const auto takeChannels = [&arguments](const std::string& text) {
        arguments.channels = channelChoiceFromText(text).value_or(arguments.channels);
    };
    const auto channelsProblem = [](const std::string& text) {
        return channelChoiceFromText(text) ? "" : "\"" + printable(text) + "\" is neither split, sum nor a number";
    };
    verb.addText("--channels", takeChannels, "split: each by itself; sum: their average; or the number of one of them",
                 channelsProblem)
        .label("CHANNELS");
    addGain(verb, arguments.picture.gain);
    verb.addFlag("--scale", arguments.picture.scale, "Show a scale of the amplitude, in decibels");
    const auto takeColors = [&arguments](const std::string& text) {
        arguments.colors = colorsFromText(text).value_or(arguments.colors);
    };
    const auto colorsProblem = [](const std::string& text) {
        return colorsFromText(text)
                   ? ""
                   : "\"" + printable(text) + "\" is neither WAVE,BACKGROUND[,AXIS[,CLIPPING]], as in " +
                         "1f6feb,ffffff, nor one of " + themeNames();
    };
    verb.addText("--colors", takeColors,
                 "WAVE,BACKGROUND[,AXIS[,CLIPPING]] as RRGGBB, the background also none; or one of: " + themeNames(),
                 colorsProblem)
        .label("COLORS");
}

void addDataOptions(Verb& verb, OverviewArguments& arguments)
{
    static std::string format;
    verb.addText("--format", format, "audiowaveform: write waveform data as its players read it, version 2, 8 bits",
                 [](const std::string& text) {
                     return text == "audiowaveform" ? "" : "\"" + printable(text) + "\" is not audiowaveform";
                 })
        .label("FORMAT");
    CommandLine::addPath(verb, "-o,--output", arguments.data,
                         "Where --format writes to: a name that ends with .json or .dat; \"-\" is JSON")
        .label("OUT");
    verb.addNumber("--frames-per-point", arguments.framesPerPoint, kFramesPerPoint,
                   "Sample frames for each point of the data; else 256");
}

void requireNothingElseGiven(const Verb& verb, std::initializer_list<const char*> options, const std::string& why)
{
    for (const char* const option : options)
        if (verb.isGiven(option))
            throw UsageError(option + why);
}

void requireSenseOfData(const OverviewArguments& arguments, const Verb& verb)
{
    if (verb.isGiven("--format") != !arguments.data.empty())
        throw UsageError(verb.isGiven("--format") ? "--format needs --output, which says where to"
                                                  : "--output needs --format, which says what to write");
    if (arguments.data.empty()) {
        requireNothingElseGiven(verb, {"--frames-per-point"}, " is about --format");
        return;
    }
    if (!audiowaveformFormatOf(arguments.data))
        throw UsageError("the name of the output ends with .json or .dat, which says what to write");
    if (arguments.files.maybeSeveral())
        throw UsageError("--format writes of one file at a time");
    if (arguments.fromStored)
        throw UsageError("--format is made of the sound, not of --stored");
}

} // namespace

void declareArguments(Verb& verb, OverviewArguments& arguments)
{
    CommandLine::addFilesOrInput(verb, arguments.files);
    addThreads(verb, arguments.threads);
    addPictureOptions(verb, arguments);
    addDataOptions(verb, arguments);
    verb.addFlag("--stored", arguments.fromStored, "Take the overview that is stored in the file, not the sound");
    verb.addFlag("--store", arguments.store, "Store the overview in the file");
    CommandLine::addEditOptions(verb, arguments.edit);
}

void requireSense(const OverviewArguments& arguments, const Verb& verb, const OutputOptions& output)
{
    const bool drawsOne = !arguments.png.empty() || !arguments.svg.empty();
    if (drawsOne && arguments.files.maybeSeveral())
        throw UsageError("--png and --svg draw one file at a time; --sheet draws them all");
    if (drawsOne && !arguments.sheet.empty())
        throw UsageError("--sheet draws all files, --png and --svg one");
    if (!arguments.sheet.empty() && !sheetFormatOf(arguments.sheet))
        throw UsageError("the name of a sheet ends with .png or .svg, which says what to write");
    if (arguments.sheet.empty())
        requireNothingElseGiven(verb, {"--columns"}, " is about --sheet");
    if (!arguments.draws())
        requireNothingElseGiven(verb, {"--width", "--height", "--colors", "--scale", "--scale-factor", "--gain"},
                                " is about a picture: --png, --svg or --sheet says where to");
    if (!arguments.writes())
        requireNothingElseGiven(verb, {"--start", "--end", "--frames", "--channels", "--force"},
                                " is about a picture or --format: --png, --svg, --sheet or --output says where to");
    if (!arguments.store)
        requireNothingElseGiven(verb, {"--in-place", "--dry-run", "--backup", "--keep-times", "--timeout"},
                                " is about --store");
    if (arguments.store && arguments.fromStored)
        throw UsageError("--store computes the overview, --stored does not");
    requireSenseOfData(arguments, verb);
    requireOrder(arguments.start, arguments.end);
    const std::string* const outputs[] = {&arguments.png, &arguments.svg, &arguments.data, &arguments.sheet};
    for (std::size_t i = 0; i < std::size(outputs); ++i)
        for (std::size_t j = 0; j < i; ++j)
            if (!outputs[i]->empty() && *outputs[i] == *outputs[j])
                throw UsageError("two outputs have the same name");
    if (arguments.takesOutput() && output.wantsJson())
        throw UsageError("JSON and a picture cannot both go to standard output");
    if (arguments.png == "-" && isTerminal(STDOUT_FILENO))
        throw UsageError("a PNG does not go to a terminal: name a file");
}
