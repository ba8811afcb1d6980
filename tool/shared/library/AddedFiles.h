// Words and copies of the files that a transaction adds.
#pragma once

#include "tool/shared/library/SQLDatabase.h"

#include <cstdint>
#include <string>
#include <vector>

/// Does for many rows in one go what triggers do for each: beside a trigger, SQLite keeps what each page was before
/// each row, which takes longer than adding the row. The triggers are away within a transaction only, so that nobody
/// else sees the tables without them, and what is undone brings them back.
class AddedFiles {
public:
    explicit AddedFiles(SQLDatabase& database);

    /// At the beginning of each transaction.
    void begin();
    /// Before a row is added to `files`.
    void expect();
    /// After it.
    void note(std::int64_t file);
    /// Before a row of `files`, or the words of a folder, are changed or removed, which triggers see to.
    void settle();
    /// Before the transaction is committed.
    void end();

private:
    SQLDatabase& database_;
    SQLStatement findTriggers_, addWords_, markCopies_;
    std::vector<std::string> triggers_; // that are away
    std::int64_t first_ = 0;            // of the rows that are not settled, which are the last of all; 0 for none
};
