#include "adm/ADMIdentifier.h"
#include "Documents.h"

#include <gtest/gtest.h>

namespace {

struct Parsed {
    const char* id;
    const char* prefix;
    std::uint32_t type, index, subIndex; // 99: left as it is
};

TEST(ADMIdentifier, EveryFormGivesItsFields)
{
    const Parsed rows[] = {
        {"AP_00010002", "AP", 1, 2, 99},
        {"AC_fFfF000a", "AC", 0xFFFF, 10, 99},
        {"AS_00011001", "AS", 1, 0x1001, 99},
        {"AT_00010001_01", "AT", 1, 1, 1},
        {"AB_00031001_0000000A", "AB", 3, 0x1001, 10},
        {"ATU_FFFFFFFF", "ATU", 99, 0xFFFFFFFF, 99},
        {"APR_1001", "APR", 99, 0x1001, 99},
        {"ACO_1001", "ACO", 99, 0x1001, 99},
        {"ao_1001 and more", "AO", 99, 0x1001, 99},
        {"AVS_0001_0002", "AVS", 99, 1, 2},
    };
    for (const Parsed& row : rows) {
        std::string prefix;
        std::uint32_t type = 99, index = 99, subIndex = 99;
        ADMParseIdentifier(row.id, &prefix, &type, &index, &subIndex);
        EXPECT_EQ(prefix, row.prefix) << row.id;
        EXPECT_EQ(type, row.type) << row.id;
        EXPECT_EQ(index, row.index) << row.id;
        EXPECT_EQ(subIndex, row.subIndex) << row.id;
    }
}

TEST(ADMIdentifier, WhatIsWrongIsNamed)
{
    const struct {
        const char* id;
        const char* reason;
    } rows[] = {
        {"", "unsupported prefix in ID "},
        {"AO1001", "unsupported prefix in ID AO1001"},
        {"XY_0001", "unsupported prefix in ID XY_0001"},
        {"_0001", "unsupported prefix in ID _0001"},
        {"APRX_0001", "unsupported prefix in ID APRX_0001"},
        {"AO_100", "malformed identifier AO_100"},
        {"AO_10001", "malformed identifier AO_10001"},
        {"AO_ZZZZ", "malformed identifier  AO_ZZZZ"},
        {"AO_", "malformed identifier  AO_"},
        {"AP_0x010001", "malformed identifier AP_0x010001"},
        {"AT_00010001", "unsupported prefix in ID AT_00010001"},
        {"AT_00010001x01", "unsupported prefix in ID AT_00010001x01"},
        {"AT_00010001_1", "malformed identifier AT_00010001_1"},
        {"AB_00010001_", "malformed identifier  AB_00010001_"},
        {"AVS_0001", "unsupported prefix in ID AVS_0001"},
    };
    for (const auto& row : rows) {
        std::uint32_t type, index, subIndex;
        EXPECT_EQ(raised([&] { ADMParseIdentifier(row.id, nullptr, &type, &index, &subIndex); }),
                  std::string("MalformedIDString: ") + row.reason);
    }
}

TEST(ADMIdentifier, AFieldIsCheckedWhenItIsAskedFor)
{
    const struct {
        const char* id;
        bool isFine;
    } rows[] = {
        {"AO_ZZ", true},         {"ATU_1", true},    {"AVS_Z_Z", true},      {"AVS_ZZ", false},
        {"AT_00010001_Z", true}, {"AC_0001", false}, {"AB_00010001", false},
    };
    for (const auto& row : rows)
        EXPECT_EQ(raised([&] { ADMParseIdentifier(row.id, nullptr, nullptr, nullptr, nullptr); }).empty(), row.isFine)
            << row.id;
}

TEST(ADMTypes, LabelsAndNames)
{
    const struct {
        std::optional<std::string_view> label, name;
        std::uint32_t type; // 0: raises
    } rows[] = {
        {"0003", {}, 3}, {"000A", {}, 10}, {"zz", "HOA", 4},       {{}, "Foo", 0xFFFF},          {"0000", "Objects", 3},
        {{}, {}, 0},     {"", "", 0},      {"1FFFF", {}, 0x1FFFF}, {"12345678901", "Matrix", 2},
    };
    for (const auto& row : rows) {
        std::uint32_t type = 0;
        const std::string problem = raised([&] {
            type = ADMGetTypeFromRequiredTypeLabelOrName(
                {{"typeLabel", row.label.value_or("")}, {"typeDefinition", row.name.value_or("")}}, "AP_1");
        });
        EXPECT_EQ(type, row.type);
        EXPECT_EQ(problem, row.type == 0 ? "MalformedDefinition: unsupported type for node AP_1" : "");
    }
    const struct {
        ADMType_t type;
        const char* name;
    } names[] = {{0, "Unknown"},     {1, "DirectSpeakers"},   {5, "Binaural"},         {6, "Unknown"},
                 {0xFFF, "Unknown"}, {0x1001, "Custom_1001"}, {0xFFFF, "Custom_FFFF"}, {0x10000, "Unknown"}};
    for (const auto& row : names)
        EXPECT_EQ(ADMGetNameForType(row.type), row.name);
}

TEST(ADMTypes, Formats)
{
    EXPECT_EQ(ADMGetFormatFromFormatLabel(""), 0U);
    EXPECT_EQ(ADMGetFormatFromName("PCM"), 1U);
    EXPECT_EQ(ADMGetFormatFromRequiredFormatLabelOrName({{"formatDefinition", "FLAC"}}, "AS_1"), 0xFFFFU);
    EXPECT_EQ(raised([] { ADMGetFormatFromRequiredFormatLabelOrName(platform::XMLAttributes(), "AS_1"); }),
              "MalformedDefinition: unsupported format for node AS_1");
}

} // namespace
