#include "loops/VireoLoopTerms.h"

#include <algorithm>
#include <cmath>

namespace {

constexpr std::int64_t kLowestNamedNote = 48;
// Kept: this mix of flats and sharps is the vocabulary.
constexpr std::string_view kNoteNames[] = {"C", "Db", "D", "D#", "E", "F", "F#", "G", "G#", "A", "A#", "B"};
constexpr std::string_view kModeNames[] = {"none", "minor", "major", "neither", "both"};

} // namespace

std::string_view VireoLoopNoteName(std::int64_t midiNote)
{
    const bool isNamed = midiNote >= kLowestNamedNote && midiNote < kLowestNamedNote + std::ssize(kNoteNames);
    return isNamed ? kNoteNames[midiNote - kLowestNamedNote] : std::string_view();
}

std::optional<std::int64_t> VireoLoopNoteNamed(std::string_view name)
{
    constexpr int kNotes[] = {9, 11, 0, 2, 4, 5, 7}; // A to G
    const char letter = name.empty() ? '\0' : static_cast<char>(name[0] & ~0x20);
    const std::string_view accidental = name.substr(std::min<std::size_t>(1, name.size()));
    const int shift = accidental == "#" ? 1 : accidental == "b" ? -1 : 0;
    if (letter < 'A' || letter > 'G' || (shift == 0 && !accidental.empty()))
        return std::nullopt;
    return kLowestNamedNote + (kNotes[letter - 'A'] + shift + 12) % 12;
}

std::string_view VireoLoopModeName(std::int64_t keyType)
{
    return keyType >= 0 && keyType < std::ssize(kModeNames) ? kModeNames[keyType] : std::string_view();
}

std::optional<std::int64_t> VireoLoopModeNamed(std::string_view name)
{
    const auto* const found = std::ranges::find(kModeNames, name);
    return found != std::end(kModeNames) ? std::optional(found - std::begin(kModeNames)) : std::nullopt;
}

double VireoLoopTempo(std::int64_t beats, std::uint64_t frames, double sampleRate)
{
    const bool isKnown = beats > 0 && frames > 0 && std::isfinite(sampleRate) && sampleRate > 0;
    return isKnown ? static_cast<double>(beats) * 60 * sampleRate / static_cast<double>(frames) : 0;
}
