#include "tool/overview/LabelGlyphs.h"

#include "tool/shared/output/DisplayWidth.h"

#include <string>

namespace {

constexpr LabelStroke line(float x0, float y0, float x1, float y1)
{
    return {x0, y0, x1, y1};
}

constexpr LabelStroke dot(float x, float y)
{
    return {x, y, x, y};
}

constexpr LabelStroke arc(float x, float y, float rx, float ry, float from = 0, float to = 360)
{
    return {x, y, rx, ry, std::array{from, to}};
}

template <class... Strokes>
constexpr LabelGlyph glyph(float width, Strokes... strokes)
{
    return {width, {strokes...}, sizeof...(strokes)};
}

// From space to tilde.
constexpr std::array kASCII{
    glyph(0.6F),
    /* ! */ glyph(0.6F, line(0.3F, 0, 0.3F, 4.8F), dot(0.3F, 6.7F)),
    /* " */ glyph(1.8F, line(0.2F, 0, 0.2F, 1.8F), line(1.6F, 0, 1.6F, 1.8F)),
    /* # */
    glyph(4, line(1.2F, 0.5F, 0.6F, 6.5F), line(3.4F, 0.5F, 2.8F, 6.5F), line(0, 2.4F, 4, 2.4F),
          line(0, 4.6F, 4, 4.6F)),
    /* $ */ glyph(4, arc(2, 2, 1.7F, 1.5F, 330, 90), arc(2, 5, 1.8F, 1.5F, 270, 515), line(2, -0.3F, 2, 7.4F)),
    /* % */ glyph(5, arc(1, 1.3F, 1, 1.3F), arc(4, 5.7F, 1, 1.3F), line(4.2F, 0, 0.8F, 7)),
    /* & */ glyph(4.6F, arc(1.8F, 1.6F, 1.4F, 1.6F), arc(1.8F, 5.2F, 1.8F, 1.8F), line(2.8F, 3.6F, 4.6F, 7)),
    /* ' */ glyph(0.4F, line(0.2F, 0, 0.2F, 1.8F)),
    /* ( */ glyph(1.6F, arc(2.4F, 3.6F, 2.2F, 4.4F, 125, 235)),
    /* ) */ glyph(1.6F, arc(-0.8F, 3.6F, 2.2F, 4.4F, -55, 55)),
    /* * */ glyph(2.8F, line(1.4F, 0.2F, 1.4F, 3), line(0.2F, 0.9F, 2.6F, 2.3F), line(2.6F, 0.9F, 0.2F, 2.3F)),
    /* + */ glyph(3.8F, line(1.9F, 2, 1.9F, 5.8F), line(0, 3.9F, 3.8F, 3.9F)),
    /* , */ glyph(0.8F, line(0.5F, 6.5F, 0.1F, 8)),
    /* - */ glyph(2.2F, line(0, 4.3F, 2.2F, 4.3F)),
    /* . */ glyph(0.6F, dot(0.3F, 6.7F)),
    /* / */ glyph(2.6F, line(0, 7.6F, 2.6F, -0.2F)),
    glyph(4, arc(2, 3.5F, 2, 3.5F)),
    glyph(4, line(0.7F, 1.5F, 2.4F, 0), line(2.4F, 0, 2.4F, 7)),
    glyph(4, arc(2, 2, 1.9F, 2, 190, 400), line(3.455F, 3.285F, 0.1F, 7), line(0.1F, 7, 4, 7)),
    glyph(4, arc(1.9F, 1.7F, 1.7F, 1.7F, 205, 450), arc(1.9F, 5.2F, 2, 1.8F, 270, 515)),
    glyph(4, line(3.1F, 7, 3.1F, 0), line(3.1F, 0, 0, 5), line(0, 5, 4.2F, 5)),
    glyph(4, line(3.7F, 0, 0.8F, 0), line(0.8F, 0, 0.4F, 3.2F), arc(1.9F, 4.7F, 2.05F, 2.3F, 222, 510)),
    glyph(4, arc(2, 4.8F, 2, 2.2F), arc(4.2F, 4.8F, 4.2F, 4.8F, 180, 255)),
    glyph(4, line(0, 0, 4, 0), line(4, 0, 1.4F, 7)),
    glyph(4, arc(2, 1.7F, 1.7F, 1.7F), arc(2, 5.2F, 2, 1.8F)),
    glyph(4, arc(2, 2.2F, 2, 2.2F), arc(-0.2F, 2.2F, 4.2F, 4.8F, 0, 75)),
    /* : */ glyph(0.6F, dot(0.3F, 2.3F), dot(0.3F, 6.7F)),
    /* ; */ glyph(0.8F, dot(0.4F, 2.3F), line(0.5F, 6.5F, 0.1F, 8)),
    /* < */ glyph(3.4F, line(3.4F, 2, 0, 3.9F), line(0, 3.9F, 3.4F, 5.8F)),
    /* = */ glyph(3.6F, line(0, 3, 3.6F, 3), line(0, 4.9F, 3.6F, 4.9F)),
    /* > */ glyph(3.4F, line(0, 2, 3.4F, 3.9F), line(3.4F, 3.9F, 0, 5.8F)),
    /* ? */ glyph(3.2F, arc(1.6F, 1.7F, 1.5F, 1.7F, 190, 440), line(1.7F, 3.4F, 1.5F, 5), dot(1.5F, 6.7F)),
    /* @ */ glyph(6, arc(3, 3.9F, 1.2F, 1.5F), line(4.2F, 2.5F, 4.2F, 5), arc(3, 3.9F, 3, 3.9F, 60, 360)),
    /* A */ glyph(4.6F, line(0, 7, 2.3F, 0), line(2.3F, 0, 4.6F, 7), line(0.8F, 4.6F, 3.8F, 4.6F)),
    /* B */
    glyph(4, line(0.2F, 0, 0.2F, 7), line(0.2F, 0, 2, 0), arc(2, 1.7F, 1.6F, 1.7F, 270, 450), line(0.2F, 3.4F, 2, 3.4F),
          arc(2, 5.2F, 1.9F, 1.8F, 270, 450), line(0.2F, 7, 2, 7)),
    /* C */ glyph(4.4F, arc(2.6F, 3.5F, 2.6F, 3.5F, 50, 310)),
    /* D */
    glyph(4.4F, line(0.2F, 0, 0.2F, 7), line(0.2F, 0, 1.4F, 0), arc(1.4F, 3.5F, 3, 3.5F, 270, 450),
          line(0.2F, 7, 1.4F, 7)),
    /* E */
    glyph(3.6F, line(0.2F, 0, 0.2F, 7), line(0.2F, 0, 3.6F, 0), line(0.2F, 3.4F, 3.2F, 3.4F), line(0.2F, 7, 3.6F, 7)),
    /* F */ glyph(3.4F, line(0.2F, 0, 0.2F, 7), line(0.2F, 0, 3.4F, 0), line(0.2F, 3.4F, 3, 3.4F)),
    /* G */
    glyph(4.8F, arc(2.6F, 3.5F, 2.6F, 3.5F, 35, 310), line(4.8F, 5.4F, 4.8F, 3.8F), line(4.8F, 3.8F, 3, 3.8F)),
    /* H */ glyph(4.4F, line(0.2F, 0, 0.2F, 7), line(4.2F, 0, 4.2F, 7), line(0.2F, 3.4F, 4.2F, 3.4F)),
    /* I */ glyph(0.6F, line(0.3F, 0, 0.3F, 7)),
    /* J */ glyph(2.8F, line(2.6F, 0, 2.6F, 5.2F), arc(1.2F, 5.2F, 1.4F, 1.8F, 0, 150)),
    /* K */ glyph(4.2F, line(0.2F, 0, 0.2F, 7), line(4, 0, 0.2F, 4), line(1.5F, 2.7F, 4.2F, 7)),
    /* L */ glyph(3.5F, line(0.2F, 0, 0.2F, 7), line(0.2F, 7, 3.5F, 7)),
    /* M */
    glyph(5.4F, line(0.2F, 7, 0.2F, 0), line(0.2F, 0, 2.7F, 5), line(2.7F, 5, 5.2F, 0), line(5.2F, 0, 5.2F, 7)),
    /* N */ glyph(4.4F, line(0.2F, 7, 0.2F, 0), line(0.2F, 0, 4.2F, 7), line(4.2F, 7, 4.2F, 0)),
    /* O */ glyph(5, arc(2.5F, 3.5F, 2.5F, 3.5F)),
    /* P */
    glyph(4, line(0.2F, 0, 0.2F, 7), line(0.2F, 0, 2, 0), arc(2, 1.9F, 1.9F, 1.9F, 270, 450),
          line(0.2F, 3.8F, 2, 3.8F)),
    /* Q */ glyph(5, arc(2.5F, 3.5F, 2.5F, 3.5F), line(3, 5, 5, 7.4F)),
    /* R */
    glyph(4, line(0.2F, 0, 0.2F, 7), line(0.2F, 0, 2, 0), arc(2, 1.9F, 1.9F, 1.9F, 270, 450), line(0.2F, 3.8F, 2, 3.8F),
          line(2, 3.8F, 4, 7)),
    /* S */ glyph(4, arc(2, 1.75F, 1.8F, 1.75F, 330, 90), arc(2, 5.25F, 1.9F, 1.75F, 270, 515)),
    /* T */ glyph(4.4F, line(0, 0, 4.4F, 0), line(2.2F, 0, 2.2F, 7)),
    /* U */ glyph(4.4F, line(0.2F, 0, 0.2F, 4.8F), arc(2.2F, 4.8F, 2, 2.2F, 180, 0), line(4.2F, 4.8F, 4.2F, 0)),
    /* V */ glyph(4.6F, line(0, 0, 2.3F, 7), line(2.3F, 7, 4.6F, 0)),
    /* W */ glyph(6.6F, line(0, 0, 1.6F, 7), line(1.6F, 7, 3.3F, 1), line(3.3F, 1, 5, 7), line(5, 7, 6.6F, 0)),
    /* X */ glyph(4.2F, line(0, 0, 4.2F, 7), line(4.2F, 0, 0, 7)),
    /* Y */ glyph(4.4F, line(0, 0, 2.2F, 3.6F), line(4.4F, 0, 2.2F, 3.6F), line(2.2F, 3.6F, 2.2F, 7)),
    /* Z */ glyph(4, line(0, 0, 4, 0), line(4, 0, 0, 7), line(0, 7, 4, 7)),
    /* [ */ glyph(1.4F, line(0.2F, -0.4F, 0.2F, 8), line(0.2F, -0.4F, 1.4F, -0.4F), line(0.2F, 8, 1.4F, 8)),
    /* \ */ glyph(2.6F, line(0, -0.2F, 2.6F, 7.6F)),
    /* ] */ glyph(1.4F, line(1.2F, -0.4F, 1.2F, 8), line(0, -0.4F, 1.2F, -0.4F), line(0, 8, 1.2F, 8)),
    /* ^ */ glyph(3.2F, line(0, 2.4F, 1.6F, 0), line(1.6F, 0, 3.2F, 2.4F)),
    /* _ */ glyph(3.8F, line(0, 8, 3.8F, 8)),
    /* ` */ glyph(0.9F, line(0, 0, 0.9F, 1.2F)),
    /* a */ glyph(3.6F, arc(1.75F, 4.65F, 1.75F, 2.35F), line(3.5F, 2.3F, 3.5F, 7)),
    /* b */ glyph(3.6F, line(0.1F, 0, 0.1F, 7), arc(1.85F, 4.65F, 1.75F, 2.35F)),
    /* c */ glyph(3.2F, arc(1.9F, 4.65F, 1.8F, 2.35F, 50, 310)),
    /* d */ glyph(3.6F, arc(1.75F, 4.9F, 1.75F, 2.1F), line(3.5F, 0, 3.5F, 7)),
    /* e */ glyph(3.6F, arc(1.8F, 4.65F, 1.8F, 2.35F, 50, 360), line(3.6F, 4.65F, 0, 4.65F)),
    /* f */ glyph(2.4F, arc(2, 1.5F, 1, 1.5F, 180, 290), line(1, 1.5F, 1, 7), line(0, 2.3F, 2.2F, 2.3F)),
    /* g */
    glyph(3.6F, arc(1.75F, 4.65F, 1.75F, 2.35F), line(3.5F, 2.3F, 3.5F, 7.4F), arc(1.8F, 7.4F, 1.7F, 1.6F, 0, 150)),
    /* h */ glyph(3.6F, line(0.1F, 0, 0.1F, 7), arc(1.8F, 4.2F, 1.7F, 1.9F, 180, 360), line(3.5F, 4.2F, 3.5F, 7)),
    /* i */ glyph(0.6F, line(0.3F, 2.3F, 0.3F, 7), dot(0.3F, 0.5F)),
    /* j */ glyph(1.2F, line(0.9F, 2.3F, 0.9F, 7.8F), arc(0, 7.8F, 0.9F, 1.2F, 0, 110), dot(0.9F, 0.5F)),
    /* k */ glyph(3.4F, line(0.1F, 0, 0.1F, 7), line(3.1F, 2.3F, 0.1F, 5), line(1.2F, 4.1F, 3.4F, 7)),
    /* l */ glyph(0.6F, line(0.3F, 0, 0.3F, 7)),
    /* m */
    glyph(5.6F, line(0, 2.3F, 0, 7), arc(1.4F, 4, 1.4F, 1.7F, 180, 360), line(2.8F, 4, 2.8F, 7),
          arc(4.2F, 4, 1.4F, 1.7F, 180, 360), line(5.6F, 4, 5.6F, 7)),
    /* n */ glyph(3.6F, line(0.1F, 2.3F, 0.1F, 7), arc(1.8F, 4.2F, 1.7F, 1.9F, 180, 360), line(3.5F, 4.2F, 3.5F, 7)),
    /* o */ glyph(3.7F, arc(1.85F, 4.65F, 1.85F, 2.35F)),
    /* p */ glyph(3.6F, line(0.1F, 2.3F, 0.1F, 9), arc(1.85F, 4.65F, 1.75F, 2.35F)),
    /* q */ glyph(3.6F, arc(1.75F, 4.65F, 1.75F, 2.35F), line(3.5F, 2.3F, 3.5F, 9)),
    /* r */ glyph(2.2F, line(0.1F, 2.3F, 0.1F, 7), arc(1.7F, 4.2F, 1.6F, 1.9F, 180, 285)),
    /* s */ glyph(3.1F, arc(1.55F, 3.5F, 1.4F, 1.2F, 330, 90), arc(1.55F, 5.85F, 1.5F, 1.15F, 270, 515)),
    /* t */ glyph(2.2F, line(1, 0.8F, 1, 5.6F), arc(2, 5.6F, 1, 1.4F, 180, 90), line(0, 2.3F, 2.2F, 2.3F)),
    /* u */ glyph(3.6F, line(0.1F, 2.3F, 0.1F, 5.1F), arc(1.8F, 5.1F, 1.7F, 1.9F, 180, 0), line(3.5F, 2.3F, 3.5F, 7)),
    /* v */ glyph(3.4F, line(0, 2.3F, 1.7F, 7), line(1.7F, 7, 3.4F, 2.3F)),
    /* w */
    glyph(5.2F, line(0, 2.3F, 1.3F, 7), line(1.3F, 7, 2.6F, 2.8F), line(2.6F, 2.8F, 3.9F, 7),
          line(3.9F, 7, 5.2F, 2.3F)),
    /* x */ glyph(3.2F, line(0, 2.3F, 3.2F, 7), line(3.2F, 2.3F, 0, 7)),
    /* y */ glyph(3.4F, line(0, 2.3F, 1.7F, 7), line(3.4F, 2.3F, 1.1F, 9)),
    /* z */ glyph(3.2F, line(0, 2.3F, 3.2F, 2.3F), line(3.2F, 2.3F, 0, 7), line(0, 7, 3.2F, 7)),
    /* { */
    glyph(1.8F, line(1.8F, -0.4F, 0.9F, 0.6F), line(0.9F, 0.6F, 0.9F, 3), line(0.9F, 3, 0.1F, 3.8F),
          line(0.1F, 3.8F, 0.9F, 4.6F), line(0.9F, 4.6F, 0.9F, 7), line(0.9F, 7, 1.8F, 8)),
    /* | */ glyph(0.4F, line(0.2F, -0.6F, 0.2F, 8.2F)),
    /* } */
    glyph(1.8F, line(0, -0.4F, 0.9F, 0.6F), line(0.9F, 0.6F, 0.9F, 3), line(0.9F, 3, 1.7F, 3.8F),
          line(1.7F, 3.8F, 0.9F, 4.6F), line(0.9F, 4.6F, 0.9F, 7), line(0.9F, 7, 0, 8)),
    /* ~ */ glyph(4, arc(1, 3.9F, 1, 0.8F, 180, 360), arc(3, 3.9F, 1, 0.8F, 180, 0)),
};
static_assert(kASCII.size() == '~' - ' ' + 1);

constexpr LabelGlyph kMinus = glyph(3.8F, line(0, 3.8F, 3.8F, 3.8F));
constexpr LabelGlyph kInfinity = glyph(7.2F, arc(2.3F, 3.8F, 1.6F, 1.8F), arc(5.6F, 3.8F, 1.6F, 1.8F));
constexpr LabelGlyph kEllipsis = glyph(3.8F, dot(0.3F, 6.7F), dot(1.9F, 6.7F), dot(3.5F, 6.7F));

constexpr LabelGlyph kSharpS = glyph(3.6F, line(0.1F, 7, 0.1F, 1.7F), arc(1.5F, 1.7F, 1.4F, 1.7F, 180, 400),
                                     arc(1.6F, 5.1F, 1.9F, 1.9F, 270, 480));

// From U+00C0 on: a letter and its mark.
constexpr std::string_view kLatin = "A`A'A^A~A:Ao..C,E`E'E^E:I`I'I^I:..N~O`O'O^O~O:..O/U`U'U^U:Y'...."
                                    "a`a'a^a~a:ao..c,e`e'e^e:i`i'i^i:..n~o`o'o^o~o:..o/u`u'u^u:y'..y:";
static_assert(kLatin.size() == 2 * (0x100 - 0xC0));

LabelGlyph box(float width)
{
    return glyph(width, line(0, 0.5F, width, 0.5F), line(width, 0.5F, width, 7), line(width, 7, 0, 7),
                 line(0, 7, 0, 0.5F));
}

std::string utf8(char32_t c)
{
    const auto byte = [](char32_t value) { return static_cast<char>(value); };
    if (c < 0x80)
        return {byte(c)};
    if (c < 0x800)
        return {byte(0xC0 | c >> 6), byte(0x80 | (c & 0x3F))};
    if (c < 0x10000)
        return {byte(0xE0 | c >> 12), byte(0x80 | (c >> 6 & 0x3F)), byte(0x80 | (c & 0x3F))};
    return {byte(0xF0 | c >> 18), byte(0x80 | (c >> 12 & 0x3F)), byte(0x80 | (c >> 6 & 0x3F)), byte(0x80 | (c & 0x3F))};
}

} // namespace

