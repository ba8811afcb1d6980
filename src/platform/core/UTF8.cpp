#include "platform/core/UTF8.h"

#include <algorithm>
#include <cstddef>
#include <iterator>
#include <utility>

namespace platform {

namespace {

constexpr char32_t kReplacement = 0xFFFD;

} // namespace

char32_t takeCharacter(std::string_view& text)
{
    const std::string_view whole = text;
    const auto byteAt = [whole](std::size_t i) { return static_cast<unsigned char>(whole[i]); };
    const unsigned lead = byteAt(0);
    text.remove_prefix(1);
    if (lead < 0x80)
        return lead;
    if (lead < 0xC2 || lead > 0xF4)
        return kReplacement;
    const std::size_t length = lead < 0xE0 ? 2 : lead < 0xF0 ? 3 : 4;
    char32_t code = lead & (0x7FU >> length);
    for (std::size_t i = 1; i < length; ++i) {
        const unsigned least = i > 1 ? 0x80 : lead == 0xE0 ? 0xA0 : lead == 0xF0 ? 0x90 : 0x80;
        const unsigned most = i > 1 ? 0xBF : lead == 0xED ? 0x9F : lead == 0xF4 ? 0x8F : 0xBF;
        if (i == whole.size() || byteAt(i) < least || byteAt(i) > most)
            return kReplacement;
        code = code << 6 | (byteAt(i) & 0x3FU);
        text.remove_prefix(1);
    }
    return code;
}

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

} // namespace platform
