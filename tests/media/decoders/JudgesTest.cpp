// Comparison with the decoders of the codings' authors, on files of common encoders: the same number of frames, the
// same samples, the same channel order, and after a seek the frames of a decode from the start.
#include "Sounds.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <cstring>
#include <random>

using namespace platform;

namespace {

/// Lossless files hold the same bits; decoders of floats round; judges write 16 or 24 bits.
constexpr float kSame = 0, kRounded = 1e-5F, k16Bits = 1.01F / 32768;
/// Opus converges after a seek, but its decoder never forgets completely.
constexpr float kSettledAfterSeek = 1e-5F;

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
constexpr const char* kOpus = "a.opus";
constexpr const char* kOpusDec = "opusdec --quiet --float --rate 48000 a.opus judged.wav";
constexpr const char* kWavPack = "a.wv";
constexpr const char* kWvUnpack = "wvunpack -q a.wv -o judged.wav";
constexpr const char* kFLAC = "a.flac";
constexpr const char* kFLACDec = "flac -s -d a.flac -o judged.wav";
constexpr const char* kSndfile = "sndfile-convert -pcm16 a.wav judged.wav";
constexpr const char* kMP3 = "a.mp3";
constexpr const char* kMPG123 = "mpg123 -q -e f32 -w judged.wav a.mp3";
constexpr const char* kOggDec = "oggdec -Q a.ogg -o judged.wav";

const Case cases[] = {
    {"VorbisLow", "oggenc -Q -q0 source.wav -o a.ogg", kOgg, kOggDec, k16Bits},
    {"VorbisMiddle", "oggenc -Q -q5 source.wav -o a.ogg", kOgg, kOggDec, k16Bits},
    {"VorbisHigh", "oggenc -Q -q10 source.wav -o a.ogg", kOgg, kOggDec, k16Bits},
    {"VorbisManaged", "oggenc -Q -b 96 --managed source.wav -o a.ogg", kOgg, kOggDec, k16Bits},
    {"Vorbis8kMono", "oggenc -Q -q3 source.wav -o a.ogg", kOgg, kOggDec, k16Bits, 8000, 1},
    {"Vorbis96k", "oggenc -Q -q5 source.wav -o a.ogg", kOgg, kOggDec, k16Bits, 96000, 2, 24},
    // oggdec places the low frequencies between the rear channels.
    {"VorbisSurround", "oggenc -Q -q5 source.wav -o a.ogg", kOgg,
     "oggdec -Q a.ogg -o o.wav && sox -D o.wav judged.wav remix 1 2 3 5 6 4", k16Bits, 48000, 6},
    {"OpusLow", "opusenc --quiet --bitrate 32 source.wav a.opus", kOpus, kOpusDec, kSame, 48000, 2, 16,
     kSettledAfterSeek},
    {"OpusMiddle", "opusenc --quiet --bitrate 96 --framesize 60 source.wav a.opus", kOpus, kOpusDec, kSame, 44100, 2,
     16, kSettledAfterSeek},
    {"OpusHigh", "opusenc --quiet --hard-cbr --bitrate 256 --framesize 2.5 source.wav a.opus", kOpus, kOpusDec, kSame,
     48000, 2, 24, kSettledAfterSeek},
    {"OpusSpeech", "opusenc --quiet --speech --bitrate 12 source.wav a.opus", kOpus, kOpusDec, kSame, 8000, 1, 16,
     kSettledAfterSeek},
    {"OpusSurround", "opusenc --quiet --bitrate 320 source.wav a.opus", kOpus, kOpusDec, kSame, 48000, 6, 16,
     kSettledAfterSeek},
    {"WavPack", "wavpack -q source.wav -o a.wv", kWavPack, kWvUnpack},
    {"WavPackHigh24", "wavpack -q -h source.wav -o a.wv", kWavPack, kWvUnpack, kSame, 96000, 2, 24},
    {"WavPackExtra24", "wavpack -q -x3 source.wav -o a.wv", kWavPack, kWvUnpack, kSame, 44100, 2, 24},
    {"WavPackHybrid", "wavpack -q -b256 source.wav -o a.wv", kWavPack, kWvUnpack},
    {"WavPackCorrected", "wavpack -q -b256 -c source.wav -o a.wv", kWavPack, kWvUnpack, kSame, 44100, 2, 24},
    {"WavPackFloat", "sox source.wav -e float f.wav && wavpack -q -hh f.wav -o a.wv", kWavPack, kWvUnpack, kSame, 44100,
     2, 24},
    {"WavPackSurround", "wavpack -q source.wav -o a.wv", kWavPack, kWvUnpack, kSame, 48000, 6, 24},
    {"WavPack8", "sox -D source.wav -b 8 8.wav && wavpack -q 8.wav -o a.wv", kWavPack, kWvUnpack, kSame, 8000, 1},
    {"WavPackMatroska", "wavpack -q source.wav -o b.wv && ffmpeg -i b.wv -c copy a.mka", "a.mka",
     "wvunpack -q b.wv -o judged.wav", kSame, 44100, 2, 24},
    {"FLAC", "flac -s source.wav -o a.flac", kFLAC, kFLACDec},
    {"FLACBest24", "flac -s -8 -e source.wav -o a.flac", kFLAC, kFLACDec, kSame, 96000, 2, 24},
    {"FLACFastMono", "flac -s -0 -b 576 source.wav -o a.flac", kFLAC, kFLACDec, kSame, 8000, 1},
    {"FLACSurround", "flac -s --channel-map=none source.wav -o a.flac", kFLAC, kFLACDec, kSame, 48000, 6, 24},
    {"OggFLAC", "flac -s --ogg source.wav -o a.oga", "a.oga", "flac -s -d --ogg a.oga -o judged.wav", kSame, 44100, 2,
     24},
    {"MP3CBR", "lame --quiet -b 128 source.wav a.mp3", kMP3, kMPG123, kRounded},
    {"MP3VBR", "lame --quiet -V 0 source.wav a.mp3", kMP3, kMPG123, kRounded, 48000},
    {"MP3ABR", "lame --quiet --abr 96 source.wav a.mp3", kMP3, kMPG123, kRounded, 32000},
    {"MP3Low", "lame --quiet -V 6 source.wav a.mp3", kMP3, kMPG123, kRounded, 22050, 1},
    {"MP3Lowest", "lame --quiet -b 16 source.wav a.mp3", kMP3, kMPG123, kRounded, 8000, 1},
    {"MP3WithTags", "lame --quiet -V 2 --tt title --ta artist --add-id3v2 source.wav a.mp3", kMP3, kMPG123, kRounded},
    {"IMA", "sndfile-convert -ima-adpcm source.wav a.wav", "a.wav", kSndfile, kSame},
    {"IMAMono", "sndfile-convert -ima-adpcm source.wav a.wav", "a.wav", kSndfile, kSame, 22050, 1},
    {"GSM", "sndfile-convert -gsm610 source.wav a.w64", "a.w64",
     "sndfile-convert -pcm16 a.w64 j.wav && sox -D j.wav judged.wav trim 0 130001s", kSame, 8000, 1},
    {"ALAC", "sndfile-convert -alac16 source.wav a.caf", "a.caf", "cp source.wav judged.wav", kSame, 48000},
    {"ALACMono", "sndfile-convert -alac16 source.wav a.caf", "a.caf", "cp source.wav judged.wav", kSame, 8000, 1},
    {"RIFX24", "sox source.wav -B a.wav", "a.wav", "cp source.wav judged.wav", kSame, 44100, 2, 24},
    {"RIFX8", "sox -D source.wav -b 8 -B a.wav", "a.wav", "sox -D a.wav -L judged.wav", kSame, 8000, 1},
    {"Wave64", "sndfile-convert -pcm24 source.wav a.w64", "a.w64", "sndfile-convert -pcm24 a.w64 judged.wav", kSame,
     48000, 6, 24},
    {"AU8", "sox -D source.wav -b 8 a.au", "a.au", "sox -D a.au judged.wav", kSame, 8000, 1},
    {"AU24", "sox source.wav a.au", "a.au", "cp source.wav judged.wav", kSame, 96000, 2, 24},
    {"AUFloat", "sox source.wav -e float a.au", "a.au", "sox a.au judged.wav", kSame, 44100, 2, 24},
    // At lower qualities decoders substitute noise, which differs between them.
    {"Musepack", "sox -D source.wav s.wav && mpcenc --standard s.wav a.mpc", "a.mpc", "mpcdec a.mpc judged.wav",
     2 * k16Bits},
    {"MusepackTagged",
     "sox -D source.wav s.wav && mpcenc --insane s.wav b.mpc && { printf 'ID3\\003\\0\\0\\0\\0\\0\\012%10s' ''; cat "
     "b.mpc; } > a.mpc",
     "a.mpc", "mpcdec b.mpc judged.wav", 2 * k16Bits, 32000},
    {"TTA", "ffmpeg -i source.wav a.tta", "a.tta", "cp source.wav judged.wav", kSame, 48000, 2, 24},
    {"MP2", "twolame --quiet -b 192 source.wav a.mp2", "a.mp2", "mpg123 -q -e f32 -w judged.wav a.mp2", kRounded},
    {"MP2Mono", "twolame --quiet -b 64 -m m source.wav a.mp2", "a.mp2", "mpg123 -q -e f32 -w judged.wav a.mp2",
     kRounded, 48000, 1},
};

class Coded : public testing::TestWithParam<Case> {};

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

float worst(const std::vector<float>& found, const std::vector<float>& expected)
{
    float worst = 0;
    for (std::size_t i = 0; i < std::min(found.size(), expected.size()); ++i)
        // Compares as if clipped where the judge clips.
        worst = std::max(worst, std::abs(std::clamp(found[i], -1.0F, 1.0F) - std::clamp(expected[i], -1.0F, 1.0F)));
    return worst;
}

} // namespace

