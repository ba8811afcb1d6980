// Reads comma-separated values (RFC 4180) as spreadsheets write them.
#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

struct CsvRow {
    std::size_t line = 0; // where it begins, counted from 1
    std::vector<std::string> cells;
};

/// Lines end with CRLF, LF or CR. A cell that begins with a quotation mark ends with one, and doubles those inside; in
/// other cells they are ordinary characters.
class CsvReader {
public:
    /// The text must outlive this; skips a byte order mark.
    CsvReader(std::string_view text, char separator);

    /// None at the end; skips empty lines. Throws Failure for unbalanced quotation marks.
    std::optional<CsvRow> next();

private:
    std::string takeCell();
    std::string takeQuoted();
    bool takeLineEnd();

    std::string_view text_;
    char separator_;
    std::size_t line_ = 1;
};
