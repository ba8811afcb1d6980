// Loop tags in words and as JSON.
#pragma once

#include "loops/tags/LoopTags.h"

#include <string>
#include <string_view>
#include <vector>

class JsonWriter;

/// One tag in words: its name, its label for people, and its value.
struct TagLine {
    const char* name;
    const char* label;
    std::string text;   // in one line, as accepted by `tags set`
    std::string brief;  // for people
    std::string source; // the chunk with the tag, unless that is a loop chunk
};
/// The known tags in a musician's order.
std::vector<TagLine> tagLines(const LoopTags& tags);
using TagText = std::string (*)(const LoopTags& tags);
/// The function for the text of one tag, in one line; the name must be one of theirs.
TagText tagTextCalled(std::string_view name);

/// The name of the root note, in any octave, and the mode.
std::string keyWords(const LoopTags& tags);

/// Writes the whole JSON object on one line.
void writeLoopTags(JsonWriter& json, const std::string& path, const LoopTags& tags);
/// Writes what that object says behind the path into one that has begun.
void writeLoopTagMembers(JsonWriter& json, const LoopTags& tags);
