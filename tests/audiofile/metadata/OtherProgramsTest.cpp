// Metadata chunks of libsndfile and ffmpeg, read here; and ours, read by libsndfile.
#include "audiofile/SoundFile.h"
#include "audiofile/metadata/AIFFInstrumentChunk.h"
#include "audiofile/metadata/AcidChunk.h"
#include "audiofile/metadata/BroadcastExtension.h"
#include "audiofile/metadata/CartChunk.h"
#include "audiofile/metadata/CommentList.h"
#include "audiofile/metadata/CueList.h"
#include "audiofile/metadata/InfoList.h"
#include "audiofile/metadata/MarkerList.h"
#include "audiofile/metadata/SamplerChunk.h"
#include "support/Hex.h"
#include "support/Programs.h"

#include <gtest/gtest.h>

#include <array>
#include <bit>

namespace {

/// The body of the first chunk with an id in a whole RIFF or FORM file; fails the test if there is none.
Bytes chunkIn(const std::string& path, FourCC id)
{
    const Bytes bytes = readFile(path);
    ByteReader reader(bytes, textOf(bytes).starts_with("RIFF") ? std::endian::little : std::endian::big);
    reader.skip(12);
    while (reader.ok()) {
        const FourCC found = reader.readFourCC();
        const auto size = reader.read<std::uint32_t>();
        const BytesView body = reader.take(size);
        if (found == id && reader.ok())
            return {body.begin(), body.end()};
        reader.skip(size % 2);
    }
    ADD_FAILURE() << "no " << fourCCText(id) << " in " << path;
    return {};
}

/// A file of 100 16-bit frames that libsndfile writes after a given command.
template <class Value>
std::string soundWith(const TemporaryFolder& folder, int format, int command, Value value)
{
    const std::string path = folder / "sound";
    SF_INFO info{.frames = 0,
                 .samplerate = 8000,
                 .channels = 1,
                 .format = format | SF_FORMAT_PCM_16,
                 .sections = 0,
                 .seekable = 0};
    const SoundFile file(sf_open(path.c_str(), SFM_WRITE, &info));
    EXPECT_EQ(sf_command(file.get(), command, &value, sizeof value), SF_TRUE);
    const short frames[100] = {};
    EXPECT_EQ(sf_writef_short(file.get(), frames, 100), 100);
    return path;
}

struct Chunk {
    FourCC id;
    Bytes body;
};

/// A WAVE (little-endian) or AIFF file of 100 frames with leading chunks, opened by libsndfile.
SoundFile openedWith(const TemporaryFolder& folder, std::vector<Chunk> chunks, std::endian order = std::endian::little)
{
    const bool isWAVE = order == std::endian::little;
    const Bytes format =
        isWAVE ? fromHex("0100 0100 401f0000 803e0000 0200 1000") : fromHex("0001 00000064 0010 400bfa00000000000000");
    chunks.insert(chunks.begin(), {isWAVE ? fourCC("fmt ") : fourCC("COMM"), format});
    chunks.push_back({isWAVE ? fourCC("data") : fourCC("SSND"), Bytes(isWAVE ? 200 : 208)});
    ByteWriter body(order);
    body.writeFourCC(isWAVE ? fourCC("WAVE") : fourCC("AIFF"));
    for (const auto& [id, content] : chunks) {
        body.writeFourCC(id);
        body.write(static_cast<std::uint32_t>(content.size()));
        body.write(content);
        body.writeZeros(content.size() % 2);
    }
    ByteWriter file(order);
    file.writeFourCC(isWAVE ? fourCC("RIFF") : fourCC("FORM"));
    file.write(static_cast<std::uint32_t>(body.size()));
    file.write(body.view());
    SF_INFO info{};
    SoundFile sound(sf_open(folder.write("ours", file.view()).c_str(), SFM_READ, &info));
    EXPECT_TRUE(sound != nullptr) << sf_strerror(nullptr);
    EXPECT_EQ(info.frames, 100);
    return sound;
}

SF_INSTRUMENT twoLoops()
{
    SF_INSTRUMENT instrument{};
    instrument.gain = 1;
    instrument.basenote = 64;
    instrument.velocity_hi = 127;
    instrument.key_hi = 127;
    instrument.loop_count = 2;
    instrument.loops[0] = {.mode = SF_LOOP_FORWARD, .start = 10, .end = 20, .count = 3};
    instrument.loops[1] = {.mode = SF_LOOP_ALTERNATING, .start = 30, .end = 41, .count = 0};
    return instrument;
}

// libsndfile's marks are numbers that lie in memory as they do in a file.
constexpr auto kDataMark = std::bit_cast<std::int32_t>(std::array{'d', 'a', 't', 'a'});

} // namespace

