// The vocabulary of loop tags: their names, and those of notes and modes.
#pragma once

#include <cstdint>
#include <span>
#include <string>
#include <string_view>
#include <vector>

class VireoLoopBaseChunk;

/// One tag that can be set.
struct TagField {
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
std::span<const TagField> tagFields();

/// The fields that a name of the command line stands for: one, two for "signature" and for "key", which is a root note
/// with its mode, none for an unknown one. Case does not count, nor do "-", "_" and spaces: labels of a table are
/// names.
std::vector<const TagField*> fieldsForKey(std::string_view key);

/// "C" to "B" for MIDI notes 48 to 59, the number for others.
std::string noteName(std::int64_t note);
/// "C" to "B" for MIDI notes of every octave, 1 to 127; empty for others.
std::string keyName(std::int64_t note);
/// "none", "minor", "major", "neither", "both"; the number for others.
std::string modeName(std::int64_t keyType);
/// The id by which people know a chunk that is carried without being interpreted.
std::string carriedChunkName(const VireoLoopBaseChunk& chunk);
