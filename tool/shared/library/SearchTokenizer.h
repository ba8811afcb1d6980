// The words of texts as the search of an index takes them.
#pragma once

#include <memory>
#include <string>
#include <string_view>
#include <vector>

class SQLDatabase;

/// Letters and digits in a row, without case and accents: the tokenizer of the table `search`.
class SearchTokenizer {
public:
    explicit SearchTokenizer(SQLDatabase& database);
    ~SearchTokenizer();
    SearchTokenizer(const SearchTokenizer&) = delete;
    SearchTokenizer& operator=(const SearchTokenizer&) = delete;

    /// Replaces what `words` held, whose memory is used again.
    void read(std::string_view text, std::vector<std::string>& words) const;
    std::vector<std::string> wordsOf(std::string_view text) const;

private:
    struct Parts;
    std::unique_ptr<Parts> parts_;
};