TEST(MetadataOfOtherPrograms, SamplerOfLibsndfile)
{
    const TemporaryFolder folder;
    const std::string path = soundWith(folder, SF_FORMAT_WAV, SFC_SET_INSTRUMENT, twoLoops());
    const auto sampler = SamplerChunk::read(chunkIn(path, fourCC("smpl")));
    ASSERT_TRUE(sampler);
    EXPECT_EQ(sampler->midiUnityNote, 64u);
    EXPECT_EQ(sampler->samplePeriod, 125000u);
    ASSERT_EQ(sampler->loops.size(), 2u);
    EXPECT_EQ(sampler->loops[0].start, 10u);
    EXPECT_EQ(sampler->loops[0].end, 19u); // libsndfile's ends are exclusive
    EXPECT_EQ(sampler->loops[0].playCount, 3u);
    EXPECT_EQ(sampler->loops[1].end, 40u);
    EXPECT_TRUE(sampler->behind.empty());
}

TEST(MetadataOfOtherPrograms, CuesOfLibsndfile)
{
    SF_CUES cues{};
    cues.cue_count = 2;
    cues.cue_points[0] = {.indx = 7,
                          .position = 5,
                          .fcc_chunk = kDataMark,
                          .chunk_start = 0,
                          .block_start = 0,
                          .sample_offset = 5,
                          .name = "verse"};
    cues.cue_points[1] = {.indx = 9,
                          .position = 50,
                          .fcc_chunk = kDataMark,
                          .chunk_start = 0,
                          .block_start = 0,
                          .sample_offset = 50,
                          .name = "end"};
    const TemporaryFolder folder;
    const auto wave = CueList::read(chunkIn(soundWith(folder, SF_FORMAT_WAV, SFC_SET_CUE, cues), fourCC("cue ")));
    ASSERT_TRUE(wave && wave->points.size() == 2);
    EXPECT_EQ(wave->points[1].id, 9u);
    EXPECT_EQ(wave->points[1].sampleOffset, 50u);
    EXPECT_EQ(wave->points[1].dataChunkId, fourCC("data"));
    const auto aiff = MarkerList::read(chunkIn(soundWith(folder, SF_FORMAT_AIFF, SFC_SET_CUE, cues), fourCC("MARK")));
    ASSERT_TRUE(aiff && aiff->markers.size() == 2);
    EXPECT_EQ(aiff->markers[0].name, "verse");
    EXPECT_EQ(aiff->markers[1].name, "end");
    EXPECT_EQ(aiff->markers[1].position, 50u);
}

TEST(MetadataOfOtherPrograms, LibsndfileReadsOurs)
{
    const TemporaryFolder folder;
    AcidChunk acid;
    acid.flags = AcidChunk::kRootNoteSet;
    acid.rootNote = 62;
    acid.beats = 16;
    acid.meterNumerator = 3;
    acid.meterDenominator = 4;
    acid.tempo = 97.5F;
    SF_LOOP_INFO loop{};
    ASSERT_EQ(
        sf_command(openedWith(folder, {{fourCC("acid"), acid.write()}}).get(), SFC_GET_LOOP_INFO, &loop, sizeof loop),
        SF_TRUE);
    EXPECT_EQ(loop.bpm, 97.5F);
    EXPECT_EQ(loop.num_beats, 16);
    EXPECT_EQ(loop.time_sig_num, 3);
    EXPECT_EQ(loop.time_sig_den, 4);
    EXPECT_EQ(loop.root_key, 62);

    SamplerChunk sampler;
    sampler.midiUnityNote = 65;
    sampler.loops.push_back(
        {.cueId = 0, .type = SamplerLoop::kForward, .start = 7, .end = 8, .fraction = 0, .playCount = 2});
    SF_INSTRUMENT instrument{};
    ASSERT_EQ(sf_command(openedWith(folder, {{fourCC("smpl"), sampler.write()}}).get(), SFC_GET_INSTRUMENT, &instrument,
                         sizeof instrument),
              SF_TRUE);
    EXPECT_EQ(instrument.basenote, 65);
    ASSERT_EQ(instrument.loop_count, 1);
    EXPECT_EQ(instrument.loops[0].start, 7u);
    EXPECT_EQ(instrument.loops[0].end, 9u);

    AIFFInstrumentChunk keys;
    keys.baseNote = 66;
    keys.sustainLoop = {AIFFLoop::kForward, 1, 2};
    MarkerList markers;
    markers.markers = {{1, 10, "in"}, {2, 20, ""}};
    const SoundFile aiff =
        openedWith(folder, {{fourCC("MARK"), markers.write()}, {fourCC("INST"), keys.write()}}, std::endian::big);
    ASSERT_EQ(sf_command(aiff.get(), SFC_GET_INSTRUMENT, &instrument, sizeof instrument), SF_TRUE);
    EXPECT_EQ(instrument.basenote, 66);
    EXPECT_EQ(instrument.loops[0].mode, SF_LOOP_FORWARD);
    char log[4096] = {}; // the only way to the markers of AIFF in libsndfile
    sf_command(aiff.get(), SFC_GET_LOG_INFO, log, sizeof log);
    EXPECT_NE(std::string(log).find("Mark ID  : 1\n   Position : 10\n   Name     : in\n"
                                    "   Mark ID  : 2\n   Position : 20\n   Name     : \n"),
              std::string::npos)
        << log;

    InfoList info;
    info.set(fourCC("IART"), "somebody");
    const SoundFile file = openedWith(folder, {{fourCC("LIST"), info.write()}});
    EXPECT_STREQ(sf_get_string(file.get(), SF_STR_ARTIST), "somebody");
}

