#include "tool/shared/library/TermMatcher.h"

#include "tool/shared/library/IndexedName.h"

#include <algorithm>
#include <iterator>

namespace {

constexpr int kWholeWord = 10;
// Of the columns of `search`: name, folder, title, artist, album, comment, words.
constexpr int kWeights[] = {5, 2, 4, 3, 2, 1, 3};

} // namespace

TermMatcher::TermMatcher(SQLDatabase& database, const SearchTokenizer& tokenizer, std::span<const std::string> terms)
    : tokenizer_(tokenizer),
      texts_(database, "SELECT name, folder, title, artist, album, comment, words FROM search_texts WHERE id = ?"),
      words_(kTexts)
{
    static_assert(std::size(kWeights) == kTexts);
    for (const std::string& term : terms)
        terms_.emplace_back(tokenizer, indexedName(term));
}

std::optional<int> TermMatcher::relevanceOf(std::int64_t file)
{
    if (!texts_.bind(1, file).step())
        return std::nullopt;
    for (int text = 0; text < kTexts; ++text)
        tokenizer_.read(texts_.bytes(text), words_[static_cast<std::size_t>(text)]);
    texts_.reset();
    int relevance = 0;
    for (const SearchTerm& term : terms_) {
        int best = 0;
        for (int text = 0; text < kTexts; ++text)
            if (const auto match = term.matchIn(words_[static_cast<std::size_t>(text)]);
                match != SearchTerm::Match::none)
                best = std::max(best, kWeights[text] + (match == SearchTerm::Match::whole ? kWholeWord : 0));
        if (best == 0)
            return std::nullopt;
        relevance += best;
    }
    return relevance;
}
