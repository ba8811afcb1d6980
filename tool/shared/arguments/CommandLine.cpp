#include "tool/shared/arguments/CommandLine.h"

#include "tool/shared/arguments/ChunkId.h"
#include "tool/shared/arguments/CoordinationFolder.h"
#include "tool/shared/arguments/Nearest.h"
#include "tool/shared/input/StandardInput.h"
#include "tool/shared/output/Failure.h"
#include "tool/shared/output/ShownName.h"
#include "tool/shared/output/UnseenCharacters.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <map>
#include <new>
#include <optional>
#include <string_view>

namespace {

std::string fileProblem(const std::string& argument)
{
    return argument == kStandardInput
               ? "\"-\" is standard input, and this needs a file's name; a file called so is \"./-\""
               : "";
}

std::string pathProblem(const std::string& argument)
{
    return argument.empty() ? "a file name is missing" : "";
}

std::string chunkIdProblem(const std::string& argument)
{
    return chunkIdFromText(argument) ? ""
                                     : "\"" + printable(argument) +
                                           "\" is no chunk id: one to four printable characters, or \\xNN for any byte";
}

constexpr double kLongestTimeout = 1e9; // 31 years

constexpr std::array<std::pair<std::string_view, ColorMode>, 3> kColorModes{
    {{"auto", ColorMode::automatic}, {"always", ColorMode::always}, {"never", ColorMode::never}}};

std::string colorProblem(const std::string& argument)
{
    const bool known =
        std::any_of(kColorModes.begin(), kColorModes.end(), [&](const auto& mode) { return mode.first == argument; });
    return known ? "" : "\"" + printable(argument) + "\" is none of auto, always, never";
}

std::optional<double> secondsFromText(const std::string& text)
{
    double seconds = -1;
    const char* const end = text.data() + text.size();
    const auto read = std::from_chars(text.data(), end, seconds);
    const bool known = read.ec == std::errc() && read.ptr == end && seconds >= 0 && seconds <= kLongestTimeout;
    return known ? std::optional(seconds) : std::nullopt;
}

std::string secondsProblem(const std::string& argument)
{
    return secondsFromText(argument) ? "" : "\"" + printable(argument) + "\" is no number of seconds, 0 or more";
}

struct RegisteredVerb {
    std::string_view name;
    void (*declare)(CommandLine&);
};

std::multimap<int, RegisteredVerb>& registeredVerbs()
{
    static std::multimap<int, RegisteredVerb> verbs; // by rank
    return verbs;
}

// Replaces the parser's names of things by ours in its messages.
std::string usageMessage(const UsageError& error)
{
    std::string message = printableOnError(error.what());
    for (const char* const prefix : {"FILE: ", "ID: ", "FROM: ", "TO: ", "FOLDER: ", "PACKAGE: "})
        if (message.starts_with(prefix))
            message.erase(0, std::string_view(prefix).size());
    return message;
}

// The verb and object that the arguments begin with, each after a space.
std::string verbsIn(const std::vector<std::string>& arguments, const Verb& program)
{
    std::string words;
    const Verb* verb = &program;
    for (const std::string& argument : arguments) {
        verb = verb->find(argument);
        if (verb == nullptr)
            break;
        words += " " + argument;
    }
    return words;
}

} // namespace

CommandLine::CommandLine()
    : program_("ktfiles", "Describes audio files, and lists and edits the chunks of their containers.", KTFILES_VERSION)
{
    program_.setFooter("Exit status: 0, 1 when a file failed, 2 for a mistake on the command line.");
}

Verb& CommandLine::addVerb(const std::string& name, const std::string& description, Verb::Work run, Verb* parent)
{
    Verb& verb = (parent != nullptr ? *parent : program_).addVerb(name, description, std::move(run));
    verb.setHeading("Options of every verb");
    addOutputOptions(verb);
    verb.setHeading("Options");
    return verb;
}

void CommandLine::addOutputOptions(Verb& verb)
{
    const Argument array = verb.addFlag(
        "--json", [this] { output_.json = JsonShape::array; }, "Print JSON: an array of objects");
    verb.addFlag(
            "--jsonl,--ndjson", [this] { output_.json = JsonShape::lines; },
            "Print JSON: an object on each line, as soon as it is known")
        .excludes(array);
    verb.addFlag("-q,--quiet", output_.quiet, "Print nothing but errors, and the JSON that is asked for");
    const auto setColor = [this](const std::string& name) {
        for (const auto& [text, mode] : kColorModes)
            if (text == name)
                output_.color = mode;
    };
    verb.addText("--color", setColor, "Color the output: auto, always or never", colorProblem).label("WHEN");
    addCoordinationFolder(verb);
}

Argument CommandLine::addFile(Verb& verb, std::string& file, const std::string& name)
{
    const auto take = [&file](const std::string& text) { file = nameMeantBy(text); };
    return verb.addText(name, take, "The audio file", fileProblem).label(" ");
}

Argument CommandLine::addFileOrInput(Verb& verb, std::string& file)
{
    const auto take = [&file](const std::string& text) { file = nameMeantBy(text); };
    return verb.addText("FILE", take, "The audio file; \"-\" is standard input").label(" ");
}

Argument CommandLine::addFiles(Verb& verb, std::vector<std::string>& files, const std::string& name)
{
    return verb.addTexts(name, files, "The audio files", fileProblem);
}

