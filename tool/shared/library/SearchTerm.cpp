#include "tool/shared/library/SearchTerm.h"

#include "platform/core/UTF8.h"

#include <utf8proc.h>

#include <algorithm>
#include <cstdlib>
#include <iterator>
#include <memory>

namespace {

struct CharacterRange {
    char32_t first, last;
};

// Of scripts that have no spaces between words, by the blocks of Unicode.
constexpr CharacterRange kUnspaced[] = {
    {0x0e00, 0x0eff},   // Thai, Lao
    {0x1000, 0x109f},   // Burmese
    {0x1780, 0x17ff},   // Khmer
    {0x3040, 0x30ff},   // Hiragana, Katakana
    {0x31f0, 0x31ff},   // Katakana
    {0x3400, 0x9fff},   // Chinese characters
    {0xf900, 0xfaff},   // Chinese characters
    {0xff66, 0xff9f},   // Katakana
    {0x20000, 0x3ffff}, // Chinese characters
};

bool hasUnspaced(std::string_view text)
{
    while (!text.empty()) {
        const char32_t character = platform::takeCharacter(text);
        if (std::ranges::any_of(kUnspaced, [character](const CharacterRange& range) {
                return character >= range.first && character <= range.last;
            }))
            return true;
    }
    return false;
}

// The text itself if it cannot be written so.
std::string written(std::string_view text, utf8proc_option_t how)
{
    utf8proc_uint8_t* result = nullptr;
    const auto options = static_cast<utf8proc_option_t>(UTF8PROC_STABLE | how);
    const utf8proc_ssize_t size = utf8proc_map(reinterpret_cast<const utf8proc_uint8_t*>(text.data()),
                                               static_cast<utf8proc_ssize_t>(text.size()), &result, options);
    const std::unique_ptr<utf8proc_uint8_t, decltype(&std::free)> owned(result, &std::free);
    return size < 0 ? std::string(text)
                    : std::string(reinterpret_cast<const char*>(result), static_cast<std::size_t>(size));
}

bool isWithin(const std::string& word, const std::string& part, bool isFirst, bool isLast)
{
    if (isFirst && isLast)
        return word.find(part) != word.npos;
    return isFirst ? word.ends_with(part) : isLast ? word.starts_with(part) : word == part;
}

} // namespace

SearchTerm::SearchTerm(const SearchTokenizer& tokenizer, std::string_view text) : isWithinWords(hasUnspaced(text))
{
    for (const utf8proc_option_t how : {UTF8PROC_COMPOSE, UTF8PROC_DECOMPOSE}) {
        Form form{written(text, how), {}};
        form.words = tokenizer.wordsOf(form.text);
        const bool isOther = forms.empty() || forms.front().words != form.words;
        if (!form.words.empty() && isOther)
            forms.push_back(std::move(form));
    }
}

bool SearchTerm::equals(const Words& words) const
{
    return std::ranges::any_of(forms, [&](const Form& form) { return form.words == words; });
}

SearchTerm::Match SearchTerm::matchIn(const Words& words) const
{
    Match best = Match::none;
    for (const Form& form : forms) {
        const std::size_t count = form.words.size();
        for (std::size_t start = 0; start + count <= words.size(); ++start) {
            bool isMatch = true;
            for (std::size_t i = 0; i < count && isMatch; ++i) {
                const bool isLast = i + 1 == count;
                const std::string& word = words[start + i];
                isMatch = isWithinWords ? isWithin(word, form.words[i], i == 0, isLast)
                          : isLast      ? word.starts_with(form.words[i])
                                        : word == form.words[i];
            }
            if (isMatch && std::equal(form.words.begin(), form.words.end(),
                                      std::next(words.begin(), static_cast<std::ptrdiff_t>(start))))
                return Match::whole;
            if (isMatch)
                best = Match::begun;
        }
    }
    return best;
}
