#include "tool/shared/indexing/BoundedText.h"

#include "platform/core/UTF8.h"

namespace {

bool breaksLine(char32_t character)
{
    return character < U' ' || platform::isLateControl(character);
}

} // namespace

std::string boundedLine(std::string_view text, std::size_t most)
{
    std::string line;
    while (!text.empty() && line.size() < most) {
        const std::string_view before = text;
        const char32_t character = platform::takeCharacter(text);
        std::string_view bytes = before.substr(0, before.size() - text.size());
        if (breaksLine(character))
            bytes = " ";
        else if (character == U'\xFFFD')
            bytes = "\xEF\xBF\xBD";
        if (line.size() + bytes.size() > most)
            break;
        if (bytes != " " || !line.empty())
            line += bytes;
    }
    line.resize(line.find_last_not_of(' ') + 1);
    return line;
}
