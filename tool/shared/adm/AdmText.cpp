#include "tool/shared/adm/AdmText.h"

std::string shortened(const std::string& text)
{
    std::size_t size = 200;
    if (text.size() <= size)
        return text;
    while (size > 0 && (static_cast<unsigned char>(text[size]) & 0xC0) == 0x80) // do not cut a character
        --size;
    return text.substr(0, size) + "…";
}

std::string countText(std::size_t count, std::string_view noun)
{
    std::string text = std::to_string(count);
    for (std::size_t at = text.size(); at > 3;)
        text.insert(at -= 3, 1, ',');
    return text + " " + std::string(noun) + (count == 1 || noun == "more" ? "" : "s");
}