std::optional<LabelGlyph> labelGlyph(char32_t character)
{
    if (character >= ' ' && character <= '~')
        return kASCII[character - ' '];
    if (character >= 0xC0 && character <= 0xFF) {
        const std::string_view pair = kLatin.substr(2 * (character - 0xC0), 2);
        if (pair != "..")
            return markOn(kASCII[static_cast<unsigned char>(pair[0]) - ' '], pair[1], pair[0] >= 'a');
    }
    switch (character) {
    case 0xDF:
        return kSharpS;
    case 0x2212:
        return kMinus;
    case 0x221E:
        return kInfinity;
    case 0x2026:
        return kEllipsis;
    default:
        break;
    }
    constexpr float kNarrowBox = 3.4F;
    const int columns = displayWidth(utf8(character));
    return columns > 0 ? std::optional(box(kNarrowBox * static_cast<float>(columns))) : std::nullopt;
}

char labelMark(char32_t character)
{
    switch (character) {
    case 0x300:
        return '`';
    case 0x301:
        return '\'';
    case 0x302:
        return '^';
    case 0x303:
        return '~';
    case 0x308:
        return ':';
    case 0x30A:
        return 'o';
    case 0x327:
        return ',';
    default:
        return 0;
    }
}

LabelGlyph markOn(const LabelGlyph& glyph, char mark, bool isLow)
{
    LabelGlyph marked = glyph;
    const float x = glyph.width / 2, y = isLow ? 0.7F : -1.5F;
    const auto add = [&marked](LabelStroke stroke) {
        if (marked.count < marked.strokes.size())
            marked.strokes[marked.count++] = stroke;
    };
    switch (mark) {
    case '`':
        add(line(x - 0.9F, y - 0.7F, x + 0.5F, y + 0.5F));
        break;
    case '\'':
        add(line(x + 0.9F, y - 0.7F, x - 0.5F, y + 0.5F));
        break;
    case '^':
        add(line(x - 1.1F, y + 0.5F, x, y - 0.7F));
        add(line(x, y - 0.7F, x + 1.1F, y + 0.5F));
        break;
    case '~':
        add(line(x - 1.2F, y + 0.3F, x - 0.4F, y - 0.3F));
        add(line(x - 0.4F, y - 0.3F, x + 0.4F, y + 0.3F));
        add(line(x + 0.4F, y + 0.3F, x + 1.2F, y - 0.3F));
        break;
    case ':':
        add(dot(x - 1, y));
        add(dot(x + 1, y));
        break;
    case 'o':
        add(arc(x, y, 0.8F, 0.8F));
        break;
    case ',':
        add(line(x + 0.2F, 7, x - 0.3F, 8.6F));
        break;
    default:
        add(line(x - 2, 7.4F, x + 2, isLow ? 1.9F : -0.4F));
        break;
    }
    return marked;
}
