#include "platform/core/ByteReader.h"
#include "platform/core/ByteWriter.h"
#include "platform/core/FourCC.h"
#include "platform/core/Packed.h"

#include <gtest/gtest.h>

#include <cstring>
#include <limits>

namespace {

TEST(Packed, LoadsAndStoresUnalignedInEitherOrder)
{
    alignas(8) const unsigned char bytes[] = {0xFF, 0x01, 0x02, 0x03, 0x04, 0x05, 0x06, 0x07, 0x88};
    EXPECT_EQ(loadBE<std::uint16_t>(bytes + 1), 0x0102);
    EXPECT_EQ(loadLE<std::uint16_t>(bytes + 1), 0x0201);
    EXPECT_EQ(loadBE<std::uint32_t>(bytes + 1), 0x01020304U);
    EXPECT_EQ(loadLE<std::int64_t>(bytes + 1), static_cast<std::int64_t>(0x8807060504030201));
    EXPECT_EQ(loadBE<std::int8_t>(bytes + 8), -120);

    unsigned char out[9] = {};
    storeBE(out + 1, 1.5F);
    EXPECT_EQ(loadBE<std::uint32_t>(out + 1), 0x3FC00000U);
    storeLE(out + 1, -2.0);
    EXPECT_EQ(loadLE<double>(out + 1), -2.0);
    EXPECT_EQ(out[8], 0xC0);
}

TEST(Packed, SwapReversesAMember)
{
    struct Layout {
        Packed<std::uint8_t> kind = 9;
        Packed<std::uint32_t> size = 0x01020304;
    };
    static_assert(sizeof(Layout) == 5);
    Layout layout;
    layout.size.swap();
    EXPECT_EQ(layout.size, 0x04030201U);
}

TEST(FourCC, TheFirstCharacterIsTheMostSignificantByte)
{
    EXPECT_EQ(fourCC("FORM"), 0x464F524DU);
    EXPECT_EQ(fourCC('(', 'c', ')', ' '), fourCC("(c) "));
    EXPECT_EQ(fourCC("\xA9nam"), 0xA96E616DU); // a byte past 127 does not spill into its neighbours
    EXPECT_EQ(fourCCText(fourCC("fmt ")), "fmt ");
    EXPECT_EQ(fourCCText(0x005C7FA9), "\\x00\\x5C\\x7F\\xA9");
}

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

TEST(ByteReader, IdsDoNotFollowTheOrderOfNumbers)
{
    ByteReader little(bytesOf(std::string_view("data\x01\x00\x00\x00tail", 12)), std::endian::little);
    EXPECT_EQ(little.readFourCC(), fourCC("data"));
    EXPECT_EQ(little.read<std::uint32_t>(), 1U);
    EXPECT_EQ(textOf(little.rest()), "tail");
    EXPECT_TRUE(little.ok());
}

TEST(ByteWriter, WritesWhatAReaderReads)
{
    for (const std::endian order : {std::endian::big, std::endian::little}) {
        ByteWriter out(order);
        out.writeFourCC(fourCC("RIFF"));
        out.write(std::uint32_t{0});
        out.write(0.25);
        out.writeZeros(3);
        out.write(bytesOf("end"));
        out.patch(4, static_cast<std::uint32_t>(out.size()));
        const Bytes bytes = out.take();
        EXPECT_TRUE(textOf(bytes).starts_with("RIFF"));
        ByteReader in(bytes, order);
        EXPECT_EQ(in.readFourCC(), fourCC("RIFF"));
        EXPECT_EQ(in.read<std::uint32_t>(), 22U);
        EXPECT_EQ(in.read<double>(), 0.25);
        in.skip(3);
        EXPECT_EQ(textOf(in.rest()), "end");
        EXPECT_TRUE(in.ok());
    }
}

} // namespace
