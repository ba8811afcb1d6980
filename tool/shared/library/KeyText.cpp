#include "tool/shared/library/KeyText.h"

#include "loops/tags/LoopTagFields.h"
#include "platform/core/ASCIICase.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <utility>

namespace {

constexpr std::int64_t kSemitones = 12;
constexpr std::int64_t kMiddleC = 60;

struct ModeWord {
    std::string_view text; // in small letters
    const char* meaning;
};

constexpr ModeWord kModes[] = {{"major", "major"}, {"maj", "major"}, {"dur", "major"},  {"minor", "minor"},
                               {"min", "minor"},   {"mol", "minor"}, {"moll", "minor"}, {"m", "minor"}};

std::string_view withoutSpaces(std::string_view text)
{
    constexpr std::string_view kSpaces = " \t\r\n";
    const std::size_t begin = text.find_first_not_of(kSpaces);
    return begin == text.npos ? std::string_view() : text.substr(begin, text.find_last_not_of(kSpaces) - begin + 1);
}

/// The key `steps` fifths above one of C major or A minor.
MusicalKey keyOnCircle(std::int64_t steps, bool isMinor)
{
    constexpr std::int64_t kFifth = 7, kRelative = 9;
    return {((isMinor ? kRelative : 0) + steps * kFifth) % kSemitones, isMinor ? "minor" : "major"};
}

/// "8A" and "8B" of Camelot, "1m" and "1d" of Open Key.
std::optional<MusicalKey> keyOfNumber(std::string_view text)
{
    std::int64_t number = 0;
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
    if (error != std::errc() || number < 1 || number > kSemitones || end + 1 != text.data() + text.size())
        return std::nullopt;
    constexpr std::int64_t kCamelotOfC = 8, kOpenOfC = 1;
    switch (asciiLower(*end)) {
    case 'a':
        return keyOnCircle(number + kSemitones - kCamelotOfC, true);
    case 'b':
        return keyOnCircle(number + kSemitones - kCamelotOfC, false);
    case 'm':
        return keyOnCircle(number - kOpenOfC, true);
    case 'd':
        return keyOnCircle(number - kOpenOfC, false);
    default:
        return std::nullopt;
    }
}

/// Takes one of the words off the beginning of a text, whatever its case.
bool takeWord(std::string_view& text, std::string_view word)
{
    const bool begins = equalIgnoringASCIICase(text.substr(0, word.size()), word);
    if (begins)
        text.remove_prefix(word.size());
    return begins;
}

/// In semitones.
std::int64_t accidentalTaken(std::string_view& text)
{
    constexpr std::pair<std::string_view, int> kAccidentals[] = {{"#", 1},  {"♯", 1},  {"sharp", 1},
                                                                 {"b", -1}, {"♭", -1}, {"flat", -1}};
    std::string_view rest = text;
    while (rest.starts_with(' ') || rest.starts_with('-'))
        rest.remove_prefix(1);
    for (const auto& [word, semitones] : kAccidentals)
        if (takeWord(rest, word)) {
            text = rest;
            return semitones;
        }
    return 0;
}

std::optional<MusicalKey> keyOfName(std::string_view text)
{
    constexpr std::array<std::int64_t, 7> kLetters = {9, 11, 0, 2, 4, 5, 7}; // A to G
    if (text.empty() || asciiLower(text.front()) < 'a' || asciiLower(text.front()) > 'g')
        return std::nullopt;
    const char letter = text.front();
    text.remove_prefix(1);
    MusicalKey key;
    key.note = kLetters[static_cast<std::size_t>(asciiLower(letter) - 'a')];
    key.note = (key.note + accidentalTaken(text) + kSemitones) % kSemitones;
    while (text.starts_with(' ') || text.starts_with('-'))
        text.remove_prefix(1);
    if (text.empty()) {
        key.mode = letter < 'a' ? "major" : "";
        return key;
    }
    if (text == "M") {
        key.mode = "major";
        return key;
    }
    const auto mode =
        std::ranges::find_if(kModes, [&](const ModeWord& word) { return equalIgnoringASCIICase(text, word.text); });
    if (mode == std::end(kModes))
        return std::nullopt;
    key.mode = mode->meaning;
    return key;
}

std::optional<MusicalKey> keyOfPart(std::string_view text)
{
    const auto key = keyOfNumber(text);
    return key ? key : keyOfName(text);
}

} // namespace

std::optional<MusicalKey> keyOfText(std::string_view text)
{
    constexpr std::size_t kLongest = 64; // longer texts are no keys
    text = withoutSpaces(text);
    if (text.size() > kLongest)
        return std::nullopt;
    if (const auto key = keyOfPart(text))
        return key;
    for (std::size_t begin = 0; begin < text.size();) { // "8A - A minor", "F#m/Gbm", "Am (8A)"
        const std::size_t separator = text.find_first_of("/,;|()", begin);
        const std::size_t dash = text.find(" - ", begin);
        const std::size_t end = std::min({separator, dash, text.size()});
        if (const auto key = keyOfPart(withoutSpaces(text.substr(begin, end - begin))))
            return key;
        begin = end + (end == dash ? 3 : 1);
    }
    return std::nullopt;
}

std::string keyText(std::int64_t note, const std::string& mode)
{
    const std::string name = loopKeyName(kMiddleC + note);
    return mode.empty() ? name : name + " " + mode;
}
