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
    using namespace std::string_view_literals;
    constexpr std::string_view unsupported = "unsupported prefix in ID ", malformed = "malformed identifier ",
                               noDigits = "malformed identifier  ";
    const struct {
        std::string_view id, problem;
    } rows[] = {
        {"", unsupported},
        {"AO1001", unsupported},
        {"XY_0001", unsupported},
        {"_0001", unsupported},
        {"APRX_0001", unsupported},
        {"\0AO_1001"sv, unsupported},
        {"AO_100", malformed},
        {"AO_10001", malformed},
        {"AO_ZZZZ", noDigits},
        {"AO_", noDigits},
        {"AP_0x010001", malformed},
        {"AT_00010001", unsupported},
        {"AT_00010001x01", unsupported},
        {"AT_00010001_1", malformed},
        {"AB_00010001_", noDigits},
        {"AVS_0001", unsupported},
    };
    for (const auto& row : rows) {
        std::uint32_t type, index, subIndex;
        EXPECT_EQ(raised([&] { ADMParseIdentifier(row.id, nullptr, &type, &index, &subIndex); }),
                  "MalformedIDString: " + std::string(row.problem).append(row.id));
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

} // namespace
