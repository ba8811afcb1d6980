#include "tool/shared/output/UnseenCharacters.h"

#include "tool/shared/output/DisplayWidth.h"

#include <algorithm>
#include <iterator>
#include <utility>

namespace {

bool isASCII(std::string_view text)
{
    return std::ranges::all_of(text, [](char c) { return static_cast<unsigned char>(c) < 0x7F; });
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
    if (isASCII(text))
        return false;
    while (!text.empty()) {
        const char32_t character = takeCharacter(text);
        if ((isLateControl(character) && character > 0x7F) || isUnseen(character))
            return true;
    }
    return false;
}
