// Records of an index as JSON, an object each, which carry all that the index knows. Page:
// docs/formats/library-index.md.
#pragma once

#include "platform/core/JsonWriter.h"
#include "tool/shared/library/LibraryRecord.h"

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <variant>

/// A folder that was indexed.
struct LibraryRoot {
    std::string path;                      // as bytes, with a slash at the end
    std::optional<std::int64_t> completed; // when it was last gone through to its end, in seconds since 1970
};

/// What could not be examined; of a file that was, problems are in its record.
struct UnseenPlace {
    std::string path;
    std::string error;
};

/// One line of JSON Lines.
using LibraryLine = std::variant<LibraryRecord, LibraryRoot, UnseenPlace>;

/// Writes an object. Names are as `indexedName` makes them, and are read back as the same bytes.
void writeLibraryRecord(JsonWriter& json, const LibraryRecord& record);
void writeLibraryRoot(JsonWriter& json, const LibraryRoot& root);

/// Reads an object that one of these, or the record of a failure, has become. Throws Failure for anything else: what
/// is no JSON, keys that are not known or come twice, and values that `requireSound` refuses.
LibraryLine libraryLineOf(std::string_view json);
