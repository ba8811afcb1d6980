// ktfiles overview: shows waveforms as sparklines, numbers and pictures, and stores them in the files.
#include "loops/overview/MDOverview.h"
#include "tool/overview/ContactSheet.h"
#include "tool/overview/DrawnSamples.h"
#include "tool/overview/OverviewArguments.h"
#include "tool/overview/OverviewReport.h"
#include "tool/overview/OverviewStore.h"
#include "tool/overview/PNGPicture.h"
#include "tool/overview/SVGPicture.h"
#include "tool/shared/access/FileAccess.h"
#include "tool/shared/input/FileByFile.h"
#include "tool/shared/input/FileVersion.h"
#include "tool/shared/output/Failure.h"
#include "tool/shared/output/Progress.h"

#include <filesystem>

namespace {

constexpr int kSheetWidth = 320, kSheetHeight = 110; // of each picture

// What is requested for one file, and what it requires.
struct Task {
    const OverviewArguments& arguments;
    bool needsPoints; // for the report on the file
};

// A file after reading.
struct Reading {
    FileOverview overview;
    FileVersion version;
    std::optional<WaveformPicture> picture = {};
};

FrameRange rangeIn(std::int64_t frames, double rate, const OverviewArguments& arguments)
{
    const auto within = [frames](std::uint64_t frame) {
        return static_cast<std::int64_t>(std::min(frame, static_cast<std::uint64_t>(frames)));
    };
    const std::uint64_t from = arguments.start.at(rate);
    FrameRange range{within(from), frames};
    if (range.from >= frames)
        throw Failure(fmt::format("ends at {}, ahead of the start that is asked for",
                                  durationText(static_cast<double>(frames) / rate)));
    if (arguments.end)
        range.to = within(arguments.end->at(rate));
    if (arguments.frames)
        range.to = range.from + std::min(within(arguments.frames->at(rate)), frames - range.from);
    if (range.to <= range.from)
        throw Failure("there is nothing between the start and the end that are asked for");
    return range;
}

void writeBytes(const std::string& out, const std::string& path, OutputFile::Existing existing,
                const std::function<void(const Sink&)>& produce)
{
    if (out != "-") {
        writeOutputFile(out, path, existing, produce);
        return;
    }
    produce([](std::string_view bytes) { Output::standard().write(bytes); });
    if (!Output::standard().flush())
        throw Failure("the output could not be written whole");
}

void writePictures(const std::string& path, const WaveformPicture& picture, const OverviewArguments& arguments)
{
    if (!arguments.png.empty())
        writeBytes(arguments.png, path, arguments.existing,
                   [&](const Sink& sink) { sink(pngOf(picture, arguments.colors)); });
    if (!arguments.svg.empty())
        writeBytes(arguments.svg, path, arguments.existing, [&](const Sink& sink) {
            sink(svgOf(picture, arguments.colors, shownName(std::filesystem::path(path).filename().string())));
        });
}

void requireFewChannels(const SoundReader& sound)
{
    if (sound.info().channels > MDOverview::kMostChannels)
        throw Failure(fmt::format("has {} channels; an overview folds {} at most", sound.info().channels,
                                  MDOverview::kMostChannels));
}

// From the stored overview if that is requested and it is fine enough, else from the samples.
WaveformPicture pictureOfFile(const std::string& path, SoundReader* sound, const FileOverview* stored,
                              const OverviewArguments& arguments, bool showsProgress)
{
    const AudioFileInfo& info = stored != nullptr ? stored->info() : sound->info();
    const std::int64_t frames = stored != nullptr ? stored->waveform().frames : info.frames;
    const FrameRange range = rangeIn(frames, sampleRateOf(info), arguments);
    const PictureSettings& settings = arguments.picture;
    const std::vector<SoundLane> lanes = lanesFor(arguments.channels, info, range, settings);
    const PictureFrame frame(settings, lanes);
    if (stored != nullptr && suffices(*stored, arguments.channels, range, settings)) {
        const auto from = static_cast<double>(range.from), to = static_cast<double>(range.to);
        return pictureOf(frame, drawnPoints(stored->waveform(), from, to, lanes.front(), frame), settings);
    }
    std::optional<SoundReader> own;
    if (sound == nullptr)
        requireFewChannels(*(sound = &own.emplace(path)));
    Progress progress("reading", range.to - range.from, !showsProgress);
    const auto advance = [&progress](std::int64_t done) { progress.advance(done); };
    return pictureOf(frame, drawnSamples(*sound, range, lanes, frame, advance), settings);
}

void writeData(const std::string& path, SoundReader& sound, const OverviewArguments& arguments)
{
    const FrameRange range = rangeIn(sound.info().frames, sampleRateOf(sound.info()), arguments);
    ChannelChoice channels = arguments.channels;
    if (channels.kind == ChannelChoice::Kind::overview)
        channels.kind = ChannelChoice::Kind::sum; // like the project's own program
    const AudiowaveformSettings settings{.format = *audiowaveformFormatOf(arguments.data),
                                         .from = range.from,
                                         .to = range.to,
                                         .framesPerPoint = arguments.framesPerPoint,
                                         .lanes = lanesOf(channels, sound.info())};
    Progress progress("reading", range.to - range.from, arguments.edit.quiet);
    writeBytes(arguments.data, path, arguments.existing, [&](const Sink& sink) {
        writeAudiowaveform(sound, settings, sink, [&progress](std::int64_t frames) { progress.advance(frames); });
    });
}

// The file's own name, or its path below the named folder.
std::string sheetName(const FoundFile& file)
{
    if (!file.isBelowFolder())
        return std::filesystem::path(file.path).filename().string();
    const std::size_t start = file.path.find_first_not_of('/', file.folderLength);
    return start == std::string::npos ? file.path : file.path.substr(start);
}

// Checked before reading, which may take minutes. An output that is the file itself is refused later in any case.
void requireFreeNames(const std::string& path, const OverviewArguments& arguments)
{
    std::error_code error;
    for (const std::string& out : {arguments.png, arguments.svg, arguments.data})
        if (!out.empty() && out != "-" && !std::filesystem::equivalent(out, path, error))
            requireFreeName(out, arguments.existing);
}

// The sheet is written after all files are read, so none of them may be the sheet.
void requireIsNotSheet(const std::string& path, const OverviewArguments& arguments)
{
    std::error_code error;
    if (!arguments.sheet.empty() && std::filesystem::equivalent(arguments.sheet, path, error))
        throw UsageError("the sheet would be written over " + printable(path));
}

Reading readFile(const std::string& path, const Task& task)
{
    const OverviewArguments& arguments = task.arguments;
    requireFreeNames(path, arguments);
    requireIsNotSheet(path, arguments);
    const FileAccess access = accessForReading(path, arguments.edit.waiting());
    const FileVersion version = versionOf(path);
    if (arguments.store)
        requireRoomForOverview(path);
    const bool showsProgress = !arguments.edit.quiet;
    if (arguments.fromStored) {
        Reading reading{FileOverview::stored(path), version};
        if (arguments.draws())
            reading.picture = pictureOfFile(path, nullptr, &reading.overview, arguments, showsProgress);
        return reading;
    }
    SoundReader sound(path);
    requireFewChannels(sound);
    if (!arguments.data.empty())
        writeData(path, sound, arguments);
    Reading reading{task.needsPoints ? FileOverview::computed(sound, showsProgress) : FileOverview::described(sound),
                    version};
    if (arguments.draws())
        reading.picture = pictureOfFile(path, &sound, nullptr, arguments, showsProgress);
    return reading;
}

// Edits files one by one. A file that changed meanwhile, even by an edit of another of its names, is read again.
StoreResult store(const std::string& path, Reading& reading, const OverviewArguments& arguments)
{
    SafeEdit edit(path, arguments.edit);
    if (versionOf(path) != reading.version) {
        SoundReader sound(edit.target());
        requireFewChannels(sound);
        reading.overview = FileOverview::computed(sound, false);
    }
    return storeOverview(edit, reading.overview, arguments.edit);
}

void tellOf(const std::string& path, Reading& reading, const OverviewArguments& arguments, OverviewReport& report)
{
    OverviewDeeds deeds{.png = arguments.png,
                        .svg = arguments.svg,
                        .data = arguments.data,
                        .sheet = arguments.sheet,
                        .width = arguments.picture.width * arguments.picture.scaleFactor,
                        .height = arguments.picture.height * arguments.picture.scaleFactor,
                        .store = {},
                        .dryRun = arguments.edit.dryRun};
    if (!reading.overview.note().empty() && !arguments.edit.quiet) {
        Output::standard().flush();
        reportFailure(path, reading.overview.note());
    }
    if (reading.picture && arguments.sheet.empty())
        writePictures(path, *reading.picture, arguments);
    if (arguments.store)
        deeds.store = store(path, reading, arguments);
    report.add(shownName(path), reading.overview, deeds);
}

bool writeSheet(const ContactSheet& sheet, const OverviewArguments& arguments, OverviewReport& report)
{
    return reportingFailures(arguments.sheet, [&] {
        const ContactSheet::Size size = sheet.size();
        writeOutputFile(arguments.sheet, {}, arguments.existing, [&](const Sink& sink) {
            sheet.write(*sheetFormatOf(arguments.sheet), arguments.colors, sink);
        });
        report.addSheet(arguments.sheet, sheet.count(), size.width, size.height);
    });
}

bool runOverview(OverviewArguments& arguments, const Verb& verb, OutputOptions output)
{
    requireSense(arguments, verb, output);
    arguments.edit.quiet = output.quiet;
    arguments.files.takesFolders = arguments.files.takesInput = !arguments.store;
    if (arguments.takesOutput()) // nothing else
        output.quiet = true;
    const bool hasSheet = !arguments.sheet.empty();
    if (hasSheet && !verb.isGiven("--width"))
        arguments.picture.width = kSheetWidth;
    if (hasSheet && !verb.isGiven("--height"))
        arguments.picture.height = kSheetHeight;
    if (hasSheet && !reportingFailures(arguments.sheet, [&] { requireFreeName(arguments.sheet, arguments.existing); }))
        return false;
    OverviewReport report(output, arguments.files);
    ContactSheet sheet(arguments.picture, arguments.columns);
    const Task task{arguments, arguments.store || output.wantsJson() || !arguments.writes()};
    bool good = forEachFile(
        arguments.files, {.threads = arguments.threads, .quiet = output.quiet},
        [&](const FoundFile& file) -> FileRest {
            const auto reading = std::make_shared<Reading>(readFile(file.path, task));
            return [&, file, reading] {
                if (hasSheet)
                    sheet.add({sheetName(file), reading->overview.duration(), std::move(reading->picture), {}});
                tellOf(file.path, *reading, arguments, report);
            };
        },
        [&](const std::string& path, const std::string& text) {
            if (hasSheet)
                sheet.add({std::filesystem::path(path).filename().string(), {}, {}, text});
            report.addFailure(path, text);
        });
    if (hasSheet && sheet.count() > 0)
        good = writeSheet(sheet, arguments, report) && good;
    report.finish();
    return good;
}

void declareOverview(CommandLine& commandLine)
{
    static OverviewArguments arguments;
    static Verb* verb = nullptr;
    verb = &commandLine.addVerb("overview", "Show waveforms: in the terminal, as numbers, as a PNG or SVG; store them",
                                [&commandLine] { return runOverview(arguments, *verb, commandLine.output()); });
    declareArguments(*verb, arguments);
}

const VerbRegistration overviewRegistration{50, "overview", declareOverview};

} // namespace
