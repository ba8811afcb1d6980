// Every format, encoded by other programs: the number of frames is preserved, each is in its place, and seeks give the
// frames of a decode from the start.
#include "Sounds.h"
#include "media/userdata/AudioFileService.h"

#include <gtest/gtest.h>

#include <cmath>
#include <cstring>
#include <random>

using namespace platform;

namespace {

/// How close a frame after a seek is to that of a decode from the start.
constexpr float kExact = 0;
/// Opus converges, but its decoder never forgets completely; AC-3 fills bands with noise that runs on.
constexpr float kSettled = 1e-5F, kNoisy = 0.05F;

enum class Length {
    kept,    // as many frames as went in
    whole,   // packets are whole; nothing tells where the sound ends
    encoder, // includes the encoder's delay of unknown length; the end may be missing
};

struct Format {
    const char* name;    // of the file
    const char* command; // makes it from "source.wav"
    FourCC formatId;
    FourCC fileType;
    std::uint32_t bits = 0; // of the source if the coding is lossless, so that every bit returns
    Length length = Length::kept;
    float tolerance = kExact;
    std::uint32_t channels = 2;
    double rate = 44100;
};

std::ostream& operator<<(std::ostream& out, const Format& format)
{
    return out << format.name;
}

constexpr std::uint32_t kFrames = 300'001; // no multiple of a packet

const Format formats[] = {
    {"cbr.mp3", "lame --quiet -b 128 source.wav cbr.mp3", fourCC(".mp3"), fourCC("MPG3")},
    {"vbr.mp3", "lame --quiet -V 2 source.wav vbr.mp3", fourCC(".mp3"), fourCC("MPG3")},
    {"320.mp3", "lame --quiet -b 320 source.wav 320.mp3", fourCC(".mp3"), fourCC("MPG3")},
    // A tag with the delay does not fit into frames this small.
    {"low.mp3", "lame --quiet -b 32 -m m --resample 24 source.wav low.mp3", fourCC(".mp3"), fourCC("MPG3"), 0,
     Length::encoder, kExact, 1, 24000},
    {"aac.m4a", "ffmpeg -i source.wav -c:a aac -aac_pns 0 aac.m4a", fourCC("aac "), fourCC("m4af")},
    {"alac16.m4a", "ffmpeg -i source.wav -c:a alac alac16.m4a", fourCC("alac"), fourCC("m4af"), 16},
    {"alac24.m4a", "ffmpeg -i source.wav -c:a alac -sample_fmt s32p alac24.m4a", fourCC("alac"), fourCC("m4af"), 24},
    {"aac.mp4",
     "ffmpeg -i source.wav -f lavfi -i testsrc=size=64x48:rate=5 -shortest -c:v mpeg4 -c:a aac -aac_pns 0 aac.mp4",
     fourCC("aac "), fourCC("mp4f")},
    // Its times jump by a frame now and then, as after copying; its frames do not.
    {"copied.m4a",
     "ffmpeg -i source.wav -t 2.27 -c:a aac -aac_pns 0 a.m4a && ffmpeg -stream_loop 2 -i a.m4a -c copy copied.m4a",
     fourCC("aac "), fourCC("m4af"), 0, Length::encoder},
    {"adts.aac", "ffmpeg -i source.wav -c:a aac -aac_pns 0 adts.aac", fourCC("aac "), fourCC("adts"), 0,
     Length::encoder},
    {"alac.caf", "ffmpeg -i source.wav -c:a alac alac.caf", fourCC("alac"), fourCC("caff"), 16},
    {"aac.caf",
     "ffmpeg -i source.wav -c:a aac -aac_pns 0 a.aac && python3 '" KTFILES_DECODER_TESTS
     "/adts_to_caf.py' a.aac aac.caf 300001",
     fourCC("aac "), fourCC("caff")},
    {"ima4.caf", "ffmpeg -i source.wav -c:a adpcm_ima_qt ima4.caf", fourCC("ima4"), fourCC("caff"), 0, Length::whole},
    {"ulaw.caf", "ffmpeg -i source.wav -c:a pcm_mulaw ulaw.caf", fourCC("ulaw"), fourCC("caff")},
    {"16.flac", "ffmpeg -i source.wav 16.flac", fourCC("flac"), fourCC("flac"), 16},
    {"24.flac", "ffmpeg -i source.wav 24.flac", fourCC("flac"), fourCC("flac"), 24},
    {"unknown.flac", "ffmpeg -i source.wav -f flac - | cat > unknown.flac", fourCC("flac"), fourCC("flac"), 16},
    {"flac.ogg", "ffmpeg -i source.wav -c:a flac flac.ogg", fourCC("flac"), fourCC("ogg "), 16},
    {"vorbis.ogg", "ffmpeg -i source.wav -c:a libvorbis vorbis.ogg", fourCC("vorb"), fourCC("ogg ")},
    {"opus.opus", "ffmpeg -i source.wav -c:a libopus opus.opus", fourCC("opus"), fourCC("ogg "), 0, Length::kept,
     kSettled, 2, 48000},
    {"ima.wav", "ffmpeg -i source.wav -c:a adpcm_ima_wav ima.wav", fourCC('m', 's', 0, 0x11), fourCC("WAVE"), 0,
     Length::whole},
    {"sox-ima.wav", "sox -D source.wav -e ima-adpcm sox-ima.wav", fourCC('m', 's', 0, 0x11), fourCC("WAVE")},
    {"ms.wav", "sox -D source.wav -e ms-adpcm ms.wav", fourCC('m', 's', 0, 2), fourCC("WAVE")},
    {"ulaw.wav", "ffmpeg -i source.wav -c:a pcm_mulaw ulaw.wav", fourCC("ulaw"), fourCC("WAVE")},
    {"alaw.w64", "ffmpeg -i source.wav -c:a pcm_alaw alaw.w64", fourCC("alaw"), fourCC("W64f")},
    {"ulaw.aifc", "ffmpeg -i source.wav -c:a pcm_mulaw -f aiff ulaw.aifc", fourCC("ulaw"), fourCC("AIFC")},
    {"ima4.aifc", "ffmpeg -i source.wav -c:a adpcm_ima_qt -f aiff ima4.aifc", fourCC("ima4"), fourCC("AIFC"), 0,
     Length::whole},
    {"pcm.w64", "ffmpeg -i source.wav -c:a pcm_s24le pcm.w64", fourCC("lpcm"), fourCC("W64f"), 24},
    {"pcm.au", "ffmpeg -i source.wav -c:a pcm_s16be pcm.au", fourCC("lpcm"), fourCC("NeXT"), 16},
    {"tta.tta", "ffmpeg -i source.wav tta.tta", fourCC("tta "), fourCC("tta "), 16},
    {"wavpack.wv", "ffmpeg -i source.wav wavpack.wv", fourCC("wvpk"), fourCC("wvpk"), 16},
    {"wma.wma", "ffmpeg -i source.wav -c:a wmav2 -b:a 128k wma.wma", fourCC('m', 's', 1, 0x61), fourCC("asf "), 0,
     Length::encoder},
    {"mp2.mp2", "ffmpeg -i source.wav -b:a 192k mp2.mp2", fourCC(".mp2"), fourCC("MPG2"), 0, Length::encoder},
    {"ac3.ac3", "ffmpeg -i source.wav -b:a 640k ac3.ac3", fourCC("ac-3"), fourCC("ac-3"), 0, Length::encoder, kNoisy},
    {"flac.mka", "ffmpeg -i source.wav -c:a flac flac.mka", fourCC("flac"), fourCC("mkv "), 16},
    {"vorbis.mka", "ffmpeg -i source.wav -c:a libvorbis vorbis.mka", fourCC("vorb"), fourCC("mkv "), 0,
     Length::encoder},
    {"opus.mka", "ffmpeg -i source.wav -c:a libopus opus.mka", fourCC("opus"), fourCC("mkv "), 0, Length::kept,
     kSettled, 2, 48000},
    {"mp3.mka", "ffmpeg -i source.wav -c:a libmp3lame mp3.mka", fourCC(".mp3"), fourCC("mkv "), 0, Length::encoder},
    {"video.mkv",
     "ffmpeg -i source.wav -f lavfi -i testsrc=size=64x48:rate=5 -shortest -c:v mpeg4 -c:a ac3 -b:a 640k "
     "video.mkv",
     fourCC("ac-3"), fourCC("mkv "), 0, Length::encoder, kNoisy},
};

std::string testIdentifier(const testing::TestParamInfo<Format>& test)
{
    std::string name = test.param.name;
    for (char& c : name)
        if (!std::isalnum(static_cast<unsigned char>(c)))
            c = '_';
    return name;
}

class Formats : public testing::TestWithParam<Format> {
protected:
    void SetUp() override
    {
        const Format& format = GetParam();
        const int bits = format.bits == 24 ? 24 : 16;
        writeSound(folder_ / "source.wav", kFrames, format.channels, format.rate, bits);
        ASSERT_TRUE(runs(folder_, format.command)) << "not made: scripts/setup test";
        std::int32_t status = 0;
        reader_ = openReader(folder_ / format.name, &status);
        ASSERT_TRUE(reader_) << status;
    }

