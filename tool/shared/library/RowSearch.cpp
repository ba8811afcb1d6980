#include "tool/shared/library/RowSearch.h"

#include <fmt/format.h>
#include <fmt/ranges.h>

#include <algorithm>
#include <limits>

namespace {

constexpr std::int64_t kRowsForOneFound = 8; // so many more are worth it

std::string lookingAtRow(const QueryOrder& order, const QueryConditions& conditions)
{
    std::string sql = "SELECT 1";
    for (const std::string& column : order.columns)
        sql += ", " + column;
    sql += " FROM files f";
    if (order.needsFolder)
        sql += " JOIN folders d ON d.id = f.folder";
    sql += " WHERE f.id = ?";
    return conditions.ofRow().sql.empty() ? sql : sql + " AND " + conditions.ofRow().sql;
}

/// The rows of a selection; none if there are more than `most`.
std::optional<RowSet> rowsOf(SQLDatabase& database, const SQLText& selection, std::size_t most)
{
    SQLStatement statement(database, selection.sql);
    RowSet rows;
    for (selection.bindTo(statement); statement.step(); rows.add(statement.number(0)))
        if (rows.size() == most)
            return std::nullopt;
    return rows;
}

} // namespace

// In proportion to what it costs to go through all rows of an index.
RowSearch::Effort::Effort(SQLDatabase& database)
{
    const auto rows = static_cast<std::size_t>(std::max(database.number("SELECT max(id) FROM files"), std::int64_t{0}));
    constexpr std::size_t least = 100;
    rowsAtFirst = rows / 250 + least;
    textsAtFirst = rows / 2000 + least;
    fewRows = rows / 50 + least;
    sortedRows = rows / 40 + least;
    passedOver = rows / 20 + least;
    readTexts = rows / 1000 + least;
}

RowSearch::RowSearch(SQLDatabase& database, const LibraryQuery& query)
    : database_(database),
      effort_(database),
      tokenizer_(database),
      conditions_(database, tokenizer_, query),
      order_(query, conditions_),
      isReversed_(query.isReversed),
      isByRow_(query.settledOrder() == LibraryQuery::Order::relevance),
      areTermsMet_(query.terms.empty()),
      row_(database, lookingAtRow(order_, conditions_))
{
    if (!query.terms.empty())
        matcher_.emplace(database, tokenizer_, query.terms);
    conditions_.ofRow().bindTo(row_, 2);
}

std::int64_t RowSearch::next()
{
    for (;;) {
        const std::int64_t row = walk();
        relevance_.reset();
        if (row == 0 || isWanted(row)) {
            given_ += row != 0 ? 1 : 0;
            return last_ = row;
        }
        const std::size_t atFirst = areTermsMet_ ? effort_.rowsAtFirst : effort_.textsAtFirst;
        if (!isSettled_ && lookedAt_ > static_cast<std::int64_t>(atFirst) + kRowsForOneFound * given_) {
            last_ = row;
            settle();
        }
    }
}

int RowSearch::relevance()
{
    if (!relevance_)
        relevance_ = matcher_ ? matcher_->relevanceOf(last_).value_or(0) : 0;
    return *relevance_;
}

// The next row that may be wanted.
std::int64_t RowSearch::walk()
{
    if (list_)
        return listed_ < list_->size() ? (*list_)[listed_++] : 0;
    for (;;) {
        const std::int64_t row = nextWalked();
        if (row == 0 || !chosen_ || chosen_->holds(row))
            return row;
        if (++passedOver_ > effort_.passedOver && chosen_->size() <= effort_.sortedRows) {
            sort(*chosen_);
            return walk();
        }
    }
}

std::int64_t RowSearch::nextWalked()
{
    for (; walkNumber_ < order_.walks.size(); ++walkNumber_, walk_.reset()) {
        if (!walk_) {
            walk_.emplace(database_, order_.walks[walkNumber_].sql);
            order_.walks[walkNumber_].bindTo(*walk_);
        }
        if (walk_->step())
            return walk_->number(0);
    }
    return 0;
}

bool RowSearch::isWanted(std::int64_t row)
{
    if (list_ && !isByRow_)
        return true; // it was looked at when the list was made
    ++lookedAt_;
    if (!conditions_.ofRow().sql.empty()) {
        const bool isGood = row_.bind(1, row).step();
        row_.reset();
        if (!isGood)
            return false;
    }
    if (!areTermsMet_)
        relevance_ = matcher_->relevanceOf(row);
    return areTermsMet_ || relevance_.has_value();
}

void RowSearch::settle()
{
    isSettled_ = true;
    std::optional<RowSet> rows = selectedRows();
    if (!rows)
        return;
    if (isByRow_) {
        list_ = rows->rows();
        listed_ = static_cast<std::size_t>(std::ranges::upper_bound(*list_, last_) - list_->begin());
        walk_.reset();
    } else if (rows->size() <= effort_.readTexts) {
        sort(*rows);
    } else {
        chosen_ = std::move(rows); // the first of many are soon met on the way
    }
}

std::optional<RowSet> RowSearch::selectedRows()
{
    constexpr std::size_t kAll = std::numeric_limits<std::size_t>::max();
    std::optional<RowSet> chosen;
    const auto take = [&](const SQLText& selection, std::size_t most) {
        std::optional<RowSet> rows = rowsOf(database_, selection, most);
        const bool isWhole = rows.has_value();
        if (isWhole && chosen)
            chosen->keep(*rows);
        else if (isWhole)
            chosen = std::move(rows);
        return isWhole;
    };
    std::vector<const SQLText*> left;
    for (const SQLText& selection : conditions_.selections())
        left.push_back(&selection);
    std::erase_if(left, [&](const SQLText* selection) { return take(*selection, effort_.fewRows); });
    bool areTextsTaken = true;
    for (const SQLText& selection : conditions_.textSelections())
        areTextsTaken = areTextsTaken && (!chosen || chosen->size() > effort_.readTexts) && take(selection, kAll);
    areTermsMet_ = areTermsMet_ || (areTextsTaken && conditions_.selectsAllTerms());
    for (const SQLText* const selection : left)
        if (!chosen || chosen->size() > effort_.sortedRows)
            take(*selection, kAll);
    return chosen;
}

// What was given already is at the beginning of the list, since both ways have the same order.
void RowSearch::sort(const RowSet& rows)
{
    std::vector<OrderKey> keys;
    for (const std::int64_t row : rows.rows()) {
        const bool isGood = row_.bind(1, row).step();
        if (isGood && (areTermsMet_ || matcher_->relevanceOf(row)))
            keys.emplace_back(row_, 1, static_cast<int>(order_.columns.size()), row);
        row_.reset();
    }
    std::ranges::sort(keys, [&](const OrderKey& a, const OrderKey& b) { return OrderKey::isAhead(a, b, isReversed_); });
    list_.emplace();
    for (const OrderKey& key : keys)
        list_->push_back(key.file());
    listed_ = static_cast<std::size_t>(given_);
    walk_.reset();
}
