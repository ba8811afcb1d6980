#include "tool/shared/library/QueryOrder.h"

#include <fmt/format.h>
#include <fmt/ranges.h>

#include <algorithm>

namespace {

using Order = LibraryQuery::Order;

// Each is what an index begins with; the row, which ends every index, is the last.
std::vector<std::string> columnsOf(Order order)
{
    switch (order) {
    case Order::relevance: // settled later
        return {};
    case Order::path:
        return {"d.path", "f.name"};
    case Order::name:
        return {"f.name"};
    case Order::tempo:
        return {"f.tempo"};
    case Order::key:
        return {"f.key_note", "f.mode", "f.tempo"};
    case Order::duration:
        return {"f.duration_seconds"};
    case Order::size:
        return {"f.size"};
    case Order::modified:
        return {"f.modified"};
    case Order::category:
        return {"f.category", "f.tempo"};
    case Order::rate:
        return {"f.sample_rate"};
    case Order::sound:
        return {"f.sound_hash"};
    }
    return {};
}

bool maybeUnknown(Order order)
{
    return order == Order::tempo || order == Order::key || order == Order::duration || order == Order::category ||
           order == Order::rate;
}

} // namespace

OrderKey::OrderKey(const SQLStatement& row, int first, int count, std::int64_t file) : file_(file)
{
    for (int column = first; column < first + count; ++column)
        if (row.isNull(column))
            cells_.emplace_back();
        else if (row.isText(column))
            cells_.emplace_back(row.text(column));
        else if (row.isReal(column))
            cells_.emplace_back(row.real(column));
        else
            cells_.emplace_back(row.number(column));
}

bool OrderKey::isAhead(const OrderKey& a, const OrderKey& b, bool isReversed)
{
    const auto isUnknown = [](const OrderKey& key) {
        return !key.cells_.empty() && std::holds_alternative<std::monostate>(key.cells_.front());
    };
    if (isUnknown(a) != isUnknown(b))
        return isUnknown(b);
    if (a.cells_ != b.cells_)
        return isReversed ? b.cells_ < a.cells_ : a.cells_ < b.cells_;
    return isReversed ? b.file_ < a.file_ : a.file_ < b.file_;
}

QueryOrder::QueryOrder(const LibraryQuery& query, const QueryConditions& conditions)
    : columns(columnsOf(query.settledOrder()))
{
    const Order order = query.settledOrder();
    const char* const direction = query.isReversed && order != Order::relevance ? " DESC" : "";
    needsFolder = order == Order::path;
    std::vector<std::string> sorting = columns;
    if (!needsFolder)
        sorting.emplace_back("f.id");
    for (std::string& column : sorting)
        column += direction;
    const std::string inOrder = fmt::format(" ORDER BY {}", fmt::join(sorting, ", "));
    if (needsFolder) {
        SQLText walk{"SELECT f.id FROM folders d CROSS JOIN files f ON f.folder = d.id", {}};
        if (!conditions.ofFolder().sql.empty())
            walk.append(conditions.ofFolder(), " WHERE ");
        walk.sql += inOrder;
        walks.push_back(std::move(walk));
    } else if (order == Order::sound) {
        walks.push_back({"SELECT f.id FROM files f INDEXED BY copied_files WHERE f.copied = 1" + inOrder, {}});
    } else if (maybeUnknown(order)) {
        walks.push_back({fmt::format("SELECT f.id FROM files f WHERE {} IS NOT NULL{}", columns.front(), inOrder), {}});
        walks.push_back({fmt::format("SELECT f.id FROM files f WHERE {} IS NULL{}", columns.front(), inOrder), {}});
    } else {
        walks.push_back({"SELECT f.id FROM files f" + inOrder, {}});
    }
}
