// The frames that the tables call sound are those that the encoder received.
#include "media/packets/EncodedFiles.h"

#include <gtest/gtest.h>

using namespace platform;

namespace {

struct Coding {
    const char* command;
    const char* extension;
    FourCC fileType, formatId;
    std::uint32_t framesPerPacket; // at 44,100 Hz and above
};

constexpr Coding kLAME{"lame --quiet IN OUT", "mp3", fourCC("MPG3"), fourCC(".mp3"), 1152};
constexpr Coding kAACInMP4{"ffmpeg -y -i IN -c:a aac OUT", "m4a", fourCC("m4af"), fourCC("aac "), 1024};

// These state the number of frames exactly.
constexpr Coding kExact[] = {
    kLAME,
    {"lame --quiet -V4 IN OUT", "mp3", fourCC("MPG3"), fourCC(".mp3"), 1152},
    {"lame --quiet --abr 160 -p IN OUT", "mp3", fourCC("MPG3"), fourCC(".mp3"), 1152},
    kAACInMP4,
    {"ffmpeg -y -i IN -c:a aac -movflags +faststart OUT", "mp4", fourCC("mp4f"), fourCC("aac "), 1024},
    {"ffmpeg -y -i IN -c:a aac OUT", "mov", fourCC("mp4f"), fourCC("aac "), 1024},
    {"ffmpeg -y -i IN -c:a alac OUT", "m4a", fourCC("m4af"), fourCC("alac"), 4096},
    {"ffmpeg -y -i IN -c:a alac OUT", "mov", fourCC("mp4f"), fourCC("alac"), 4096},
    {"ffmpeg -y -i IN -c:a alac OUT", "caf", fourCC("caff"), fourCC("alac"), 4096},
};

void expectConsistent(const PacketSource& source)
{
    const PacketTable& table = source.table();
    if (table.validFrames > 0) {
        EXPECT_EQ(static_cast<std::uint64_t>(table.validFrames + table.primingFrames + table.remainderFrames),
                  source.packetCount() * source.format().framesPerPacket);
    }
}

void expectExact(const Coding& coding, const Sound& sound)
{
    SCOPED_TRACE(std::string(coding.command) + " ." + coding.extension + " " + std::to_string(sound.frames) +
                 " frames at " + std::to_string(sound.rate) + " Hz");
    const auto source = opened(encoded(coding.command, coding.extension, sound));
    ASSERT_TRUE(source);
    EXPECT_EQ(source->fileType(), coding.fileType);
    EXPECT_EQ(source->format().formatId, coding.formatId);
    EXPECT_EQ(source->format().sampleRate, sound.rate);
    EXPECT_EQ(source->format().channelsPerFrame, sound.channels);
    EXPECT_EQ(source->table().validFrames, sound.frames);
    if (sound.rate >= 44100) {
        EXPECT_EQ(source->format().framesPerPacket, coding.framesPerPacket);
    }
    expectConsistent(*source);
    Bytes packet;
    EXPECT_NE(source->read(source->packetCount(), packet), 0);
    if (source->packetCount() > 0) {
        EXPECT_EQ(source->read(source->packetCount() - 1, packet), 0);
        EXPECT_FALSE(packet.empty());
    }
}

} // namespace

TEST(FrameCount, ofEveryLength)
{
    for (const Coding& coding : kExact)
        for (const std::uint32_t frames : {1U, 1151U, 1152U, 44100U, 100003U})
            expectExact(coding, {.frames = frames});
}

TEST(FrameCount, ofEveryRateAndChannelCount)
{
    for (const std::uint32_t rate : {8000U, 16000U, 22050U, 32000U, 48000U})
        for (const std::uint32_t channels : {1U, 2U}) {
            const Sound sound{.frames = 30011, .rate = rate, .channels = channels};
            expectExact({"lame --quiet -V2 IN OUT", "mp3", fourCC("MPG3"), fourCC(".mp3"), 1152}, sound);
            expectExact(kAACInMP4, sound);
        }
    expectExact({"ffmpeg -y -i IN -c:a alac OUT", "m4a", fourCC("m4af"), fourCC("alac"), 4096},
                {.frames = 30011, .rate = 96000, .channels = 6});
}

TEST(FrameCount, ofNoFramesAtAll)
{
    const Sound nothing{.frames = 0};
    expectExact(kLAME, nothing);
    expectExact({"ffmpeg -y -i IN -c:a libmp3lame OUT", "mp3", fourCC("MPG3"), fourCC(".mp3"), 1152}, nothing);
    EXPECT_EQ(refusal(encoded(kAACInMP4.command, "m4a", nothing)), AudioHandle::kFormatNotSupported); // has no track
}
