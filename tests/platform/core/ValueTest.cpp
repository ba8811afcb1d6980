#include "platform/core/Value.h"

#include <gtest/gtest.h>

namespace {

using namespace platform;

TEST(Value, EachKindIsKeptApart)
{
    // A literal must not decay to a bool, nor an unsigned 1 be a bool or a real.
    EXPECT_NE(Value("text").get<std::string>(), nullptr);
    EXPECT_NE(Value(1U).get<std::int64_t>(), nullptr);
    EXPECT_NE(Value(true).get<bool>(), nullptr);
    EXPECT_FALSE(Value(1) == Value(true));
    EXPECT_FALSE(Value(1) == Value(1.0));
    EXPECT_FALSE(Value(1.0) == Value(Date{1.0}));
    EXPECT_TRUE(Value().isNull());
    EXPECT_FALSE(Value("").isNull());
    EXPECT_EQ(Value(Array{1, "two", Dictionary{{"three", 3.0}}}), Value(Array{1, "two", Dictionary{{"three", 3.0}}}));
}

TEST(Value, FindIsNullForAnotherKind)
{
    const Dictionary tags{{"beats", 4}, {"name", "loop"}};
    ASSERT_NE(find<std::int64_t>(tags, "beats"), nullptr);
    EXPECT_EQ(*find<std::int64_t>(tags, "beats"), 4);
    EXPECT_EQ(find<double>(tags, "beats"), nullptr);
    EXPECT_EQ(find<std::int64_t>(tags, "name"), nullptr);
    EXPECT_EQ(find<std::int64_t>(tags, "key"), nullptr);
}

} // namespace
