#include "tool/shared/arguments/TimeoutOption.h"

#include "tool/shared/output/Terminal.h"

#include <charconv>
#include <cmath>
#include <system_error>

namespace {

constexpr double kLongestLockWait = 1e8; // three years

std::optional<double> timeoutFromText(const std::string& text)
{
    double seconds = 0;
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), seconds);
    const bool isNumber = error == std::errc() && end == text.data() + text.size() && std::isfinite(seconds);
    return isNumber && seconds >= 0 && seconds <= kLongestLockWait ? std::optional(seconds) : std::nullopt;
}

} // namespace

void addTimeout(Verb& verb, std::optional<double>& seconds, const std::string& description)
{
    const auto problem = [](const std::string& text) {
        return timeoutFromText(text) ? "" : "\"" + printable(text) + "\" is no time in seconds, 0 to 100000000";
    };
    const auto take = [&seconds](const std::string& text) { seconds = timeoutFromText(text); };
    verb.addText("--timeout", take, description, problem).label("SECONDS");
}
