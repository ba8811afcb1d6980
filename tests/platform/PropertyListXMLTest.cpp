#include "platform/PropertyList.h"

#include <gtest/gtest.h>

#include <chrono>

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
        {"<?xml version='1.0' encoding='ISO-8859-1'?><plist><string>A</string></plist>", "A"},
        {xmlList("<data> AAE\nC Aw </data>"), Bytes{std::byte{0}, std::byte{1}, std::byte{2}, std::byte{3}}},
        {xmlList("<dict><key>k</key><string>1</string><key>k</key><string>2</string></dict>"), Dictionary{{"k", "2"}}},
        {xmlList("<date> 2000-12-31T23:59:59Z </date>"), Date{-1}},
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

    std::u16string wide = u"\uFEFF<?xml version='1.0' encoding='UTF-16'?><plist><string>\u65E5</string></plist>";
    EXPECT_EQ(readPropertyList(std::as_bytes(std::span(wide))), Value("\u65E5"));
    wide[60] = 0xD800;
    EXPECT_FALSE(readPropertyList(std::as_bytes(std::span(wide)))) << "a surrogate alone";
    wide = u"<?xml version='1.0'?><plist><true/></plist>";
    EXPECT_FALSE(readPropertyList(std::as_bytes(std::span(wide)))) << "no byte order mark";
}

TEST(PropertyListXML, MalformedIsRefusedAndTheLineNamed)
{
    const std::string_view contents[] = {
        "",
        "<string>a</string><string>b</string>",
        "text",
        "<array>text</array>",
        "<array><key>k</key></array>",
        "<key>k</key>",
        "<dict><string>v</string></dict>",
        "<dict><key>k</key></dict>",
        "<dict><key>k</key><key>l</key><true/></dict>",
        "<string><true/></string>",
        "<true>x</true>",
        "<set/>",
        "<integer/>",
        "<integer>1.5</integer>",
        "<integer>9223372036854775808</integer>",
        "<integer>- 1</integer>",
        "<integer>--1</integer>",
        "<real>1,5</real>",
        "<real>+-1</real>",
        "<real/>",
        "<date>2026-02-30T00:00:00Z</date>",
        "<date>2026-02-03</date>",
        "<date>0000-01-01T00:00:00Z</date>",
        "<data>A</data>",
        "<data>AA=A</data>",
        "<data>AAAA=</data>",
        "<data>A*==</data>",
        "<string>&unknown;</string>",
        "<string>a",
        "<string a='&unknown;'/>",
    };
    for (const std::string_view content : contents) {
        Error error;
        EXPECT_FALSE(readPropertyList(bytesOf(xmlList(content)), &error)) << content;
        EXPECT_TRUE(error.description.starts_with("property list: line 1: ")) << content << ": " << error.description;
    }
    Error error;
    EXPECT_FALSE(readPropertyList(bytesOf("<?xml version='1.0'?>\n<plist>\n<true/>\n<oops/>\n</plist>"), &error));
    EXPECT_EQ(error.description, "property list: line 4: unknown element \"oops\"");
    for (const std::string_view text : {"<true/>", "<plist/>", "<plist><string>\xFF</string></plist>"})
        EXPECT_FALSE(readPropertyList(bytesOf(text))) << text;
    std::string deep;
    for (int i = 0; i < 100'000; ++i)
        deep += "<array>";
    EXPECT_FALSE(readPropertyList(bytesOf(xmlList(deep))));
}

TEST(PropertyListXML, DeclarationsInTheDoctypeAreRefused)
{
    const std::string_view declarations[] = {
        "<!ENTITY a 'x'>",
        "<!ENTITY % a 'x'>",
        "<!ENTITY a SYSTEM 'file:///etc/passwd'>",
        "<!ATTLIST true a CDATA 'x'>",
        "<!ATTLIST true a (x|y) 'x'>",
        "<!ELEMENT true (a,b)>",
        "<!NOTATION n SYSTEM 'n'>",
    };
    for (const std::string_view declaration : declarations) {
        Error error;
        const std::string text = "<!DOCTYPE plist [" + std::string(declaration) + "]>" + xmlList("<true/>");
        EXPECT_FALSE(readPropertyList(bytesOf(text), &error)) << declaration;
    }
    EXPECT_TRUE(readPropertyList(bytesOf("<!DOCTYPE plist []>" + xmlList("<true/>"))));
    // With a DTD elsewhere an unknown entity is no error of form, but what it stands for would be missing.
    EXPECT_FALSE(readPropertyList(bytesOf("<!DOCTYPE plist SYSTEM 'p.dtd'>" + xmlList("<string>a&b;</string>"))));
}

TEST(PropertyListXML, ManyAttributesCostTimeInProportion)
{
    std::string text = "<plist";
    for (int i = 0; i < 200'000; ++i)
        text += " a" + std::to_string(i) + "=''";
    const auto start = std::chrono::steady_clock::now();
    EXPECT_FALSE(readPropertyList(bytesOf(text + "><true/></plist>")));
    EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::seconds(5)); // it took minutes
    // Only tags are limited.
    std::string many;
    for (int i = 0; i < 5000; ++i)
        many += "<!--a--><?b?>";
    const std::string blanks(50'000, ' ');
    for (const std::string& content : {"<data><![CDATA[" + std::string(400'000, 'A') + "]]></data>", many + "<true/>",
                                       "<!--" + blanks + "--><true/>", "<?pi " + blanks + "?><true/>",
                                       blanks + "<true/>", "<string>" + std::string(50'000, 'x') + "</string>"}) {
        Error error;
        EXPECT_TRUE(readPropertyList(bytesOf(blanks + xmlList(content)), &error))
            << content.substr(0, 20) << error.description;
    }
}

} // namespace
