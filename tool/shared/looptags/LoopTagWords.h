// Loop tags in words and as JSON.
#pragma once

#include "loops/tags/LoopTags.h"

#include <string>
#include <string_view>
#include <vector>

class JsonWriter;

/// One tag in words: its name, its label for people, and the value.
struct TagLine {
    const char* name;
    const char* label;
    std::string text;   // in one line, as `tags set` takes it back
    std::string brief;  // for people
    std::string source; // the chunk that says it, where that is none of the loop chunks
};
/// What is known of the tags, in a musician's order.
std::vector<TagLine> tagLines(const LoopTags& tags);
using TagText = std::string (*)(const LoopTags& tags);
/// What gives the text of one tag, in one line, by its name, which must be one of theirs.
TagText tagTextCalled(std::string_view name);

/// The root note by its name, in whatever octave, and the mode.
std::string keyWords(const LoopTags& tags);

/// The whole JSON object, on one line.
void writeLoopTags(JsonWriter& json, const std::string& path, const LoopTags& tags);
