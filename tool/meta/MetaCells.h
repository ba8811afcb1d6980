// The fields of a file that can be set, as cells of a table with the texts that set them.
#pragma once

#include "tool/meta/MetaFileEdit.h"

struct MetaCell {
    MetaName name;
    std::string text;
};

/// All fields that can be set, in file order. The lines of a coding history are one cell, "codingHistory", and a text
/// of "strg" that a marker shows appears only as the marker's.
std::vector<MetaCell> cellsOf(const HeldMetadata& held, const MetaGroups& groups = {});

/// The indices of the names in the order of columns: by group, then by item and field. Fields can be set in that order.
std::vector<std::size_t> inOrder(const std::vector<MetaName>& names);

/// The text in a table: as $'…' if it contains control characters other than tabs and line ends, or begins like that.
std::string writtenCell(std::string_view text);
/// The meaning of a table's text. Throws UsageError.
std::string meantCell(std::string_view cell);

/// The steps that give a file's fields the cells' values, in the cells' order; none for values that differ at most in
/// line ends. An empty cell is ignored, or with `emptyRemoves` removes its field, and the item or chunk whose fields
/// are all removed. Throws Failure.
std::vector<MetaStep> stepsTo(const std::vector<MetaCell>& cells, const HeldMetadata& held, bool emptyRemoves,
                              bool isLenient);

/// Why the value is invalid for every file; empty if it may be valid. Dates must be the standard's, because
/// spreadsheets write others.
std::string problemOf(const MetaCell& cell, bool isLenient);
/// Whether the file has the value.
bool stands(const MetaCell& cell, const HeldMetadata& held);
