// The order of the files of an answer, in SQL.
#pragma once

#include "tool/shared/library/QueryConditions.h"

#include <compare>
#include <cstdint>
#include <string>
#include <variant>
#include <vector>

/// A place in the order: the values that it goes by, and last the row.
class OrderKey {
public:
    /// From columns of a row from `first` on.
    OrderKey(const SQLStatement& row, int first, int count, std::int64_t file);

    std::int64_t file() const { return file_; }
    /// Unknown first values come last either way.
    static bool isAhead(const OrderKey& a, const OrderKey& b, bool isReversed);

private:
    using Cell = std::variant<std::monostate, std::int64_t, double, std::string>; // in the order of SQLite

    std::vector<Cell> cells_;
    std::int64_t file_;
};

/// How the rows of `files f` are gone through in an order, and by which columns.
struct QueryOrder {
    QueryOrder(const LibraryQuery& query, const QueryConditions& conditions);

    /// One behind the other, queries for all rows of the scope, in order and without sorting.
    std::vector<SQLText> walks;
    /// The columns of an OrderKey, with "f." and "d." ahead of their names.
    std::vector<std::string> columns;
    bool needsFolder = false; // whether "d." is among them
};
