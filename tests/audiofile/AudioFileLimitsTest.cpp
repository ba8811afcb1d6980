#include "audiofile/AudioFileLimits.h"

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

} // namespace
