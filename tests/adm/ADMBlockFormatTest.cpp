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

TEST(ADMBlockFormat, Validation)
{
    struct Coordinate {
        const char* name;
        const char* bound = "";
    };
    const std::string before = "MalformedDefinition: audioBlockFormat '" + std::string(kID) + "' is missing ",
                      cartesian = before + "X and/or Y cartesian coordinate",
                      polar = before + "azimuth and/or elevation polar coordinate";
    const struct {
        const char* isCartesian;
        std::vector<Coordinate> coordinates;
        std::string problem;
    } rows[] = {
        {"0", {{"azimuth"}, {"elevation"}}, ""},
        {"0", {{"azimuth"}, {"distance"}}, polar},
        {"0", {}, polar},
        {"0", {{"X"}, {"Y"}}, polar}, // coordinates do not make a block cartesian
        {"0", {{"azimuth"}, {"elevation", "min"}}, polar},
        {"1", {{"X"}, {"Y"}}, ""},
        {"0", {{"elevation"}}, polar},
        {"1", {{"X"}, {"Z"}}, cartesian},
        {"1", {{"Y"}}, cartesian},
        {"true", {{"azimuth"}, {"elevation"}}, cartesian},
    };
    for (const auto& row : rows) {
        ADMAudioBlockFormat_Object block = object();
        block.setSubElement("cartesian", row.isCartesian, {});
        for (const auto& [name, bound] : row.coordinates)
            block.setSubElement("position", "1", {{"coordinate", name}, {bound[0] != 0 ? "bound" : "x", bound}});
        EXPECT_EQ(raised([&] { block.validate(); }), row.problem);
        EXPECT_EQ(block.position().distance, 1);
    }
    for (const char* name : {"coordinates", "coordinate"})
        EXPECT_EQ(raised([&] {
                      object().setSubElement("position", "1", {{name, ""}});
                  }),
                  "MalformedDefinition: cartesian audioBlockFormat position is missing coordinate attribute");
}

} // namespace
