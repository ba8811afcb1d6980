#include "tool/shared/arguments/SoundRange.h"

#include "tool/shared/arguments/UsageError.h"
#include "tool/shared/arguments/Verb.h"
#include "tool/shared/output/Terminal.h"

namespace {

Argument addLength(Verb& verb, const std::string& name, const std::function<void(const SoundLength&)>& take,
                   const std::string& description)
{
    const auto problem = [](const std::string& text) {
        return soundLengthFromText(text)
                   ? ""
                   : "\"" + printable(text) + "\" is neither a number of frames nor a time such as 2.5s or 1:02.5";
    };
    return verb
        .addText(
            name, [take](const std::string& text) { take(soundLengthFromText(text).value_or(SoundLength())); },
            description, problem)
        .label("N");
}

} // namespace

void addSoundRange(Verb& verb, const SoundRangeTakers& takers)
{
    addLength(verb, "--start", takers.start, "Leave out what is ahead of frame N, or of a time such as 2.5s or 1:02.5");
    const Argument end = addLength(verb, "--end", takers.end, "Stop at frame N, or at that time");
    addLength(verb, "--frames", takers.frames, "Stop after N frames, or that time").excludes(end);
}

void requireOrder(const SoundLength& start, const std::optional<SoundLength>& end)
{
    if (end && end->seconds.has_value() == start.seconds.has_value() &&
        (end->seconds ? *end->seconds <= *start.seconds : end->frames <= start.frames))
        throw UsageError("--start is not ahead of --end");
}
