#include "tool/shared/output/UnseenCharacters.h"

#include <algorithm>
#include <iterator>
#include <utility>

namespace {

bool isASCII(std::string_view text)
{
    return std::ranges::all_of(text, [](char c) { return static_cast<unsigned char>(c) < 0x7F; });
}

// Calls `visit` for each character of UTF-8 with its bytes; U+FFFD stands for a byte that belongs to none.
template <class Visit>
void forEachCharacter(std::string_view text, Visit visit)
{
    while (!text.empty()) {
        const auto lead = static_cast<unsigned char>(text.front());
        std::size_t length = lead < 0x80   ? 1
                             : lead < 0xC2 ? 0
                             : lead < 0xE0 ? 2
                             : lead < 0xF0 ? 3
                             : lead < 0xF5 ? 4
                                           : 0;
        const bool isWhole =
            length > 0 && length <= text.size() && std::ranges::all_of(text.substr(1, length - 1), [](char c) {
                return (static_cast<unsigned char>(c) & 0xC0U) == 0x80;
            });
        length = isWhole ? length : 1;
        char32_t character = !isWhole ? 0xFFFD : length == 1 ? lead : lead & (0x7FU >> length);
        for (std::size_t i = 1; i < length; ++i)
            character = character << 6 | (static_cast<unsigned char>(text[i]) & 0x3FU);
        visit(character, text.substr(0, length));
        text.remove_prefix(length);
    }
}

} // namespace

bool isLateControl(char32_t character)
{
    return character >= 0x7F && character < 0xA0;
}

bool isUnseen(char32_t character)
{
    constexpr std::pair<char32_t, char32_t> ranges[] = {{0x034F, 0x034F}, {0x061C, 0x061C}, {0x180E, 0x180E},
                                                        {0x200B, 0x200F}, {0x2028, 0x202E}, {0x2060, 0x206F},
                                                        {0xFEFF, 0xFEFF}, {0xFFF9, 0xFFFB}, {0xE0000, 0xE007F}};
    return std::any_of(std::begin(ranges), std::end(ranges), [character](const auto& range) {
        return character >= range.first && character <= range.second;
    });
}

bool isMisleading(std::string_view text)
{
    bool found = false;
    if (!isASCII(text))
        forEachCharacter(text, [&](char32_t character, std::string_view) {
            found = found || (isLateControl(character) && character > 0x7F) || isUnseen(character);
        });
    return found;
}
