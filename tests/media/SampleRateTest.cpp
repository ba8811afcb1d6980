// Frames at another sample rate than the file's: their times, their quality, and that they are the same however they
// are reached.
#include "ReaderFrames.h"
#include "media/decoding/DecoderModule.h"
#include "media/decoding/PolyphaseSums.h"
#include "media/samples/SampleRoads.h"
#include "support/FakeDecoder.h"
#include "support/Programs.h"

#include <bit>
#include <cmath>
#include <cstring>
#include <functional>
#include <limits>
#include <numbers>
#include <random>

using namespace platform;

namespace {

class SampleRate : public testing::Test {
protected:
    void SetUp() override
    {
        if (decoderModule() == nullptr)
            GTEST_SKIP() << "the decoder module is not built";
    }

    TemporaryFolder folder;
};

constexpr SampleFormat kFloats{.bits = 32, .isFloat = true, .order = std::endian::native};

/// A reader of a float file with the values of `sound` by frame and channel.
std::unique_ptr<ConvertingReader> readerOf(const TemporaryFolder& folder, double rate, std::uint32_t channels,
                                           std::size_t frames, const std::function<double(std::size_t, int)>& sound)
{
    std::vector<float> samples;
    for (std::size_t frame = 0; frame < frames; ++frame)
        for (std::uint32_t channel = 0; channel < channels; ++channel)
            samples.push_back(static_cast<float>(sound(frame, static_cast<int>(channel))));
    auto format = StreamDescription::packedPCM(rate, channels, {.bits = 32, .isFloat = true});
    return openReader(writeAudio(folder, fourCC("WAVE"), format, samples));
}

/// Noise that identifies every frame.
double noise(std::size_t frame, int channel)
{
    std::uint64_t bits = (frame + 1) * 0x9E3779B97F4A7C15U + static_cast<std::uint64_t>(channel) * 0xBF58476D1CE4E5B9U;
    bits ^= bits >> 29;
    return static_cast<double>(static_cast<std::int32_t>(bits * 0x94D049BB133111EBU >> 32)) / 2147483648.0;
}

std::function<double(std::size_t, int)> sine(double hertz, double rate)
{
    return [=](std::size_t frame, int) {
        return 0.5 * std::sin(2 * std::numbers::pi * hertz * static_cast<double>(frame) / rate);
    };
}

/// Signal-to-noise ratio in decibels of an expected sine, away from the ends.
double qualityOf(const std::vector<float>& samples, double hertz, double rate)
{
    double signal = 0, noise = 0;
    const auto expected = sine(hertz, rate);
    for (std::size_t i = 1000; i + 1000 < samples.size(); ++i) {
        const double value = expected(i, 0);
        signal += value * value;
        noise += (samples[i] - value) * (samples[i] - value);
    }
    return 10 * std::log10(signal / noise);
}

bool areSame(const std::vector<float>& a, const float* b)
{
    return std::memcmp(a.data(), b, a.size() * sizeof(float)) == 0;
}

/// Reads at 60 positions, in pieces of several sizes, and compares with one read of everything.
void expectSeeksToGiveWhatAFullReadGives(ConvertingReader& reader)
{
    const std::uint32_t channels = reader.clientFormat().channelsPerFrame;
    const auto count = reader.clientFrameCount();
    const auto whole = readFrom<float>(reader, 0, static_cast<std::uint32_t>(count) + 100);
    ASSERT_EQ(whole.size(), count * channels);
    std::mt19937 random(7);
    std::vector<std::uint64_t> places{0, 1, count - 1, count};
    while (places.size() < 60)
        places.push_back(random() % count);
    for (const std::uint64_t place : places) {
        const auto frames = static_cast<std::uint32_t>(random() % 3000);
        for (std::uint64_t at = place, end = std::min(count, place + frames); at < end;) { // the second goes on
            const auto piece = static_cast<std::uint32_t>(std::min<std::uint64_t>(end - at, 1000));
            const auto read = readFrom<float>(reader, static_cast<std::int64_t>(at), piece);
            ASSERT_EQ(read.size(), std::size_t{piece} * channels);
            ASSERT_TRUE(areSame(read, whole.data() + at * channels)) << "at " << at;
            at += piece;
        }
    }
}

} // namespace

