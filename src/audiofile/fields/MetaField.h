// What a file says about itself, field by field, each told where it stands.
#pragma once

#include "platform/core/Bytes.h"
#include "platform/core/FourCC.h"

#include <cstdint>
#include <optional>
#include <string>
#include <variant>

/// One chunk, as far as it is held.
struct MetaChunk {
    FourCC id = 0;
    std::int64_t offset = 0; // of the header, in the file
    std::int64_t size = 0;   // as stated
    Bytes body;              // what is there; of what is too long to be held the beginning
    bool isHeld = true;      // false where `body` is such a beginning
};

struct MetaField {
    using Value = std::variant<std::string, std::int64_t, std::uint64_t, double>;

    std::string group;              // "bext": what the option --only asks for
    std::string place;              // "bext", of a second chunk "bext[1]"
    std::string name;               // within the place: "description"; empty where the chunk is the field
    Value value;                    // texts in UTF-8
    std::string words;              // what the value or its id stands for: "Artist", "LUFS"
    std::optional<double> seconds;  // what a number of frames takes
    const char* encoding = nullptr; // of a text that is not UTF-8, its IANA name
    std::optional<std::uint64_t>
        byteSize; // of bytes: `value` is the hexadecimal of the first, `ascii` the same as text
    std::string ascii;
    FourCC chunk = 0;
    std::int64_t offset = 0;

    /// "bext.description", "cue[3].label".
    std::string fullName() const
    {
        std::string text;
        appendFullName(text);
        return text;
    }
    void appendFullName(std::string& text) const
    {
        text += place;
        if (!name.empty() && name.front() != '[')
            text += '.';
        text += name;
    }
};
