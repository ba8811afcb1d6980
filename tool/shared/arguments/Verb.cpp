#include "tool/shared/arguments/Verb.h"

#include "tool/shared/arguments/UsageError.h"
#include "tool/shared/output/DisplayWidth.h"
#include "tool/shared/output/Terminal.h"

#include <CLI/CLI.hpp>

#include <algorithm>
#include <iterator>

namespace {

// The parser splits a value "[a,b]" as a list, although it may be a file name; this hides the bracket from it.
constexpr char kBracketGuard = '\x01';

std::string guarded(const std::string& argument)
{
    const bool looksLikeList = argument.size() >= 2 && argument.front() == '[' && argument.back() == ']';
    return looksLikeList || argument.starts_with(kBracketGuard) ? kBracketGuard + argument : argument;
}

// A validator sees every value first.
CLI::Option* unguarding(CLI::Option* option, TextCheck check = {})
{
    const auto unguard = [check = std::move(check)](std::string& text) {
        if (text.size() >= 2 && text[0] == kBracketGuard && (text[1] == '[' || text[1] == kBracketGuard))
            text.erase(0, 1);
        return check ? check(text) : std::string();
    };
    return option->transform(CLI::Validator(unguard, ""));
}

// The parser counts what it "required".
std::string inWords(const std::string& problem)
{
    const std::size_t end = problem.find(": At Most 1 required but received");
    return end == problem.npos ? problem : problem.substr(0, end) + " is given more than once";
}

// The option group of words for another program, which follow "--".
constexpr const char* kWordsGroup = "Words";

/// Formats the help: one usage line for a verb, and one for each of its objects.
class HelpFormatter : public CLI::Formatter {
public:
    HelpFormatter()
    {
        label("Positionals", "Arguments");
        column_width(kNameColumns);
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
            help.erase(gap, 1); // the group of words lists nothing but has an empty line before it
        return fitted(help);
    }

    std::string make_option_name(const CLI::Option* option, bool isPositional) const override
    {
        std::string names = CLI::Formatter::make_option_name(option, isPositional);
        if (const std::size_t comma = names.find(','); comma != names.npos)
            names.insert(comma + 1, " ");
        return names;
    }

    /// Omits which options exclude each other, because the descriptions say so.
    std::string make_option_opts(const CLI::Option* option) const override
    {
        const std::string text = CLI::Formatter::make_option_opts(option);
        return text.substr(0, text.find(" Excludes:"));
    }

private:
    static constexpr int kNameColumns = 26, kMostColumns = 100; // longer lines are hard to read

