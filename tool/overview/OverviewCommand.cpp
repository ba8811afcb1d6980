// ktfiles overview: waveforms as sparklines, numbers and pictures, and stored in the files.
#include "tool/overview/OverviewReport.h"
#include "tool/overview/OverviewStore.h"
#include "tool/overview/PNGPicture.h"
#include "tool/overview/SVGPicture.h"
#include "tool/shared/access/FileAccess.h"
#include "tool/shared/arguments/CommandLine.h"
#include "tool/shared/arguments/SoundRange.h"
#include "tool/shared/arguments/ThreadsOption.h"
#include "tool/shared/edits/OutputFile.h"
#include "tool/shared/input/FileByFile.h"
#include "tool/shared/input/FileVersion.h"
#include "tool/shared/output/ClockTime.h"
#include "tool/shared/output/Failure.h"

#include <filesystem>
#include <unistd.h>

namespace {

constexpr std::pair kWidths{16, 16384};
constexpr std::pair kHeights{8, 4096};

struct OverviewArguments {
    FileArguments files;
    std::string png, svg;
    PictureSettings picture;
    SoundLength start;
    std::optional<SoundLength> end, frames;
    PictureColors colors = defaultColors();
    OutputFile::Existing existing = OutputFile::Existing::refuse;
    bool fromStored = false;
    bool store = false;
    unsigned threads = 0;
    EditOptions edit;

