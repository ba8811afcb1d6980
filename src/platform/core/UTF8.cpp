#include "platform/core/UTF8.h"

#include <algorithm>
#include <bit>
#include <iterator>
#include <utility>

namespace platform {

namespace {

constexpr char32_t kReplacement = 0xFFFD;

/// The values that a byte after the first one of a character may have.
struct ContinuationBytes {
    unsigned least = 0x80, most = 0xBF;
};

/// Those of a second byte: fewer than of later ones, so that no character has two forms, and none is a surrogate or
/// beyond U+10FFFF.
ContinuationBytes secondBytesAfter(unsigned lead)
{
    switch (lead) {
    case 0xE0:
        return {.least = 0xA0};
    case 0xED:
        return {.most = 0x9F};
    case 0xF0:
        return {.least = 0x90};
    case 0xF4:
        return {.most = 0x8F};
    default:
        return {};
    }
}

/// The rest of a character that begins with `lead`, which is no ASCII.
char32_t takeContinuation(unsigned lead, std::string_view& text)
{
    if (lead < 0xC2 || lead > 0xF4)
        return kReplacement;
    const int length = std::countl_one(static_cast<unsigned char>(lead));
    char32_t code = lead & (0x7FU >> length);
    ContinuationBytes allowed = secondBytesAfter(lead);
    for (int i = 1; i < length; ++i) {
        const unsigned byte = text.empty() ? 0U : static_cast<unsigned char>(text[0]);
        if (byte < allowed.least || byte > allowed.most)
            return kReplacement;
        code = code << 6 | (byte & 0x3FU);
        text.remove_prefix(1);
        allowed = {};
    }
    return code;
}

} // namespace

char32_t takeCharacter(std::string_view& text)
{
    const unsigned lead = static_cast<unsigned char>(text[0]);
    text.remove_prefix(1);
    return lead < 0x80 ? lead : takeContinuation(lead, text);
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
