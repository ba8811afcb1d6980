#include "platform/PropertyList.h"

#include <gtest/gtest.h>

namespace {

using namespace platform;

/// A binary list of the objects, numbered in order; offsets and references have one byte.
std::string binaryList(const std::vector<std::string>& objects, unsigned char top = 0)
{
    std::string file = "bplist00";
    std::string table;
    for (const std::string& object : objects) {
        table += static_cast<char>(file.size());
        file += object;
    }
    const auto number = [](std::size_t n) { return std::string(7, '\0') + static_cast<char>(n); };
    const std::size_t tableOffset = file.size();
    return file + table + std::string(6, '\0') + "\x01\x01" + number(objects.size()) + number(top) +
           number(tableOffset);
}

/// A literal with its NUL bytes.
template <std::size_t N>
std::string raw(const char (&bytes)[N])
{
    return {bytes, N - 1};
}

TEST(PropertyListBinary, WhatOtherWritersMayWrite)
{
    const std::string zeros(14, '\0');
    const struct {
        std::string object;
        Value value;
    } cases[] = {
        {raw("\x10\xFF"), 255},
        {raw("\x12\xFF\xFF\xFF\xFF"), 4294967295},
        {raw("\x13\xFF\xFF\xFF\xFF\xFF\xFF\xFF\xFE"), -2},
        {"\x14" + zeros + "\x01\x02", 258},
        {"\x14" + std::string(16, '\xFF'), -1},
        {raw("\x22\x3F\xC0\x00\x00"), 1.5},
        {raw("\x5F\x10\x02hi"), "hi"},
        {raw("\x5F\x13\0\0\0\0\0\0\0\x02hi"), "hi"},
        {raw("\x62\0a\0\xE9"), "a\u00E9"},
        {raw("\x51\0"), std::string(1, '\0')},
    };
    for (const auto& c : cases) {
        Error error;
        EXPECT_EQ(readPropertyList(bytesOf(binaryList({c.object})), &error), c.value) << error.description;
    }
    const std::string twice = binaryList({raw("\xD2\1\1\2\3"), "\x51k", "\x51v", "\x51w"});
    EXPECT_EQ(readPropertyList(bytesOf(twice)), Value(Dictionary{{"k", "w"}}));
    EXPECT_EQ(readPropertyList(bytesOf(binaryList({"\x51v", "\x51w"}, 1))), Value("w"));
}

TEST(PropertyListBinary, MalformedIsRefused)
{
    const std::vector<std::string> lists[] = {
        // clang-format off
        {},
        // unknown types
        {raw("\x00")}, {raw("\x0F")}, {raw("\x80\x01")}, {raw("\xC0")}, {raw("\x24\0\0\0\0")}, {raw("\x15")},
        {raw("\x32\0\0\0\0")},
        // cut short
        {raw("\x13\0\0\0")}, {raw("\x33\0\0\0\0\0\0\0")}, {raw("\x55hi")}, {raw("\x62\0a\0")}, {raw("\x5F")},
        {raw("\xD1\x01")},
        // 2^64, and 2^64 - 1
        {"\x14" + std::string(7, '\0') + "\x01" + std::string(8, '\0')},
        {"\x14" + std::string(8, '\0') + std::string(8, '\xFF')},
        // no text: not ASCII, surrogates alone
        {raw("\x51\xE9")}, {raw("\x61\xD8\0")}, {raw("\x62\xDC\0\xD8\0")},
        // counts that are no integer, or enormous
        {raw("\x5F\x22hi")}, {"\x4F\x13" + std::string(8, '\xFF')}, {"\x6F\x13\x80" + std::string(7, '\0')},
        {"\xAF\x13\x7F" + std::string(7, '\xFF')}, {"\xDF\x13\x80" + std::string(7, '\0')},
        // references to nothing, to themselves, keys that are no text
        {raw("\xA1\x01")}, {raw("\xA1\x00")}, {raw("\xA1\x01"), raw("\xA1\x00")}, {raw("\xD1\x01\x00"), "\x51k"},
        {raw("\xD1\x01\x01"), raw("\x09")},
        // clang-format on
    };
    for (const auto& objects : lists)
        EXPECT_FALSE(readPropertyList(bytesOf(binaryList(objects)))) << testing::PrintToString(objects);

    const std::string good = binaryList({raw("\xA1\x01"), raw("\x09")});
    ASSERT_TRUE(readPropertyList(bytesOf(good)));
    for (std::size_t length = 0; length < good.size(); ++length)
        EXPECT_FALSE(readPropertyList(bytesOf(std::string_view(good).substr(0, length)))) << length;
    for (std::size_t at = good.size() - 26; at < good.size(); ++at) { // the trailer's numbers, one byte too high
        std::string bad = good;
        bad[at] = '\xFF';
        EXPECT_FALSE(readPropertyList(bytesOf(bad))) << at;
    }
}

TEST(PropertyListBinary, LenientReadingLeavesOutWhatCannotBeRead)
{
    const std::string zeros(32, '\0');
    const auto lenient = [](const std::vector<std::string>& objects) {
        return readPropertyList(bytesOf(binaryList(objects)), nullptr, PropertyListReading::lenient);
    };
    // Complete objects of unknown types, so that nothing else is wrong with them.
    for (const char marker : {'\x00', '\x07', '\x0A', '\x15', '\x1F', '\x21', '\x24', '\x30', '\x32', '\x34', '\x80'}) {
        const std::string object = marker + zeros;
        EXPECT_FALSE(readPropertyList(bytesOf(binaryList({object})))) << int{marker};
        EXPECT_FALSE(lenient({object})) << int{marker};
        EXPECT_EQ(lenient({raw("\xA2\1\2"), object, "\x09"}), Value(Array{Value(), true})) << int{marker};
    }
    EXPECT_EQ(lenient({raw("\xD3\1\2\3\4\5\6"), "\x51k", "\x09", "\x51l", raw("\x51\xE9"), "\x08",
                       "\x14" + std::string(8, '\0') + std::string(8, '\xFF')}),
              Value(Dictionary{{"l", 18446744073709551615.0}}));
    EXPECT_FALSE(lenient({raw("\xA1\x01")}));
    EXPECT_FALSE(lenient({raw("\x13\0\0\0")}));
}

TEST(PropertyListBinary, SharedObjectsDoNotUnfoldWithoutLimit)
{
    std::vector<std::string> objects;
    for (char next = 1; next <= 5; ++next)
        objects.push_back("\xAF\x10\x10" + std::string(16, next)); // 16 references to the next: 16^5 values
    objects.push_back("\x51x");
    Error error;
    EXPECT_FALSE(readPropertyList(bytesOf(binaryList(objects)), &error));
    EXPECT_NE(error.description.find("unfold"), std::string::npos);
}

// The writer must not share so much that readers with a budget refuse its files.
TEST(PropertyListBinary, ALongTextUsedVeryOftenReadsBack)
{
    const Value value = Array(3000, std::string(20'000, 'x'));
    const auto bytes = writePropertyList(value, PropertyListFormat::binary);
    ASSERT_TRUE(bytes);
    EXPECT_LT(bytes->size(), 1'000'000U);
    EXPECT_TRUE(readPropertyList(*bytes) == value);
}

} // namespace
