#include "loops/overview/MDOverview.h"

#include "OverviewImages.h"

#include <gtest/gtest.h>

#include <limits>

namespace {

using Samples = std::vector<std::int8_t>;

// The points of 8-bit samples added at once, in a block of their size.
Points pointsOfBytes(const Samples& samples, int channels)
{
    const long frames = static_cast<long>(samples.size()) / channels;
    KTMem block(OverviewBlockSize(frames));
    MDOverview overview(&block);
    overview.Add(samples.data(), 0, frames, channels, 1, 0);
    return pointsOf(*overview.Finalize());
}

Samples ramp()
{
    Samples samples(3 * 256);
    for (std::size_t i = 0; i < samples.size(); ++i)
        samples[i] = static_cast<std::int8_t>(i / 4);
    return samples;
}

// One sample of 100 in silence.
Samples click(std::size_t at)
{
    Samples samples(2 * 256);
    samples[at] = 100;
    return samples;
}

Samples alternating(std::size_t count, std::int8_t even, std::int8_t odd)
{
    Samples samples(count);
    for (std::size_t i = 0; i < count; ++i)
        samples[i] = i % 2 == 0 ? even : odd;
    return samples;
}

TEST(MDOverview, KnownPicturesOfKnownSignals)
{
    const struct {
        const char* name;
        Samples samples;
        int channels;
        Points points;
    } cases[] = {
        {"square", alternating(512, -90, 90), 1, {{-90, 90}, {-90, 90}}},
        {"ramp", ramp(), 1, {{0, 63}, {0, 127}, {-128 + 1, 0}}},
        {"always above zero", Samples(256, 50), 1, {{0, 50}}},
        {"click, first of a point", click(256), 1, {{0, 0}, {0, 100}}},
        {"click, last of a point", click(255), 1, {{0, 100}, {0, 0}}},
        {"full-scale negative", Samples(300, -128), 1, {{-127, 0}, {-127, 0}}},
        {"left only", alternating(4, 60, 0), 2, {{0, 60}}},
        {"right only, full scale", alternating(600, 0, -128), 2, {{-127, 0}, {-127, 0}}},
        {"left full-scale negative", alternating(2, -128, 1), 2, {{-1, 127}}},
        {"three channels are folded", {1, -2, 30, 4, -50, 6}, 3, {{-50, 30}}},
    };
    for (const auto& [name, samples, channels, points] : cases)
        EXPECT_EQ(pointsOfBytes(samples, channels), points) << name;
}

TEST(MDOverview, TakesTheFirstOrTheLastByteOfAStride)
{
    const Samples samples{10, 20, 30, 40, 50, 60}; // two samples of three bytes
    for (const auto& [firstByte, maximum] : {std::pair{0, 60}, {1, 40}, {7, 40}}) {
        KTMem block(10);
        MDOverview overview(&block);
        overview.Add(samples.data(), 0, 2, 1, 3, firstByte);
        EXPECT_EQ(pointsOf(block), (Points{{0, maximum}})) << firstByte;
    }
}

TEST(MDOverview, WhatIsBeyondTheBlockIsDropped)
{
    const Samples samples(2000, 9);
    const std::vector<float> floats(5000, 0.5F);
    KTMem block(OverviewBlockSize(512));
    MDOverview overview(&block);
    overview.Add(samples.data(), 400, 2000, 1, 1, 0);
    EXPECT_EQ(pointsOf(block), (Points{{0, 0}, {0, 9}}));
    EXPECT_EQ(OverviewFrames(block), 512u);
    overview.Add(samples.data(), 3 * 256, 1, 1, 1, 0); // not even counted
    overview.Add(samples.data(), std::numeric_limits<long>::max(), 1, 1, 1, 0);
    overview.Add(samples.data(), -1, 1, 1, 1, 0);
    overview.Finalize();
    EXPECT_EQ(OverviewFrames(block), 2400u);
    EXPECT_EQ(block.size(), OverviewBlockSize(512));

    // The unused rest of a block is returned.
    KTMem large(OverviewBlockSize(1000));
    MDOverview early(&large);
    early.Add(samples.data(), 0, 300, 1, 1, 0);
    EXPECT_EQ(early.Finalize()->size(), OverviewBlockSize(300));

    // In slices of 2,048 the second one begins beyond it.
    MDOverview sliced(&block);
    sliced.Add(floats.data(), 0, 5000, 1);
    sliced.Finalize();
    EXPECT_EQ(OverviewFrames(block), 2048u);
}

TEST(MDOverview, RoundsHalfToEvenClampsAndPassesOverNaN)
{
    constexpr float infinity = std::numeric_limits<float>::infinity();
    constexpr float nan = std::numeric_limits<float>::quiet_NaN();
    const struct {
        float sample;
        int value;
    } cases[] = {{0.5F, 64},        {0.5F / 128, 0},       {1.5F / 128, 2}, {2.5F / 128, 2}, {0.50001F / 128, 1},
                 {-1.5F / 128, -2}, {-126.5F / 128, -126}, {1.0F, 127},     {-1.0F, -127},   {126.6F / 128, 127},
                 {infinity, 127},   {-infinity, -127},     {nan, 0},        {3e38F, 127}};
    for (const auto& [sample, value] : cases) {
        KTMem block(10);
        MDOverview overview(&block);
        overview.Add(&sample, 0, 1, 1);
        EXPECT_EQ(pointsOf(block), (Points{{std::min(value, 0), std::max(value, 0)}})) << sample;
    }
}

TEST(MDOverview, TheRoughPictureFollowsTheExactOneAndDecays)
{
    KTMem block(OverviewBlockSize(256 * 20));
    MDOverview overview(&block);
    std::vector<float> samples(256, 0.5F);
    overview.AddRough(samples.data(), 256); // nothing exact yet
    EXPECT_EQ(pointsOf(block).front(), (std::pair{0, 0}));

    overview.Add(samples.data(), 0, 100, 1);
    samples[3] = std::numeric_limits<float>::quiet_NaN();
    overview.AddRough(samples.data(), 256); // frames 100 to 355: raises no exact point that is higher
    EXPECT_EQ(pointsOf(block)[0], (std::pair{0, 64}));
    EXPECT_EQ(pointsOf(block)[1], (std::pair{-63, 63}));
    EXPECT_EQ(OverviewFrames(block), 512u);

    const std::vector<float> quiet(256, -0.9F); // only what is above zero counts
    for (int call = 0; call < 16; ++call)
        overview.AddRough(quiet.data(), 256);
    EXPECT_EQ(pointsOf(block)[16], (std::pair{-63, 63})); // the running peak
    EXPECT_EQ(pointsOf(block)[17], (std::pair{0, 0}));    // which the 17th call forgets
    const std::vector<float> loud(256 * 9, 7.0F);
    overview.AddRough(loud.data(), 256 * 9); // to the end of the block and no further
    EXPECT_EQ(pointsOf(block)[19], (std::pair{-127, 127}));
    EXPECT_EQ(OverviewFrames(block), 20u * 256);

    overview.Add(loud.data(), 100, 256 * 9, 1); // the exact pass takes its points back
    EXPECT_EQ(pointsOf(block)[1], (std::pair{0, 127}));
    EXPECT_EQ(pointsOf(block)[8], (std::pair{0, 127}));
}

} // namespace