TEST_F(SampleRate, FramesStandAtTheirTimesAndAreCountedUpToTheEnd)
{
    const struct {
        std::uint32_t from, to;
        std::size_t frames;
        std::uint64_t expected;
    } cases[] = {
        {44100, 48000, 44100, 48000}, {48000, 44100, 48000, 44100}, {44100, 48000, 1, 2},
        {48000, 44100, 1, 1},         {44100, 44099, 44100, 44099}, {48000, 8000, 48001, 8001},
        {8000, 768000, 10, 960},      {44100, 1, 44101, 2},         {44100, 48000, 0, 0},
    };
    for (const auto& test : cases) {
        SCOPED_TRACE(std::to_string(test.from) + " to " + std::to_string(test.to));
        const auto reader = readerOf(folder, test.from, 1, test.frames, [](std::size_t, int) { return 0.25; });
        ASSERT_EQ(reader->setClientFormat(StreamDescription::packedPCM(test.to, 1, kFloats)), 0);
        EXPECT_EQ(reader->frameCount(), test.frames);
        EXPECT_EQ(reader->clientFrameCount(), test.expected);
        EXPECT_EQ(readFrom<float>(*reader, 0, 50000).size(), test.expected);
        EXPECT_TRUE(readFrom<float>(*reader, std::numeric_limits<std::int64_t>::max(), 10).empty());
    }
    // An impulse in the middle shows the position: frame 4410 becomes frame 4800.
    const auto reader = readerOf(folder, 44100, 1, 9000, [](std::size_t frame, int) { return frame == 4410 ? 1 : 0; });
    ASSERT_EQ(reader->setClientFormat(StreamDescription::packedPCM(48000, 1, kFloats)), 0);
    const auto samples = readFrom<float>(*reader, 0, 10000);
    EXPECT_EQ(std::max_element(samples.begin(), samples.end()) - samples.begin(), 4800);
    EXPECT_NEAR(samples[4800], 1, 0.01);
    EXPECT_NEAR(samples[4799], samples[4801], 1e-6);
}

TEST_F(SampleRate, ASineComesBackAndLevelsStay)
{
    constexpr std::size_t frames = 88200;
    std::unique_ptr<ConvertingReader> reader;
    for (const double hertz : {1000.0, 10007.0, 19001.0}) {
        reader = readerOf(folder, 44100, 1, frames, sine(hertz, 44100));
        ASSERT_EQ(reader->setClientFormat(StreamDescription::packedPCM(48000, 1, kFloats)), 0);
        const auto there = readFrom<float>(*reader, 0, 96000);
        EXPECT_GT(qualityOf(there, hertz, 48000), 120);
        reader = readerOf(folder, 48000, 1, 96000, sine(hertz, 48000));
        ASSERT_EQ(reader->setClientFormat(StreamDescription::packedPCM(44100, 1, kFloats)), 0);
        const auto back = readFrom<float>(*reader, 0, frames);
        ASSERT_EQ(back.size(), frames);
        EXPECT_GT(qualityOf(back, hertz, 44100), 120);
    }

    for (const double rate : {48000.0, 22050.0, 44099.0}) {
        reader = readerOf(folder, 44100, 1, 20000, [](std::size_t, int) { return 0.5; });
        ASSERT_EQ(reader->setClientFormat(StreamDescription::packedPCM(rate, 1, kFloats)), 0);
        for (const float level : readFrom<float>(*reader, 1000, 7000))
            ASSERT_NEAR(level, 0.5, 1e-6) << rate;
    }
    // Nothing above half of the lower rate is aliased.
    reader = readerOf(folder, 48000, 1, frames, sine(23000, 48000));
    ASSERT_EQ(reader->setClientFormat(StreamDescription::packedPCM(44100, 1, kFloats)), 0);
    for (const float level : readFrom<float>(*reader, 1000, 70000))
        ASSERT_NEAR(level, 0, 1e-5);
}

TEST(PolyphaseSums, OfVectorsAreThoseOfThePlainLoop)
{
    constexpr std::size_t taps = 48, phases = 5, stride = 4000, frames = 300;
    std::mt19937 random(3);
    std::uniform_real_distribution<float> any(-1, 1);
    std::vector<float> filters(taps * phases), samples(stride * 5);
    std::generate(filters.begin(), filters.end(), [&] { return any(random); });
    std::generate(samples.begin(), samples.end(), [&] { return any(random); });
    for (const std::size_t channels : {1U, 2U, 3U, 5U})
        for (const std::size_t step : {3U, 5U, 64U}) {
            std::vector<float> plain(frames * channels), fast(plain.size());
            PolyphaseRun run{filters.data(), taps,   phases,   step,         2,
                             samples.data(), stride, channels, plain.data(), frames};
            runPolyphasePlain(run);
            run.to = fast.data();
            runPolyphase(run);
            EXPECT_TRUE(areSame(plain, fast.data())) << channels << " channels, step " << step;
#if defined(__x86_64__)
            std::fill(fast.begin(), fast.end(), 0.0F);
            if (hasFastRoads())
                runPolyphaseFast(run); // which a processor with wider vectors does not take
            EXPECT_TRUE(!hasFastRoads() || areSame(plain, fast.data())) << channels << " channels, step " << step;
#endif
        }
}

