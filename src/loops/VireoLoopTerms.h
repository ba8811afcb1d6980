// The musical terms for the numbers of a loop's tags, and the tempo that follows from them.
#pragma once

#include "platform/core/Export.h"

#include <cstdint>
#include <optional>
#include <string_view>

/// "C" to "B" for the MIDI notes 48 to 59, in which keys are stored, spelt as in CAF files ("Db", but "D#"). Empty
/// for other notes.
KT_EXPORT std::string_view VireoLoopNoteName(std::int64_t midiNote);
/// The MIDI note, 48 to 59, of a key's name: a letter, large or small, with "#", "b" or nothing after it; "B#" is
/// "C". None for other texts.
KT_EXPORT std::optional<std::int64_t> VireoLoopNoteNamed(std::string_view name);

/// "none", "minor", "major", "neither", "both" for the key types 0 to 4; empty for others.
KT_EXPORT std::string_view VireoLoopModeName(std::int64_t keyType);
/// The key type of exactly such a name; null for another.
KT_EXPORT std::optional<std::int64_t> VireoLoopModeNamed(std::string_view name);

/// The tempo in beats per minute of so many beats in so many frames at a rate in Hz; 0 when one of them is unknown.
KT_EXPORT double VireoLoopTempo(std::int64_t beats, std::uint64_t frames, double sampleRate);
