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