TEST(MetadataOfOtherPrograms, InfoOfFFmpeg)
{
    const TemporaryFolder folder;
    ASSERT_TRUE(runs(folder, "ffmpeg -f lavfi -i anullsrc=r=8000:cl=mono -t 0.01 -metadata artist='An odd one' "
                             "-metadata title=Even -metadata comment= -bitexact out.wav"));
    const auto info = InfoList::read(chunkIn(folder / "out.wav", fourCC("LIST")));
    ASSERT_TRUE(info);
    EXPECT_EQ(info->find(fourCC("IART")), "An odd one");
    EXPECT_EQ(info->find(fourCC("INAM")), "Even");
}

TEST(MetadataOfOtherPrograms, BroadcastExtensionAndCartOfLibsndfile)
{
    SF_BROADCAST_INFO info{};
    std::ranges::copy(std::string_view("The description"), info.description);
    std::ranges::copy(std::string_view("2026-11-22"), info.origination_date);
    info.time_reference_low = 5;
    info.time_reference_high = 1;
    info.version = 2;
    info.loudness_value = -2310;
    const TemporaryFolder folder;
    const auto bext = BroadcastExtension::read(
        chunkIn(soundWith(folder, SF_FORMAT_WAV, SFC_SET_BROADCAST_INFO, info), fourCC("bext")));
    ASSERT_TRUE(bext);
    EXPECT_EQ(bext->description.text(), "The description");
    EXPECT_EQ(bext->originationDate.text(), "2026-11-22");
    EXPECT_EQ(bext->timeReference(), 0x100000005u);
    EXPECT_EQ(bext->loudnessValue, -2310);
    ASSERT_FALSE(bext->codingHistoryLines().empty()); // libsndfile's own line
    EXPECT_TRUE(bext->codingHistoryLines()[0].starts_with("A=PCM,F=8000,W=16,M=mono"));

    SF_CART_INFO told{};
    std::ranges::copy(std::string_view("0101"), told.version);
    std::ranges::copy(std::string_view("A title"), told.title);
    std::ranges::copy(std::string_view("https://example.org/"), told.url);
    told.level_reference = -32768;
    std::ranges::copy(std::string_view("SEG1"), told.post_timers[1].usage);
    told.post_timers[1].value = 77;
    const auto cart =
        CartChunk::read(chunkIn(soundWith(folder, SF_FORMAT_WAV, SFC_SET_CART_INFO, told), fourCC("cart")));
    ASSERT_TRUE(cart);
    EXPECT_EQ(cart->version.text(), "0101");
    EXPECT_EQ(cart->title.text(), "A title");
    EXPECT_EQ(cart->url.text(), "https://example.org/");
    EXPECT_EQ(cart->levelReference, -32768);
    EXPECT_EQ(cart->postTimers[1].usage, fourCC("SEG1"));
    EXPECT_EQ(cart->postTimers[1].value, 77u);
}

TEST(MetadataOfOtherPrograms, CommentsOfSox)
{
    const TemporaryFolder folder;
    ASSERT_TRUE(runs(folder, "sox -n -r 8000 -c 1 -b 16 --comment 'An odd one' out.aiff trim 0 0.01"));
    const auto list = CommentList::read(chunkIn(folder / "out.aiff", fourCC("COMT")));
    ASSERT_TRUE(list && list->comments.size() == 1);
    EXPECT_EQ(list->comments[0].text, "An odd one");
    EXPECT_TRUE(list->behind.empty());
}