    TemporaryFolder folder_;
    std::unique_ptr<ConvertingReader> reader_;
};

void expectNear(const Bytes& found, BytesView expected, float tolerance, std::uint64_t frame)
{
    ASSERT_EQ(found.size(), expected.size()) << "from frame " << frame;
    if (tolerance == kExact) {
        EXPECT_EQ(std::memcmp(found.data(), expected.data(), found.size()), 0) << "from frame " << frame;
        return;
    }
    float worst = 0;
    for (std::size_t i = 0; i + sizeof(float) <= found.size(); i += sizeof(float)) {
        float a, b;
        std::memcpy(&a, found.data() + i, sizeof a);
        std::memcpy(&b, expected.data() + i, sizeof b);
        worst = std::max(worst, std::abs(a - b));
    }
    EXPECT_LE(worst, tolerance) << "from frame " << frame;
}

/// Distance of `found`, shifted by `lag` frames, from `expected`; first channel, in the middle.
double distance(const std::vector<float>& found, const std::vector<float>& expected, int lag, std::uint32_t channels)
{
    double sum = 0;
    for (std::size_t i = 100'000; i < 104'000; ++i) {
        const auto moved = static_cast<std::size_t>(static_cast<std::ptrdiff_t>(i) + lag);
        const double difference = found[i * channels] - expected[moved * channels];
        sum += difference * difference;
    }
    return sum;
}

} // namespace

