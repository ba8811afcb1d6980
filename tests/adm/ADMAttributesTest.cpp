#include "adm/ADMAttributes.h"
#include "Documents.h"

#include <gtest/gtest.h>

namespace {

TEST(ADMAttributes, FromATree)
{
    const BytesView bytes = bytesOf("<n a='1' e='' typeLabel='0003'><one>1</one><two/><two>2</two>"
                                    "<l language='de'>x</l><l>y</l><l language='de'>z</l></n>");
    platform::MemoryInputStream stream(Bytes(bytes.begin(), bytes.end()));
    const auto tree = platform::XMLTree::parse(stream);
    const platform::XMLNode node = tree->root();
    EXPECT_EQ(ADMGetAttribute(node, "a", "default"), "1");
    EXPECT_EQ(ADMGetAttribute(node, "e", "default"), "default");
    EXPECT_EQ(ADMGetAttribute(node, "b"), std::nullopt);
    EXPECT_EQ(raised([&] { ADMGetRequiredAttribute(node, "e"); }),
              "MalformedDefinition: Required attribute 'e' not found");
    EXPECT_EQ(ADMGetTypeFromRequiredTypeLabelOrName(node, "n"), 3U);
    std::size_t count = 9;
    EXPECT_EQ(ADMGetSubElementValue(node, "two", &count), "");
    EXPECT_EQ(count, 2U);
    EXPECT_EQ(ADMGetSubElementValue(node, "three", &count), std::nullopt);
    EXPECT_EQ(count, 0U);
    EXPECT_EQ(ADMGetUniqueSubElementValue(node, "one"), "1");
    EXPECT_EQ(ADMGetUniqueSubElementValue(node, "three", "default"), "default");
    EXPECT_EQ(raised([&] { ADMGetUniqueSubElementValue(node, "two"); }),
              "MalformedDefinition: Subelement 'two' defined multiple times, but must be unique");
    EXPECT_EQ(ADMGetRequiredUniqueSubElementValue(node, "one"), "1");
    for (const char* name : {"two", "three"})
        EXPECT_EQ(raised([&] { ADMGetRequiredUniqueSubElementValue(node, name); }),
                  "MalformedDefinition: Required subelement '" + std::string(name) + "' missing");
    EXPECT_EQ(ADMGetLabelsDictionary(node, "l"), (std::map<std::string, std::string>{{"de", "z"}}));
}

} // namespace
