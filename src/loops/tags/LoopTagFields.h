// The vocabulary of loop tags: their names, and those of keys.
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
    enum class Kind { number, text, list, transients };

    const char* name; // in JSON, in lines and on the command line
    const char* word; // a shorter name for the command line, or the same
    const char* key;  // in the library's dictionary; null for the transients
    Kind kind;
    bool isFileInfo = false; // of the two dictionaries
    std::int64_t least = 0;  // of numbers
    std::int64_t most = 0;
};

/// All of them, in the order of output.
KT_EXPORT std::span<const LoopTagField> loopTagFields();

/// The fields that a name of the command line stands for: one, two for "signature" and for "key", which is a root note
/// with its mode, none for an unknown one. Case does not count, nor do "-", "_" and spaces: labels of a table are
/// names.
KT_EXPORT std::vector<const LoopTagField*> loopTagFieldsForKey(std::string_view key);

/// "C" to "B" for MIDI notes of every octave, 1 to 127; empty for others.
KT_EXPORT std::string loopKeyName(std::int64_t note);
/// The id by which people know a chunk that is carried without being interpreted; "silence" for the one that has none.
KT_EXPORT std::string carriedLoopChunkName(const VireoLoopBaseChunk& chunk);
