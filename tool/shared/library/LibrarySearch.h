// The answer of an index to a query, file by file.
#pragma once

#include "tool/shared/library/Library.h"
#include "tool/shared/library/LibraryQuery.h"

#include <memory>

/// What a record holds beside its plain values.
struct LibraryParts {
    bool overview = false;
    bool fields = false;
    bool tags = false;
    bool problems = false;
};

/// Must not outlive the library. Operations throw Failure.
class LibrarySearch {
public:
    /// The query must have its words settled.
    LibrarySearch(Library& library, const LibraryQuery& query, LibraryParts parts = {});
    ~LibrarySearch();
    LibrarySearch(const LibrarySearch&) = delete;
    LibrarySearch& operator=(const LibrarySearch&) = delete;

    /// Fills the record with the next file that was found; false behind the last.
    bool next(LibraryRecord& record);
    /// Whether there are files beyond the limit, once `next` has returned false.
    bool hasMore() const;

private:
    class Answer;
    std::unique_ptr<Answer> answer_;
};
