// A verb of the command: its options, positional arguments, help, and the verbs below it. Nothing else uses the parser.
#pragma once

#include <functional>
#include <memory>
#include <string>
#include <string_view>
#include <type_traits>
#include <utility>
#include <vector>

namespace CLI {
class App;
class Option;
} // namespace CLI

/// One option or positional argument while it is declared.
class Argument {
public:
    Argument& required();
    /// Sets the placeholder for the value in the help.
    Argument& label(const std::string& text);
    Argument& describe(const std::string& text);
    /// Forbids giving both arguments.
    Argument& excludes(const Argument& other);

private:
    friend class Verb;
    explicit Argument(CLI::Option& option) : option_(&option) {}

    CLI::Option* option_;
};

/// What is wrong with a text; empty if nothing is.
using TextCheck = std::function<std::string(const std::string& text)>;

class Verb {
public:
    using Work = std::function<bool()>;
    using TakeText = std::function<void(const std::string& text)>;
    using TakeNumber = std::function<void(long number)>;

    /// The program itself, whose verbs are the others.
    Verb(const std::string& name, const std::string& description, const std::string& version);
    Verb(const Verb&) = delete;
    Verb& operator=(const Verb&) = delete;

    /// Adds a verb below this one. `work` returns whether it succeeded.
    Verb& addVerb(const std::string& name, const std::string& description, Work work);
    /// Sets the last lines of the help.
    void setFooter(const std::string& text);
    /// Sets the heading in the help for what is added from now on; initially "Options".
    void setHeading(const std::string& text);

    // Options have `names` such as "-q,--quiet", positional arguments one such as "FILE". References must outlive the
    // parsing.

    Argument addFlag(const std::string& names, bool& value, const std::string& description);
    Argument addFlag(const std::string& names, std::function<void()> act, const std::string& description);
    Argument addText(const std::string& names, TakeText take, const std::string& description, TextCheck check = {});
    Argument addText(const std::string& names, std::string& value, const std::string& description,
                     TextCheck check = {});
    Argument addTexts(const std::string& names, std::vector<std::string>& values, const std::string& description,
                      TextCheck check = {});
    /// Adds words for another program; they come last, after "--".
    Argument addWords(const std::string& name, std::vector<std::string>& words, const std::string& description);
    /// `range` is the smallest and the largest value; "N" in the help.
    Argument addNumber(const std::string& names, TakeNumber take, std::pair<long, long> range,
                       const std::string& description);
    /// As above, stored in a number or an optional one.
    template <class Number>
        requires(!std::is_invocable_v<Number, long>)
    Argument addNumber(const std::string& names, Number& value, std::pair<long, long> range,
                       const std::string& description)
    {
        const auto take = [&value](long number) {
            if constexpr (requires { typename Number::value_type; })
                value = static_cast<typename Number::value_type>(number);
            else
                value = static_cast<Number>(number);
        };
        return addNumber(names, TakeNumber(take), range, description);
    }

    /// The result of parsing: the work of a verb, or if `verb` is null, a `text` to print.
    struct Request {
        const Verb* verb = nullptr;
        std::string text;
    };
    /// Sets the values that the arguments give. The verb is this one if none is named. Throws UsageError.
    Request parse(const std::vector<std::string>& arguments);

    /// Whether the option was given.
    bool isGiven(const std::string& name) const;
    bool work() const { return work_(); }
    const std::string& name() const;
    /// The verb of that name below this one; null if there is none.
    const Verb* find(const std::string& name) const;
    /// Names of the verbs below this one.
    std::vector<std::string_view> names() const;
    /// `above` are the names that precede this verb's.
    std::string help(const std::string& above = "") const;

private:
    Verb(std::shared_ptr<CLI::App> app, Work work);

    std::shared_ptr<CLI::App> app_;
    Work work_;
    std::vector<std::unique_ptr<Verb>> verbs_;
};
