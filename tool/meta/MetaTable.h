// A table of metadata: files by rows, fields by columns, read from CSV or from the XML that `meta export` writes.
#pragma once

#include "tool/meta/MetaCells.h"

struct MetaColumn {
    std::string heading; // as it stands there
    MetaName field;
};

struct MetaRow {
    struct Cell {
        std::size_t column = 0;
        std::string text; // as meant
    };
    std::size_t line = 0; // on which it begins, counted from 1
    std::string path;
    std::vector<Cell> cells; // in the order of columns
};

/// What is wrong with a table.
struct TableProblem {
    std::size_t line = 0;
    std::string text;
};

struct MetaTable {
    std::vector<MetaColumn> columns; // in the order in which fields are set
    std::vector<MetaRow> rows;
    std::vector<TableProblem> problems; // while there are any, rows may be missing

    std::vector<MetaCell> cellsOf(const MetaRow& row) const;
};

/// Which is it, is seen from the first character. Headings are names of fields, or those that the core export of
/// bwfmetaedit has; one of them is "path" or "FileName". Throws Failure for what cannot be read, and for what is no
/// table.
MetaTable readMetaTable(const std::string& file);
/// The same of a text that begins as XML does, or not.
MetaTable metaTableFromXML(std::string_view text);
MetaTable metaTableFromCSV(std::string_view text);

/// Columns and rows as they come, made a table in the end.
class MetaTableMaker {
public:
    /// The index of a column; of one that is there already its own.
    std::size_t column(const std::string& heading);
    /// The problem of a heading; empty when it names a field, or a file, or is passed over.
    static std::string problemOf(const std::string& heading);
    static bool isPath(const std::string& heading);

    void add(MetaRow row) { table_.rows.push_back(std::move(row)); }
    void addProblem(std::size_t line, std::string text) { table_.problems.push_back({line, std::move(text)}); }
    /// The text of a cell as it is meant; empty, with a problem, where it is none.
    std::string meant(std::size_t line, const std::string& heading, std::string_view cell);

    MetaTable finish();

private:
    MetaTable table_;
    std::map<std::string, std::size_t, std::less<>> columns_; // by their fields
};
