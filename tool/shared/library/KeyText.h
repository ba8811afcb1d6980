// Keys as people and programs write them into fields: "F#m", "Gb major", "A minor", "8A".
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

struct MusicalKey {
    std::int64_t note = 0; // 0 to 11: C to B
    std::string mode;      // "major", "minor"; empty if it is not known
};

/// The key that a text names; none for other texts. Beside the names of notes: Camelot numbers ("8A" is A minor) and
/// Open Key numbers ("1m" is A minor). A capital letter alone is major, as in the key fields of ID3; a small one
/// leaves the mode open. Of several keys in a text the first counts.
std::optional<MusicalKey> keyOfText(std::string_view text);

/// "F# minor"; the note alone if there is no mode.
std::string keyText(std::int64_t note, const std::string& mode);
