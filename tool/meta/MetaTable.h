// A table of metadata with files as rows and fields as columns, read from CSV or from the XML of `meta export`.
#pragma once

#include "tool/meta/MetaCells.h"

struct MetaColumn {
    std::string heading; // as it stands in the table
    MetaName field;
};

struct MetaRow {
    struct Cell {
        std::size_t column = 0;
        std::string text; // its meaning
    };
    std::size_t line = 0; // where it begins, counted from 1
    std::string path;
    std::vector<Cell> cells; // in column order
};

/// A problem in a table.
struct TableProblem {
    std::size_t line = 0;
    std::string text;
};

struct MetaTable {
    std::vector<MetaColumn> columns; // in the order in which fields are set
    std::vector<MetaRow> rows;
    std::vector<TableProblem> problems; // if there are any, rows may be missing

    std::vector<MetaCell> cellsOf(const MetaRow& row) const;
};

/// The first character tells the format. Headings are names of fields, or those of bwfmetaedit's core export; one of
/// them is "path" or "FileName". Throws Failure if the file cannot be read or is no table.
MetaTable readMetaTable(const std::string& file);
/// As above for a text in XML.
MetaTable metaTableFromXML(std::string_view text);
MetaTable metaTableFromCSV(std::string_view text);

/// Collects columns and rows, and makes a table of them in the end.
class MetaTableMaker {
public:
    /// The index of a column; adds the column if it is new.
    std::size_t column(const std::string& heading);
    /// What is wrong with a heading; empty if it names a field or a file, or is ignored.
    static std::string problemOf(const std::string& heading);
    static bool isPath(const std::string& heading);

    void add(MetaRow row) { table_.rows.push_back(std::move(row)); }
    void addProblem(std::size_t line, std::string text) { table_.problems.push_back({line, std::move(text)}); }
    /// The meaning of a cell's text; empty, with a problem, if it has none.
    std::string meant(std::size_t line, const std::string& heading, std::string_view cell);

    MetaTable finish();

private:
    MetaTable table_;
    std::map<std::string, std::size_t, std::less<>> columns_; // by field
};
