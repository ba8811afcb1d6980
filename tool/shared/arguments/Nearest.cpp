#include "tool/shared/arguments/Nearest.h"

#include "platform/core/ASCIICase.h"

#include <algorithm>
#include <numeric>
#include <utility>
#include <vector>

namespace {

/// The number of letters to add, drop or change (Levenshtein distance), ignoring case.
std::size_t distanceOf(std::string_view a, std::string_view b)
{
    std::vector<std::size_t> row(b.size() + 1);
    std::iota(row.begin(), row.end(), std::size_t{0});
    for (std::size_t i = 0; i < a.size(); ++i) {
        std::size_t diagonal = std::exchange(row[0], i + 1);
        for (std::size_t j = 0; j < b.size(); ++j) {
            const std::size_t changed = diagonal + (asciiLower(a[i]) == asciiLower(b[j]) ? 0 : 1);
            diagonal = row[j + 1];
            row[j + 1] = std::min({changed, diagonal + 1, row[j] + 1});
        }
    }
    return row.back();
}

} // namespace

std::string didYouMean(std::string_view word, std::span<const std::string_view> known)
{
    constexpr std::size_t longest = 64, farthest = 2;
    if (word.empty() || word.size() > longest)
        return {};
    std::string_view nearest;
    std::size_t least = farthest + 1;
    for (const std::string_view name : known) {
        const bool isBeginning = equalIgnoringASCIICase(name.substr(0, word.size()), word);
        const std::size_t distance = isBeginning ? 0 : distanceOf(word, name);
        if (distance < std::min(least, word.size())) {
            least = distance;
            nearest = name;
        }
    }
    return nearest.empty() ? "" : ", did you mean \"" + std::string(nearest) + "\"?";
}
