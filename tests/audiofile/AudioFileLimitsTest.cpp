#include "audiofile/AudioFileLimits.h"

#include "media/containers/ContainerHeaders.h"

#include <gtest/gtest.h>

namespace {

TEST(AudioFileLimits, GuessesBeats)
{
    const struct {
        std::int64_t rate, frames;
        int count;
        float beats, beatCount = 0;
        int timingFlag = 0;
    } cases[] = {
        {44100, 88200, 1, 8},             // 240 beats per minute, halved
        {44100, 44100 * 240 / 140, 1, 8}, // the shortest: 280, halved to 140
        {44100, 44100 * 240 / 140 - 1, 1, 0},
        {44100, 44100 * 60, 1, 256}, // the longest: 8, doubled four times to 128
        {44100, 44100 * 60 + 1, 1, 0},
        {44100, 44100 * 8, 1, 32}, // 60, doubled to 120
        {44100, 88200, -3, 0},
        {INT64_MAX, INT64_MAX, 1, 0},
        {44100, 88200, 1, 0, 4},    // it is known
        {44100, 88200, 1, 0, 0, 1}, // it is no loop
    };
    for (const auto& expected : cases) {
        AudioFileInfo info;
        info.sampleRate = expected.rate;
        info.frames = expected.frames;
        info.beatCount = expected.beatCount;
        info.timingFlag = expected.timingFlag;
        EXPECT_EQ(CalculateBeatCountForFile(&info, expected.count, 0), expected.beats)
            << expected.rate << ' ' << expected.frames << ' ' << expected.count;
    }
}

TEST(AudioFileLimits, SizesAndFrames)
{
    EXPECT_EQ(MaxAudioFileSize(kAIFF, true), 0x7F000000);
    EXPECT_EQ(MaxAudioFileSize(kWAVE, false), 0xFE000000);
    EXPECT_EQ(MaxAudioFileSize(kWAVE, true), 0x7F00000000);
    EXPECT_EQ(MaxAudioFileSize(kCaff, false), 0x7F00000000);
    const struct {
        FourCC type;
        int bits, busFormat;
        std::uint64_t frames;
    } cases[] = {
        {kAIFF, 16, 2, 532'676'608},
        {kAIFF, 16, 0, 0},
        {kAIFF, 16, 15, 0},
        {kAIFF, 4, 1, 0},
        {kAIFF, 24, 5, 0x7F000000 / 18},
        {kCaff, 8, 1, 0x7FFFFFFF},
        {kWAVE, 32, 14, 0x7FFFFFFF},
        {kCaff, 64, 14, 0x7FFFFFFF},
        {kWAVE, 64, 14, 0x7FFFFFFF}, // not the limit of WAVE files
    };
    for (const auto& each : cases)
        EXPECT_EQ(MaxNumberOfFramesInAudioFile(static_cast<int>(each.type), each.bits, each.busFormat), each.frames)
            << fourCCText(each.type) << ' ' << each.bits << ' ' << each.busFormat;
    const int channels[] = {0, 1, 2, 4, 4, 6, 7, 8, 8, 8, 8, 10, 10, 12, 14, 0};
    for (int format = 0; format < 16; ++format)
        EXPECT_EQ(AudioBusFormatChannels(format), channels[format]) << format;
}

TEST(AudioFileLimits, BytesAreSwappedByTheFirstRuleThatMatches)
{
    const struct {
        const char* type;
        int bits;
        const char* code;
        bool swaps;
    } cases[] = {
        {"WAVE", 8, "COMP", false},  {"WAVE", 8, "lpcm", true},   {".WAV", 8, "lpcm", true},
        {"AIFF", 8, "lpcm", false},  {"AIFF", 16, "COMP", false}, {"AIFF", 16, "sowt", false},
        {"caff", 16, "sowt", true},  {"AIFF", 16, "lpcm", true},  {"WAVE", 16, "lpcm", false},
        {".WAV", 24, "lpcm", false}, {"caff", 16, "mcpl", false}, {"caff", 32, "23lf", false},
        {"caff", 16, "lpcm", true},  {"AIFF", 32, "23lf", true},  {"AIFF", 16, "mcpl", true},
    };
    const auto code = [](const char* text) { return loadBE<FourCC>(reinterpret_cast<const std::byte*>(text)); };
    for (const auto& each : cases)
        EXPECT_EQ(AudioFileDataNeedsSwap(code(each.type), each.bits, code(each.code)), each.swaps)
            << each.type << ' ' << each.bits << ' ' << each.code;
}

TEST(AudioFileLimits, TheTempoIsCountedInFiveThousandths)
{
    AudioFileInfo info;
    info.beatCount = 8;
    info.frames = 4 * 44100;
    EXPECT_EQ(info.VireoLoopTempo(), 120 * 5000u);
    info.frames = 4 * 44100 + 1;
    EXPECT_EQ(info.VireoLoopTempo(), 599996u); // cut, not rounded
    info.beatCount = 1e6F;
    info.frames = 44100;
    EXPECT_EQ(info.VireoLoopTempo(), static_cast<std::uint32_t>(300'000'000'000)); // the low 32 bits
}

} // namespace