TEST_P(Coded, DecodesAsItsMakersSay)
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
    EXPECT_LE(worst(found, expected), test.tolerance);
    EXPECT_EQ(reader->missingFrames(), 0u);

    std::mt19937 random(3);
    for (int i = 0; i < 30; ++i) {
        const std::size_t frame = random() % (found.size() / channels - 3000);
        const Bytes piece = framesOf(*reader, frame, 3000);
        std::vector<float> again(piece.size() / sizeof(float));
        std::memcpy(again.data(), piece.data(), piece.size());
        const std::vector<float> before(found.begin() + static_cast<std::ptrdiff_t>(frame * channels),
                                        found.begin() + static_cast<std::ptrdiff_t>((frame + 3000) * channels));
        ASSERT_EQ(again.size(), before.size());
        ASSERT_LE(worst(again, before), test.settled) << "from frame " << frame;
    }
}

INSTANTIATE_TEST_SUITE_P(Judged, Coded, testing::ValuesIn(cases),
                         [](const testing::TestParamInfo<Case>& test) { return std::string(test.param.name); });

namespace {

void append(Bytes& bytes, std::uint64_t number, int count)
{
    while (count-- > 0)
        bytes.push_back(static_cast<std::byte>(number >> 8 * count));
}

std::uint32_t checksum(BytesView bytes, int bits, std::uint32_t polynomial)
{
    std::uint32_t sum = 0;
    for (const std::byte byte : bytes) {
        sum ^= std::to_integer<std::uint32_t>(byte) << (bits - 8);
        for (int i = 0; i < 8; ++i)
            sum = sum << 1 ^ (sum >> (bits - 1) & 1 ? polynomial : 0);
    }
    return sum & ((1u << bits) - 1);
}

/// A FLAC file (RFC 9639) of unpacked mono 16-bit samples whose blocks all differ in size, which encoders may write but
/// rarely do.
Bytes flacOfChangingBlocks(const std::vector<std::int16_t>& samples)
{
    Bytes file;
    append(file, 0x664C6143'80000022, 8); // "fLaC", and STREAMINFO as the last
    append(file, 16, 2);                  // the smallest block
    append(file, 6000, 2);                // and the largest
    append(file, 0, 6);                   // frames of any size
    append(file, std::uint64_t{44100} << 44 | std::uint64_t{15} << 36 | samples.size(), 8);
    file.resize(file.size() + 16); // no MD5
    std::mt19937 random(7);
    for (std::size_t at = 0; at < samples.size();) {
        const std::size_t count = std::min<std::size_t>(16 + random() % 5985, samples.size() - at);
        Bytes frame;
        append(frame, 0xFFF97908, 4); // numbered by sample, the block's size below
        if (at < 0x80)
            append(frame, at, 1);
        else if (at < 0x800)
            append(frame, 0xC080 | (at >> 6) << 8 | (at & 63), 2);
        else if (at < 0x10000)
            append(frame, 0xE08080 | (at >> 12) << 16 | (at >> 6 & 63) << 8 | (at & 63), 3);
        else
            append(frame, 0xF0808080 | (at >> 18) << 24 | (at >> 12 & 63) << 16 | (at >> 6 & 63) << 8 | (at & 63), 4);
        append(frame, count - 1, 2);
        append(frame, checksum(frame, 8, 0x07), 1);
        append(frame, 2, 1); // verbatim
        for (const std::size_t end = at + count; at < end; ++at)
            append(frame, static_cast<std::uint16_t>(samples[at]), 2);
        append(frame, checksum(frame, 16, 0x8005), 2);
        file.insert(file.end(), frame.begin(), frame.end());
    }
    return file;
}

} // namespace

TEST(Judges, FLACOfChangingBlocksIsWhereItBelongs)
{
    const std::vector<float> rough = roughSound(300'000, 1, 44100);
    std::vector<std::int16_t> samples(rough.size());
    floatToSamples(rough.data(), {.bits = 16}, reinterpret_cast<std::byte*>(samples.data()), rough.size());
    const TemporaryFolder folder;
    const auto reader = openReader(folder.write("a.flac", BytesView(flacOfChangingBlocks(samples))));
    ASSERT_TRUE(reader);
    ASSERT_TRUE(runs(folder, "flac -s -t a.flac")); // it is one
    ASSERT_EQ(reader->frameCount(), samples.size());
    const auto expectAt = [&](std::size_t frame, std::uint32_t count) {
        const Bytes found = framesOf(*reader, frame, count);
        ASSERT_EQ(found.size(), count * sizeof(std::int16_t));
        EXPECT_EQ(std::memcmp(found.data(), samples.data() + frame, found.size()), 0) << "from frame " << frame;
    };
    expectAt(0, 300'000);
    EXPECT_EQ(reader->missingFrames(), 0u);
    std::mt19937 random(8);
    for (int i = 0; i < 40; ++i)
        expectAt(random() % 297'000, 3000);
}
