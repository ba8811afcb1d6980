#include "platform/PropertyList.h"

#include <gtest/gtest.h>

namespace {

using namespace platform;

std::string xmlList(std::string_view content)
{
    return "<plist version=\"1.0\">" + std::string(content) + "</plist>";
}

TEST(PropertyListXML, WhatOtherWritersMayWrite)
{
    const struct {
        std::string text;
        Value value;
    } cases[] = {
        {"<?xml version='1.0'?>\n<!DOCTYPE plist PUBLIC \"-//X//DTD PLIST 1.0//EN\" \"http://x.invalid/p.dtd\">" +
             xmlList("<!-- c --><dict><key>a</key><true/></dict>"),
         Dictionary{{"a", true}}},
        {"\xEF\xBB\xBF" + xmlList("<string>x<![CDATA[<y>]]>&#x41;&amp;</string>"), "x<y>A&"},
        {xmlList(
             "<array> <integer> +7 </integer>\n<integer>-0x1F</integer><real>+1e2</real><real>\nnan</real></array>"),
         Value()},
        {"<?xml version='1.0' encoding='ISO-8859-1'?><plist><string>\xE9</string></plist>", "\u00E9"},
        {xmlList("<data> AAE\nC Aw </data>"), Bytes{std::byte{0}, std::byte{1}, std::byte{2}, std::byte{3}}},
        {xmlList("<dict><key>k</key><string>1</string><key>k</key><string>2</string></dict>"), Dictionary{{"k", "2"}}},
        {xmlList("<date> 2000-12-31T23:59:59Z </date>"), Date{-1}},
        {xmlList("<date>2001-01-01T00:00:01.250Z</date>"), Date{1.25}},
        {xmlList("<data>ab+/yz09</data>"),
         Bytes{std::byte{0x69}, std::byte{0xBF}, std::byte{0xBF}, std::byte{0xCB}, std::byte{0x3D}, std::byte{0x3D}}},
    };
    for (const auto& c : cases) {
        Error error;
        const auto value = readPropertyList(bytesOf(c.text), &error);
        ASSERT_TRUE(value) << c.text << error.description;
        if (!c.value.isNull()) // a NaN equals nothing
            EXPECT_EQ(*value, c.value) << c.text;
        else
            EXPECT_EQ((*value->get<Array>())[1], Value(-31));
    }
}

TEST(PropertyListXML, MalformedIsRefusedAndTheLineNamed)
{
    const std::string_view contents[] = {"",
                                         "<string>a</string><string>b</string>",
                                         "<array>text</array>",
                                         "<dict><key>k</key></dict>",
                                         "<string><true/></string>",
                                         "<set/>",
                                         "<integer>1.5</integer>",
                                         "<integer>9223372036854775808</integer>",
                                         "<integer>--1</integer>",
                                         "<real>1,5</real>",
                                         "<date>2026-02-30T00:00:00Z</date>",
                                         "<date>0000-01-01T00:00:00Z</date>",
                                         "<date>2026-01-01T00:00:00.Z</date>",
                                         "<date>2026-01-01T00:00:00.5</date>",
                                         "<date>2026-01-01T00:00:00x5Z</date>",
                                         "<date>2026-01-01T00:00:00.5xZ</date>",
                                         "<data>A</data>",
                                         "<data>A*==</data>",
                                         "<string>&unknown;</string>",
                                         "<string a='&unknown;'/>"};
    for (const std::string_view content : contents) {
        Error error;
        EXPECT_FALSE(readPropertyList(bytesOf(xmlList(content)), &error)) << content;
        EXPECT_TRUE(error.description.starts_with("property list: line 1: ")) << content << ": " << error.description;
    }
    Error error;
    EXPECT_FALSE(readPropertyList(bytesOf("<?xml version='1.0'?>\n<plist>\n<true/>\n<oops/>\n</plist>"), &error));
    EXPECT_EQ(error.description, "property list: line 4: unknown element \"oops\"");
    for (const std::string_view text : {"<true/>", "<plist/>"})
        EXPECT_FALSE(readPropertyList(bytesOf(text))) << text;
    std::string deep;
    for (int i = 0; i < 100'000; ++i)
        deep += "<array>";
    EXPECT_FALSE(readPropertyList(bytesOf(xmlList(deep))));
}

TEST(PropertyListXML, LenientReadingLeavesOutWhatCannotBeRead)
{
    const auto lenient = [](std::string_view content) {
        return readPropertyList(bytesOf(xmlList(content)), nullptr, PropertyListReading::lenient);
    };
    EXPECT_EQ(lenient("<dict><key>a</key><real/><key>b</key><integer>-9223372036854775809</integer><key>c</key>"
                      "<date>today</date><key>d</key><data>A</data><key>e</key><integer>7</integer></dict>"),
              Value(Dictionary{{"b", -9223372036854775808.0}, {"e", 7}}));
    EXPECT_EQ(lenient("<array><integer>18446744073709551615</integer><integer>x</integer><true/></array>"),
              Value(Array{18446744073709551615.0, Value(), true}));
    for (const std::string_view content :
         {"<real/>", "<array><set/></array>", "<dict><true/></dict>", "<array>x</array>"})
        EXPECT_FALSE(lenient(content)) << content;
}

TEST(PropertyListXML, IsWrittenForPeopleToo)
{
    const Value value = Dictionary{{"a", Array{1, "x"}}, {"b", Bytes(3)}, {"c", Dictionary{}}};
    EXPECT_EQ(
        textOf(*writePropertyList(value, PropertyListFormat::xml)),
        "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<plist version=\"1.0\">\n<dict>\n\t<key>a</key>\n\t<array>\n"
        "\t\t<integer>1</integer>\n\t\t<string>x</string>\n\t</array>\n\t<key>b</key>\n\t<data>\n\tAAAA\n\t</data>\n"
        "\t<key>c</key>\n\t<dict/>\n</dict>\n</plist>\n");
}

// XMLParserTest.cpp covers the parser's own refusals; other limits must not disable them.
TEST(PropertyListXML, LongTextIsNoLongTag)
{
    EXPECT_FALSE(readPropertyList(bytesOf("<!DOCTYPE plist [<!ENTITY a 'x'>]>" + xmlList("<true/>"))));
    EXPECT_FALSE(readPropertyList(bytesOf("<plist a='" + std::string(100'000, 'x') + "'><true/></plist>")));
    const std::string blanks(50'000, ' ');
    for (const std::string& content : {"<data><![CDATA[" + std::string(12'000'000, 'A') + "]]></data>",
                                       "<!--" + blanks + "--><?pi " + blanks + "?>" + blanks + "<true/>"}) {
        Error error;
        EXPECT_TRUE(readPropertyList(bytesOf(blanks + xmlList(content)), &error)) << error.description;
    }
}

} // namespace
