// What `find` prints of each file.
#pragma once

#include "tool/shared/library/LibraryQuery.h"
#include "tool/shared/library/LibrarySearch.h"
#include "tool/shared/output/DataRecords.h"
#include "tool/shared/output/Table.h"

#include <string>

/// How paths are separated where nothing else is printed.
enum class PathEnd : char { line = '\n', nul = '\0' };

class FindReport {
public:
    /// Paths that end with a NUL byte take the place of tables and lines.
    FindReport(const OutputOptions& options, const LibraryQuery& query, PathEnd pathEnd);

    Form form() const { return form_; }
    /// The parts of records that will be printed.
    LibraryParts parts() const;
    void add(const LibraryRecord& record);
    void finish() { records_.finish(); }
    /// In the place of `finish` where the index could not be read to its end.
    void fail(const std::string& path, const std::string& text);

private:
    void addRow(const LibraryRecord& record);
    void addData(const LibraryRecord& record);
    std::string shownPath(const LibraryRecord& record) const;

    const LibraryQuery& query_;
    PathEnd pathEnd_;
    Form form_;
    bool color_;
    bool isFirst_ = true;
    Output& output_ = Output::standard();
    Table table_;
    DataRecords records_;
};
