// Instruments, loops and markers in WAVE files of libsndfile.
#include "loops/SamplerTags.h"
#include "LoopFiles.h"
#include "audiofile/SoundFile.h"

TEST(SamplerTags, ReadsWhatLibsndfileWrites)
{
    const TemporaryFolder folder;
    for (const int format : {SF_FORMAT_WAV, SF_FORMAT_WAVEX}) {
        const std::string path = (folder.path() / "loop").string();
        SF_INFO info{};
        info.samplerate = 44100;
        info.channels = 1;
        info.format = format | SF_FORMAT_PCM_16;
        {
            const SoundFile file(sf_open(path.c_str(), SFM_WRITE, &info));
            ASSERT_TRUE(file != nullptr) << sf_strerror(nullptr);
            SF_INSTRUMENT instrument{};
            instrument.basenote = 57;
            instrument.velocity_hi = instrument.key_hi = 127;
            instrument.loop_count = 1;
            instrument.loops[0].mode = SF_LOOP_FORWARD;
            instrument.loops[0].start = 10;
            instrument.loops[0].end = 90; // of "smpl" the frame behind the loop
            SF_CUES cues{};
            cues.cue_count = 2;
            for (unsigned i = 0; i < cues.cue_count; ++i) {
                cues.cue_points[i].indx = static_cast<int>(i + 1);
                cues.cue_points[i].position = cues.cue_points[i].sample_offset = 20 * (i + 1);
                cues.cue_points[i].fcc_chunk = 0x61746164;
            }
            ASSERT_EQ(sf_set_string(file.get(), SF_STR_TITLE, "Ten"), 0);
            ASSERT_EQ(sf_command(file.get(), SFC_SET_INSTRUMENT, &instrument, sizeof instrument), SF_TRUE);
            ASSERT_EQ(sf_command(file.get(), SFC_SET_CUE, &cues, sizeof cues), SF_TRUE);
            const std::vector<short> samples(100, 7);
            ASSERT_EQ(sf_writef_short(file.get(), samples.data(), 100), 100);
        }
        VireoLoopChunksManager manager = manage(path, false);
        ASSERT_NE(manager.audioFile(), nullptr);
        SamplerTags tags;
        ASSERT_EQ(SamplerTags::read(*manager.audioFile(), tags), 0);
        EXPECT_EQ(tags.rootNote ? tags.rootNote->value : 0, 57) << format;
        EXPECT_EQ(tags.loops.size(), 1u) << format;
        EXPECT_EQ(tags.markers.size(), 2u) << format;
        ASSERT_EQ(tags.texts.size(), 1u) << format;
        EXPECT_EQ(tags.texts.front().text, "Ten");
        for (const SamplerTags::Loop& loop : tags.loops)
            EXPECT_EQ(std::pair(loop.firstFrame, loop.lastFrame), std::pair(std::uint64_t{10}, std::uint64_t{89}));
        for (std::size_t i = 0; i < tags.markers.size(); ++i)
            EXPECT_EQ(tags.markers[i].frame, 20 * (i + 1)) << format;
    }
}
