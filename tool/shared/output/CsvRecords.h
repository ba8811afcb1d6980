// A verb's CSV (RFC 4180): a header, then a row per record, with the same columns for all files.
#pragma once

#include "tool/shared/output/Output.h"
#include "tool/shared/output/Record.h"

#include <span>
#include <string>

/// Columns by their names in JSON; the last is "error".
using CsvColumns = std::span<const char* const>;

/// One row, CRLF included. Columns without a value are empty. Numbers are as in JSON, lists are joined by commas, text
/// is unchanged: a cell that begins with "=" stays so, since a reader would take a change for part of the name. Invalid
/// UTF-8 becomes U+FFFD; on a terminal the text is made printable.
std::string csvRow(CsvColumns columns, const Record& record);
/// The row of a file that failed.
std::string csvFailure(CsvColumns columns, const std::string& path, const std::string& text);

/// Appends one cell, in quotation marks if its text needs them.
void appendCsvCell(std::string& row, std::string_view text);

/// Writes nothing unless CSV was requested.
class CsvRecords {
public:
    /// The columns must outlive this.
    CsvRecords(const OutputOptions& options, CsvColumns columns) : columns_(columns), isWanted_(options.csv) {}

    void add(const Record& record) { addRow(isWanted_ ? csvRow(columns_, record) : ""); }
    /// Adds a row made by `csvRow`.
    void addRow(std::string_view row);
    void addFailure(const std::string& path, const std::string& text)
    {
        addRow(isWanted_ ? csvFailure(columns_, path, text) : "");
    }
    /// Call after the last row, even if there was none.
    void finish() { addRow({}); }

private:
    CsvColumns columns_;
    bool isWanted_;
    bool hasBegun_ = false;
};
