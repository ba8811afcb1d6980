// The CSV of a verb (RFC 4180): a header, then a row for each record, with the same columns whatever the files are.
#pragma once

#include "tool/shared/output/Output.h"
#include "tool/shared/output/Record.h"

#include <span>
#include <string>

/// Columns by the names that JSON has for them; the last is "error".
using CsvColumns = std::span<const char* const>;

/// One row, CRLF included. Of a column that the record has no value for nothing stands between the commas. Numbers are
/// written as in JSON, lists joined by commas, text as it is: a cell that begins with "=" is not changed, since a
/// reader would take the change for the name. What is not UTF-8 becomes U+FFFD; on a terminal the text is printable.
std::string csvRow(CsvColumns columns, const Record& record);
/// The row of a file that failed.
std::string csvFailure(CsvColumns columns, const std::string& path, const std::string& text);

/// One cell, in quotation marks where its text needs them.
void appendCsvCell(std::string& row, std::string_view text);

/// Writes nothing unless CSV is asked for.
class CsvRecords {
public:
    /// The columns must outlive this.
    CsvRecords(const OutputOptions& options, CsvColumns columns) : columns_(columns), isWanted_(options.csv) {}

    void add(const Record& record) { addRow(isWanted_ ? csvRow(columns_, record) : ""); }
    /// One that `csvRow` made.
    void addRow(std::string_view row);
    void addFailure(const std::string& path, const std::string& text)
    {
        addRow(isWanted_ ? csvFailure(columns_, path, text) : "");
    }
    /// Behind the last; there may have been none.
    void finish() { addRow({}); }

private:
    CsvColumns columns_;
    bool isWanted_;
    bool hasBegun_ = false;
};
