// What the programs of a coding's makers decode, of files by the encoders that people use: as many frames, the same
// samples, channels in the same order, and after a seek those of a decode from the start.
#include "Sounds.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <cstring>
#include <random>

using namespace platform;

namespace {

/// Files hold the same bits; decoders of floats round; judges write 16 or 24 bits.
constexpr float kSame = 0, kRounded = 2e-6F, k24Bits = 1.2e-7F, k16Bits = 1.01F / 32768;

struct Case {
    const char* name;
    const char* encode; // makes "coded" with some extension of "source.wav"
    const char* coded;
    const char* judge; // makes "judged.wav" of it
    float tolerance = kSame;
    double rate = 44100;
    std::uint32_t channels = 2;
    int bits = 16;
    float settled = kSame; // how near a frame after a seek is to that of a decode from the start
};

std::ostream& operator<<(std::ostream& out, const Case& test)
{
    return out << test.name;
}

constexpr const char* kOgg = "a.ogg";
constexpr const char* kOggDec = "oggdec -Q a.ogg -o judged.wav";

const Case cases[] = {
    {"VorbisLow", "oggenc -Q -q0 source.wav -o a.ogg", kOgg, kOggDec, k16Bits},
    {"VorbisMiddle", "oggenc -Q -q5 source.wav -o a.ogg", kOgg, kOggDec, k16Bits},
    {"VorbisHigh", "oggenc -Q -q10 source.wav -o a.ogg", kOgg, kOggDec, k16Bits},
    {"VorbisManaged", "oggenc -Q -b 96 --managed source.wav -o a.ogg", kOgg, kOggDec, k16Bits},
    {"Vorbis8kMono", "oggenc -Q -q3 source.wav -o a.ogg", kOgg, kOggDec, k16Bits, 8000, 1},
    {"Vorbis96k", "oggenc -Q -q5 source.wav -o a.ogg", kOgg, kOggDec, k16Bits, 96000, 2, 24},
    // oggdec puts the low frequencies between the rear channels.
    {"VorbisSurround", "oggenc -Q -q5 source.wav -o a.ogg", kOgg,
     "oggdec -Q a.ogg -o o.wav && sox -D o.wav judged.wav remix 1 2 3 5 6 4", k16Bits, 48000, 6},
};

class Judges : public testing::TestWithParam<Case> {};

/// All frames as 32-bit floats.
std::vector<float> floatsOf(ConvertingReader& reader)
{
    StreamDescription format = StreamDescription::packedPCM(
        reader.clientFormat().sampleRate, reader.clientFormat().channelsPerFrame, {.bits = 32, .isFloat = true});
    EXPECT_EQ(reader.setClientFormat(format), 0);
    const Bytes bytes = allFramesOf(reader, 5000);
    std::vector<float> samples(bytes.size() / sizeof(float));
    std::memcpy(samples.data(), bytes.data(), bytes.size());
    return samples;
}

/// The frame of the first sample that is further off than `tolerance`; of none, the number of frames.
std::size_t firstDifference(const std::vector<float>& found, const std::vector<float>& expected, float tolerance,
                            std::uint32_t channels)
{
    const std::size_t count = std::min(found.size(), expected.size());
    for (std::size_t i = 0; i < count; ++i)
        // What the judge clips is clipped.
        if (std::abs(std::clamp(found[i], -1.0F, 1.0F) - std::clamp(expected[i], -1.0F, 1.0F)) > tolerance)
            return i / channels;
    return count / channels;
}

} // namespace

TEST_P(Judges, DecodeTheSame)
{
    const Case& test = GetParam();
    const std::uint32_t frames = 130'001; // no multiple of any packet
    const TemporaryFolder folder;
    writeRoughSound(folder / "source.wav", frames, test.channels, test.rate, test.bits);
    ASSERT_TRUE(runs(folder, test.encode)) << "not made: scripts/setup test";
    ASSERT_TRUE(runs(folder, test.judge)) << "not judged: scripts/setup test";
    const auto judged = openReader(folder / "judged.wav");
    const auto reader = openReader(folder / test.coded);
    ASSERT_TRUE(judged);
    ASSERT_TRUE(reader);
    EXPECT_EQ(reader->clientFormat().sampleRate, judged->clientFormat().sampleRate);
    ASSERT_EQ(reader->clientFormat().channelsPerFrame, judged->clientFormat().channelsPerFrame);
    const std::uint32_t channels = reader->clientFormat().channelsPerFrame;
    const std::vector<float> found = floatsOf(*reader);
    const std::vector<float> expected = floatsOf(*judged);
    EXPECT_EQ(found.size() / channels, expected.size() / channels);
    EXPECT_EQ(firstDifference(found, expected, test.tolerance, channels), found.size() / channels);

    std::mt19937 random(3);
    for (int i = 0; i < 30; ++i) {
        const std::size_t frame = random() % (found.size() / channels - 3000);
        const Bytes piece = framesOf(*reader, frame, 3000);
        std::vector<float> again(piece.size() / sizeof(float));
        std::memcpy(again.data(), piece.data(), piece.size());
        const std::vector<float> before(found.begin() + static_cast<std::ptrdiff_t>(frame * channels),
                                        found.begin() + static_cast<std::ptrdiff_t>((frame + 3000) * channels));
        ASSERT_EQ(firstDifference(again, before, test.settled, channels), 3000u) << "from frame " << frame;
    }
}

INSTANTIATE_TEST_SUITE_P(Of, Judges, testing::ValuesIn(cases),
                         [](const testing::TestParamInfo<Case>& test) { return std::string(test.param.name); });
