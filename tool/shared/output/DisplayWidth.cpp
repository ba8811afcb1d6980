#include "tool/shared/output/DisplayWidth.h"

#include <algorithm>
#include <utf8proc.h>

namespace {

// Follows terminals where the library differs from them.
int widthOf(char32_t character)
{
    const utf8proc_property_t& properties = *utf8proc_get_property(static_cast<utf8proc_int32_t>(character));
    if (properties.category == UTF8PROC_CATEGORY_MC)
        return 1; // these marks are not combining on terminals
    if (properties.boundclass == UTF8PROC_BOUNDCLASS_V || properties.boundclass == UTF8PROC_BOUNDCLASS_T)
        return 0; // vowels and finals of decomposed Korean syllables
    return utf8proc_charwidth(static_cast<utf8proc_int32_t>(character));
}

/// The longest prefix of `text` that fits, including everything that combines with its last character.
std::string_view beginning(std::string_view text, int width)
{
    std::string_view rest = text;
    std::size_t size = 0;
    for (int taken = 0; !rest.empty(); size = text.size() - rest.size()) {
        taken += widthOf(takeCharacter(rest));
        if (taken > width)
            break;
    }
    return text.substr(0, size);
}

/// The longest suffix of `text` that fits and does not begin with a combining character.
std::string_view ending(std::string_view text, int width)
{
    int tooMuch = displayWidth(text) - width;
    while (!text.empty()) {
        std::string_view rest = text;
        const int taken = widthOf(takeCharacter(rest));
        if (tooMuch <= 0 && taken > 0)
            break;
        tooMuch -= taken;
        text = rest;
    }
    return text;
}

} // namespace

bool isShowable(char32_t character)
{
    switch (utf8proc_category(static_cast<utf8proc_int32_t>(character))) {
    case UTF8PROC_CATEGORY_CN:
    case UTF8PROC_CATEGORY_CC:
    case UTF8PROC_CATEGORY_CS:
    case UTF8PROC_CATEGORY_ZL:
    case UTF8PROC_CATEGORY_ZP:
        return false;
    default:
        return true;
    }
}

int displayWidth(std::string_view text)
{
    int width = 0;
    while (!text.empty())
        width += widthOf(takeCharacter(text));
    return width;
}

std::string shortened(std::string_view text, int width)
{
    if (displayWidth(text) <= width)
        return std::string(text);
    if (width <= 1)
        return width == 1 ? "…" : "";
    const std::string_view head = beginning(text, (width - 1) / 3);
    return std::string(head) + "…" + std::string(ending(text, width - 1 - displayWidth(head)));
}

std::string wrapped(std::string_view text, int width, int column, int indent)
{
    std::string result;
    for (bool isFirst = true; !text.empty(); isFirst = false) {
        const std::size_t end = std::min(text.find(' ', text.find_first_not_of(' ')), text.size());
        std::string_view word = text.substr(0, end); // with the spaces before it
        text.remove_prefix(end);
        if (!isFirst && column + displayWidth(word) > width && word.find_first_not_of(' ') != word.npos) {
            word.remove_prefix(word.find_first_not_of(' '));
            result += '\n' + std::string(static_cast<std::size_t>(indent), ' ');
            column = indent;
        }
        result += word;
        column += displayWidth(word);
    }
    return result;
}