TEST_P(Formats, DescribesItself)
{
    const Format& format = GetParam();
    const StreamDescription& file = reader_->fileFormat();
    const StreamDescription& frames = reader_->clientFormat();
    EXPECT_EQ(fourCCText(file.formatId), fourCCText(format.formatId));
    EXPECT_EQ(file.sampleRate, format.rate);
    EXPECT_EQ(file.channelsPerFrame, format.channels);
    EXPECT_EQ(frames.sampleRate, format.rate);
    EXPECT_EQ(frames.channelsPerFrame, format.channels);
    if (format.bits > 0) {
        EXPECT_EQ(file.bitsPerChannel, format.bits);
        EXPECT_EQ(frames.bitsPerChannel, format.bits);
    }
    AudioHandle* handle = nullptr;
    std::uint32_t size = sizeof handle;
    ASSERT_EQ(reader_->property(ConvertingReader::audioFileProperty, size, &handle), 0);
    FourCC type = 0;
    size = sizeof type;
    ASSERT_EQ(handle->property(AudioFile::fileTypeProperty, size, &type), 0);
    EXPECT_EQ(fourCCText(type), fourCCText(format.fileType));
    StreamDescription again;
    size = sizeof again;
    EXPECT_EQ(handle->property(AudioFile::dataFormatProperty, size, &again), 0);
    EXPECT_EQ(again, file);
    EXPECT_EQ(handle->property(fourCC("none"), size, &again), AudioFile::kUnsupportedProperty);
}

