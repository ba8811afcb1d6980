// The vocabulary of loop tags: their names, and the names of keys.
#pragma once

#include "platform/core/Export.h"

#include <cstdint>
#include <span>
#include <string>
#include <string_view>
#include <vector>

class VireoLoopBaseChunk;

/// One tag that can be set.
struct LoopTagField {
    /// What its value is.
    enum class Kind { number, text, list, transients };

    const char* name;        // in JSON, in lines and on the command line
    const char* word;        // a shorter name for the command line, or the same
    const char* key;         // in the library's dictionaries; null for the transients
    Kind kind;               // what its value is
    bool isFileInfo = false; // whether its dictionary is that of titles and artists
    std::int64_t least = 0;  // of numbers
    std::int64_t most = 0;   // of numbers
};

/// All tags, in the order of output.
KT_EXPORT std::span<const LoopTagField> loopTagFields();

/// The fields of a name on the command line: one; two for "signature" and for "key", which is a root note with its
/// mode; none for an unknown name. Case, "-", "_" and spaces do not count, so that labels of a table are names too.
KT_EXPORT std::vector<const LoopTagField*> loopTagFieldsForKey(std::string_view key);

/// "C" to "B" for MIDI notes of every octave, 1 to 127; empty for others.
KT_EXPORT std::string loopKeyName(std::int64_t note);
/// The id by which people know a chunk that is carried uninterpreted; "silence" for the one without an id.
KT_EXPORT std::string carriedLoopChunkName(const VireoLoopBaseChunk& chunk);
