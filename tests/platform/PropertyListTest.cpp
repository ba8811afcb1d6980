#include "platform/PropertyList.h"
#include "platform/core/Status.h"
#include "support/TemporaryFolder.h"

#include <gtest/gtest.h>

#include <cstdio>
#include <cstdlib>
#include <limits>

namespace {

using namespace platform;
using enum PropertyListFormat;

Value nested(int depth)
{
    Value value = 1;
    for (int i = 0; i < depth; ++i)
        value = i % 2 == 0 ? Value(Array{std::move(value)}) : Value(Dictionary{{"k", std::move(value)}});
    return value;
}

/// One value of every kind, in the sizes at which encodings change.
Value sample()
{
    Array integers;
    for (const std::int64_t n : {0L, 1L, 255L, 256L, 65535L, 65536L, 4294967295L, 4294967296L, -1L, -256L,
                                 std::numeric_limits<std::int64_t>::max(), std::numeric_limits<std::int64_t>::min()})
        integers.emplace_back(n);
    Dictionary lengths;
    for (const std::size_t n : {0U, 1U, 14U, 15U, 16U, 255U, 256U, 70000U})
        lengths[std::to_string(n)] = Array{std::string(n, 'x'), Bytes(n, std::byte{0xA5}), Array(n % 1000, false)};
    return Dictionary{
        {"integers", std::move(integers)},
        {"lengths", std::move(lengths)},
        {"reals", Array{0.0, -0.1, 1e300, 5e-324, std::numeric_limits<double>::infinity()}},
        {"flags", Array{true, false}},
        {"dates", Array{Date{0}, Date{-63082368000.0}, Date{252423993599.0}, Date{817212600}}},
        {"texts",
         Array{"", " two  blanks\t\n", "<&>\"'", "a\rb\r\n", "caf\u00E9", "\u65E5\u672C", "\U0001D11E", "\u00E9"}},
        {"empty", Array{Array{}, Dictionary{}, Bytes{}}},
        {"\u00FCber", "key"},
    };
}

// We read what python3's plistlib writes, and vice versa.
TEST(PropertyList, AgreesWithAnotherImplementation)
{
    if (std::system("python3 -c 'import plistlib' 2>/dev/null") != 0)
        GTEST_SKIP() << "python3 is missing: scripts/setup test";
    const TemporaryFolder folder;
    folder.write("ours.xml", textOf(*writePropertyList(sample(), xml)));
    folder.write("ours.binary", textOf(*writePropertyList(sample(), binary)));
    constexpr const char* script = R"(
import datetime, plistlib, sys
lengths = [0, 1, 14, 15, 16, 255, 256, 70000]
sample = {
    'integers': [0, 1, 255, 256, 65535, 65536, 2**32 - 1, 2**32, -1, -256, 2**63 - 1, -2**63],
    'lengths': {str(n): ['x' * n, b'\xa5' * n, [False] * (n % 1000)] for n in lengths},
    'reals': [0.0, -0.1, 1e300, 5e-324, float('inf')],
    'flags': [True, False],
    'dates': [datetime.datetime(2001, 1, 1), datetime.datetime(2, 1, 1), datetime.datetime(9999, 12, 31, 23, 59, 59),
              datetime.datetime(2026, 11, 24, 11, 30)],
    'texts': ['', ' two  blanks\t\n', '<&>"\'', 'a\rb\r\n', 'caf\xe9', '\u65e5\u672c', '\U0001d11e', '\xe9'],
    'empty': [[], {}, b''],
    '\xfcber': 'key',
}
folder = sys.argv[1]
for name in ('ours.xml', 'ours.binary'):
    with open(f'{folder}/{name}', 'rb') as file:
        read = plistlib.load(file)
    for key, value in sample.items():
        assert read[key] == value and repr(read[key])[:40] == repr(value)[:40], f'{name}: {key}: {read[key]}'[:400]
    assert len(read) == len(sample)
sample['texts'][3] = 'a\nb\n'  # plistlib itself writes no bare carriage return
for name, format in (('theirs.xml', plistlib.FMT_XML), ('theirs.binary', plistlib.FMT_BINARY)):
    with open(f'{folder}/{name}', 'wb') as file:
        plistlib.dump(sample, file, fmt=format)
)";
    const std::string command = "python3 - '" + folder.path().string() + "'";
    std::FILE* python = popen(command.c_str(), "w");
    ASSERT_NE(python, nullptr);
    std::fputs(script, python);
    ASSERT_EQ(pclose(python), 0);

    Value expected = sample();
    (*(*expected.get<Dictionary>())["texts"].get<Array>())[3] = "a\nb\n";
    for (const char* name : {"theirs.xml", "theirs.binary"}) {
        Error error;
        const auto value = readPropertyList(readFile(folder / name), &error);
        ASSERT_TRUE(value) << name << ": " << error.description;
        EXPECT_EQ(*value, expected) << name;
    }
}

TEST(PropertyList, NestingIsLimitedBothWays)
{
    for (const PropertyListFormat format : {xml, binary}) {
        const auto bytes = writePropertyList(nested(kPropertyListMaximumDepth), format);
        ASSERT_TRUE(bytes);
        EXPECT_EQ(readPropertyList(*bytes), nested(kPropertyListMaximumDepth));
        EXPECT_FALSE(writePropertyList(nested(kPropertyListMaximumDepth + 1), format));
    }
}

TEST(PropertyList, WhatNoListCanHoldIsNotWritten)
{
    for (const PropertyListFormat format : {xml, binary}) {
        for (const Value& value : {Value(), Value(Array{1, Value()}), Value("\xC3"), Value(Dictionary{{"\xFF", 1}})}) {
            Error error;
            EXPECT_FALSE(writePropertyList(value, format, &error));
            EXPECT_EQ(error.domain, ErrorDomain::status);
        }
    }
    const double nan = std::numeric_limits<double>::quiet_NaN();
    for (const Value& value : {Value("a\x01"), Value(std::string(1, '\0')), Value("\uFFFE"), Value(Date{nan}),
                               Value(Date{252423993600.0}), Value(Date{-63113904001.0})}) {
        EXPECT_FALSE(writePropertyList(value, xml));
        EXPECT_TRUE(writePropertyList(value, binary));
    }
    EXPECT_EQ(readPropertyList(*writePropertyList(Date{-0.25}, xml)), Value(Date{-1}));
}

} // namespace
