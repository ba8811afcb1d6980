#include "loops/overview/AudioRepresentation.h"

#include "OverviewImages.h"
#include "support/TemporaryFolder.h"

#include <gtest/gtest.h>

namespace {

constexpr platform::SampleFormat kFloats{32, true, false, std::endian::native};

TEST(AudioRepresentation, NothingComesOfWhatIsNoOverview)
{
    KTMem none;
    const KTMem header = blockOf(fromHex("0000000000000000"));
    const KTMem pointMissing = blockOf(300, {{0, 1}});
    KTMem negative(OverviewBlockSize(std::int64_t{1} << 31)); // read as int32
    SetOverviewFrames(negative, std::int64_t{1} << 31);
    for (const KTMem* block : std::initializer_list<const KTMem*>{nullptr, &none, &header, &pointMissing, &negative})
        EXPECT_EQ(AudioRepresentation::initWithOverview(block, 44100), nullptr);
}

TEST(AudioRepresentation, OfAnOverviewHasItsPointsForTheOneChannel)
{
    const KTMem block = blockOf(300, {{-3, 64}, {-127, 127}});
    const auto representation = AudioRepresentation::audioRepresentationWithOverview(&block, 48000);
    ASSERT_NE(representation, nullptr);
    EXPECT_EQ(representation->frames(), 300);
    EXPECT_EQ(representation->sampleRate(), 48000);
    ASSERT_EQ(representation->overviewBuffers().size(), 2u);
    for (const auto& buffers : representation->overviewBuffers()) {
        EXPECT_EQ(buffers.minima, (std::vector<float>{-3 / 128.F, -127 / 128.F}));
        EXPECT_EQ(buffers.maxima, (std::vector<float>{64 / 128.F, 127 / 128.F}));
    }
    EXPECT_TRUE(representation->samples(0).empty());
}

TEST(AudioRepresentation, ReadsTheSamplesOfAFile)
{
    const TemporaryFolder folder;
    std::vector<float> interleaved(3 * 257);
    interleaved[0] = 0.5F;            // first channel, first point
    interleaved[3 * 256 + 1] = -1.5F; // second channel, second point
    interleaved[3 * 256 + 2] = 1.25F; // third
    const auto bytes = std::as_bytes(std::span(interleaved));
    const CFileRef ref(folder.write("a.caf", imageOf(kFloats, 3, bytes)).c_str(), false);
    const auto open = AudioRepresentation::newAudioRepresentationUsingCAudioFileIOWithFileURL;
    const auto three = open(ref.URL());
    ASSERT_NE(three, nullptr);
    EXPECT_EQ(three->frames(), 257);
    EXPECT_EQ(three->sampleRate(), 44100);
    EXPECT_EQ(*three->fileURL(), *ref.URL());
    ASSERT_EQ(three->overviewBuffers().size(), 3u);
    EXPECT_EQ(three->overviewBuffers()[0].minima, (std::vector<float>{0, -1.5F}));
    EXPECT_EQ(three->overviewBuffers()[0].maxima, (std::vector<float>{0.5F, 1.25F}));
    EXPECT_EQ(three->overviewBuffers()[1].maxima, (std::vector<float>{0.5F, 0}));
    EXPECT_EQ(three->overviewBuffers()[2].minima, (std::vector<float>{0, -1.5F}));
    EXPECT_EQ(three->samples(2)[256], 1.25F);
    EXPECT_EQ(three->samples(2).size(), 257u);
    EXPECT_TRUE(three->samples(3).empty());

    const auto mono = open(CFileRef(folder.write("b.caf", imageOf(kFloats, 1, bytes)).c_str(), false).URL());
    ASSERT_NE(mono, nullptr);
    EXPECT_TRUE(std::ranges::equal(mono->samples(0), interleaved));
    EXPECT_EQ(mono->overviewBuffers().size(), 2u);
    EXPECT_EQ(mono->overviewBuffers()[0].minima, mono->overviewBuffers()[1].minima);
}

} // namespace
