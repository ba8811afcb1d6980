#include "platform/FileText.h"

#include "platform/TextEncoding.h"

namespace platform {

namespace {

bool isASCII(std::string_view text)
{
    unsigned char bits = 0;
    for (const char c : text)
        bits |= static_cast<unsigned char>(c);
    return bits < 0x80;
}

std::string decodeLatin1(std::string_view bytes)
{
    std::string text;
    for (const char c : bytes) {
        const auto byte = static_cast<unsigned char>(c);
        if (byte < 0x80)
            text += c;
        else
            (text += static_cast<char>(0xC0 | byte >> 6)) += static_cast<char>(0x80 | (byte & 0x3F));
    }
    return text;
}

} // namespace

FileText decodeFileText(std::string_view bytes, FallbackEncoding fallback)
{
    if (isASCII(bytes) || !String::fromUTF8(bytes).isNull()) // most files are ASCII, which needs no copy to check
        return {std::string(bytes)};
    if (fallback == FallbackEncoding::macintosh)
        return {decodeText(bytes, kTextEncodingWestern).utf8(), "macintosh"};
    return {decodeLatin1(bytes), "ISO-8859-1"};
}

} // namespace platform
