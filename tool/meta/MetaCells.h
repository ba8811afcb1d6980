// The fields of a file as cells of a table: those that can be set, each by the text that sets it.
#pragma once

#include "tool/meta/MetaFileEdit.h"

struct MetaCell {
    MetaName name;
    std::string text;
};

/// All fields that can be set, in the order of the file. The lines of a coding history are one cell, "codingHistory",
/// and a text of "strg" that a marker shows stands with the marker only.
std::vector<MetaCell> cellsOf(const HeldMetadata& held, const MetaGroups& groups = {});

/// The indices of the names in the order of columns: by groups, within these by item and by field. It is an order in
/// which they can be set.
std::vector<std::size_t> inOrder(const std::vector<MetaName>& names);

/// As written to a table: in $'…' what holds control characters beside tabs and line ends, and what begins so.
std::string writtenCell(std::string_view text);
/// What is meant by what stands in a table. Throws UsageError.
std::string meantCell(std::string_view cell);

/// The steps that make a file's fields say what the cells do, which are in order; none for those that do already,
/// whatever its line ends. An empty cell leaves its field alone; with `emptyRemoves` it removes it, and the item or the
/// chunk of which every field goes. Throws Failure.
std::vector<MetaStep> stepsTo(const std::vector<MetaCell>& cells, const HeldMetadata& held, bool emptyRemoves,
                              bool isLenient);

/// Why no file has this value; empty when one might. Dates must be those of the standard, since spreadsheets write
/// them in other ways.
std::string problemOf(const MetaCell& cell, bool isLenient);
/// Whether the file has it.
bool stands(const MetaCell& cell, const HeldMetadata& held);
