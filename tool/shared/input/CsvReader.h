// Reads comma-separated values (RFC 4180), as spreadsheets write them too.
#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

struct CsvRow {
    std::size_t line = 0; // on which it begins, counted from 1
    std::vector<std::string> cells;
};

/// Lines end with CRLF, LF or CR. A cell that begins with a quotation mark ends with one, and has two for each in it;
/// marks elsewhere are characters like any other.
class CsvReader {
public:
    /// The text must outlive this; a byte order mark ahead of it is passed over.
    CsvReader(std::string_view text, char separator);

    /// None at the end; lines with nothing on them are passed over. Throws Failure for quotation marks that do not
    /// match.
    std::optional<CsvRow> next();

private:
    std::string takeCell();
    std::string takeQuoted();
    bool takeLineEnd();

    std::string_view text_;
    char separator_;
    std::size_t line_ = 1;
};