TEST_F(SampleRate, SeeksGiveBitForBitWhatAFullReadGives)
{
    const struct {
        double from, to;
        std::uint32_t channels, wanted;
    } cases[] = {{44100, 48000, 2, 2}, {48000, 44100, 1, 1}, {44100, 44099, 1, 2}, {48000, 8000, 3, 1},
                 {11025, 96000, 2, 3}, {44100, 4410, 1, 1},  {8000, 768000, 1, 1}, {192000, 44100, 2, 2}};
    for (const auto& test : cases) {
        SCOPED_TRACE(std::to_string(test.from) + " to " + std::to_string(test.to));
        const auto frames = static_cast<std::size_t>(50000 * std::min(1.0, test.from / test.to));
        const auto reader = readerOf(folder, test.from, test.channels, frames, noise);
        ASSERT_EQ(reader->setClientFormat(StreamDescription::packedPCM(test.to, test.wanted, kFloats)), 0);
        expectSeeksToGiveWhatAFullReadGives(*reader);
    }
}

TEST_F(SampleRate, SeeksInCompressedFilesToo)
{
    ASSERT_TRUE(runs(folder, "ffmpeg -f lavfi -i anoisesrc=d=2:r=44100:seed=1 -ac 2 a.flac && ffmpeg -i a.flac a.mp3"));
    for (const char* name : {"a.flac", "a.mp3"}) {
        SCOPED_TRACE(name);
        const auto reader = openReader(folder / name);
        ASSERT_TRUE(reader);
        ASSERT_EQ(reader->setClientFormat(StreamDescription::packedPCM(48000, 2, kFloats)), 0);
        EXPECT_EQ(reader->clientFrameCount(), 96000U);
        expectSeeksToGiveWhatAFullReadGives(*reader);
    }
}

TEST_F(SampleRate, WhatIsNoNumberDoesNotOutliveItsNeighbours)
{
    const auto broken = readerOf(folder, 44100, 1, 9000, [](std::size_t frame, int) {
        return frame == 4000 ? std::numeric_limits<double>::quiet_NaN() : 0.25;
    });
    ASSERT_EQ(broken->setClientFormat(StreamDescription::packedPCM(48000, 1, kFloats)), 0);
    for (const float value : readFrom<float>(*broken, 0, 9000))
        ASSERT_TRUE(std::isfinite(value));
}

TEST_F(SampleRate, RefusesRatesThatCannotBeConverted)
{
    const auto reader = readerOf(folder, 44100, 1, 100, noise);
    const double rates[] = {0,      0.5,   44100.5,      -48000,
                            768001, 1e300, std::nan(""), std::numeric_limits<double>::infinity()};
    for (const double rate : rates) {
        Error error;
        EXPECT_EQ(reader->setClientFormat(StreamDescription::packedPCM(rate, 1, kFloats), &error),
                  AudioHandle::kFormatNotSupported)
            << rate;
        EXPECT_EQ(error.code, AudioHandle::kFormatNotSupported) << rate;
        EXPECT_EQ(reader->clientFormat().sampleRate, 44100) << rate;
    }
    const auto far = readerOf(folder, 768000, 1, 100, noise); // a filter of hundreds of megabytes
    EXPECT_EQ(far->setClientFormat(StreamDescription::packedPCM(1, 1, kFloats)), AudioHandle::kFormatNotSupported);
    const auto wide = readerOf(folder, 44100, 65, 10, noise);
    EXPECT_EQ(wide->setClientFormat(StreamDescription::packedPCM(48000, 65, kFloats)),
              AudioHandle::kFormatNotSupported);
    EXPECT_EQ(wide->setClientFormat(StreamDescription::packedPCM(48000, 64, kFloats)), 0);
    EXPECT_EQ(readFrom<float>(*wide, 0, 100).size(), 11U * 64);
}
