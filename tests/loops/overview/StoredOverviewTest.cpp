#include "loops/overview/StoredOverview.h"

#include "OverviewImages.h"
#include "platform/core/Packed.h"
#include "support/FaultInjection.h"
#include "support/TemporaryFolder.h"

#include <gtest/gtest.h>

#include <cerrno>

namespace {

constexpr platform::SampleFormat k16{16, false, false, std::endian::little};
constexpr std::uint32_t kFrames = 300;

// Files of 300 mono 16-bit frames, with chunks after the samples.
struct StoredChunk {
    std::string_view id;
    Bytes body;
};

Bytes withChunks(ContainerBuilder image, std::initializer_list<StoredChunk> chunks)
{
    for (const StoredChunk& chunk : chunks)
        image.chunk(chunk.id, chunk.body);
    return image.bytes();
}

Bytes wave(std::initializer_list<StoredChunk> chunks = {})
{
    return withChunks(ContainerBuilder("RIFF").format().chunk("data", Bytes(2 * kFrames)), chunks);
}

Bytes aiff(std::initializer_list<StoredChunk> chunks = {})
{
    return withChunks(ContainerBuilder("FORM", "AIFF").format(kFrames).chunk("SSND", Bytes(8 + 2 * kFrames)), chunks);
}

Bytes caf(std::initializer_list<StoredChunk> chunks = {}, std::optional<std::int64_t> dataSize = {})
{
    Bytes data(4 + 2 * kFrames);
    data[3] = std::byte{7}; // edit count
    return withChunks(ContainerBuilder("caff").format().chunk("data", data, dataSize), chunks);
}

/// A block, whose header is in host order, as a WAVE file stores it.
std::string inWave(const KTMem& block)
{
    Bytes bytes = bytesOf(block);
    storeLE(bytes.data(), OverviewFrames(block));
    return toHex(bytes);
}

class StoredOverview : public testing::Test {
protected:
    CFileRef fileOf(BytesView image) { return CFileRef(folder_.write("file", image).c_str(), false); }
    Bytes chunkOf(const CFileRef& ref, std::string_view id)
    {
        CAudioFileIO file(ref, 0);
        return file.FindChunk(fourCC(id[0], id[1], id[2], id[3])).value_or(Bytes());
    }
    /// The block, or the status if there is none.
    std::string read(const CFileRef& ref, long frames = 0)
    {
        std::int32_t status = 1;
        const auto block = ReadOverviewFromAudioFile(ref, frames, &status);
        EXPECT_TRUE(block == nullptr || (IsOverviewBlock(*block) && status == kStatusOK));
        return block ? inWave(*block) : std::to_string(status);
    }
    /// "stored", or the status; "0" if it was not stored but there was no error.
    std::string write(const CFileRef& ref, KTMem* overview, long frames = 0)
    {
        const Bytes before = overview != nullptr ? bytesOf(*overview) : Bytes();
        bool isStored = true;
        const std::int32_t status = WriteOverviewToAudioFile(ref, overview, frames, &isStored);
        EXPECT_TRUE(status == kStatusOK || !isStored);
        EXPECT_EQ(overview != nullptr ? bytesOf(*overview) : Bytes(), before); // in host order again
        return isStored ? "stored" : std::to_string(status);
    }
    KTMem overview_ = blockOf(kFrames, {{-3, 64}, {-127, 127}});
    TemporaryFolder folder_;
};

const std::string kNone = std::to_string(kStatusOK), kRefused = std::to_string(kStatusParameterError),
                  kCutShort = std::to_string(kStatusEndOfFile), kMissing = std::to_string(kStatusFileNotFound);

TEST_F(StoredOverview, IsStoredByteForByte)
{
    const struct {
        const char* name;
        Bytes image;
        std::string_view id;
        const char* body;
    } cases[] = {{"WAVE", wave(), "LGWV", "2c010000 00000000 fd40 817f"},
                 {"AIFF", aiff(), "LGWV", "0000012c 00000000 fd40 817f"},
                 {"CAF", caf(), "ovvw", "00000007 00000100 fd004000 81007f00"}};
    for (const auto& [name, image, id, body] : cases) {
        SCOPED_TRACE(name);
        const CFileRef ref = fileOf(image);
        for (int round = 0; round < 2; ++round) { // the second takes the place of the first
            EXPECT_EQ(write(ref, &overview_), "stored");
            EXPECT_EQ(chunkOf(ref, id), fromHex(body));
            EXPECT_EQ(read(ref), inWave(overview_));
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
    const Bytes old = fromHex("0000000000000100 01000200 01000200");
    const CFileRef ref = fileOf(caf({{"ovvw", old}, {"note", Bytes(3)}, {"ovvw", old}}));
    EXPECT_EQ(write(ref, &silence), kNone);
    EXPECT_EQ(readFile(ref.GetPath()), caf({{"note", Bytes(3)}}));
    EXPECT_EQ(read(ref), kNone);

    const CFileRef other = fileOf(wave()); // elsewhere it is as good as any
    EXPECT_EQ(write(other, &silence), "stored");
    EXPECT_EQ(chunkOf(other, "LGWV"), fromHex("2c01000000000000 00000000"));
}

TEST_F(StoredOverview, OlderOnesAreReadToo)
{
    const std::string ahead = std::string(40, 'e') + std::string(16, 'd'); // not interpreted
    for (const auto image : {wave, aiff}) {
        EXPECT_EQ(read(fileOf(image({{"ovwf", fromHex(ahead + "40fd7f81")}}))), hex("2c01000000000000 fd40817f"));
        for (const char* points : {"", "40fd", "40fd7f", "40fd7f8100"})
            EXPECT_EQ(read(fileOf(image({{"ovwf", fromHex(ahead + points)}}))), kRefused) << points;
        EXPECT_EQ(read(fileOf(image({}))), kNone);
    }
    const std::string newer = hex("2c01000000000000 0001 0002"); // goes first
    EXPECT_EQ(read(fileOf(wave({{"LGWV", fromHex(newer)}, {"ovwf", fromHex(ahead + "40fd7f81")}}))), newer);
    // An overview that does not fit hides nothing.
    EXPECT_EQ(read(fileOf(wave({{"LGWV", Bytes(11)}, {"ovwf", fromHex(ahead + "40fd7f81")}}))),
              hex("2c01000000000000 fd40817f"));
}

// CAF pairs of any number of frames, in a file of 300 frames or as many as the case says.
TEST_F(StoredOverview, PairsOfOtherLengthsBecomePoints)
{
    const struct {
        const char* name;
        long frames;
        const char* chunk;  // edit count, frames per pair; pairs
        const char* points; // null: refused
    } cases[] = {
        {"1024: four points of a pair", 2048, "0000000000000400 f0002000 80007fff", "f020f020f020f020817f817f817f817f"},
        {"64: four pairs to a point", 300, "0000000000000040 ff000100 fe000100 ff000300 ff000200 f8000800", "fe03f808"},
        {"200: the second pair reaches into both points", 300, "00000000000000c8 ff000500 fb000100", "fb05fb01"},
        {"no pair", 300, "0000000000000100", "00000000"},
        {"all above zero", 300, "0000000000000100 03000500 04000600", "03050406"},
        {"the last pair is missing", 300, "0000000000000100 ff000100", "ff010000"},
        {"more pairs than frames", 256, "0000000000000100 ff000100 80007f00", "ff01"},
        {"one pair of 2^31 - 1", 300, "000000007fffffff ff000100", "ff01ff01"},
        {"0 frames to a pair", 300, "0000000000000000 ff000100", nullptr},
        {"2^32 - 1 frames to a pair", 300, "00000000ffffffff ff000100", nullptr},
        {"half a header", 300, "00000000", nullptr},
    };
    for (const auto& [name, frames, chunk, points] : cases) {
        ByteWriter count(std::endian::little);
        count.write(std::uint64_t(frames));
        EXPECT_EQ(read(fileOf(caf({{"ovvw", fromHex(chunk)}})), frames),
                  points != nullptr ? toHex(count.view()) + points : kRefused)
            << name;
    }
}

TEST_F(StoredOverview, OneThatDoesNotFitTheFileIsNotGivenOut)
{
    const std::pair<const char*, const char*> blocks[] = {
        {"a point too few", "2c01000000000000 0001"},
        {"a point too many", "2c01000000000000 000100010001"},
        {"half a header", "2c010000"},
        {"its count is of 32 ones", "ffffffff00000000 00010001"},
    };
    for (const auto& [name, block] : blocks)
        EXPECT_EQ(read(fileOf(wave({{"LGWV", fromHex(block)}}))), kRefused) << name;
    const struct {
        const char* name;
        Bytes image;
        std::string status;
    } cases[] = {
        {"another byte order", aiff({{"LGWV", fromHex("2c01000000000000 00010001")}}), kRefused},
        {"larger than the file",
         ContainerBuilder("RIFF").format().chunk("data", Bytes(600)).chunk("LGWV", Bytes(12), 0x7FFFFFFF).bytes(),
         kCutShort},
        {"no audio file", Bytes(100), kRefused},
    };
    for (const auto& [name, image, status] : cases)
        EXPECT_EQ(read(fileOf(image)), status) << name;
    EXPECT_EQ(read(CFileRef((folder_ / "missing").c_str(), false)), kMissing);
}

TEST_F(StoredOverview, WhatCannotBeStoredLeavesTheFileUntouched)
{
    KTMem tooShort = blockOf(kFrames, {{-3, 64}});
    KTMem tooLong = blockOf(700, {{-3, 64}, {0, 0}, {0, 0}});
    KTMem unfinished = blockOf(256, {{-3, 64}, {0, 0}});
    const struct {
        const char* name;
        Bytes image;
        KTMem* overview;
        std::string status = kRefused;
    } cases[] = {
        {"no block", wave(), nullptr},
        {"a point too few", wave(), &tooShort},
        {"of another file", aiff(), &tooLong},
        {"another count", caf(), &unfinished},
        {"samples to the end of the file", caf({}, -1), &overview_},
        {"fewer samples than promised", caf({}, 5000), &overview_},
        {"no audio file", Bytes(600), &overview_},
        {"behind a chunk beyond the end, which would grow into it",
         ContainerBuilder("caff").format().chunk("data", Bytes(604)).chunk("ovvw", Bytes(9), 40).bytes(), &overview_,
         kCutShort},
    };
    for (const auto& [name, image, overview, status] : cases) {
        const CFileRef ref = fileOf(image);
        EXPECT_EQ(write(ref, overview), status) << name;
        EXPECT_EQ(readFile(ref.GetPath()), image) << name;
    }
    const CFileRef missing((folder_ / "missing").c_str(), false);
    EXPECT_EQ(write(missing, &overview_), kMissing);
    EXPECT_FALSE(std::filesystem::exists(missing.GetPath()));
}

TEST_F(StoredOverview, StrayBytesAtTheEndNeitherHideItNorBecomeSamples)
{
    const auto with = [](Bytes image, std::string_view behind) {
        image.insert(image.end(), bytesOf(behind).begin(), bytesOf(behind).end());
        return image;
    };
    const std::string block = inWave(overview_);
    const Bytes cleanWave = wave(), cleanCaf = caf();
    for (const Bytes& image : {with(cleanWave, "1234567"), with(aiff(), "1"), with(cleanCaf, std::string_view("\0", 1)),
                               with(cleanCaf, "12345678901")}) {
        const CFileRef ref = fileOf(image);
        EXPECT_EQ(write(ref, &overview_), "stored");
        EXPECT_EQ(read(ref), block);
        const Bytes once = readFile(ref.GetPath());
        EXPECT_EQ(write(ref, &overview_), "stored");
        EXPECT_EQ(readFile(ref.GetPath()), once) << "it grows";
        EXPECT_EQ(CAudioFileIO(ref, 0).Info().frames, kFrames);
    }
    for (const Bytes& image : {with(cleanWave, "12345678"), with(cleanCaf, "123456789012")}) {
        const CFileRef ref = fileOf(image);
        EXPECT_EQ(write(ref, &overview_), kRefused);
        EXPECT_EQ(readFile(ref.GetPath()), image);
    }
}

TEST_F(StoredOverview, TheOldOneStaysUntilTheNewOneStands)
{
    KTMem other = blockOf(kFrames, {{-1, 1}, {-2, 2}});
    for (const int failing : {1, 2, 3}) {
        const CFileRef ref = fileOf(caf());
        ASSERT_EQ(write(ref, &overview_), "stored");
        const std::string before = read(ref);
        FaultInjector faults;
        faults.fail(Call::pwrite, ENOSPC, failing, 100);
        const std::string result = write(ref, &other);
        EXPECT_TRUE(read(ref) == before || result == "stored") << failing << result;
    }
}

// The status is the chunk layer's, and the file is closed each time.
TEST_F(StoredOverview, FailuresOfTheDiskAreReported)
{
    const std::string block = inWave(overview_);
    for (const Bytes& image : {wave(), aiff(), caf()}) {
        const CFileRef ref = fileOf(image);
        FaultInjector faults;
        faults.fail(Call::pwrite, ENOSPC, 1, 100);
        EXPECT_TRUE(write(ref, &overview_).starts_with('-'));
        faults.fail(Call::pwrite, ENOSPC, 1, 0);
        EXPECT_EQ(write(ref, &overview_), "stored");
        // If any read fails, there is no overview or the stored one.
        for (int nth = 1; nth < 6; ++nth) {
            faults.fail(Call::pread, EIO, nth);
            const std::string got = read(ref);
            EXPECT_TRUE(got == block || got.starts_with('-')) << nth << got;
        }
    }
}

} // namespace
