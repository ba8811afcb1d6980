#include "tool/shared/arguments/SoundRange.h"

#include "tool/shared/output/Terminal.h"

#include <CLI/CLI.hpp>

namespace {

CLI::Option* addLength(CLI::App& verb, const std::string& name, std::function<void(const SoundLength&)> take,
                       const std::string& description)
{
    return verb
        .add_option_function<std::string>(
            name, [take](const std::string& text) { take(soundLengthFromText(text).value_or(SoundLength())); },
            description)
        ->option_text("N")
        ->check(CLI::Validator(
            [](std::string& text) {
                return soundLengthFromText(text) ? ""
                                                 : "\"" + printable(text) +
                                                       "\" is neither a number of frames nor a time such as 2.5s or "
                                                       "1:02.5";
            },
            ""));
}

} // namespace

void addSoundRange(CLI::App& verb, const SoundRangeTakers& takers)
{
    addLength(verb, "--start", takers.start, "Leave out what is ahead of frame N, or of a time such as 2.5s or 1:02.5");
    CLI::Option* const end = addLength(verb, "--end", takers.end, "Stop at frame N, or at that time");
    addLength(verb, "--frames", takers.frames, "Stop after N frames, or that time")->excludes(end);
}

void requireOrder(const SoundLength& start, const std::optional<SoundLength>& end)
{
    if (end && end->seconds.has_value() == start.seconds.has_value() &&
        (end->seconds ? *end->seconds <= *start.seconds : end->frames <= start.frames))
        throw CLI::ValidationError("--start is not ahead of --end");
}
