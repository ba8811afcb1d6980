// The vocabulary of loop tags on the command line: the keys, the names of notes and modes, and KEY=VALUE.
#pragma once

#include "platform/core/Value.h"

#include <cstdint>
#include <span>
#include <string>
#include <string_view>
#include <vector>

class VireoLoopBaseChunk;

/// One tag that can be set.
struct TagField {
    enum class Kind { number, text, list, transients };

    const char* name; // in JSON and on the command line
    const char* key;  // in the library's dictionary; null for the transients
    Kind kind;
    bool isFileInfo = false; // of the two dictionaries
    std::int64_t least = 0;  // of numbers
    std::int64_t most = 0;
};

/// All of them, in the order of output.
std::span<const TagField> tagFields();

/// The fields that a key of the command line stands for: one, two for "signature", none for an unknown key.
std::vector<const TagField*> fieldsForKey(std::string_view key);

/// A field and its new value: null to clear it, an array of integers for transients.
struct TagAssignment {
    const TagField* field;
    platform::Value value;
};

/// Files and "KEY=VALUE" in any order, told apart: what has a "=" and no "/" ahead of it is an assignment. Throws
/// UsageError for an unknown key, a key named twice and a value that can never be.
struct TagArguments {
    std::vector<std::string> files;
    std::vector<TagAssignment> assignments;
};
TagArguments parseAssignments(std::span<const std::string> arguments);
/// The same for "tags remove": what is a key and holds no "/" is one; its field is to be cleared.
TagArguments parseKeys(std::span<const std::string> arguments);

/// "C" to "B" for MIDI notes 48 to 59, the number for others.
std::string noteName(std::int64_t note);
/// "none", "minor", "major", "neither", "both"; the number for others.
std::string modeName(std::int64_t keyType);
/// The id by which people know a chunk that is carried without being interpreted.
std::string carriedChunkName(const VireoLoopBaseChunk& chunk);
