// The index of a library of audio files: an SQLite database that `index` fills, and `find` and `page` ask.
#pragma once

#include "tool/shared/library/LibraryRecord.h"
#include "tool/shared/library/SQLDatabase.h"

#include <string>

/// The index of the user unless another is named: "ktfiles/library.db" in the folder for data of the desktop.
std::string defaultLibrary();

/// An open index. Operations throw Failure.
class Library {
public:
    /// What for: asking, or changing; `create` makes the index and its folder if there is none.
    explicit Library(const std::string& path, SQLDatabase::Mode mode);

    SQLDatabase& database() { return database_; }
    const std::string& path() const { return database_.path(); }

private:
    SQLDatabase database_;
};

/// The columns of `files` by their names, each after "f.", with ", " between them.
std::string libraryColumnNames();
/// Fills the plain values of a record from columns in the order of libraryColumns(), of which the first is `first`.
void readLibraryColumns(LibraryRecord& record, const SQLStatement& row, int first);
