// Finds the rows of an answer, in order.
#pragma once

#include "tool/shared/library/QueryOrder.h"
#include "tool/shared/library/TermMatcher.h"

#include <cstdint>
#include <optional>
#include <vector>

/// There are two ways, which give the same rows. The first goes along an index in the order that is wanted and looks at
/// each row, which is soon done if much is found. After a number of rows that are not wanted, the second takes the rows
/// of single conditions from their indexes, keeps those that are in all, and looks at these only: as they come along
/// the order for some time, and then, unless they are a great many, all of them, which are sorted.
///
/// With the order of relevance, rows come in their own order, each with its relevance. Must not outlive the database.
class RowSearch {
public:
    RowSearch(SQLDatabase& database, const LibraryQuery& query);

    /// The next row; 0 behind the last.
    std::int64_t next();
    /// Of the row that `next` gave last. It is worked out from its texts now unless that was needed before.
    int relevance();

private:
    /// Numbers of rows.
    struct Effort {
        explicit Effort(SQLDatabase& database);

        std::size_t rowsAtFirst, textsAtFirst; // to look at in the first way; texts cost several times as much
        std::size_t fewRows;                   // to take from an index without asking what others have
        std::size_t sortedRows;                // to look at and sort
        std::size_t passedOver;                // on the way along the order, before what is left is sorted
        std::size_t readTexts;                 // to read rather than look up
    };

    std::int64_t walk();
    std::int64_t nextWalked();
    bool isWanted(std::int64_t row);
    /// Goes over to the second way.
    void settle();
    std::optional<RowSet> selectedRows();
    void sort(const RowSet& rows);

    SQLDatabase& database_;
    Effort effort_;
    SearchTokenizer tokenizer_;
    QueryConditions conditions_;
    QueryOrder order_;
    bool isReversed_, isByRow_;
    std::optional<TermMatcher> matcher_; // for terms
    bool areTermsMet_ = false;           // by all rows that are looked at
    SQLStatement row_;                   // looks at one row

    std::size_t walkNumber_ = 0;
    std::optional<SQLStatement> walk_;
    std::int64_t given_ = 0, lookedAt_ = 0, last_ = 0;
    std::optional<int> relevance_; // of the last
    bool isSettled_ = false;
    std::size_t passedOver_ = 0;
    std::optional<RowSet> chosen_;                  // no other row is wanted
    std::optional<std::vector<std::int64_t>> list_; // what comes, instead of a walk
    std::size_t listed_ = 0;
};
