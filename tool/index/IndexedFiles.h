// Goes through all that an index knows, by path.
#pragma once

#include "tool/shared/library/Library.h"

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

/// A file as an index has seen it.
struct IndexedFile {
    FilePlace place;
    SeenStamp stamp;
    std::int64_t row = 0;     // of an audio file; 0 for other files
    std::int64_t indexed = 0; // of an audio file
    std::string folderWords;  // what a search for words looks at of its folder
};

/// Must not outlive the library. Nothing may be changed on the way.
class IndexedFiles {
public:
    /// Other files than audio are passed over unless they are asked for.
    enum class Which { audio, all };
    IndexedFiles(Library& library, Which which);

    /// The next file in the order of the paths; none at the end.
    std::optional<IndexedFile> next();

private:
    SQLStatement files_;
};

/// Reads the records of files. Must not outlive the library.
class RecordReader {
public:
    explicit RecordReader(Library& library);
    /// All that is known of an audio file.
    LibraryRecord record(const IndexedFile& file);
    /// The file of a place; none if nothing is known of it.
    std::optional<IndexedFile> find(const FilePlace& place);

private:
    SQLStatement record_, findings_, place_;
};
