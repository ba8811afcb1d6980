// Whether, and how well, a file has the terms of a query in its texts.
#pragma once

#include "tool/shared/library/SQLDatabase.h"
#include "tool/shared/library/SearchTerm.h"

#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <vector>

/// Agrees with the table `search`. Must not outlive the database and the tokenizer.
class TermMatcher {
public:
    TermMatcher(SQLDatabase& database, const SearchTokenizer& tokenizer, std::span<const std::string> terms);

    /// The relevance of a file: for each term 10 if it is a whole word, and 5 to 1 by the best text that has it so;
    /// none if a term is missing.
    std::optional<int> relevanceOf(std::int64_t file);

private:
    static constexpr int kTexts = 7; // the columns of `search`

    const SearchTokenizer& tokenizer_;
    std::vector<SearchTerm> terms_;
    SQLStatement texts_;
    std::vector<SearchTerm::Words> words_; // of each text of one file
};