TEST_P(Formats, HasTheFramesThatWentIn)
{
    const Format& format = GetParam();
    const Bytes all = allFramesOf(*reader_, 4096);
    const std::uint32_t frameSize = reader_->clientFormat().bytesPerFrame;
    EXPECT_EQ(all.size() / frameSize, reader_->frameCount());
    EXPECT_EQ(reader_->missingFrames(), 0u);
    EXPECT_TRUE(framesOf(*reader_, reader_->frameCount(), 10).empty());
    EXPECT_TRUE(framesOf(*reader_, reader_->frameCount() + (1u << 30), 10).empty());
    if (format.length == Length::kept) {
        EXPECT_EQ(reader_->frameCount(), kFrames);
    }
    EXPECT_GE(reader_->frameCount(), format.length == Length::whole ? kFrames : kFrames - 2000);
    EXPECT_LT(reader_->frameCount(), kFrames + 5000);

    const std::vector<float> expected = sound(kFrames, format.channels, format.rate);
    if (format.bits > 0) {
        Bytes stored(expected.size() * format.bits / 8);
        floatToSamples(expected.data(), reader_->clientFormat().sampleFormat(), stored.data(), expected.size());
        EXPECT_EQ(all, stored);
    } else if (format.length != Length::encoder) {
        std::vector<float> found(all.size() / frameSize * format.channels);
        samplesToFloat(all.data(), reader_->clientFormat().sampleFormat(), found.data(), found.size());
        const double inPlace = distance(found, expected, 0, format.channels);
        for (const int lag : {-1152, -1105, -1024, -576, -529, -312, -64, -1, 1, 64, 312, 529, 576, 1024, 1105, 1152})
            EXPECT_LT(inPlace, distance(found, expected, lag, format.channels)) << lag;
    }
}

TEST_P(Formats, GivesAfterASeekWhatADecodeFromTheStartGives)
{
    const Format& format = GetParam();
    const Bytes all = allFramesOf(*reader_, 1000);
    const std::uint32_t frameSize = reader_->clientFormat().bytesPerFrame;
    const std::uint64_t count = all.size() / frameSize;
    std::mt19937 random(9);
    const auto expectAt = [&](ConvertingReader& reader, std::uint64_t frame, std::uint32_t frames) {
        const std::uint64_t there = std::min<std::uint64_t>(frames, count - frame);
        expectNear(framesOf(reader, frame, frames), BytesView(all).subspan(frame * frameSize, there * frameSize),
                   format.tolerance, frame);
    };
    for (int i = 0; i < 60; ++i)
        expectAt(*reader_, random() % count, static_cast<std::uint32_t>(1 + random() % 3000));
    for (const std::uint64_t frame :
         {std::uint64_t{0}, count - 1, std::uint64_t{1}, count / 2, count / 2 + 5000, count / 2 + 4000})
        expectAt(*reader_, frame, 2500);
    // The first operation on a newly opened file is a seek.
    const auto fresh = openReader(folder_ / format.name);
    ASSERT_TRUE(fresh);
    expectAt(*fresh, count - 7000, 100);
}

INSTANTIATE_TEST_SUITE_P(All, Formats, testing::ValuesIn(formats), testIdentifier);

// In files of one page FFmpeg counts the first packet, which yields no frames, and cuts that many off the end.
TEST(ShortFiles, VorbisOfOnePageKeepsItsEnd)
{
    const TemporaryFolder folder;
    for (const std::uint32_t frames : {44u, 4410u, 44100u}) {
        writeSound(folder / "source.wav", frames, 1, 44100, 16);
        ASSERT_TRUE(runs(folder, "ffmpeg -y -i source.wav -c:a libvorbis short.ogg"));
        const auto reader = openReader(folder / "short.ogg");
        ASSERT_TRUE(reader);
        EXPECT_EQ(reader->frameCount(), frames);
        EXPECT_EQ(allFramesOf(*reader, 1000).size(), std::size_t{frames} * reader->clientFormat().bytesPerFrame);
    }
}
