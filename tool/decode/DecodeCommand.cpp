// ktfiles decode: turns audio files of any format into linear PCM.
#include "tool/decode/DecodeReport.h"
#include "tool/decode/DecodeTargets.h"
#include "tool/shared/arguments/CommandLine.h"
#include "tool/shared/arguments/SoundRange.h"
#include "tool/shared/arguments/ThreadsOption.h"
#include "tool/shared/edits/OutputFile.h"
#include "tool/shared/input/FileByFile.h"
#include "tool/shared/input/InputFile.h"
#include "tool/shared/input/StandardInput.h"

#include <array>
#include <unistd.h>

namespace {

constexpr std::pair kRates{1, 768'000};
constexpr std::pair kChannels{1, 1024};

struct NamedDepth {
    std::string_view name;
    SampleDepth depth;
};
constexpr std::array<NamedDepth, 4> kDepths{
    {{"16", {16, false}}, {"24", {24, false}}, {"32", {32, false}}, {"f32", {32, true}}}};

struct DecodeArguments {
    FileArguments files;
    std::string out;
    unsigned threads = 0;
    DecodeOptions options;
};

const NamedDepth* depthNamed(std::string_view name)
{
    const auto found =
        std::find_if(kDepths.begin(), kDepths.end(), [name](const NamedDepth& depth) { return depth.name == name; });
    return found != kDepths.end() ? &*found : nullptr;
}

// The format that was requested, or that the output's name implies.
const DecodeFormat& formatFor(const DecodeArguments& arguments)
{
    if (arguments.options.wishes.format != nullptr)
        return *arguments.options.wishes.format;
    const bool namesFile = arguments.out != "-" && !isDecodeFolder(arguments.out);
    const DecodeFormat* const format = namesFile ? decodeFormatOf(arguments.out) : decodeFormats().data();
    if (format == nullptr)
        throw UsageError("the extension of \"" + printable(arguments.out) +
                         "\" is that of no format here: --format says which is meant");
    return *format;
}

bool runDecode(DecodeArguments& arguments, OutputOptions output)
{
    arguments.options.wishes.format = &formatFor(arguments);
    arguments.options.quiet = output.quiet;
    requireOrder(arguments.options.wishes.start, arguments.options.wishes.end);
    const bool toOutput = arguments.out == "-";
    if (toOutput && output.wantsJson())
        throw UsageError("JSON and the sound cannot both go to standard output");
    if (toOutput && isTerminal(STDOUT_FILENO))
        throw UsageError("sound does not go to a terminal: name a file");
    if (!arguments.out.empty() && !isDecodeFolder(arguments.out) && arguments.files.maybeSeveral())
        throw UsageError(toOutput ? "one file at a time goes to standard output"
                                  : "of several files the output is a folder: \"" + printable(arguments.out) +
                                        "\" is none; one to be made ends with \"/\"");
    std::vector<std::string> names;
    if (!reportingRecord(arguments.files.listName(), output, [&] { names = allNames(arguments.files); }))
        return false;
    if (arguments.out.empty() || isDecodeFolder(arguments.out))
        for (const std::string& name : names)
            if (name == kStandardInput)
                throw UsageError("what comes from standard input has no name to decode it to: -o OUT names a file");
    DecodeTargets targets(arguments.out, *arguments.options.wishes.format);
    DecodeReport report(toOutput ? Form::none : outputForm(output), output);
    const FoundFiles found{names.front(), targets.plan(names)};
    arguments.options.showsProgress = !output.quiet;
    prepareOutputFiles();
    // Each output has a temporary file, and only so many are removed at a signal.
    const FileLoop loop{.threads = std::min(threadsFor(arguments.threads), kMostTemporaryFiles),
                        .doing = "decoding",
                        .quiet = output.quiet};
    return writeFileByFile(report, found, loop, [&](const FoundFile& file) {
        requireRegularFile(file.path); // before a folder is made for it
        return decodeFile({file.path, targets.outputOf(file)}, arguments.options);
    });
}

template <class Value>
void addNumber(Verb& verb, const std::string& name, std::optional<Value>& value, std::pair<int, int> range,
               const std::string& description)
{
    verb.addNumber(name, value, range, fmt::format("{}, {} to {}", description, range.first, range.second));
}

// An option whose text is either valid or a usage error.
template <class Parse, class Take>
void addText(Verb& verb, const std::string& name, const std::string& label, Parse parse, Take take,
             const std::string& problem, const std::string& description)
{
    verb.addText(
            name, [parse, take](const std::string& text) { take(parse(text)); }, description,
            [parse, problem](const std::string& text) {
                return parse(text) ? "" : "\"" + printable(text) + "\" is " + problem;
            })
        .label(label);
}

void addSoundOptions(Verb& verb, DecodeWishes& wishes)
{
    addText(
        verb, "--format", "FORMAT", decodeFormatNamed,
        [&wishes](const DecodeFormat* format) { wishes.format = format; }, "none of wav, aiff, caf, raw",
        "wav, aiff, caf or raw (bare samples); else what the extension of OUT means, or wav");
    addNumber(verb, "--rate", wishes.sampleRate, kRates, "Convert to a sample rate in Hz");
    addNumber(verb, "--channels", wishes.channels, kChannels, "Convert to a number of channels");
    addText(
        verb, "--bits", "BITS", depthNamed, [&wishes](const NamedDepth* depth) { wishes.depth = depth->depth; },
        "none of 16, 24, 32, f32",
        "16, 24, 32 or f32 (floats; in AIFF as AIFC); else as in FILE, floats of lossy formats");
    addSoundRange(verb, {.start = [&wishes](const SoundLength& start) { wishes.start = start; },
                         .end = [&wishes](const SoundLength& end) { wishes.end = end; },
                         .frames = [&wishes](const SoundLength& frames) { wishes.frames = frames; }});
}

void declareDecode(CommandLine& commandLine)
{
    static DecodeArguments arguments;
    Verb& verb = commandLine.addVerb("decode", "Decode audio files of any format to linear PCM",
                                     [&commandLine] { return runDecode(arguments, commandLine.output()); });
    CommandLine::addFilesOrInput(verb, arguments.files);
    addThreads(verb, arguments.threads);
    CommandLine::addPath(verb, "-o,--output", arguments.out,
                         "The file or folder to write to, \"-\" for standard output; else the current folder")
        .label("OUT");
    addSoundOptions(verb, arguments.options.wishes);
    verb.addFlag("--conceal", arguments.options.conceal,
                 "Keep what a damaged file gives, with silence for the frames that cannot be decoded");
    verb.addFlag("--force", arguments.options.force, "Replace files that exist");
}

const VerbRegistration decodeRegistration{90, "decode", declareDecode};

} // namespace