Argument CommandLine::addFiles(Verb& verb, FileArguments& files, const std::string& name)
{
    files.label = name;
    const Argument added = verb.addTexts(name, files.names, "The audio files, and folders of them");
    addFileList(verb, files);
    return added;
}

Argument CommandLine::addFilesOrInput(Verb& verb, FileArguments& files)
{
    files.takesInput = true;
    return addFiles(verb, files).describe("The audio files, and folders of them; \"-\" is standard input");
}

void CommandLine::addFileList(Verb& verb, FileArguments& files)
{
    verb.addText("--files-from", files.list, "Also the files that LIST names, one on a line; \"-\" is standard input",
                 pathProblem)
        .label("LIST");
    verb.addFlag("-0,--null", files.isNulSeparated, "A NUL byte ends each name in LIST, not the line");
}

Argument CommandLine::addCsv(Verb& verb)
{
    return verb.addFlag("--csv", output_.csv, "Print comma-separated values (RFC 4180), with a header");
}

Argument CommandLine::addChunkId(Verb& verb, FourCC& id)
{
    const auto take = [&id](const std::string& text) { id = chunkIdFromText(text).value_or(0); };
    return verb
        .addText("ID", take, "The chunk's id; shorter ones are padded with spaces, \\xNN is any byte", chunkIdProblem)
        .label(" ");
}

Argument CommandLine::addPath(Verb& verb, const std::string& name, std::string& path, const std::string& description)
{
    return verb.addText(name, path, description, pathProblem);
}

void CommandLine::addForceOption(Verb& verb, OutputFile::Existing& existing)
{
    verb.addFlag(
        "--force", [&existing] { existing = OutputFile::Existing::replace; }, "Replace a file that is there");
}

void CommandLine::addEditOptions(Verb& verb, EditOptions& options)
{
    verb.addFlag("--in-place", options.inPlace, "Change the file itself, not a copy that takes its place");
    verb.addFlag("--dry-run", options.dryRun, "Say what would be done, and do nothing");
    verb.addFlag("--backup", options.backup, "Keep the original as FILE.bak, FILE.bak.1, ...");
    const auto setTimeout = [&options](const std::string& text) { options.timeout = secondsFromText(text); };
    verb.addText("--timeout", setTimeout, "Give up when others hold the file for that long", secondsProblem)
        .label("SECONDS");
    verb.addFlag("--keep-times", options.keepTimes, "Keep the time of the last modification");
}

void CommandLine::declareVerbs(const std::vector<std::string>& arguments)
{
    VerbRegistration::declareNamed(*this, arguments.empty() ? "" : arguments.front());
    program_.addVerb("help", "Print the help of a verb", [this] { return printHelp(); })
        .addTexts("VERB", helpTopics_, "The verb, and what it works on");
}

UsageError CommandLine::unknownVerb(const std::string& word) const
{
    return UsageError("there is no verb \"" + printable(word) + "\"" + didYouMean(word, program_.names()));
}

bool CommandLine::printHelp() const
{
    const Verb* topic = &program_;
    std::string above;
    for (const std::string& word : helpTopics_) {
        above = topic == &program_ ? program_.name() : above + " " + topic->name();
        topic = topic->find(word);
        if (topic == nullptr)
            throw unknownVerb(word);
    }
    Output::standard().write(topic->help(above));
    return true;
}

int CommandLine::parseAndRun(const std::vector<std::string>& arguments)
{
    declareVerbs(arguments);
    try {
        if (!arguments.empty() && !arguments.front().starts_with('-') && program_.find(arguments.front()) == nullptr)
            throw unknownVerb(arguments.front());
        const auto [verb, text] = program_.parse(arguments);
        if (verb == &program_) {
            std::fputs(program_.help().c_str(), stderr);
            return kExitUsage;
        }
        if (output_.csv && output_.wantsJson())
            throw UsageError("--csv and JSON exclude each other");
        Output::standard().write(text);
        return verb == nullptr || verb->work() ? kExitOK : failureStatus_;
    } catch (const UsageError& error) {
        std::fputs(
            fmt::format("ktfiles: {}\nTry \"ktfiles help{}\".\n", usageMessage(error), verbsIn(arguments, program_))
                .c_str(),
            stderr);
        return kExitUsage;
    }
}

int CommandLine::run(int argc, char** argv)
{
    int status = kExitFailed;
    try {
        status = parseAndRun(std::vector<std::string>(argv + std::min(argc, 1), argv + argc));
    } catch (const std::bad_alloc&) {
        reportFailure("error", "out of memory");
    } catch (const std::exception& error) {
        reportFailure("error", error.what());
    }
    if (!Output::standard().finish() && status == kExitOK)
        status = kExitFailed;
    return status;
}

VerbRegistration::VerbRegistration(int rank, const char* name, void (*declare)(CommandLine&))
{
    registeredVerbs().emplace(rank, RegisteredVerb{name, declare});
}

void VerbRegistration::declareNamed(CommandLine& commandLine, std::string_view name)
{
    const auto& verbs = registeredVerbs();
    const auto isMeant = [name](const auto& verb) { return verb.second.name == name; };
    const bool isKnown = std::any_of(verbs.begin(), verbs.end(), isMeant);
    for (const auto& verb : verbs)
        if (!isKnown || isMeant(verb))
            verb.second.declare(commandLine);
}
