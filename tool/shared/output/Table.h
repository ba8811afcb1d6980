// A table for people: columns as wide as their widest cell, whatever scripts the names are written in.
#pragma once

#include <string>
#include <vector>

class Output;

enum class Align { left, right };

/// Holds its rows until `print`, since the last may widen every column. Cells must come from `printable` or be ASCII.
class Table {
public:
    struct Column {
        std::string title;
        Align align = Align::left;
        int width = 0; // at least
    };

    explicit Table(std::vector<Column> columns);
    void add(std::vector<std::string> row);
    /// The titles (bold with `color`) and the rows; nothing when there is no row.
    void print(Output& output, bool color) const;
    /// One row at the widths known so far, for lists too long to hold.
    void printRow(Output& output, const std::vector<std::string>& row, bool bold = false) const;
    void printTitles(Output& output, bool color) const;

private:
    std::vector<Column> columns_;
    std::vector<std::vector<std::string>> rows_;
};
