// A text of a query as a search looks for it.
#pragma once

#include "tool/shared/library/SearchTokenizer.h"

#include <string>
#include <string_view>
#include <vector>

/// Names of files have their characters composed or taken apart, as their systems write them, and people type either:
/// where that makes other words, as in Japanese and Korean, each is a form. In scripts without spaces between words a
/// term counts within them too.
struct SearchTerm {
    using Words = std::vector<std::string>;
    struct Form {
        std::string text;
        Words words;
    };
    enum class Match { none, begun, whole };

    /// `text` is UTF-8.
    SearchTerm(const SearchTokenizer& tokenizer, std::string_view text);

    /// Whether the words of a text are those of the term, all of them and no others.
    bool equals(const Words& words) const;
    /// How the words of a text have the term: one behind the other, of which the last may be begun only.
    Match matchIn(const Words& words) const;

    std::vector<Form> forms; // none if there is no word
    bool isWithinWords = false;
};
