#include "loops/overview/MDOverview.h"

#include "OverviewImages.h"
#include "support/FaultInjection.h"
#include "support/TemporaryFolder.h"

#include <gtest/gtest.h>

#include <cerrno>
#include <cmath>
#include <cstdlib>
#include <cstring>
#include <filesystem>

namespace {

// The overview of an image opened as a memory file; empty for none.
Bytes overviewOf(BytesView image, std::int32_t* status = nullptr)
{
    CAudioFileIO file;
    EXPECT_EQ(openInMemory(file, image, 0), kStatusOK);
    const auto block = file.CreateOverview({}, status);
    return block ? bytesOf(*block) : Bytes();
}

// Lengths around points, and around the pieces in which a file is read.
TEST(CreateOverview, FastRoadEqualsPlainRoadOnEveryFormatAndChannelCount)
{
    constexpr long piece = 128 * 1024;
    std::mt19937 random(7);
    for (const platform::SampleFormat format : storedFormats())
        for (const int channels : {1, 2, 3, 4, 7, 24, 250, 1024, 2048}) {
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

// 32-bit integers become floats of 24 bits, half to even, before they become bytes: ties of the second rounding are
// where a road without floats would go another way.
TEST(CreateOverview, IntegersAreRoundedAsByWayOfFloats)
{
    const platform::SampleFormat format{32, false, false, std::endian::little};
    for (const int step : {0, 1, 2, 63, 64, 125, 126, 127})
        for (int offset = -300; offset <= 300; ++offset)
            for (const int sign : {-1, 1}) {
                const std::int64_t tie = (std::int64_t{step} << 24) + (1 << 23) + offset;
                const auto value = static_cast<std::int32_t>(std::min<std::int64_t>(tie, INT32_MAX) * sign);
                const Bytes sample(reinterpret_cast<const std::byte*>(&value),
                                   reinterpret_cast<const std::byte*>(&value + 1));
                const auto onTheWay = static_cast<float>(value) / 16777216.0F;
                const int rounded = std::clamp(static_cast<int>(std::nearbyint(onTheWay)), -127, 127);
                const Bytes block = overviewOf(imageOf(format, 1, sample));
                ASSERT_EQ(pointsOf(blockOf(block)), (Points{{std::min(rounded, 0), std::max(rounded, 0)}})) << value;
            }
}

TEST(CreateOverview, AClickIsSeenAtEachBoundary)
{
    const platform::SampleFormat format{16, false, false, std::endian::little};
    constexpr std::size_t frames = 140000; // two pieces of mono
    for (const std::size_t at :
         {0u, 255u, 256u, 2047u, 2048u, 32767u, 32768u, 65535u, 65536u, 131071u, 131072u, 139999u}) {
        Bytes samples(2 * frames);
        samples[2 * at + 1] = std::byte{0x80}; // -32768
        Points expected(OverviewPointCount(frames));
        expected[at / 256].first = -127;
        EXPECT_EQ(pointsOf(blockOf(overviewOf(imageOf(format, 1, samples)))), expected) << at;
    }
}

TEST(CreateOverview, WhatCannotBeDrawnGivesNothingAndSaysWhy)
{
    const platform::SampleFormat format{16, false, false, std::endian::little};
    const Bytes compressed = readFile(KTFILES_MEDIA "/tone-adpcm.wav");
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
    std::int32_t status = 1;
    EXPECT_EQ(CAudioFileIO().CreateOverview({}, &status), nullptr);
    EXPECT_EQ(status, kStatusNotOpen);
    EXPECT_EQ(CAudioFileIO().CreateOverview(), nullptr);
}

// The header promises more than is there; a recording that was never finished promises nothing.
TEST(CreateOverview, DrawsWhatIsThereOfAShortFile)
{
    const platform::SampleFormat format{16, false, false, std::endian::little};
    const Bytes samples(700, std::byte{0x11});
    const std::string edit(4, '\0');
    const auto wave = [&](std::int64_t stored) {
        return ContainerBuilder("RIFF").chunk("fmt ", waveFormat(format, 1)).chunk("data", samples, stored).bytes();
    };
    const auto caf = [&](std::int64_t stored) {
        Bytes data(4);
        data.insert(data.end(), samples.begin(), samples.end());
        return ContainerBuilder("caff").chunk("desc", cafDescription(format, 1)).chunk("data", data, stored).bytes();
    };
    const auto aiff = [&](std::int64_t stored) {
        Bytes data(8);
        data.insert(data.end(), samples.begin(), samples.end());
        return ContainerBuilder("FORM", "AIFF").format(1000).chunk("SSND", data, stored).bytes();
    };
    const struct {
        const char* name;
        Bytes image;
        std::int64_t missing;
    } cases[] = {{"whole WAVE", wave(700), 0},         {"short WAVE", wave(2700), 2000},
                 {"open WAVE", wave(0xFFFFFFFF), 0},   {"whole CAF", caf(704), 0},
                 {"short CAF", caf(1704), 1000},       {"open CAF", caf(-1), 0},
                 {"short AIFF", aiff(8 + 2000), 1300}, {"open AIFF", aiff(0xFFFFFFFF), 0}};
    for (const auto& [name, image, missing] : cases) {
        CAudioFileIO file;
        ASSERT_EQ(openInMemory(file, image, 0), kStatusOK);
        EXPECT_EQ(file.Info().missingDataSize, missing) << name;
        const auto block = file.CreateOverview();
        ASSERT_NE(block, nullptr) << name;
        EXPECT_EQ(pointsOf(*block), (Points{{0, 17}, {0, 17}})) << name;
        EXPECT_EQ(OverviewFrames(*block), 350u) << name;
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

TEST_F(CreateOverviewOfFile, ReportsItsProgressUpToTheEnd)
{
    std::vector<long long> reported;
    const auto block = file_.CreateOverview(
        [&](long long done, long long frames) {
            EXPECT_EQ(frames, 1000000);
            reported.push_back(done);
            return true;
        },
        &status_);
    EXPECT_NE(block, nullptr);
    EXPECT_EQ(status_, kStatusOK);
    EXPECT_GE(reported.size(), 3u);
    EXPECT_TRUE(std::is_sorted(reported.begin(), reported.end()));
    EXPECT_EQ(reported.front(), 0);
    EXPECT_EQ(reported.back(), 1000000);
}

TEST_F(CreateOverviewOfFile, EndsWhenItIsTold)
{
    int calls = 0;
    EXPECT_EQ(file_.CreateOverview([&](long long, long long) { return ++calls < 2; }, &status_), nullptr);
    EXPECT_EQ(status_, kStatusUserCancelled);
    EXPECT_EQ(calls, 2);
}

TEST_F(CreateOverviewOfFile, AReadThatFailsGivesNothing)
{
    FaultInjector faults;
    faults.fail(Call::pread, EIO, 5);
    EXPECT_EQ(file_.CreateOverview({}, &status_), nullptr);
    EXPECT_EQ(status_, kStatusIOError);
    faults.limitTransfers(1001); // reads that deliver less than was asked for
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

// A file of 4 GiB and a bit, all hole but for its last sample; the system is not asked to read the hole.
TEST(CreateOverview, ReadsRF64BeyondFourGiB)
{
    const TemporaryFolder folder;
    const platform::SampleFormat format{64, true, false, std::endian::little};
    constexpr std::uint64_t frames = (4 << 16) + 1; // of 2,048 channels, 16 KiB each
    constexpr std::uint64_t size = frames * 2048 * 8;
    ContainerBuilder image("RF64");
    image.ds64(size + 72, size).chunk("fmt ", waveFormat(format, 2048)).chunk("data", Bytes(), 0xFFFFFFFF);
    const std::string path = folder.write("long.wav", image.bytes(0xFFFFFFFF));
    const auto start = std::filesystem::file_size(path);
    std::filesystem::resize_file(path, start + size);
    CAudioFileIO file(CFileRef(path.c_str(), false), kFileIOReadWrite);
    ASSERT_EQ(file.Info().frames, static_cast<std::int64_t>(frames));
    const double loud = -2;
    ASSERT_EQ(file.Write(&loud, static_cast<long long>(start + size - 8), sizeof loud), kStatusOK);

    static SystemCallGuard* current = nullptr;
    SystemCallGuard guard;
    current = &guard;
    platform::systemCalls().pread = [](int descriptor, void* to, std::size_t count,
                                       std::int64_t offset) -> std::int64_t {
        if (offset < 1 << 20 || offset > static_cast<std::int64_t>(size) - (1 << 20))
            return current->real().pread(descriptor, to, count, offset);
        std::memset(to, 0, count);
        return static_cast<std::int64_t>(count);
    };
    const auto block = file.CreateOverview();
    ASSERT_NE(block, nullptr);
    Points expected(OverviewPointCount(frames));
    expected.back() = {-127, 0};
    EXPECT_EQ(pointsOf(*block), expected);
}

bool runs(const TemporaryFolder& folder, const std::string& command)
{
    const std::string line = "cd '" + folder.path().string() + "' && { " + command + "; } >/dev/null 2>&1 </dev/null";
    return std::system(line.c_str()) == 0;
}

// One sound, converted by other programs without a change of its samples.
TEST(CreateOverview, OneSoundGivesOneOverviewInEveryContainer)
{
    const TemporaryFolder folder;
    if (!runs(folder, "command -v sox && command -v ffmpeg"))
        GTEST_SKIP() << "no sox or ffmpeg";
    ASSERT_TRUE(runs(folder, "sox -D -n -b 16 -r 44100 -c 2 base.wav synth 1.7 sine 300-3000 pinknoise fade 0.4"));
    const std::vector<std::string> conversions = {"ffmpeg -y -i base.wav -c:a pcm_s24le a.wav",
                                                  "ffmpeg -y -i base.wav -c:a pcm_s32le b.wav",
                                                  "ffmpeg -y -i base.wav -c:a pcm_f32le c.wav",
                                                  "ffmpeg -y -i base.wav -c:a pcm_f64le d.wav",
                                                  "ffmpeg -y -i base.wav -c:a pcm_s16be e.aiff",
                                                  "ffmpeg -y -i base.wav -c:a pcm_s24be f.aiff",
                                                  "ffmpeg -y -i base.wav -c:a pcm_s16le g.caf",
                                                  "ffmpeg -y -i base.wav -c:a pcm_s24be h.caf",
                                                  "ffmpeg -y -i base.wav -c:a pcm_f32le i.caf",
                                                  "ffmpeg -y -i base.wav -rf64 always j.wav",
                                                  "sox base.wav k.aiff",
                                                  "ffmpeg -y -i base.wav -c:a pcm_s16le l.aif",
                                                  "sox base.wav -b 24 m.caf",
                                                  "sox base.wav -e float -b 32 n.caf"};
    const auto overviewOfFile = [&](const std::string& name) {
        CAudioFileIO file(CFileRef((folder / name).c_str(), false), 0);
        const auto block = file.CreateOverview();
        return block ? toHex(bytesOf(*block)) : "none";
    };
    const std::string expected = overviewOfFile("base.wav");
    EXPECT_EQ(expected.size(), 2 * OverviewBlockSize(74970));
    for (const std::string& conversion : conversions) {
        ASSERT_TRUE(runs(folder, conversion)) << conversion;
        const std::string name = conversion.substr(conversion.rfind('.') - 1);
        const std::string converted = name.rfind(' ') == std::string::npos ? name : name.substr(name.rfind(' ') + 1);
        EXPECT_EQ(overviewOfFile(converted), expected) << conversion;
    }
}

} // namespace
