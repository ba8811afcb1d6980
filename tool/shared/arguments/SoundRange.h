// The options by which verbs take a part of the sound, the same in all of them.
#pragma once

#include "tool/shared/output/ClockTime.h"

#include <functional>

class Verb;

/// Where the values go.
struct SoundRangeTakers {
    std::function<void(const SoundLength&)> start, end, frames;
};

/// --start, and either --end or --frames.
void addSoundRange(Verb& verb, const SoundRangeTakers& takers);
/// Throws UsageError when both are of one kind and the end is not behind the start.
void requireOrder(const SoundLength& start, const std::optional<SoundLength>& end);
