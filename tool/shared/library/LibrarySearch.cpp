#include "tool/shared/library/LibrarySearch.h"

#include "tool/shared/library/IndexedName.h"
#include "tool/shared/library/RowSearch.h"

#include <fmt/format.h>

#include <algorithm>
#include <utility>
#include <vector>

namespace {

// Of more, the first so many are put in the order of relevance, and the others follow as they come: to read the texts
// of all that have a frequent word takes seconds.
constexpr std::size_t kRankedRows = 1000;

struct RankedRow {
    int relevance;
    std::int64_t row;
};

} // namespace

class LibrarySearch::Answer {
public:
    Answer(Library& library, const LibraryQuery& query, LibraryParts parts)
        : parts_(parts),
          limit_(query.limit.value_or(0)),
          rows_(library.database(), query),
          file_(library.database(), fmt::format("SELECT d.path, f.name, f.size, f.modified, f.indexed, {} FROM files f "
                                                "JOIN folders d ON d.id = f.folder WHERE f.id = ?",
                                                libraryColumnNames())),
          overview_(library.database(), "SELECT frames_per_point, points FROM overviews WHERE file = ?"),
          details_(library.database(), "SELECT fields, tags FROM details WHERE file = ?"),
          problems_(library.database(), "SELECT kind, text FROM findings WHERE file = ? ORDER BY rowid")
    {
        if (query.settledOrder() == LibraryQuery::Order::relevance)
            rank(query.isReversed);
    }

    bool next(LibraryRecord& record)
    {
        if (hasEnded_)
            return false;
        for (std::int64_t row = nextRow(); row != 0; row = nextRow()) {
            if (limit_ != 0 && given_ == limit_) {
                hasMore_ = true;
                break;
            }
            if (fill(record, row)) {
                ++given_;
                return true;
            }
        }
        hasEnded_ = true;
        return false;
    }
    bool hasMore() const { return hasMore_; }

private:
    void rank(bool isReversed)
    {
        while (ranked_.size() < kRankedRows) {
            const std::int64_t row = rows_.next();
            if (row == 0)
                break;
            ranked_.push_back({rows_.relevance(), row});
        }
        std::ranges::sort(ranked_, [isReversed](const RankedRow& a, const RankedRow& b) {
            const bool isAhead = std::pair(-a.relevance, a.row) < std::pair(-b.relevance, b.row);
            return a.row != b.row && isAhead != isReversed;
        });
    }

    std::int64_t nextRow() { return nextRanked_ < ranked_.size() ? ranked_[nextRanked_++].row : rows_.next(); }

    /// False for a row that has gone since it was found.
    bool fill(LibraryRecord& record, std::int64_t row)
    {
        constexpr int kFirstColumn = 5;
        if (!file_.bind(1, row).step())
            return false;
        record = {};
        record.place = {nameOfIndexed(file_.bytes(0)), nameOfIndexed(file_.bytes(1))};
        record.stamp.size = file_.number(2);
        record.stamp.modified = file_.number(3);
        record.indexed = file_.number(4);
        readLibraryColumns(record, file_, kFirstColumn);
        file_.reset();
        if (parts_.overview && overview_.bind(1, row).step()) {
            record.overview = LibraryOverview{overview_.number(0), overview_.text(1)};
            overview_.reset();
        }
        if ((parts_.fields || parts_.tags) && details_.bind(1, row).step()) {
            if (parts_.fields)
                record.fields = details_.text(0);
            if (parts_.tags)
                record.tags = details_.text(1);
            details_.reset();
        }
        if (parts_.problems)
            for (problems_.bind(1, row); problems_.step();)
                record.problems.push_back({problems_.text(0), problems_.text(1)});
        return true;
    }

    LibraryParts parts_;
    std::int64_t limit_, given_ = 0;
    bool hasEnded_ = false, hasMore_ = false;
    RowSearch rows_;
    std::vector<RankedRow> ranked_;
    std::size_t nextRanked_ = 0;
    SQLStatement file_, overview_, details_, problems_;
};

LibrarySearch::LibrarySearch(Library& library, const LibraryQuery& query, LibraryParts parts)
    : answer_(std::make_unique<Answer>(library, query, parts))
{
}

LibrarySearch::~LibrarySearch() = default;

bool LibrarySearch::next(LibraryRecord& record)
{
    return answer_->next(record);
}

bool LibrarySearch::hasMore() const
{
    return answer_->hasMore();
}
