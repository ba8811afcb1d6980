// The records of container and chunk headers: byte order, and the rules by which sizes are stored.
#include "audiofile/ContainerHeaders.h"

#include "support/ContainerBuilder.h"

#include <gtest/gtest.h>

namespace {

ContainerChkExtended header(FourCC id, FourCC formType, FourCC firstChunk = 0, std::uint32_t firstChunkSize = 0)
{
    ContainerChkExtended header;
    header.id = id;
    header.formType = formType;
    header.firstChunkId = firstChunk;
    header.firstChunkSize = firstChunkSize;
    return header;
}

TEST(ContainerHeaders, ByteOrderServesBothDirections)
{
    struct Case {
        const char* what;
        Bytes image;
        std::uint32_t size;
        FourCC firstTableId; // in host order, or as it lies in the file
    };
    const Case cases[] = {
        {"RIFF", ContainerBuilder("RIFF").chunk("fmt ", 64).bytes(), 76, 0},
        {"FORM", ContainerBuilder("FORM", "AIFC").chunk("COMM", 64).bytes(), 76, 0},
        {"ds64", ContainerBuilder("RF64").ds64(1, 2, {{fourCC("levl"), 3}, {kData, 4}, {kUuid, 5}}).bytes(), 76,
         fourCC("levl")},
        {"ds64 without room", ContainerBuilder("BW64").ds64(1, 2).chunk("levl", 28).bytes(), 76,
         byteSwapped(fourCC("levl"))},
        {"a reservation is no table",
         ContainerBuilder("RIFF").chunk("JUNK", std::string(28, 0) + "levl" + std::string(32, 0)).bytes(), 76,
         byteSwapped(fourCC("levl"))},
    };
    for (const Case& each : cases) {
        SCOPED_TRACE(each.what);
        ContainerChkExtended record;
        ASSERT_EQ(each.image.size(), sizeof record);
        std::memcpy(&record, each.image.data(), sizeof record);
        record.ByteOrder();
        EXPECT_EQ(record.size, each.size);
        EXPECT_TRUE(record.formType == kWAVE || record.formType == kAIFC);
        EXPECT_EQ(fourCCText(record.table[0].id), fourCCText(each.firstTableId));
        ContainerChk plain;
        std::memcpy(&plain, each.image.data(), sizeof plain);
        plain.ByteOrder();
        EXPECT_EQ(std::memcmp(&plain, &record, sizeof plain), 0);
        record.ByteOrder();
        EXPECT_EQ(std::memcmp(&record, each.image.data(), sizeof record), 0);
    }
}

TEST(ContainerHeaders, AContainerStoresWhatItsFieldHolds)
{
    struct Case {
        FourCC formType;
        long long size;
        std::int64_t stored;
    };
    for (const Case& each : {Case{kWAVE, 0x80000000, 0x80000000}, Case{kWAVE, 1LL << 40, 0xFFFFFFFF},
                             Case{kAIFF, 0x80000000, 0x7FFFFFFF}, Case{kAIFC, -1, -1}}) {
        ContainerChk chunk{kFORM, 0u, each.formType};
        chunk.SetSize(each.size);
        EXPECT_EQ(chunk.Size(), each.stored);
    }
}

TEST(ContainerHeaders, EffectiveSizes)
{
    ContainerChkExtended ds64 = header(kRF64, kWAVE, kDs64, 28 + 24);
    ds64.size = 0xFFFFFFFF;
    ds64.riffSize = 1ULL << 40;
    ds64.dataSize = 1ULL << 39;
    ds64.tableLength = 0xFFFFFFFF; // more than are held
    ds64.table = {Ds64TableEntry{fourCC("levl"), 7u}, {fourCC("levl"), 8u}, {fourCC("wavl"), 9u}};
    ContainerChkExtended tooShort = ds64;
    tooShort.firstChunkSize = 27;
    const ContainerChkExtended aiff = header(kFORM, kAIFF);
    struct Case {
        FourCC id;
        std::uint32_t field;
        const ContainerChkExtended& header;
        std::int64_t size;
    };
    const Case cases[] = {
        {kData, 0xFFFFFFFF, ds64, 1LL << 39},
        {kData, 0xFFFFFFFE, ds64, 0xFFFFFFFE}, // a field that says something counts
        {fourCC("levl"), 0xFFFFFFFF, ds64, 7},
        {fourCC("wavl"), 0xFFFFFFFF, ds64, 9},
        {fourCC("none"), 0xFFFFFFFF, ds64, 0xFFFFFFFF},
        {kData, 0xFFFFFFFF, tooShort, 0xFFFFFFFF},
        {fourCC("SSND"), 0x80000000, aiff, -0x80000000LL},
    };
    for (const Case& each : cases)
        EXPECT_EQ((ChkHeader{each.id, each.field}.EffectiveSize(each.header)), each.size) << fourCCText(each.id);
    EXPECT_EQ(ds64.EffectiveSize(), 1LL << 40);
    EXPECT_EQ(tooShort.EffectiveSize(), 0xFFFFFFFF);
    ds64.tableLength = 2;
    EXPECT_EQ((ChkHeader{fourCC("wavl"), 0xFFFFFFFFu}.EffectiveSize(ds64)), 0xFFFFFFFF);
}

TEST(ContainerHeaders, TheChunkSizeRule)
{
    struct Case {
        const char* what;
        ContainerChkExtended header;
        FourCC id;
        long long size;
        std::int32_t result;
        std::uint32_t field;
        std::uint32_t tableLength;
    };
    const FourCC levl = fourCC("levl");
    ContainerChkExtended taken = header(kRF64, kWAVE, kDs64, 40);
    taken.table[0].id = fourCC("othr");
    ContainerChkExtended second = header(kRF64, kWAVE, kDs64, 28 + 24);
    second.table[0].id = fourCC("othr");
    const Case cases[] = {
        {"AIFF", header(kFORM, kAIFF), levl, 0x7FFFFFFF, 0, 0x7FFFFFFF, 0},
        {"AIFF, too large", header(kFORM, kAIFF), levl, 0x80000000, -9, 0x7FFFFFFF, 0},
        {"RIFF", header(kRIFF, kWAVE), levl, 0xFFFFFFFF, 0, 0xFFFFFFFF, 0},
        {"RIFF, too large", header(kRIFF, kWAVE), levl, 0x100000000, -9, 0xFFFFFFFF, 0},
        {"data", header(kRF64, kWAVE, kDs64, 28), kData, 0x100000000, 0, 0xFFFFFFFF, 0},
        {"small", header(kRF64, kWAVE, kDs64, 28), levl, 0xFFFFFFFE, 0, 0xFFFFFFFE, 0},
        {"no table, just representable", header(kRF64, kWAVE, kDs64, 39), levl, 0xFFFFFFFF, 0, 0xFFFFFFFF, 0},
        {"no table", header(kRF64, kWAVE, kDs64, 39), levl, 0x100000000, -9, 0xFFFFFFFF, 0},
        {"table full", taken, levl, 0x100000000, -9, 0xFFFFFFFF, 0},
        {"second entry", second, levl, 0x100000000, 0, 0xFFFFFFFF, 2},
        {"in a reservation", header(kRIFF, kWAVE, kJUNK, 40), levl, 0x100000000, 0, 0xFFFFFFFF, 1},
    };
    for (Case each : cases) {
        SCOPED_TRACE(each.what);
        ChkHeader chunk{each.id, {}};
        EXPECT_EQ(chunk.SetSize(each.size, each.header), each.result);
        EXPECT_EQ(chunk.size, each.field);
        EXPECT_EQ(each.header.tableLength, each.tableLength);
        if (each.result == 0 && each.header.HasValidDs64()) {
            EXPECT_EQ(chunk.EffectiveSize(each.header), each.size);
        }
    }
}

TEST(ContainerHeaders, TheContainerSizeRule)
{
    struct Case {
        const char* what;
        ContainerChkExtended header;
        long long size;
        std::int32_t result;
        const char* id;
        std::uint32_t field;
        FourCC first;
        std::size_t stored;
    };
    const Case cases[] = {
        {"RIFF", header(kRIFF, kWAVE), 0x100000000, -9, "RIFF", 0xFFFFFFFF, 0, 12},
        {"AIFF: the limit is not that of the field", header(kFORM, kAIFF), 0xFFFFFFFF, 0, "FORM", 0x7FFFFFFF, 0, 12},
        {"AIFF", header(kFORM, kAIFF), 0x100000000, -9, "FORM", 0x7FFFFFFF, 0, 12},
        {"grows", header(kRIFF, kWAVE, kJUNK, 28), 0x100000000, 0, "RF64", 0xFFFFFFFF, kDs64, 48},
        {"stays large", header(kBW64, kWAVE, kDs64, 4096), 0x100000000, 0, "BW64", 0xFFFFFFFF, kDs64, 84},
        {"shrinks", header(kBW64, kWAVE, kDs64, 40), 0xFFFFFFFF, 0, "RIFF", 0xFFFFFFFF, kJUNK, 60},
        {"stays small", header(kRIFF, kWAVE, kJUNK, 28), 100, 0, "RIFF", 100, kJUNK, 48},
        {"reservation too short", header(kRIFF, kWAVE, kJUNK, 27), 0x100000000, -9, "RIFF", 0xFFFFFFFF, kJUNK, 12},
    };
    for (Case each : cases) {
        SCOPED_TRACE(each.what);
        EXPECT_EQ(each.header.SetSize(each.size), each.result);
        EXPECT_EQ(fourCCText(each.header.id), each.id);
        EXPECT_EQ(each.header.size, each.field);
        EXPECT_EQ(each.header.firstChunkId, each.first);
        EXPECT_EQ(each.header.StoredSize(), each.stored);
    }
}

} // namespace