    bool draws() const { return !png.empty() || !svg.empty(); }
};

void writePicture(const std::string& out, const std::string& path, OutputFile::Existing existing,
                  const std::string& bytes)
{
    if (out != "-") {
        writeOutputFile(out, path, existing, [&](const Sink& sink) { sink(bytes); });
        return;
    }
    Output::standard().write(bytes);
    if (!Output::standard().flush())
        throw Failure("the picture could not be written whole");
}

void drawPictures(const std::string& path, const Waveform& waveform, const OverviewArguments& arguments)
{
    PictureSettings settings = arguments.picture;
    const double rate = waveform.sampleRate;
    const std::uint64_t start = arguments.start.at(rate);
    settings.start = static_cast<double>(start) / rate;
    if (settings.start >= waveform.seconds())
        throw Failure(fmt::format("ends at {}, ahead of the start of the picture", durationText(waveform.seconds())));
    if (arguments.end)
        settings.end = static_cast<double>(arguments.end->at(rate)) / rate;
    if (arguments.frames)
        settings.end = static_cast<double>(start) / rate + static_cast<double>(arguments.frames->at(rate)) / rate;
    if (settings.end <= settings.start)
        throw Failure("there is nothing between the start and the end of the picture");
    const WaveformPicture picture = pictureOf(waveform, settings);
    if (!arguments.png.empty())
        writePicture(arguments.png, path, arguments.existing, pngOf(picture, arguments.colors));
    if (!arguments.svg.empty())
        writePicture(arguments.svg, path, arguments.existing,
                     svgOf(picture, arguments.colors, std::filesystem::path(path).filename().string()));
}

// Ahead of the reading, which may take minutes. One that is the file itself is refused later, whatever is asked for.
void requireFreeNames(const std::string& path, const OverviewArguments& arguments)
{
    std::error_code error;
    for (const std::string& out : {arguments.png, arguments.svg})
        if (!out.empty() && out != "-" && !std::filesystem::equivalent(out, path, error))
            requireFreeName(out, arguments.existing);
}

// An overview, and the file as it was before it was read.
struct Reading {
    FileOverview overview;
    FileVersion version;
};

Reading readOverview(const std::string& path, const OverviewArguments& arguments)
{
    requireFreeNames(path, arguments);
    const FileAccess access = accessForReading(path, arguments.edit.waiting());
    const FileVersion version = versionOf(path);
    if (arguments.store)
        requireRoomForOverview(path);
    const bool showsProgress = !arguments.edit.quiet && !arguments.files.maybeSeveral();
    return {arguments.fromStored ? FileOverview::stored(path) : FileOverview::computed(path, showsProgress), version};
}

// Files are edited one by one. What was changed meanwhile, if only by the edit of another of its names, is read again.
StoreResult store(const std::string& path, Reading& reading, const OverviewArguments& arguments)
{
    SafeEdit edit(path, arguments.edit);
    if (versionOf(path) != reading.version)
        reading.overview = FileOverview::computed(edit.target(), false);
    return storeOverview(edit, reading.overview, arguments.edit);
}

void tellOf(const std::string& path, Reading& reading, const OverviewArguments& arguments, OverviewReport& report)
{
    OverviewDeeds deeds{.png = arguments.png,
                        .svg = arguments.svg,
                        .width = arguments.picture.width,
                        .height = arguments.picture.height,
                        .store = {},
                        .dryRun = arguments.edit.dryRun};
    if (!reading.overview.note().empty() && !arguments.edit.quiet) {
        Output::standard().flush();
        reportFailure(path, reading.overview.note());
    }
    if (arguments.draws())
        drawPictures(path, reading.overview.waveform(), arguments);
    if (arguments.store)
        deeds.store = store(path, reading, arguments);
    report.add(path, reading.overview, deeds);
}

// What the parser cannot see: options that make sense only together, or not together.
void requireSense(const OverviewArguments& arguments, const Verb& verb, const OutputOptions& output)
{
    const auto given = [&verb](const char* option) { return verb.isGiven(option); };
    if (arguments.draws() && arguments.files.maybeSeveral())
        throw UsageError("--png and --svg draw one file at a time");
    if (!arguments.draws())
        for (const char* const option :
             {"--width", "--height", "--start", "--end", "--frames", "--colors", "--scale", "--force"})
            if (given(option))
                throw UsageError(std::string(option) + " is about a picture: --png or --svg says where to");
    if (!arguments.store)
        for (const char* const option : {"--in-place", "--dry-run", "--backup", "--keep-times", "--timeout"})
            if (given(option))
                throw UsageError(std::string(option) + " is about --store");
    if (arguments.store && arguments.fromStored)
        throw UsageError("--store computes the overview, --stored does not");
    requireOrder(arguments.start, arguments.end);
    if (arguments.draws() && arguments.png == arguments.svg)
        throw UsageError("--png and --svg name the same file");
    const bool toOutput = arguments.png == "-" || arguments.svg == "-";
    if (toOutput && output.wantsJson())
        throw UsageError("JSON and a picture cannot both go to standard output");
    if (arguments.png == "-" && isTerminal(STDOUT_FILENO))
        throw UsageError("a PNG does not go to a terminal: name a file");
}

bool runOverview(OverviewArguments& arguments, const Verb& verb, OutputOptions output)
{
    requireSense(arguments, verb, output);
    arguments.edit.quiet = output.quiet;
    arguments.files.takesFolders = !arguments.store;
    if (arguments.png == "-" || arguments.svg == "-") // nothing but the picture
        output.quiet = true;
    OverviewReport report(output, arguments.files);
    const bool good = forEachFile(
        arguments.files, {.threads = arguments.threads, .quiet = output.quiet},
        [&](const FoundFile& file) -> FileRest {
            const auto reading = std::make_shared<Reading>(readOverview(file.path, arguments));
            return [&, path = file.path, reading] { tellOf(path, *reading, arguments, report); };
        },
        [&](const std::string& path, const std::string& text) { report.addFailure(path, text); });
    report.finish();
    return good;
}

void addSize(Verb& verb, const std::string& name, int& pixels, std::pair<int, int> range)
{
    verb.addNumber(name, pixels, range,
                   fmt::format("Its size in pixels, {} to {}; else {}", range.first, range.second, pixels));
}

void addPictureOptions(Verb& verb, OverviewArguments& arguments)
{
    CommandLine::addPath(verb, "--png", arguments.png, "Draw a PNG; \"-\" is standard output").label("OUT");
    CommandLine::addPath(verb, "--svg", arguments.svg, "Draw an SVG; \"-\" is standard output").label("OUT");
    CommandLine::addForceOption(verb, arguments.existing);
    addSize(verb, "--width", arguments.picture.width, kWidths);
    addSize(verb, "--height", arguments.picture.height, kHeights);
    addSoundRange(verb, {.start = [&arguments](const SoundLength& start) { arguments.start = start; },
                         .end = [&arguments](const SoundLength& end) { arguments.end = end; },
                         .frames = [&arguments](const SoundLength& frames) { arguments.frames = frames; }});
    verb.addFlag("--scale", arguments.picture.scale, "Show a scale of the amplitude, in decibels");
    const auto takeColors = [&arguments](const std::string& text) {
        arguments.colors = colorsFromText(text).value_or(arguments.colors);
    };
    const auto problem = [](const std::string& text) {
        return colorsFromText(text) ? ""
                                    : "\"" + printable(text) + "\" is neither WAVE,BACKGROUND[,AXIS], as in " +
                                          "1f6feb,ffffff, nor one of " + themeNames();
    };
    verb.addText("--colors", takeColors,
                 "WAVE,BACKGROUND[,AXIS] as RRGGBB, the background also none; or one of: " + themeNames(), problem)
        .label("COLORS");
}

void declareOverview(CommandLine& commandLine)
{
    static OverviewArguments arguments;
    static Verb* verb = nullptr;
    verb = &commandLine.addVerb("overview", "Show waveforms: in the terminal, as numbers, as a PNG or SVG; store them",
                                [&commandLine] { return runOverview(arguments, *verb, commandLine.output()); });
    CommandLine::addFiles(*verb, arguments.files);
    addThreads(*verb, arguments.threads);
    addPictureOptions(*verb, arguments);
    verb->addFlag("--stored", arguments.fromStored, "Take the overview that is stored in the file, not the sound");
    verb->addFlag("--store", arguments.store, "Store the overview in the file");
    CommandLine::addEditOptions(*verb, arguments.edit);
}

const VerbRegistration registration{50, declareOverview};

} // namespace
