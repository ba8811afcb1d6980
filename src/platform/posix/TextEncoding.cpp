// Text encodings, decoded here because iconv's modules may be missing at run time, and because glibc's module for the
// Western encoding differs from the published table in 0xC6 and 0xF0: a file's name must not depend on what is
// installed.
#include "platform/TextEncoding.h"

#include "platform/core/Packed.h"

#include <cstring>

namespace platform {

namespace {

/// The upper half of the Western encoding, 0x80 to 0xFF (a charset of RFC 1345, with the euro sign at 0xDB).
constexpr char16_t kWestern[] = u"ÄÅÇÉÑÖÜáàâäãåçéèêëíìîïñóòôöõúùûü"
                                u"†°¢£§•¶ß®©™´¨≠ÆØ∞±≤≥¥µ∂∑∏π∫ªºΩæø"
                                u"¿¡¬√ƒ≈∆«»…\u00A0ÀÃÕŒœ–—“”‘’÷◊ÿŸ⁄€‹›ﬁﬂ"
                                u"‡·‚„‰ÂÊÁËÈÍÎÏÌÓÔ\uF8FFÒÚÛÙıˆ˜¯˘˙˚¸˝˛ˇ";
static_assert(std::size(kWestern) == 128 + 1);

String decodeWestern(std::string_view bytes)
{
    std::u16string units;
    units.reserve(bytes.size());
    for (const char c : bytes) {
        const auto byte = static_cast<unsigned char>(c);
        units += byte < 0x80 ? static_cast<char16_t>(byte) : kWestern[byte - 0x80];
    }
    return String::fromUTF16(units);
}

String decodeUnicode16(std::string_view bytes)
{
    if (bytes.size() % 2 != 0)
        return nullptr;
    const bool isLittleEndian = bytes.starts_with("\xFF\xFE");
    if (isLittleEndian || bytes.starts_with("\xFE\xFF"))
        bytes.remove_prefix(2);
    std::u16string units;
    units.reserve(bytes.size() / 2);
    for (; !bytes.empty(); bytes.remove_prefix(2))
        units += load<char16_t>(bytes.data(), isLittleEndian ? std::endian::little : std::endian::big);
    return String::fromUTF16(units);
}

/// The bytes before the first 16-bit zero.
std::string_view bytesBeforeZeroUnit(const char* text)
{
    std::size_t size = 0;
    while (text[size] != '\0' || text[size + 1] != '\0')
        size += 2;
    return {text, size};
}

} // namespace

TextEncoding systemTextEncoding()
{
    return kTextEncodingUTF8;
}

String decodeText(std::string_view bytes, TextEncoding encoding)
{
    switch (encoding) {
    case kTextEncodingWestern:
        return decodeWestern(bytes);
    case kTextEncodingUnicode16:
        return decodeUnicode16(bytes);
    case kTextEncodingUTF8:
        return String::fromUTF8(bytes);
    default:
        return nullptr;
    }
}

String decodeCString(const char* text, TextEncoding encoding)
{
    if (text == nullptr)
        return nullptr;
    return decodeText(encoding == kTextEncodingUnicode16 ? bytesBeforeZeroUnit(text) : std::string_view(text),
                      encoding);
}

} // namespace platform
