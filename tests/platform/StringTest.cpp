#include "platform/String.h"
#include "platform/TextEncoding.h"

#include <gtest/gtest.h>

#include <iconv.h>

using namespace platform;
using namespace std::string_literals;

TEST(String, TakesWellFormedUTF8Only)
{
    const std::string valid[] = {"",
                                 "plain ASCII, longer than eight bytes",
                                 "a\0b"s,
                                 "\u0080\u07FF\u0800\uD7FF\uE000\uFFFF",
                                 "\U00010000\U0010FFFF",
                                 "1234567\u00E41234567\U0001F3B5"};
    for (const std::string& text : valid)
        EXPECT_EQ(String::fromUTF8(text).utf8(), text) << text;

    // A lone, an overlong, an incomplete sequence; surrogates; beyond the last character.
    const std::string invalid[] = {"\x80",     "\xC0\x80",         "\xC3",         "\xED\xA0\x80",
                                   "\xE2\x82", "\xF4\x90\x80\x80", "\xF0\x9F\x8E", "\xFF"};
    for (const std::string& bytes : invalid)
        for (const std::string& before : {""s, "1234567"s, "12345678"s, "\u00E4"s}) // at each place of the fast road
            EXPECT_TRUE(String::fromUTF8(before + bytes + "z").isNull()) << testing::PrintToString(bytes);
}

TEST(String, ConvertsToUTF16AndBack)
{
    std::u16string units;
    // Every scalar value of one unit; of those with two units, both ends and 1,024 in between.
    for (std::uint32_t scalar = 0; scalar <= 0x10FFFF; scalar += scalar < 0x10000 ? 1 : 0x3FF) {
        if (scalar >= 0x10000)
            (units += static_cast<char16_t>(0xD7C0 + (scalar >> 10))) +=
                static_cast<char16_t>(0xDC00 + (scalar & 0x3FF));
        else if (scalar < 0xD800 || scalar > 0xDFFF)
            units += static_cast<char16_t>(scalar);
    }
    const String text = String::fromUTF16(units);
    EXPECT_EQ(text.utf8().size(), 0x80 + 2 * 0x780 + 3 * (0xF800 - 0x800) + 4 * 1026);
    EXPECT_TRUE(text.utf16() == units); // not EXPECT_EQ, which would print them all
    EXPECT_TRUE(String::fromUTF8(text.utf8()) == text);
    for (const std::u16string& alone : {u"\xD800"s, u"\xD800x"s, u"\xDBFF\xDBFF"s, u"\xDC00\xD800"s, u"\xDFFF"s})
        EXPECT_TRUE(String::fromUTF16(alone).isNull());
}

TEST(String, FileSystemFormsFitOrFail)
{
    const String text = String::fromUTF8("a\u00E4"); // three bytes
    char buffer[8] = "old";
    EXPECT_FALSE(text.getFileSystemRepresentation(buffer, 3));
    EXPECT_STREQ(buffer, "");
    EXPECT_TRUE(text.getFileSystemRepresentation(buffer, 4));
    EXPECT_STREQ(buffer, "a\u00E4");
    EXPECT_FALSE(text.getFileSystemRepresentation(nullptr, 4) || text.getFileSystemRepresentation(buffer, 0));
    EXPECT_FALSE(String::fromUTF8("a\0b"s).getFileSystemRepresentation(buffer, sizeof buffer));
    EXPECT_FALSE(String().getFileSystemRepresentation(buffer, sizeof buffer));
    const String longer = String::fromUTF8(std::string(5000, 'x'));
    std::string bytes(longer.maximumSizeOfFileSystemRepresentation(), '\0');
    EXPECT_TRUE(longer.getFileSystemRepresentation(bytes.data(), bytes.size()));
    EXPECT_EQ(bytes.c_str(), longer.utf8());
}

TEST(TextEncoding, EveryByteOfTheWesternEncodingDecodes)
{
    const iconv_t converter = iconv_open("UTF-8", "MACINTOSH");
    for (int byte = 1; byte < 256; ++byte) {
        const char text[] = {static_cast<char>(byte), '\0'};
        const String decoded = decodeCString(text, kTextEncodingWestern);
        ASSERT_EQ(decoded.utf16().size(), 1U) << byte;
        // The C library's table, if installed, is an independent reference; it has a Greek letter for 0xC6, and another
        // private value for the sign at 0xF0, which Unicode lacks.
        if (converter == reinterpret_cast<iconv_t>(-1) || byte == 0xC6 || byte == 0xF0)
            continue;
        char in = text[0], out[8] = "", *from = &in, *to = out;
        std::size_t inSize = 1, outSize = sizeof out;
        ASSERT_EQ(iconv(converter, &from, &inSize, &to, &outSize), 0U);
        EXPECT_EQ(decoded.utf8(), std::string(out, to)) << byte;
    }
    if (converter != reinterpret_cast<iconv_t>(-1))
        iconv_close(converter);
    EXPECT_EQ(decodeCString("\x8A\xC6\xF0", kTextEncodingWestern).utf8(), "\u00E4\u2206\uF8FF");
}

TEST(TextEncoding, DecodesByNumber)
{
    struct Case {
        std::string bytes;
        TextEncoding encoding;
        String expected;
    };
    const Case cases[] = {
        {"\u00E4", kTextEncodingUTF8, String::fromUTF8("\u00E4")},
        {"\x8A", kTextEncodingUTF8, nullptr},
        {"\0a\x20\x22"s, kTextEncodingUnicode16, String::fromUTF8("a\u2022")},
        {"\xFE\xFF\0a"s, kTextEncodingUnicode16, String::fromUTF8("a")},
        {"\xFF\xFE"
         "a\0"s,
         kTextEncodingUnicode16, String::fromUTF8("a")},
        {"\xD8\x3C\xDF\xB5", kTextEncodingUnicode16, String::fromUTF8("\U0001F3B5")},
        {"\xD8\x3C", kTextEncodingUnicode16, nullptr}, // half a pair
        {"abc", kTextEncodingUnicode16, nullptr},      // half a unit
        {"", kTextEncodingUnicode16, String::fromUTF8("")},
        {"a", 12345, nullptr},
    };
    for (const Case& c : cases) {
        EXPECT_EQ(decodeText(c.bytes, c.encoding), c.expected) << testing::PrintToString(c.bytes);
        if (c.bytes.size() % 2 == 0) { // std::string ends in one zero, and a 16-bit C string in two
            EXPECT_EQ(decodeCString((c.bytes + "\0"s).c_str(), c.encoding), c.expected);
        }
    }
    EXPECT_EQ(decodeText(decodeText("a", systemTextEncoding()).utf8(), kTextEncodingUTF8).utf8(), "a");
    EXPECT_TRUE(decodeCString(nullptr, kTextEncodingWestern).isNull());
}
