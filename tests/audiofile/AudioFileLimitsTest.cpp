#include "audiofile/AudioFileLimits.h"

#include <gtest/gtest.h>

namespace {

constexpr FourCC kAIFF = fourCC("AIFF");
constexpr FourCC kWAVE = fourCC("WAVE");
constexpr FourCC kCAF = fourCC("caff");

TEST(AudioFileLimits, BytesOfAFile)
{
    EXPECT_EQ(MaxAudioFileSize(kAIFF, false), 2130706432);
    EXPECT_EQ(MaxAudioFileSize(kAIFF, true), 2130706432);
    EXPECT_EQ(MaxAudioFileSize(kWAVE, false), 4261412864);
    EXPECT_EQ(MaxAudioFileSize(kWAVE, true), 0x7F00000000);
    EXPECT_EQ(MaxAudioFileSize(fourCC(".WAV"), false), 0x7F00000000);
    EXPECT_EQ(MaxAudioFileSize(kCAF, false), 0x7F00000000);
}

TEST(AudioFileLimits, FramesOfAFile)
{
    const auto frames = [](FourCC type, int bits, int bus) {
        return MaxNumberOfFramesInAudioFile(static_cast<int>(type), bits, bus);
    };
    EXPECT_EQ(frames(kAIFF, 16, 2), 532676608U);
    EXPECT_EQ(frames(kAIFF, 16, 0), 0U);
    EXPECT_EQ(frames(kAIFF, 16, 15), 0U);
    EXPECT_EQ(frames(kAIFF, 24, 1), 0x7F000000U / 3);
    EXPECT_EQ(frames(kAIFF, 4, 2), 0U);
    EXPECT_EQ(frames(kAIFF, -32, 2), 0U);
    EXPECT_EQ(frames(kCAF, 8, 1), 0x7FFFFFFFU);
    EXPECT_EQ(frames(kWAVE, 32, 14), 0x7FFFFFFFU); // the limit of WAVE is not applied
    const int channels[] = {0, 1, 2, 4, 4, 6, 7, 8, 8, 8, 8, 10, 10, 12, 14, 0};
    for (int bus = 0; bus < 16; ++bus)
        EXPECT_EQ(AudioBusFormatChannels(bus), channels[bus]) << bus;
    EXPECT_EQ(AudioBusFormatChannels(-1), 0);
}

TEST(AudioFileLimits, SwapsByTheFirstRuleThatMatches)
{
    struct Case {
        const char* type;
        int bits;
        const char* code;
        bool swaps;
    };
    const Case cases[] = {
        {"WAVE", 8, "COMP", false},  {"AIFF", 16, "COMP", false}, {"AIFF", 8, "NONE", false},
        {"WAVE", 8, "lpcm", true},   {".WAV", 8, "lpcm", true},   {"caff", 8, "mcpl", false},
        {"AIFF", 16, "sowt", false}, {"caff", 16, "sowt", true},  {"WAVE", 16, "lpcm", false},
        {".WAV", 24, "lpcm", false}, {"caff", 24, "mcpl", false}, {"caff", 32, "23lf", false},
        {"caff", 24, "lpcm", true},  {"caff", 32, "fl32", true},  {"AIFF", 16, "mcpl", true},
        {"AIFF", 24, "NONE", true},
    };
    const auto code = [](const char* text) { return fourCC(text[0], text[1], text[2], text[3]); };
    for (const Case& expected : cases)
        EXPECT_EQ(AudioFileDataNeedsSwap(code(expected.type), expected.bits, code(expected.code)), expected.swaps)
            << expected.type << ' ' << expected.bits << ' ' << expected.code;
}

TEST(AudioFileLimits, GuessesBeats)
{
    struct Case {
        std::int64_t rate, frames;
        int count;
        float beats;
    };
    const Case cases[] = {
        {44100, 88200, 1, 8},             // 240 beats per minute, halved
        {44100, 44100 * 240 / 140, 1, 8}, // the shortest: 280, halved to 140
        {44100, 44100 * 240 / 140 - 1, 1, 0},
        {44100, 44100 * 60, 1, 256}, // the longest: 8, doubled four times to 128
        {44100, 44100 * 60 + 1, 1, 0},
        {44100, 44100 * 8, 1, 32}, // 60, doubled to 120
        {48000, 329143, 1, 32},    // just below 70: doubled
        {48000, 329142, 1, 16},    // just above 70: kept
        {44100, 88200, 0, 0},
        {44100, 88200, -3, 0},
        {0, 0, 1, 0},
        {INT64_MAX, INT64_MAX, 1, 0},
        {-44100, 88200, 1, 0},
    };
    for (const Case& expected : cases) {
        AudioFileInfo info;
        info.sampleRate = expected.rate;
        info.frames = expected.frames;
        EXPECT_EQ(CalculateBeatCountForFile(&info, expected.count, 0), expected.beats)
            << expected.rate << ' ' << expected.frames << ' ' << expected.count;
    }
    AudioFileInfo info;
    info.frames = 88200;
    info.timingFlag = 1;
    EXPECT_EQ(CalculateBeatCountForFile(&info, 1, 0), 0);
    info.timingFlag = 0;
    info.beatCount = 4;
    EXPECT_EQ(CalculateBeatCountForFile(&info, 1, 0), 0);
}

} // namespace
