#include "tool/shared/library/TermMatcher.h"

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
        terms_.push_back(tokenizer.wordsOf(term));
}

std::optional<int> TermMatcher::relevanceOf(std::int64_t file)
{
    if (!texts_.bind(1, file).step())
        return std::nullopt;
    for (int text = 0; text < kTexts; ++text)
        tokenizer_.read(texts_.bytes(text), words_[static_cast<std::size_t>(text)]);
    texts_.reset();
    int relevance = 0;
    for (const Words& term : terms_) {
        int best = 0;
        for (int text = 0; text < kTexts; ++text)
            best = std::max(best, relevanceIn(text, term));
        if (best == 0)
            return std::nullopt;
        relevance += best;
    }
    return relevance;
}

// A term's last word may be begun only.
int TermMatcher::relevanceIn(int text, const Words& term) const
{
    const Words& words = words_[static_cast<std::size_t>(text)];
    const int weight = kWeights[text];
    int best = 0;
    for (std::size_t start = 0; !term.empty() && start + term.size() <= words.size(); ++start) {
        const std::string& last = words[start + term.size() - 1];
        if (!last.starts_with(term.back()) ||
            !std::equal(term.begin(), term.end() - 1, words.begin() + static_cast<std::ptrdiff_t>(start)))
            continue;
        best = std::max(best, weight + (last.size() == term.back().size() ? kWholeWord : 0));
    }
    return best;
}
