#include "tool/shared/arguments/CommandLine.h"

#include "tool/shared/arguments/ChunkId.h"
#include "tool/shared/arguments/CoordinationFolder.h"
#include "tool/shared/output/Failure.h"
#include "tool/shared/output/UnseenCharacters.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <memory>
#include <new>
#include <string_view>

namespace {

// The parser takes a value "[a,b]" apart as a list, but it is a fine file name: this hides the bracket from it.
constexpr char kBracketGuard = '\x01';

std::string guarded(std::string argument)
{
    const bool looksLikeList = argument.size() >= 2 && argument.front() == '[' && argument.back() == ']';
    return looksLikeList || argument.starts_with(kBracketGuard) ? kBracketGuard + argument : argument;
}

std::string& unguarded(std::string& argument)
{
    if (argument.size() >= 2 && argument[0] == kBracketGuard && (argument[1] == '[' || argument[1] == kBracketGuard))
        argument.erase(0, 1);
    return argument;
}

std::string fileProblem(std::string& argument)
{
    return unguarded(argument) == "-" ? "\"-\" is not a file name; a file of that name is \"./-\"" : "";
}

std::string noProblem(std::string& argument)
{
    unguarded(argument);
    return "";
}

std::string pathProblem(std::string& argument)
{
    return unguarded(argument).empty() ? "a file name is missing" : "";
}

std::string chunkIdProblem(std::string& argument)
{
    return chunkIdFromText(unguarded(argument))
               ? ""
               : "\"" + printable(argument) +
                     "\" is no chunk id: one to four printable characters, or \\xNN for any byte";
}

constexpr double kLongestTimeout = 1e9; // 31 years

constexpr std::array<std::pair<std::string_view, ColorMode>, 3> kColorModes{
    {{"auto", ColorMode::automatic}, {"always", ColorMode::always}, {"never", ColorMode::never}}};

std::string colorProblem(std::string& argument)
{
    const bool known =
        std::any_of(kColorModes.begin(), kColorModes.end(), [&](const auto& mode) { return mode.first == argument; });
    return known ? "" : "\"" + printable(argument) + "\" is none of auto, always, never";
}

std::string secondsProblem(std::string& argument)
{
    double seconds = -1;
    const char* const end = argument.data() + argument.size();
    const auto read = std::from_chars(argument.data(), end, seconds);
    const bool known = read.ec == std::errc() && read.ptr == end && seconds >= 0 && seconds <= kLongestTimeout;
    return known ? "" : "\"" + printable(argument) + "\" is no number of seconds, 0 or more";
}

// The group of options that are words for another program, behind "--".
constexpr const char* kWordsGroup = "Words";

const CLI::App* findVerb(const CLI::App& app, const std::string& name)
{
    const auto found = app.get_subcommands([&](const CLI::App* verb) { return verb->get_name() == name; });
    return found.empty() ? nullptr : found.front();
}

/// Help in the words of the grammar: one usage line for a verb, and one for each of its objects.
class HelpFormatter : public CLI::Formatter {
public:
    HelpFormatter()
    {
        label("Positionals", "Arguments");
        column_width(26);
    }

    std::string make_usage(const CLI::App* app, std::string name) const override
    {
        std::string usage = "Usage: " + usageLine(*app, name);
        if (app->get_parent() != nullptr)
            for (const CLI::App* object : app->get_subcommands([](const CLI::App*) { return true; }))
                usage += "\n       " + usageLine(*object, name + " " + object->get_name());
        return usage + "\n";
    }

