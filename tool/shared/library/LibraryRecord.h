// What an index knows about one audio file.
#pragma once

#include "platform/core/Value.h"

#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <variant>
#include <vector>

/// What tells a changed file from the same one: all as the system says. Times in nanoseconds since 1970.
struct SeenStamp {
    std::int64_t size = 0;     // in bytes
    std::int64_t modified = 0; // its content
    std::int64_t changed = 0;  // its content, name, owner or mode
    std::int64_t inode = 0;

    bool operator==(const SeenStamp&) const = default;
};

/// Where a file is: bytes, as the system has them.
struct FilePlace {
    std::string folder; // absolute, links resolved, with a slash at the end
    std::string name;

    std::string path() const { return folder + name; }
    auto operator<=>(const FilePlace&) const = default;
};

/// A waveform: pairs of lowest and highest value, -127 to 127, as in an overview block.
struct LibraryOverview {
    std::int64_t framesPerPoint = 0; // 256 times a power of two
    std::string points;              // two bytes each
};

/// Something that is wrong with a file.
struct LibraryProblem {
    std::string kind; // as `info --check` calls it; "unreadable"
    std::string text; // in words
};

/// A row of an index. Empty texts and missing numbers are not known.
struct LibraryRecord {
    using Text = std::string;
    using Whole = std::optional<std::int64_t>;
    using Real = std::optional<double>;

    FilePlace place;
    SeenStamp stamp;
    std::int64_t indexed = 0; // when it was read, in seconds since 1970

    // What it is, as `info` says it.
    Text state;          // "whole", "damaged": there is less than its headers promise, or it has problems; "unreadable"
    Text kind;           // "loop", "one-shot", "recording"
    Text containerName;  // "WAVE", "AIFF", "MP3"
    Text fileType;       // "WAVE", "AIFF", "MPG3"
    Text coding;         // "PCM", "AAC LC"
    Real sampleRate;     // in Hz
    Whole bitsPerSample; // of linear PCM
    Whole sourceBits;    // bits of a sample that count; of lossless codings those of the original
    Whole floatingPoint; // 1: samples are floats
    Whole channels;
    Text channelLayout;
    Whole frames;
    Real durationSeconds;
    Whole bitRate; // bits per second of compressed sound

    // What it says about its music.
    Real tempo; // in beats per minute
    Text tempoSource;
    Whole beatCount;
    Whole keyNote; // 0 to 11: C to B
    Text mode;     // "major", "minor", "neither", "both"
    Text key;      // in words: "F# minor"
    Text keySource;
    Text signature; // "4/4"
    Text category;  // of the instrument: "Bass"
    Text subCategory;
    Text genre;
    Text descriptors; // with ", " between them

    // Texts about it, of whichever field of its format says them.
    Text title;
    Text artist;
    Text album;
    Text comment;
    Text recorded; // when, as the file says it: "2026-11-23", "2026"

    Text soundHash; // of the samples as they are stored: SHA-256 in hexadecimal, if that was asked for

    std::vector<LibraryProblem> problems;
    std::optional<LibraryOverview> overview;
    Text fields; // all metadata fields, a JSON array of objects with "name", "value" and perhaps "words"
    Text tags;   // all loop tags, the JSON object that `tags --json` prints, without the path; empty if there are none
};

/// A column of the table `files` that holds a member of a record.
struct LibraryColumn {
    using Member = std::variant<LibraryRecord::Text LibraryRecord::*, LibraryRecord::Whole LibraryRecord::*,
                                LibraryRecord::Real LibraryRecord::*>;

    const char* name; // in the database: "sample_rate"
    const char* key;  // in JSON and CSV: "sampleRate"
    Member member;
};

/// All columns with plain values, in the order of the table. The place, the stamp and the other tables are not among
/// them.
std::span<const LibraryColumn> libraryColumns();