    static std::string fitted(std::string_view help)
    {
        const int columns = std::min(terminalColumns(), kMostColumns);
        std::string result;
        while (!help.empty()) {
            const std::size_t end = std::min(help.find('\n'), help.size());
            const std::string_view line = help.substr(0, end);
            const bool isListed = line.starts_with("  "), isUsage = line.find(" [options]") != line.npos;
            result += wrapped(line, columns, 0, isUsage ? 11 : isListed ? kNameColumns : 0) + '\n';
            help.remove_prefix(std::min(end + 1, help.size()));
        }
        return result;
    }

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

} // namespace

Argument& Argument::required()
{
    option_->required();
    return *this;
}

Argument& Argument::label(const std::string& text)
{
    option_->option_text(text);
    return *this;
}

Argument& Argument::describe(const std::string& text)
{
    option_->description(text);
    return *this;
}

Argument& Argument::excludes(const Argument& other)
{
    option_->excludes(other.option_);
    return *this;
}

Verb::Verb(const std::string& name, const std::string& description, const std::string& version)
    : app_(std::make_shared<CLI::App>(description, name))
{
    app_->set_version_flag("-V,--version", name + " " + version, "Print the version");
    app_->set_help_flag("-h,--help", "Print this help");
    app_->require_subcommand(0, 1);
    app_->formatter(std::make_shared<HelpFormatter>());
}

Verb::Verb(std::shared_ptr<CLI::App> app, Work work) : app_(std::move(app)), work_(std::move(work))
{
    app_->group("Verbs");
    app_->footer("");
    app_->require_subcommand(0, 1);
}

Verb& Verb::addVerb(const std::string& name, const std::string& description, Work work)
{
    const std::shared_ptr<CLI::App> below(app_, app_->add_subcommand(name, description)); // owned by this verb
    return *verbs_.emplace_back(new Verb(below, std::move(work)));
}

void Verb::setFooter(const std::string& text)
{
    app_->footer(text);
}

void Verb::setHeading(const std::string& text)
{
    app_->option_defaults()->group(text);
}

Argument Verb::addFlag(const std::string& names, bool& value, const std::string& description)
{
    return Argument(*app_->add_flag(names, value, description));
}

Argument Verb::addFlag(const std::string& names, std::function<void()> act, const std::string& description)
{
    return Argument(*app_->add_flag_callback(names, std::move(act), description));
}

Argument Verb::addText(const std::string& names, TakeText take, const std::string& description, TextCheck check)
{
    CLI::Option* const option = app_->add_option_function<std::string>(names, std::move(take), description);
    return Argument(*unguarding(option, std::move(check)));
}

Argument Verb::addText(const std::string& names, std::string& value, const std::string& description, TextCheck check)
{
    return Argument(*unguarding(app_->add_option(names, value, description), std::move(check)));
}

Argument Verb::addTexts(const std::string& names, std::vector<std::string>& values, const std::string& description,
                        TextCheck check)
{
    return Argument(*unguarding(app_->add_option(names, values, description)->option_text("..."), std::move(check)));
}

Argument Verb::addWords(const std::string& name, std::vector<std::string>& words, const std::string& description)
{
    const Argument added = addTexts(name, words, description);
    added.option_->group(kWordsGroup);
    return added;
}

Argument Verb::addNumber(const std::string& names, TakeNumber take, std::pair<long, long> range,
                         const std::string& description)
{
    CLI::Option* const option = app_->add_option_function<long>(names, std::move(take), description)->option_text("N");
    return Argument(*unguarding(option)->check(CLI::Range(range.first, range.second).description("")));
}

Verb::Request Verb::parse(const std::vector<std::string>& arguments)
{
    std::vector<std::string> reversed; // the order that the parser expects
    std::transform(arguments.rbegin(), arguments.rend(), std::back_inserter(reversed), guarded);
    try {
        app_->parse(std::move(reversed));
    } catch (const CLI::CallForHelp&) {
        return {nullptr, app_->help()}; // of the verb that the arguments name
    } catch (const CLI::CallForVersion& version) {
        return {nullptr, version.what() + std::string("\n")};
    } catch (const CLI::ParseError& error) {
        throw UsageError(inWords(error.what()));
    }
    const Verb* verb = this;
    while (!verb->app_->get_subcommands().empty())
        verb = verb->find(verb->app_->get_subcommands().front()->get_name());
    return {verb, {}};
}

bool Verb::isGiven(const std::string& name) const
{
    return app_->count(name) > 0;
}

const std::string& Verb::name() const
{
    return app_->get_name();
}

std::vector<std::string_view> Verb::names() const
{
    std::vector<std::string_view> names;
    for (const std::unique_ptr<Verb>& verb : verbs_)
        names.push_back(verb->name());
    return names;
}

const Verb* Verb::find(const std::string& name) const
{
    const auto found = std::ranges::find(verbs_, name, [](const auto& verb) { return verb->name(); });
    return found != verbs_.end() ? found->get() : nullptr;
}

std::string Verb::help(const std::string& above) const
{
    // The parser's own function would return the help of a verb in the arguments, such as "help" itself.
    const std::string name = above.empty() ? app_->get_name() : above + " " + app_->get_name();
    return app_->get_formatter()->make_help(app_.get(), name, CLI::AppFormatMode::Normal);
}
