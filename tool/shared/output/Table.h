// A table for people: columns as wide as their widest cell, whatever scripts the names are written in, and a table that
// fits the terminal.
#pragma once

#include <string>
#include <vector>

class Output;

enum class Align { left, right };

/// Holds its rows until `print`, since the last may widen every column. Cells must come from `printable` or be ASCII.
/// On a terminal it is made to fit: first names are shortened to 20 columns, then columns are left out, empty ones
/// and then those with the highest `dropRank` first, then names are shortened further. What room is left in the end
/// goes to the names.
class Table {
public:
    struct Column {
        std::string title;
        Align align = Align::left;
        int width = 0;           // at least
        int dropRank = 0;        // 0: is never left out
        bool isCuttable = false; // names and texts, which may be shortened
    };

    explicit Table(std::vector<Column> columns);
    void add(std::vector<std::string> row);
    /// The titles (bold with `color`) and the rows; nothing when there is no row.
    void print(Output& output, bool color);

    // For lists too long to hold, whose columns have their widths from the start:

    /// Also makes the table fit; a cuttable column that comes last takes all that is left.
    void printTitles(Output& output, bool color);
    void printRow(Output& output, const std::vector<std::string>& row, bool bold = false) const;

private:
    void fit();
    int totalWidth() const;
    void narrow(int least, int limit);
    bool dropColumn();

    std::vector<Column> columns_;
    std::vector<int> widths_; // as printed; of a column that is left out -1
    bool isOnTerminal_ = false;
    std::vector<std::vector<std::string>> rows_;
};
