// What is asked of an index.
#pragma once

#include "tool/shared/library/LibraryRecord.h"

#include <cstdint>
#include <limits>
#include <optional>
#include <string>
#include <vector>

/// From a number to another, both included.
struct NumberRange {
    double least = -std::numeric_limits<double>::infinity();
    double most = std::numeric_limits<double>::infinity();

    bool operator==(const NumberRange&) const = default;
};

/// A key, or all keys with a root note, or all of a mode.
struct KeyChoice {
    std::optional<std::int64_t> note; // 0 to 11: C to B
    std::string mode;                 // "major", "minor", or empty: any

    bool operator==(const KeyChoice&) const = default;
};

/// All that a file must be to be found, and in which order files are. What is empty asks for nothing.
struct LibraryQuery {
    /// Files below a folder.
    struct Scope {
        std::string path;  // absolute, links resolved, with a slash at the end
        std::string typed; // as it was named, with a slash at the end; results are named below it
    };
    /// `sound` puts the same sounds together, and is for duplicates only.
    enum class Order { relevance, path, name, tempo, key, duration, size, modified, category, rate, sound };

    std::vector<Scope> scopes;      // one of them holds the file
    std::vector<std::string> terms; // each begins a word of the file, or is several words in a row
    std::vector<NumberRange> tempos;
    std::vector<KeyChoice> keys;
    bool takesRelated = false; // relative and parallel keys too, and tempos half and twice as fast
    // Texts as a file has them, but for case and accents.
    std::string category; // or sub-category
    std::string genre;
    std::string artist;
    std::string title;
    std::string album;
    std::string kind;                    // as in a record
    std::vector<std::string> containers; // of one of these; names as in records
    std::vector<std::string> codings;    // or so coded
    std::optional<NumberRange> seconds;
    std::optional<NumberRange> sampleRate;
    std::optional<NumberRange> channels;
    std::vector<std::string> problems;         // kinds; one of them is found
    bool takesAnyProblem = false;              // one of any kind
    bool takesDuplicates = false;              // the sound is that of another file in the index
    std::optional<std::int64_t> modifiedSince; // in nanoseconds since 1970

    std::optional<Order> order; // else the order of relevance for terms, or of duplicates, or of paths
    bool isReversed = false;
    std::optional<std::int64_t> limit; // 0: none

    std::vector<std::string> words; // those of the command line, until `settleWords` tells scopes from terms

    Order settledOrder() const;
};

/// The tempos with those half and twice as fast if they are wanted.
std::vector<NumberRange> wantedTempos(const LibraryQuery& query);
/// The keys with their relative and parallel keys if they are wanted.
std::vector<KeyChoice> wantedKeys(const LibraryQuery& query);
