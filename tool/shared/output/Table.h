// A table for people: columns are as wide as their widest cell in any script, and the table fits the terminal.
#pragma once

#include <string>
#include <vector>

class Output;

enum class Align { left, right };

/// Keeps its rows until `print`, since the last may widen every column. Cells must come from `printable` or be ASCII.
/// To fit a terminal, names are shortened to 20 columns first; then columns are dropped, empty ones first and then by
/// descending `dropRank`; then names are shortened further. Room left over goes to the names.
class Table {
public:
    struct Column {
        std::string title;
        Align align = Align::left;
        int width = 0;           // at least
        int dropRank = 0;        // 0: never dropped
        bool isCuttable = false; // names and texts, which may be shortened
    };

    explicit Table(std::vector<Column> columns);
    void add(std::vector<std::string> row);
    /// Prints the titles (bold with `color`) and the rows; nothing if there are no rows.
    void print(Output& output, bool color);

    // For lists too long to keep, with column widths fixed in advance.

    /// Also fits the table to the terminal; a cuttable last column gets the room left over.
    void printTitles(Output& output, bool color);
    void printRow(Output& output, const std::vector<std::string>& row, bool bold = false) const;

private:
    void fit();
    int totalWidth() const;
    void narrow(int least, int limit);
    bool dropColumn();

    std::vector<Column> columns_;
    std::vector<int> widths_; // as printed; -1 for a dropped column
    bool isOnTerminal_ = false;
    std::vector<std::vector<std::string>> rows_;
};
