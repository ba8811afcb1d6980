#include "tool/shared/library/IndexedName.h"

#include "platform/core/UTF8.h"

namespace {

// The characters for bytes that are no UTF-8 are U+10FF80 to U+10FFFF, in UTF-8 F4 8F BE 80 to F4 8F BF BF.
void appendByte(std::string& text, unsigned char byte)
{
    text += "\xf4\x8f";
    text += static_cast<char>(0xbc + (byte >> 6));
    text += static_cast<char>(0x80 + (byte & 0x3f));
}

bool standsForByte(char32_t character)
{
    return character >= 0x10ff80;
}

} // namespace

std::string indexedName(std::string_view name)
{
    constexpr char32_t replacement = 0xfffd;
    constexpr std::string_view replacementBytes = "\xef\xbf\xbd";
    std::string text;
    text.reserve(name.size());
    while (!name.empty()) {
        std::string_view rest = name;
        const char32_t character = platform::takeCharacter(rest);
        const std::string_view bytes = name.substr(0, name.size() - rest.size());
        if ((character == replacement && bytes != replacementBytes) || standsForByte(character))
            for (const char byte : bytes)
                appendByte(text, static_cast<unsigned char>(byte));
        else
            text += bytes;
        name = rest;
    }
    return text;
}

std::string nameOfIndexed(std::string_view text)
{
    std::string name;
    name.reserve(text.size());
    while (!text.empty()) {
        std::string_view rest = text;
        const char32_t character = platform::takeCharacter(rest);
        if (standsForByte(character))
            name += static_cast<char>(character & 0xff);
        else
            name += text.substr(0, text.size() - rest.size());
        text = rest;
    }
    return name;
}
