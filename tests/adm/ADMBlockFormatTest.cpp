#include "Documents.h"
#include "adm/ADMAudioBlockFormat_DirectSpeaker.h"
#include "adm/ADMAudioBlockFormat_Object.h"

#include <gtest/gtest.h>

namespace {

constexpr const char* kID = "AB_00031001_00000001";

ADMAudioBlockFormat_Object object()
{
    return ADMAudioBlockFormat_Object({{"audioBlockFormatID", kID}});
}

TEST(ADMBlockFormat, TheIDDecidesTheKind)
{
    const struct {
        const char* id;
        const char* problem;
    } rows[] = {
        {"AB_00010001_00000001", ""},
        {"ab_00030001_00000001", ""},
        {"AB_00020001_00000001", "UnsupportedDefinition: type '2' not supported for audioBlockFormat"},
        {"AB_10010001_00000001", "UnsupportedDefinition: type '4097' not supported for audioBlockFormat"},
        {"AC_00030001", "WrongIDPrefix: prefix 'AC' is not a valid prefix for audioBlockFormat"},
        {"AB_00030001", "MalformedIDString: unsupported prefix in ID AB_00030001"},
        {"", "MalformedDefinition: Required attribute 'audioBlockFormatID' not found"},
    };
    for (const auto& row : rows) {
        std::unique_ptr<ADMAudioBlockFormat> block;
        EXPECT_EQ(raised([&] {
                      block = ADMAudioBlockFormat::audioBlockFormatWithAttributes({{"audioBlockFormatID", row.id}});
                  }),
                  row.problem);
        EXPECT_TRUE(block == nullptr || block->audioBlockFormatID() == row.id);
    }
}

TEST(ADMBlockFormat, IDsStayAsTheyAreWritten)
{
    for (const char* id : {kID, "AB_0003100a_00000001", "ab_00031001_00000001", "AB_00031001_00000001 "}) {
        ADMAudioBlockFormat_Object block({{"audioBlockFormatID", id}});
        EXPECT_EQ(block.audioBlockFormatID(), id);
        block.setType(1);
        block.setIndex(2);
        block.setBlockIndex(3);
        EXPECT_EQ(block.audioBlockFormatID(), id);
        EXPECT_EQ(block.blockIndex(), 3U);
        block.setAudioBlockFormatID("another");
        EXPECT_EQ(block.audioBlockFormatID(), "another");
    }
}

TEST(ADMBlockFormat, Defaults)
{
    const ADMAudioBlockFormat_Object block = object();
    EXPECT_EQ(block.rtime(), 0);
    EXPECT_EQ(block.duration(), kADMInvalidTime);
    EXPECT_EQ(block.gain(), 1);
    EXPECT_FALSE(block.hasGain());
    EXPECT_EQ(block.importance(), 1);
    EXPECT_EQ(block.position(), ADMPosition());
    EXPECT_EQ(block.position().distance, 1);
    EXPECT_EQ(block.interpolationLength(), 0);
}

TEST(ADMBlockFormat, Validation)
{
    struct Coordinate {
        const char* name;
        const char* bound;
    };
    const std::string cartesian =
        "MalformedDefinition: audioBlockFormat '" + std::string(kID) + "' is missing X and/or Y cartesian coordinate";
    const std::string polar = "MalformedDefinition: audioBlockFormat '" + std::string(kID) +
                              "' is missing azimuth and/or elevation polar coordinate";
    const struct {
        const char* isCartesian;
        std::vector<Coordinate> coordinates;
        std::string problem;
    } rows[] = {
        {"0", {{"azimuth", ""}, {"elevation", ""}}, ""},
        {"0", {{"azimuth", ""}, {"distance", ""}}, polar},
        {"0", {}, polar},
        {"0", {{"X", ""}, {"Y", ""}}, polar}, // coordinates do not make a block cartesian
        {"0", {{"azimuth", ""}, {"elevation", "min"}}, polar},
        {"1", {{"X", ""}, {"Y", ""}}, ""},
        {"1", {{"X", ""}, {"Z", ""}}, cartesian},
        {"true", {{"azimuth", ""}, {"elevation", ""}}, cartesian},
    };
    for (const auto& row : rows) {
        ADMAudioBlockFormat_Object block = object();
        block.setSubElement("cartesian", row.isCartesian, {});
        for (const Coordinate& each : row.coordinates) {
            if (*each.bound == '\0')
                block.setSubElement("position", "1", {{"coordinate", each.name}});
            else
                block.setSubElement("position", "1", {{"coordinate", each.name}, {"bound", each.bound}});
        }
        EXPECT_EQ(raised([&] { block.validate(); }), row.problem);
        EXPECT_EQ(block.position().distance, 1);
    }
    for (const char* name : {"coordinates", "coordinate"})
        EXPECT_EQ(raised([&] {
                      object().setSubElement("position", "1", {{name, ""}});
                  }),
                  "MalformedDefinition: cartesian audioBlockFormat position is missing coordinate attribute");
}

TEST(ADMBlockFormat, EverySubElementSetsItsProperty)
{
    ADMAudioBlockFormat_Object block = object();
    const char* coordinates[] = {"X", "Y", "Z", "azimuth", "elevation", "distance", "x"};
    float value = 1;
    for (const char* coordinate : coordinates)
        block.setSubElement("position", std::to_string(value++), {{"coordinate", coordinate}});
    EXPECT_EQ(block.position(), (ADMPosition{false, 1, 2, 3, 4, 5, 6}));
    EXPECT_TRUE(block.hasCartesianX() && block.hasCartesianY() && block.hasCartesianZ());
    EXPECT_TRUE(block.hasPolarAzimuth() && block.hasPolarElevation() && block.hasPolarDistance());
    block.setSubElement("width", "1", {});
    block.setSubElement("height", "2", {});
    block.setSubElement("depth", "3", {});
    EXPECT_EQ(block.width() * 100 + block.height() * 10 + block.depth(), 123);
    EXPECT_TRUE(block.hasWidth() && block.hasHeight() && block.hasDepth());
    block.setSubElement("jumpPosition", "1", {});
    EXPECT_TRUE(block.jumpPosition());
    EXPECT_EQ(block.interpolationLength(), -1);
    block.setSubElement("jumpPosition", "0", {{"interpolationLength", "0.25"}});
    EXPECT_FALSE(block.jumpPosition());
    EXPECT_EQ(block.interpolationLength(), 0.25);
    block.setSubElement("diffuse", "0.5", {});
    EXPECT_EQ(block.diffuse(), 0.5);
    block.setSubElement("screenRef", "1", {});
    EXPECT_TRUE(block.screenRef());
    block.setSubElement("gain", "-3", {{"gainUnit", "dB"}});
    EXPECT_TRUE(block.hasGain() && block.gain() == -3 && block.gainUnit() == 1);
    block.setSubElement("importance", "7", {});
    EXPECT_EQ(block.importance(), 7);
    block.setSubElement("headLocked", "1", {});
    EXPECT_TRUE(block.headLocked() && !block.headphoneVirtualize());
    block.setSubElement("headphoneVirtualize", "1", {});
    EXPECT_TRUE(block.headphoneVirtualize());
}

TEST(ADMBlockFormat, ALoudspeakerIsItsLabel)
{
    ADMAudioBlockFormat_DirectSpeaker block({{"audioBlockFormatID", "AB_00010001_00000001"}});
    block.setSubElement("position", "30", {{"coordinate", "azimuth"}});
    block.setSubElement("position", "30", {});
    EXPECT_EQ(block.position(), ADMPosition());
    block.setSubElement("speakerLabel", "M+030", {});
    block.setSubElement("speakerLabel", " M-030", {});
    EXPECT_EQ(block.speakerLabel(), " M-030");
    block.setSubElement("gain", "0.5", {});
    EXPECT_EQ(block.description(),
              "<ADMAudioBlockFormat_DirectSpeaker: ID = AB_00010001_00000001, rtime = 00:00:00.00000, "
              "duration = " +
                  ADMTimeMicrosecToTimestampString(kADMInvalidTime) +
                  ", gain = 0.500000, importance = 1.000000, headlocked = NO, headphoneVirtualize = "
                  "NO, label =  M-030, position = (azimuth=0.000000, elevation=0.000000, "
                  "distance=1.000000)>");
}

TEST(ADMBlockFormat, ObjectDescription)
{
    ADMAudioBlockFormat_Object block({{"audioBlockFormatID", kID}, {"duration", "00:00:01.00000"}});
    block.setSubElement("cartesian", "1", {});
    EXPECT_EQ(
        block.description(),
        "<ADMAudioBlockFormat_Object: ID = AB_00031001_00000001, rtime = 00:00:00.00000, duration = 00:00:01.00000, "
        "gain = 1.000000, importance = 1.000000, headlocked = NO, headphoneVirtualize = NO, position = (x=0.000000, "
        "y=0.000000, z=0.000000), size=(width=0.000000, depth=0.000000, height=0.000000), diffuse = 0.000000, "
        "jumpPosition = NO, interpolationLength = 0.000000 >");
}

} // namespace
