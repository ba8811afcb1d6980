#include "platform/core/ByteReader.h"
#include "platform/core/FourCC.h"

#include <gtest/gtest.h>

#include <limits>

namespace {

TEST(ByteReader, AFailedReadYieldsNothingAndStaysFailed)
{
    const std::string_view text("\x01\x02"
                                "data"
                                "\x03\x04\x05");
    ByteReader in(bytesOf(text));
    EXPECT_EQ(in.read<std::uint16_t>(), 0x0102);
    EXPECT_EQ(in.readFourCC(), fourCC("data"));
    EXPECT_EQ(in.read<std::uint32_t>(), 0U); // one byte is missing
    EXPECT_FALSE(in.ok());
    EXPECT_EQ(in.remaining(), 0U);
    EXPECT_EQ(in.read<std::uint8_t>(), 0U);
    EXPECT_TRUE(in.take(0).empty());
    EXPECT_FALSE(in.ok());

    ByteReader huge(bytesOf(text));
    EXPECT_TRUE(huge.take(std::numeric_limits<std::size_t>::max()).empty());
    EXPECT_FALSE(huge.ok());
}

} // namespace
