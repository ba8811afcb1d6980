// Tags of AIFF files as libsndfile reads them.
#include "LoopFiles.h"
#include "audiofile/SoundFile.h"

namespace {

SoundFile openSound(const std::string& path)
{
    SF_INFO info{};
    SoundFile file(sf_open(path.c_str(), SFM_READ, &info));
    EXPECT_TRUE(file != nullptr) << sf_strerror(nullptr);
    EXPECT_EQ(info.frames, 8);
    EXPECT_EQ(info.samplerate, 44100);
    return file;
}

std::string textIn(const SoundFile& file, int kind)
{
    const char* text = sf_get_string(file.get(), kind);
    return text != nullptr ? text : "";
}

} // namespace

TEST(Sndfile, ReadsLoopInformationAndTexts)
{
    const TemporaryFolder folder;
    for (const bool isAhead : {false, true}) {
        const Chunks other{{fourCC("APPL"), "other"}};
        const std::string path = folder.write("loop.aiff", audioFile(kAIFF, other, isAhead));
        for (const std::size_t length : {9u, 30u, 4u}) { // a new file, and edits of one that has tags
            ASSERT_TRUE(manage(path).writeChunks(everyKind(length)));
            const Tags tags = tagsOf(path);
            const SoundFile file = openSound(path);
            SF_LOOP_INFO loop{};
            ASSERT_EQ(sf_command(file.get(), SFC_GET_LOOP_INFO, &loop, sizeof loop), SF_TRUE);
            EXPECT_EQ(std::to_string(loop.num_beats), tags.at("BeatCount"));
            EXPECT_EQ(std::to_string(loop.time_sig_num), tags.at("SignatureTop"));
            EXPECT_EQ(std::to_string(loop.time_sig_den), tags.at("SignatureBottom"));
            EXPECT_EQ(std::to_string(loop.root_key), tags.at("MidiRootNote"));
            EXPECT_EQ(textIn(file, SF_STR_TITLE), tags.at("Title"));
            EXPECT_EQ(textIn(file, SF_STR_ARTIST), tags.at("Artist"));
            EXPECT_EQ(textIn(file, SF_STR_COPYRIGHT), tags.at("Copyright"));

            short samples[9] = {};
            EXPECT_EQ(sf_readf_short(file.get(), samples, 9), 8);
            EXPECT_EQ(samples[0], 0x0102);
            EXPECT_EQ(samples[7], 0x0F10);
        }
        ASSERT_TRUE(manage(path).removeChunks(VireoLoopChunks::Empty()));
        const SoundFile file = openSound(path);
        SF_LOOP_INFO loop{};
        EXPECT_EQ(sf_command(file.get(), SFC_GET_LOOP_INFO, &loop, sizeof loop), SF_FALSE);
        EXPECT_EQ(textIn(file, SF_STR_TITLE), "");
    }
}
