// What a file says about itself, field by field, each with its place.
#pragma once

#include "platform/core/Bytes.h"
#include "platform/core/FourCC.h"

#include <cstdint>
#include <optional>
#include <string>
#include <variant>

/// One chunk, all of it or its beginning.
struct MetaChunk {
    FourCC id = 0;           // of the chunk
    std::int64_t offset = 0; // of the header, from the start of the file
    std::int64_t size = 0;   // as stated
    Bytes body;              // all of it or, of a chunk too long to be held, its beginning
    bool isHeld = true;      // false where `body` is such a beginning
};

/// One field of a file.
struct MetaField {
    /// What a field holds.
    using Value = std::variant<std::string, std::int64_t, std::uint64_t, double>;

    std::string group;              // "bext": what the option --only asks for
    std::string place;              // "bext"; of a second such chunk "bext[1]"
    std::string name;               // within the place: "description"; empty where the chunk is the field
    Value value;                    // texts in UTF-8
    std::string words;              // the meaning of the value or its id: "Artist", "LUFS"
    std::optional<double> seconds;  // the duration of a number of frames
    const char* encoding = nullptr; // of a text that was not UTF-8, the IANA name; else null
    std::optional<std::uint64_t>
        byteSize;            // of bytes: `value` is the hexadecimal of the first, `ascii` the same as text
    std::string ascii;       // of bytes: the first ones as text
    FourCC chunk = 0;        // the id of its chunk
    std::int64_t offset = 0; // of the chunk's header, from the start of the file

    /// The place and the name: "bext.description", "cue[3].label".
    std::string fullName() const
    {
        std::string text;
        appendFullName(text);
        return text;
    }
    /// Appends fullName() to a text.
    void appendFullName(std::string& text) const
    {
        text += place;
        if (!name.empty() && name.front() != '[')
            text += '.';
        text += name;
    }
};