    std::string make_help(const CLI::App* app, std::string name, CLI::AppFormatMode mode) const override
    {
        std::string help = CLI::Formatter::make_help(app, std::move(name), mode);
        if (const std::size_t gap = help.find("\n\n\n"); gap != help.npos)
            help.erase(gap, 1); // the group of words lists nothing, and has an empty line in front all the same
        return help;
    }

private:
    static std::string usageLine(const CLI::App& app, const std::string& name)
    {
        std::string line = name;
        for (const CLI::Option* option : app.get_options([](const CLI::Option* one) { return one->get_positional(); }))
            if (option->get_group() != kWordsGroup)
                line += " " + option->get_name(true) + (option->get_expected_max() > 1 ? "..." : "");
        line += app.get_parent() == nullptr ? " VERB [OBJECT] FILE... [options]" : " [options]";
        for (const CLI::Option* words :
             app.get_options([](const CLI::Option* one) { return one->get_group() == kWordsGroup; }))
            line += " [-- " + words->get_name(true) + "...]";
        return line;
    }
};

std::multimap<int, void (*)(CommandLine&)>& registeredVerbs()
{
    static std::multimap<int, void (*)(CommandLine&)> verbs;
    return verbs;
}

// The parser's own words with its own names of things put into ours.
std::string usageMessage(const CLI::ParseError& error)
{
    std::string message = printableOnError(error.what());
    for (const char* const prefix : {"FILE: ", "ID: ", "FROM: ", "TO: ", "FOLDER: ", "PACKAGE: "})
        if (message.starts_with(prefix))
            message.erase(0, std::string_view(prefix).size());
    return message;
}

} // namespace

CommandLine::CommandLine()
    : app_("Describes audio files, and lists and edits the chunks of their containers.", "ktfiles")
{
    app_.set_version_flag("--version", "ktfiles " KTFILES_VERSION, "Print the version");
    app_.set_help_flag("-h,--help", "Print this help");
    app_.require_subcommand(0, 1);
    app_.formatter(std::make_shared<HelpFormatter>());
    app_.footer("Exit status: 0, 1 when a file failed, 2 for a mistake on the command line.");
    VerbRegistration::declareAll(*this);
    addHelpVerb();
}

CLI::App& CommandLine::addVerb(const std::string& name, const std::string& description, std::function<bool()> run,
                               CLI::App* parent)
{
    CLI::App& verb = *(parent != nullptr ? parent : &app_)->add_subcommand(name, description);
    verb.group("Verbs");
    verb.footer("");
    verb.require_subcommand(0, 1);
    addOutputOptions(verb);
    work_[&verb] = std::move(run);
    return verb;
}

void CommandLine::addOutputOptions(CLI::App& verb)
{
    verb.add_flag("--json", output_.json, "Print JSON");
    verb.add_flag("-q,--quiet", output_.quiet, "Print nothing but errors, and what --json asks for");
    const auto setColor = [this](const std::string& name) {
        for (const auto& [text, mode] : kColorModes)
            if (text == name)
                output_.color = mode;
    };
    verb.add_option_function<std::string>("--color", setColor, "Color the output: auto, always or never")
        ->option_text("WHEN")
        ->check(CLI::Validator(colorProblem, ""));
    addCoordinationFolder(verb);
}

CLI::Option* CommandLine::addFile(CLI::App& verb, std::string& file, const std::string& name)
{
    return verb.add_option(name, file, "The audio file")->option_text(" ")->transform(CLI::Validator(fileProblem, ""));
}

CLI::Option* CommandLine::addFiles(CLI::App& verb, std::vector<std::string>& files, const std::string& name)
{
    return verb.add_option(name, files, "The audio files")
        ->option_text("...")
        ->transform(CLI::Validator(fileProblem, ""));
}

CLI::Option* CommandLine::addWords(CLI::App& verb, const std::string& name, std::vector<std::string>& words,
                                   const std::string& description)
{
    return verb.add_option(name, words, description)
        ->option_text("...")
        ->group(kWordsGroup)
        ->transform(CLI::Validator(noProblem, ""));
}

CLI::Option* CommandLine::addChunkId(CLI::App& verb, FourCC& id)
{
    return verb
        .add_option_function<std::string>(
            "ID", [&id](const std::string& text) { id = chunkIdFromText(text).value_or(0); },
            "The chunk's id; shorter ones are padded with spaces, \\xNN is any byte")
        ->option_text(" ")
        ->transform(CLI::Validator(chunkIdProblem, ""));
}

