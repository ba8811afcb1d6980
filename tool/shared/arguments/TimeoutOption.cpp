#include "tool/shared/arguments/TimeoutOption.h"

#include "tool/shared/output/Terminal.h"

#include <charconv>
#include <cmath>
#include <system_error>

namespace {

constexpr double kLongestTimeout = 1e8; // three years

std::string timeoutProblem(const std::string& text)
{
    double seconds = 0;
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), seconds);
    const bool isNumber = error == std::errc() && end == text.data() + text.size() && std::isfinite(seconds);
    return isNumber && seconds >= 0 && seconds <= kLongestTimeout
               ? ""
               : "\"" + printable(text) + "\" is no time in seconds, 0 to 100000000";
}

} // namespace

void addTimeout(CLI::App& verb, std::optional<double>& seconds, const std::string& description)
{
    verb.add_option("--timeout", seconds, description)
        ->option_text("SECONDS")
        ->check(CLI::Validator([](std::string& text) { return timeoutProblem(text); }, ""));
}
