#include "loops/overview/MDOverview.h"

#include "OverviewImages.h"
#include "support/FakeDecoder.h"
#include "support/FaultInjection.h"
#include "support/Media.h"
#include "support/Programs.h"
#include "support/TemporaryFolder.h"

#include <gtest/gtest.h>

#include <cerrno>
#include <filesystem>

namespace {

// The overview of an image opened as a memory file; empty if there is none.
Bytes overviewOf(BytesView image, std::int32_t* status = nullptr)
{
    MemoryAudioFile file(image, 0);
    const auto block = file.CreateOverview({}, status);
    return block ? bytesOf(*block) : Bytes();
}

// Lengths around points, and around the pieces in which a file is read.
TEST(CreateOverview, FastRoadEqualsPlainRoadOnEveryFormat)
{
    constexpr long piece = 128 * 1024;
    std::mt19937 random(7);
    for (const platform::SampleFormat format : storedFormats())
        for (const int channels : {1, 2, 3, 24, 2048}) {
            const long perPiece = piece / (channels * format.bytesPerSample());
            const long lengths[] = {1,
                                    255,
                                    256,
                                    257,
                                    511 + static_cast<long>(random() % 600),
                                    perPiece,
                                    perPiece + 1,
                                    2 * perPiece + static_cast<long>(random() % 300)};
            for (const long frames : lengths) {
                if (frames * channels > 600000)
                    continue;
                const Bytes samples = randomSamples(
                    random, format, static_cast<std::size_t>(frames) * static_cast<std::size_t>(channels));
                ASSERT_EQ(overviewOf(imageOf(format, channels, samples)), plainOverview(format, channels, samples))
                    << nameOf(format) << ", " << channels << " channels, " << frames << " frames";
            }
        }
}

TEST(CreateOverview, WhatCannotBeDrawnGivesNothingAndSaysWhy)
{
    const platform::SampleFormat format{16, false, false, std::endian::little};
    const Bytes compressed = readFile(mediaPath("tone-adpcm.wav"));
    const struct {
        const char* name;
        Bytes image;
        std::int32_t status;
    } cases[] = {{"no frames", imageOf(format, 2, Bytes(3)), kStatusEndOfFile},
                 {"2,049 channels", imageOf(format, 2049, Bytes(2049 * 2)), kStatusParameterError},
                 {"compressed", compressed, kStatusParameterError},
                 {"no audio file", Bytes(500), kStatusParameterError}};
    for (const auto& [name, image, expected] : cases) {
        std::int32_t status = 1;
        EXPECT_TRUE(overviewOf(image, &status).empty()) << name;
        EXPECT_EQ(status, expected) << name;
    }
}

class CreateOverviewOfFile : public testing::Test {
protected:
    void SetUp() override
    {
        const platform::SampleFormat format{24, false, false, std::endian::big};
        path_ = folder_.write("long.caf", imageOf(format, 2, Bytes(6 * 1000000, std::byte{0x20})));
        ASSERT_EQ(file_.Open(CFileRef(path_.c_str(), false), 0), kStatusOK);
    }
    TemporaryFolder folder_;
    std::string path_;
    CAudioFileIO file_;
    std::int32_t status_ = 1;
};

TEST_F(CreateOverviewOfFile, AReadThatFailsGivesNothing)
{
    FaultInjector faults;
    faults.fail(Call::pread, EIO, 5);
    EXPECT_EQ(file_.CreateOverview({}, &status_), nullptr);
    EXPECT_EQ(status_, kStatusIOError);
    faults.limitTransfers(1001); // reads return less than requested
    const auto block = file_.CreateOverview();
    ASSERT_NE(block, nullptr);
    EXPECT_EQ(pointsOf(*block), Points(OverviewPointCount(1000000), {-32, 32}));
}

TEST_F(CreateOverviewOfFile, AFileThatWasCutMeanwhileGivesNothing)
{
    std::filesystem::resize_file(path_, 3000000);
    EXPECT_EQ(file_.CreateOverview({}, &status_), nullptr);
    EXPECT_EQ(status_, kStatusEndOfFile);
}

TEST(CreateOverview, ACodedFileThatEndsEarlyIsDrawnAndOneThatBreaksIsNot)
{
    const TemporaryFolder folder;
    const CFileRef ref(folder.write("a.ogg", "OggS, coded somehow").c_str(), false);
    FakeDecoder::File coded{.formatId = fourCC("vorb"), .fileType = fourCC("OggS"), .frames = 20000};
    const FakeDecoder::Module module(coded);
    std::int32_t status = 1;
    {
        CAudioFileIO file(ref, 0);
        coded.framesThere = 700;
        const auto block = file.CreateOverview({}, &status);
        ASSERT_NE(block, nullptr);
        EXPECT_EQ(status, kStatusOK);
        ASSERT_EQ(pointsOf(*block).size(), 3u);
        EXPECT_EQ(pointsOf(*block)[2].second, 127);
    }
    CAudioFileIO file(ref, 0);
    coded.broken = 600;
    EXPECT_EQ(file.CreateOverview({}, &status), nullptr);
    EXPECT_EQ(status, kStatusIOError);
}

// One sound, converted losslessly by other programs.
TEST(CreateOverview, OneSoundGivesOneOverviewInEveryContainer)
{
    const TemporaryFolder folder;
    if (!runs(folder, "command -v sox && command -v ffmpeg"))
        GTEST_SKIP() << "no sox or ffmpeg";
    ASSERT_TRUE(runs(folder, "sox -D -n -b 16 -r 44100 -c 2 base.wav synth 1.7 sine 300-3000 pinknoise fade 0.4"));
    std::vector<std::string> conversions = {"sox base.wav a.aiff", "sox base.wav -b 24 a.caf",
                                            "sox base.wav -e float -b 32 b.caf",
                                            "ffmpeg -y -i base.wav -rf64 always a.wav"};
    for (const char* codecAndFile : {"s24le b.wav", "s32le c.wav", "f32le d.wav", "f64le e.wav", "s16be b.aiff",
                                     "s24be c.aiff", "s16le d.aif", "s16le c.caf", "s24be d.caf", "f32le e.caf"})
        conversions.push_back("ffmpeg -y -i base.wav -c:a pcm_" + std::string(codecAndFile));
    const auto overviewOfFile = [&](const std::string& name) {
        CAudioFileIO file(CFileRef((folder / name).c_str(), false), 0);
        const auto block = file.CreateOverview();
        return block ? toHex(bytesOf(*block)) : "none";
    };
    const std::string expected = overviewOfFile("base.wav");
    EXPECT_EQ(expected.size(), 2 * OverviewBlockSize(74970));
    for (const std::string& conversion : conversions) {
        ASSERT_TRUE(runs(folder, conversion)) << conversion;
        EXPECT_EQ(overviewOfFile(conversion.substr(conversion.rfind(' ') + 1)), expected) << conversion;
    }
}

} // namespace
