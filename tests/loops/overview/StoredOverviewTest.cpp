#include "loops/overview/StoredOverview.h"

#include "OverviewImages.h"
#include "support/FaultInjection.h"
#include "support/TemporaryFolder.h"

#include <gtest/gtest.h>

#include <cerrno>

namespace {

using namespace std::string_view_literals;
constexpr platform::SampleFormat k16{16, false, false, std::endian::little};
constexpr std::uint32_t kFrames = 300;

// Files of 300 frames of 16-bit mono, with chunks behind the samples.
struct StoredChunk {
    std::string_view id;
    Bytes body;
};

void addChunks(ContainerBuilder& image, std::initializer_list<StoredChunk> chunks)
{
    for (const StoredChunk& chunk : chunks)
        image.chunk(chunk.id, chunk.body);
}

Bytes wave(std::initializer_list<StoredChunk> chunks = {})
{
    ContainerBuilder image("RIFF");
    image.format().chunk("data", Bytes(2 * kFrames));
    addChunks(image, chunks);
    return image.bytes();
}

Bytes aiff(std::initializer_list<StoredChunk> chunks = {})
{
    ContainerBuilder image("FORM", "AIFF");
    image.format(kFrames).chunk("SSND", Bytes(8 + 2 * kFrames));
    addChunks(image, chunks);
    return image.bytes();
}

Bytes caf(std::initializer_list<StoredChunk> chunks = {}, std::optional<std::int64_t> dataSize = {})
{
    Bytes data(4 + 2 * kFrames);
    data[3] = std::byte{7}; // edit count
    ContainerBuilder image("caff");
    image.format().chunk("data", data, dataSize);
    addChunks(image, chunks);
    return image.bytes();
}

Bytes compressedCAF(std::int64_t frames, std::initializer_list<StoredChunk> chunks)
{
    ByteWriter table;
    for (const std::int64_t field : {frames, frames, std::int64_t{0}})
        table.write(field);
    Bytes description = cafDescription(k16, 1);
    std::copy_n(bytesOf("alac"sv).begin(), 4, description.begin() + 8);
    std::fill(description.begin() + 16, description.begin() + 24, std::byte{0}); // sizes of packets vary
    ContainerBuilder image("caff");
    image.chunk("desc", description).chunk("pakt", table.view()).chunk("data", Bytes(4096));
    addChunks(image, chunks);
    return image.bytes();
}

class StoredOverview : public testing::Test {
protected:
    CFileRef fileOf(BytesView image) { return CFileRef(folder_.write("file", image).c_str(), false); }
    std::string chunkOf(const CFileRef& ref, std::string_view id)
    {
        CAudioFileIO file(ref, 0);
        const auto body = file.FindChunk(fourCC(id[0], id[1], id[2], id[3]));
        return body ? toHex(*body) : "none";
    }
    std::string read(const CFileRef& ref, long frames = 0)
    {
        const auto block = ReadOverviewFromAudioFile(ref, frames, &status_);
        EXPECT_TRUE(block == nullptr || IsOverviewBlock(*block));
        return block ? toHex(bytesOf(*block)) : "none";
    }
    KTMem overview_ = blockOf(kFrames, {{-3, 64}, {-127, 127}});
    TemporaryFolder folder_;
    std::int32_t status_ = 1;
    bool stored_ = false;
};

TEST_F(StoredOverview, IsStoredByteForByte)
{
    const struct {
        const char* name;
        Bytes image;
        std::string_view id;
        const char* body;
    } cases[] = {
        {"WAVE", wave(), "LGWV",
         "2c010000"
         "00000000"
         "fd40"
         "817f"},
        {"AIFF", aiff(), "LGWV",
         "0000012c"
         "00000000"
         "fd40"
         "817f"},
        {"CAF", caf(), "ovvw",
         "00000007"
         "00000100"
         "fd004000"
         "81007f00"},
    };
    const std::string block = toHex(bytesOf(overview_));
    for (const auto& [name, image, id, body] : cases) {
        SCOPED_TRACE(name);
        const CFileRef ref = fileOf(image);
        for (int round = 0; round < 2; ++round) { // the second takes the place of the first
            stored_ = false;
            EXPECT_EQ(WriteOverviewToAudioFile(ref, &overview_, 0, &stored_), kStatusOK);
            EXPECT_TRUE(stored_);
            EXPECT_EQ(toHex(bytesOf(overview_)), block); // in host order again
            EXPECT_EQ(chunkOf(ref, id), body);
            EXPECT_EQ(read(ref), block);
            EXPECT_EQ(status_, kStatusOK);
            const Bytes written = readFile(ref.GetPath());
            EXPECT_EQ(written.size(), image.size() + (id == "ovvw" ? 12 + 16 : 8 + 12));
            EXPECT_TRUE(std::equal(image.begin() + 12, image.end(), written.begin() + 12));
        }
        EXPECT_EQ(WriteOverviewToAudioFile(ref, &overview_, 0, nullptr), kStatusOK);
    }
}

TEST_F(StoredOverview, CAFGetsNoneOfSilenceAndLosesTheOnesItHad)
{
    KTMem silence = blockOf(kFrames, {{0, 0}, {0, 0}});
    const Bytes old = fromHex("0000000000000100"
                              "01000200"
                              "01000200");
    const CFileRef ref = fileOf(caf({{"ovvw", old}, {"note", Bytes(3)}, {"ovvw", old}}));
    stored_ = true;
    EXPECT_EQ(WriteOverviewToAudioFile(ref, &silence, 0, &stored_), kStatusOK);
    EXPECT_FALSE(stored_);
    EXPECT_EQ(readFile(ref.GetPath()), caf({{"note", Bytes(3)}}));
    EXPECT_EQ(read(ref), "none");
    EXPECT_EQ(status_, kStatusOK);

    const CFileRef other = fileOf(wave()); // elsewhere it is as good as any
    EXPECT_EQ(WriteOverviewToAudioFile(other, &silence, 0, &stored_), kStatusOK);
    EXPECT_TRUE(stored_);
    EXPECT_EQ(chunkOf(other, "LGWV"), "2c01000000000000"
                                      "00000000");
}

TEST_F(StoredOverview, OlderOnesAreReadToo)
{
    const std::string prefix(40, 'e');
    const std::string header(16, 'd'); // not interpreted
    const auto older = [&](std::string_view points) { return fromHex(prefix + header + std::string(points)); };
    for (const bool isAIFF : {false, true}) {
        const auto image = isAIFF ? aiff : wave;
        EXPECT_EQ(read(fileOf(image({{"ovwf", older("40fd7f81")}}))), "2c01000000000000"
                                                                      "fd40817f");
        EXPECT_EQ(status_, kStatusOK);
        for (const char* points : {"", "40fd", "40fd7f", "40fd7f8100"}) {
            EXPECT_EQ(read(fileOf(image({{"ovwf", older(points)}}))), "none") << points;
            EXPECT_EQ(status_, kStatusParameterError);
        }
        EXPECT_EQ(read(fileOf(image({}))), "none");
        EXPECT_EQ(status_, kStatusOK);
    }
    // The newer one goes first.
    const Bytes newer = fromHex("2c01000000000000"
                                "0001"
                                "0002");
    EXPECT_EQ(read(fileOf(wave({{"LGWV", newer}, {"ovwf", older("40fd7f81")}}))), toHex(newer));
}

// CAF pairs of any number of frames, in a file of 300 frames or of as many as the case says.
TEST_F(StoredOverview, PairsOfOtherLengthsBecomePoints)
{
    const struct {
        const char* name;
        long frames;
        const char* header; // edit count, frames per pair
        const char* pairs;
        const char* points; // "none": refused
    } cases[] = {
        {"1024: four points of a pair", 2048, "0000000000000400",
         "f0002000"
         "80007fff",
         "f020f020f020f020817f817f817f817f"},
        {"64: four pairs to a point", 300, "0000000000000040",
         "ff000100"
         "fe000100"
         "ff000300"
         "ff000200"
         "f8000800",
         "fe03f808"},
        {"200: the second pair reaches into both points", 300, "00000000000000c8",
         "ff000500"
         "fb000100",
         "fb05fb01"},
        {"only the high byte, rounded down", 300, "0000000000000100",
         "ffff00ff"
         "00010100",
         "ff000001"},
        {"all above zero", 256, "0000000000000080",
         "10002000"
         "11002100",
         "1021"},
        {"no pair", 300, "0000000000000100", "", "00000000"},
        {"the last pair is missing", 300, "0000000000000100", "ff000100", "ff010000"},
        {"half of a point is missing", 256, "0000000000000080", "10002000", "0020"},
        {"half of a pair", 300, "0000000000000100",
         "ff000100"
         "0102",
         "ff010000"},
        {"more pairs than frames", 256, "0000000000000100",
         "ff000100"
         "80007f00",
         "ff01"},
        {"one pair of 2^31 - 1", 300, "000000007fffffff", "ff000100", "ff01ff01"},
        {"0 frames to a pair", 300, "0000000000000000", "ff000100", "none"},
        {"2^31 frames to a pair", 300, "0000000080000000", "ff000100", "none"},
        {"2^32 - 1 frames to a pair", 300, "00000000ffffffff", "ff000100", "none"},
        {"half a header", 300, "00000000", "", "none"},
    };
    for (const auto& [name, frames, header, pairs, points] : cases) {
        const CFileRef ref = fileOf(caf({{"ovvw", fromHex(std::string(header) + pairs)}}));
        ByteWriter count(std::endian::little);
        count.write(std::uint64_t(frames));
        const bool refused = points == "none"sv;
        EXPECT_EQ(read(ref, frames), refused ? "none" : toHex(count.view()) + points) << name;
        EXPECT_EQ(status_, refused ? kStatusParameterError : kStatusOK) << name;
    }
}

TEST_F(StoredOverview, OneThatDoesNotFitTheFileIsNotGivenOut)
{
    const struct {
        const char* name;
        Bytes image;
        std::int32_t status;
    } cases[] = {
        {"a point too few",
         wave({{"LGWV", fromHex("2c01000000000000"
                                "0001")}}),
         kStatusParameterError},
        {"a point too many",
         wave({{"LGWV", fromHex("2c01000000000000"
                                "000100010001")}}),
         kStatusParameterError},
        {"half a point more",
         wave({{"LGWV", fromHex("2c01000000000000"
                                "0001000100")}}),
         kStatusParameterError},
        {"half a header", wave({{"LGWV", fromHex("2c010000")}}), kStatusParameterError},
        {"nothing", wave({{"LGWV", {}}}), kStatusParameterError},
        {"its count is that of others",
         wave({{"LGWV", fromHex("2c02000000000000"
                                "00010001")}}),
         kStatusParameterError},
        {"its count is of 32 ones",
         wave({{"LGWV", fromHex("ffffffff00000000"
                                "00010001")}}),
         kStatusParameterError},
        {"another byte order",
         aiff({{"LGWV", fromHex("2c01000000000000"
                                "00010001")}}),
         kStatusParameterError},
        {"larger than the file",
         ContainerBuilder("RIFF").format().chunk("data", Bytes(600)).chunk("LGWV", Bytes(12), 0x7FFFFFFF).bytes(),
         kStatusEndOfFile},
        {"a file of no frames",
         ContainerBuilder("RIFF").format().chunk("data", Bytes()).chunk("LGWV", Bytes(8)).bytes(),
         kStatusParameterError},
        {"a claim of 2^50 frames",
         compressedCAF(1LL << 50, {{"ovvw", fromHex("0000000000000100"
                                                    "ff000100")}}),
         kStatusParameterError},
        {"no audio file", Bytes(100), kStatusParameterError},
    };
    for (const auto& [name, image, expected] : cases) {
        EXPECT_EQ(read(fileOf(image)), "none") << name;
        EXPECT_EQ(status_, expected) << name;
    }
    EXPECT_EQ(read(CFileRef((folder_ / "missing").c_str(), false)), "none");
    EXPECT_EQ(status_, kStatusFileNotFound);
}

TEST_F(StoredOverview, TheCallerMayKnowTheFramesBetter)
{
    const Bytes image = compressedCAF(4000, {});
    const CFileRef ref = fileOf(image);
    EXPECT_EQ(WriteOverviewToAudioFile(ref, &overview_, 0, &stored_), kStatusParameterError);
    EXPECT_EQ(readFile(ref.GetPath()), image);
    EXPECT_EQ(WriteOverviewToAudioFile(ref, &overview_, 290, &stored_), kStatusOK);
    EXPECT_EQ(read(ref, 290), "2201000000000000"
                              "fd40817f");
}

TEST_F(StoredOverview, WhatCannotBeStoredLeavesTheFileUntouched)
{
    KTMem none;
    KTMem tooShort = blockOf(kFrames, {{-3, 64}});
    KTMem tooLong = blockOf(700, {{-3, 64}, {0, 0}, {0, 0}});
    KTMem unfinished = blockOf(256, {{-3, 64}, {0, 0}});
    KTMem odd = blockOf(fromHex("2c01000000000000"
                                "0001000100"));
    const struct {
        const char* name;
        Bytes image;
        KTMem* overview;
    } cases[] = {
        {"no block", wave(), nullptr},
        {"an empty block", wave(), &none},
        {"a point too few", wave(), &tooShort},
        {"of another file", aiff(), &tooLong},
        {"another count", caf(), &unfinished},
        {"half a point", wave(), &odd},
        {"samples to the end of the file", caf({}, -1), &overview_},
        {"fewer samples than promised", caf({}, 5000), &overview_},
        {"REX2", fromHex("43415420000000205245583248454144"), &overview_},
        {"no audio file", Bytes(600), &overview_},
    };
    for (const auto& [name, image, overview] : cases) {
        const CFileRef ref = fileOf(image);
        stored_ = true;
        EXPECT_EQ(WriteOverviewToAudioFile(ref, overview, 0, &stored_), kStatusParameterError) << name;
        EXPECT_FALSE(stored_) << name;
        EXPECT_EQ(readFile(ref.GetPath()), image) << name;
    }
    // What is added behind one that goes beyond the end of the file would be part of it.
    const Bytes hiding =
        ContainerBuilder("caff").format().chunk("data", Bytes(604)).chunk("ovvw", Bytes(9), 40).bytes();
    const CFileRef ref = fileOf(hiding);
    EXPECT_EQ(WriteOverviewToAudioFile(ref, &overview_, 0, &stored_), kStatusEndOfFile);
    EXPECT_EQ(readFile(ref.GetPath()), hiding);

    const CFileRef missing((folder_ / "missing").c_str(), false);
    EXPECT_EQ(WriteOverviewToAudioFile(missing, &overview_, 0, &stored_), kStatusFileNotFound);
    EXPECT_FALSE(std::filesystem::exists(missing.GetPath()));
}

// The status is that of the chunk layer, the block is in host order, and the file is closed each time.
TEST_F(StoredOverview, FailuresOfTheDiskAreReported)
{
    const std::string block = toHex(bytesOf(overview_));
    for (const Bytes& image : {wave(), aiff(), caf()}) {
        const CFileRef ref = fileOf(image);
        FaultInjector faults;
        faults.fail(Call::pwrite, ENOSPC, 1, 100);
        stored_ = true;
        EXPECT_LT(WriteOverviewToAudioFile(ref, &overview_, 0, &stored_), 0);
        EXPECT_FALSE(stored_);
        EXPECT_EQ(toHex(bytesOf(overview_)), block);
        faults.fail(Call::pwrite, ENOSPC, 1, 0);
        EXPECT_EQ(WriteOverviewToAudioFile(ref, &overview_, 0, &stored_), kStatusOK);
        // Whichever read fails, there is no overview, or it is the one that was stored.
        for (int nth = 1; nth < 6; ++nth) {
            faults.fail(Call::pread, EIO, nth);
            const std::string got = read(ref);
            EXPECT_TRUE(got == block || (got == "none" && status_ != kStatusOK)) << nth << got << status_;
        }
    }
}

TEST_F(StoredOverview, TheSideFileHasAnExtensionOfItsOwn)
{
    EXPECT_STREQ(GetMetadataFileRefForAudioFile(CFileRef("/a/b.c/take 1.wav", false)).GetPath(), "/a/b.c/take 1.ktmd");
    EXPECT_STREQ(GetMetadataFileRefForAudioFile(CFileRef("/a/b.c/take", false)).GetPath(), "/a/b.c/take.ktmd");
    EXPECT_FALSE(GetMetadataFileRefForAudioFile(CFileRef()).IsValid());
}

} // namespace