CLI::Option* CommandLine::addPath(CLI::App& verb, const std::string& name, std::string& path,
                                  const std::string& description)
{
    return verb.add_option(name, path, description)->transform(CLI::Validator(pathProblem, ""));
}

void CommandLine::addForceOption(CLI::App& verb, OutputFile::Existing& existing)
{
    verb.add_flag_callback(
        "--force", [&existing] { existing = OutputFile::Existing::replace; }, "Replace a file that is there");
}

void CommandLine::addEditOptions(CLI::App& verb, EditOptions& options)
{
    verb.add_flag("--in-place", options.inPlace, "Change the file itself, not a copy that takes its place");
    verb.add_flag("--dry-run", options.dryRun, "Say what would be done, and do nothing");
    verb.add_flag("--backup", options.backup, "Keep the original as FILE.bak, FILE.bak.1, ...");
    verb.add_option_function<double>(
            "--timeout", [&options](double seconds) { options.timeout = seconds; },
            "Give up when others hold the file for that long")
        ->option_text("SECONDS")
        ->check(CLI::Validator(secondsProblem, ""));
    verb.add_flag("--keep-times", options.keepTimes, "Keep the time of the last modification");
}

void CommandLine::addHelpVerb()
{
    CLI::App& help = *app_.add_subcommand("help", "Print the help of a verb");
    help.group("Verbs");
    help.footer("");
    help.add_option("VERB", helpTopics_, "The verb, and what it works on")->option_text("...");
    work_[&help] = [this] { return printHelp(); };
}

bool CommandLine::printHelp() const
{
    const CLI::App* topic = &app_;
    std::string above;
    for (const std::string& word : helpTopics_) {
        above = topic == &app_ ? app_.get_name() : above + " " + topic->get_name();
        topic = findVerb(*topic, word);
        if (topic == nullptr)
            throw CLI::ValidationError("there is no verb \"" + printable(word) + "\"");
    }
    Output::standard().write(topic->help(above));
    return true;
}

int CommandLine::parseAndRun(std::vector<std::string> arguments)
{
    const CLI::App* verb = &app_;
    try {
        if (!arguments.empty() && !arguments.front().starts_with('-') && findVerb(app_, arguments.front()) == nullptr)
            throw CLI::ValidationError("there is no verb \"" + printable(arguments.front()) + "\"");
        std::reverse(arguments.begin(), arguments.end());
        app_.parse(std::move(arguments));
        while (!verb->get_subcommands().empty())
            verb = verb->get_subcommands().front();
        if (verb == &app_) {
            std::fputs(app_.help().c_str(), stderr);
            return kExitUsage;
        }
        return work_.at(verb)() ? kExitOK : failureStatus_;
    } catch (const CLI::CallForHelp&) {
        Output::standard().write(app_.help());
        return kExitOK;
    } catch (const CLI::CallForVersion& version) {
        Output::standard().print("{}\n", version.what());
        return kExitOK;
    } catch (const CLI::ParseError& error) {
        std::fputs(fmt::format("ktfiles: {}\nTry \"ktfiles help\".\n", usageMessage(error)).c_str(), stderr);
        return kExitUsage;
    }
}

int CommandLine::run(int argc, char** argv)
{
    std::vector<std::string> arguments;
    for (int i = 1; i < argc; ++i)
        arguments.push_back(guarded(argv[i]));
    int status = kExitFailed;
    try {
        status = parseAndRun(std::move(arguments));
    } catch (const std::bad_alloc&) {
        reportFailure("error", "out of memory");
    } catch (const std::exception& error) {
        reportFailure("error", error.what());
    }
    if (!Output::standard().finish() && status == kExitOK)
        status = kExitFailed;
    return status;
}

VerbRegistration::VerbRegistration(int rank, void (*declare)(CommandLine&))
{
    registeredVerbs().emplace(rank, declare);
}

void VerbRegistration::declareAll(CommandLine& commandLine)
{
    for (const auto& [rank, declare] : registeredVerbs())
        declare(commandLine);
}
