// The options that select a part of the sound, the same for all verbs.
#pragma once

#include "tool/shared/output/ClockTime.h"

#include <functional>

class Verb;

/// Receivers of the values.
struct SoundRangeTakers {
    std::function<void(const SoundLength&)> start, end, frames;
};

/// Adds --start, and either --end or --frames.
void addSoundRange(Verb& verb, const SoundRangeTakers& takers);
/// Throws UsageError if both are of one kind and the end is not after the start.
void requireOrder(const SoundLength& start, const std::optional<SoundLength>& end);
