// What a query asks of a file, in SQL.
#pragma once

#include "tool/shared/library/LibraryQuery.h"
#include "tool/shared/library/RowSet.h"
#include "tool/shared/library/SQLDatabase.h"
#include "tool/shared/library/SearchTokenizer.h"

#include <cstdint>
#include <memory>
#include <string>
#include <variant>
#include <vector>

/// A text of SQL with the values of its parameters. Texts and tests must stay until its statements have run.
struct SQLText {
    using Parameter = std::variant<std::int64_t, double, std::string, const SQLTest*>;

    std::string sql;
    std::vector<Parameter> parameters;

    /// Binds the parameters from `first` on; the number behind the last.
    int bindTo(SQLStatement& statement, int first = 1) const;
    void append(const SQLText& text, const char* between);
};

/// Must not outlive the database and the tokenizer.
class QueryConditions {
public:
    QueryConditions(SQLDatabase& database, const SearchTokenizer& tokenizer, const LibraryQuery& query);

    /// What a row of `files f` must be, but for the terms of the query; empty if nothing is asked.
    const SQLText& ofRow() const { return ofRow_; }
    /// Queries for the rows that meet one condition each, by an index and without looking at the rows.
    const std::vector<SQLText>& selections() const { return selections_; }
    /// The rows that have all terms, and all words of the texts that are asked for; empty without either. The second of
    /// two is for terms of a letter alone, which begins so many words that it takes long.
    const std::vector<SQLText>& textSelections() const { return textSelections_; }
    /// Whether these leave no term out. Rows without one that is left out must be looked for in their texts.
    bool selectsAllTerms() const { return selectsAllTerms_; }
    /// The scope if there is one alone, as a condition on `folders d`; else empty.
    const SQLText& ofFolder() const { return ofFolder_; }

private:
    void addText(const char* column, const std::string& text);
    void addCategory(const std::string& category);
    void addTextSelections(SQLDatabase& database, const LibraryQuery& query);
    void addScopes(SQLDatabase& database, const LibraryQuery& query);
    void addForms(const LibraryQuery& query);
    void addMusic(const LibraryQuery& query);
    void addProblems(const LibraryQuery& query);
    void require(const SQLText& condition) { ofRow_.append(condition, " AND "); }
    /// A condition that selects rows as well.
    void addIndexed(const std::vector<SQLText>& choices);
    const SQLTest* keep(std::unique_ptr<SQLTest> test);

    const SearchTokenizer& tokenizer_;
    SQLText ofRow_, ofFolder_;
    std::vector<SQLText> selections_, textSelections_;
    bool selectsAllTerms_ = true;
    std::vector<std::unique_ptr<SQLTest>> tests_;
};
