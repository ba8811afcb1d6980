#include "files/registry/CFileServer.h"

#include "audiofile/CAudioFileIO.h"
#include "platform/Memory.h"
#include "support/FakeDecoder.h"
#include "support/FaultInjection.h"
#include "support/References.h"
#include "support/TemporaryFolder.h"

#include <gtest/gtest.h>

namespace fs = std::filesystem;

namespace {

constexpr unsigned int kRefused = CFileServer::kRefused;

/// Writes 16-bit samples, computed by `sample` from frame and channel.
template <class Sample>
CFileRef writeAudio(const TemporaryFolder& folder, const char* name, int channels, long frames, Sample sample,
                    long rate = 44100)
{
    const CFileRef ref = file(folder / name);
    CAudioFileIO out;
    EXPECT_EQ(out.CreateAndOpenCommon(ref, 0, kAudioBusUndefined, channels, 16, rate, kWAVE, false), kStatusOK);
    std::vector<float> samples(static_cast<std::size_t>(channels * frames));
    for (long frame = 0; frame < frames; ++frame)
        for (int channel = 0; channel < channels; ++channel)
            samples[static_cast<std::size_t>(frame * channels + channel)] = sample(frame, channel);
    EXPECT_EQ(out.WriteFrames(samples.data(), 0, frames), kStatusOK);
    EXPECT_EQ(out.Close(), kStatusOK);
    return ref;
}

float ramp(long frame)
{
    return static_cast<float>(frame % 256 - 128) / 128;
}

CFileRef writeMono(const TemporaryFolder& folder, const char* name, long frames = 10, long rate = 44100)
{
    return writeAudio(
        folder, name, 1, frames, [](long frame, int) { return ramp(frame); }, rate);
}

std::vector<std::string> namesOf(CFileServer& server, unsigned int clientId)
{
    std::vector<std::string> names;
    for (const TFileInfo& info : server.GetFileInfoVector(clientId))
        names.push_back(info.ref.CopyFileName().utf8());
    return names;
}

using Names = std::vector<std::string>;

} // namespace

TEST(CFileServer, SharesOneReadingOfAFile)
{
    const TemporaryFolder folder;
    const CFileRef ref = writeMono(folder, "a.wav", 1000);
    CFileServer server(10);
    EXPECT_EQ(server.Register(1, &ref), 1U);
    const TFileInfo first = server.GetFileInfo(&ref);
    ASSERT_NE(first.samples, nullptr);
    EXPECT_EQ(first.frames, 1000U);
    EXPECT_EQ(first.channels, 1U);
    EXPECT_EQ(first.sampleRate, 44100);
    for (long frame = 0; frame < 1000; ++frame)
        ASSERT_EQ(first.samples[frame], ramp(frame));
    const CFileRef again = file(folder / "a.wav"); // another URL object, equal to the first
    {
        FaultInjector faults;
        EXPECT_EQ(server.Register(2, &again), 2U);
        EXPECT_EQ(server.Register(2, &again), 2U);
        EXPECT_EQ(faults.calls(Call::openFile) + faults.calls(Call::openFileWithoutLinks), 0);
    }
    EXPECT_EQ(server.GetFileInfo(&again).samples, first.samples);
    EXPECT_EQ(server.UnRegister(1), 0U);
    EXPECT_EQ(server.GetFileInfo(&ref).samples, first.samples);
    EXPECT_EQ(server.UnRegister(2), 0U);
    const TFileInfo gone = server.GetFileInfo(&ref);
    EXPECT_FALSE(gone.ref.IsValid());
    EXPECT_EQ(gone.samples, nullptr);
    EXPECT_FALSE(server.GetFileInfo(nullptr).ref.IsValid());
}

TEST(CFileServer, ANewClientHasTheSmallestIdThatIsFree)
{
    const TemporaryFolder folder;
    const CFileRef ref = writeMono(folder, "a.wav");
    CFileServer server(10);
    for (const unsigned int id : {3U, 2U}) // in any order
        server.Register(id, &ref);
    EXPECT_EQ(server.CreateNewClientId(), 1U);
    server.Register(1, &ref);
    EXPECT_EQ(server.CreateNewClientId(), 4U);
    server.UnRegister(2);
    EXPECT_EQ(server.CreateNewClientId(), 2U);
}

TEST(CFileServer, RefusalsAndFailures)
{
    const TemporaryFolder folder;
    const CFileRef good = writeMono(folder, "good.wav");
    const CFileRef second = writeMono(folder, "second.wav");
    const CFileRef third = writeMono(folder, "third.wav");
    fs::create_symlink("nowhere", folder / "link.wav");
    CFileServer server(2);
    EXPECT_EQ(server.Register(0, &good), kRefused);
    EXPECT_EQ(server.Register(1, nullptr), kRefused);
    for (const CFileRef& ref :
         {CFileRef::None, file(folder.path()), file(folder / "missing"), file(folder / "link.wav")})
        EXPECT_EQ(server.Register(1, &ref), kRefused);
    const CFileRef bad[] = {file(folder.write("text.wav", "no audio file")), file(folder.write("empty.wav", "")),
                            writeMono(folder, "no-frames.wav", 0)};
    for (const CFileRef& ref : bad)
        EXPECT_EQ(server.Register(1, &ref), 0U) << std::string(ref);
    {
        FaultInjector faults;
        faults.fail(Call::pread, EIO, 2, 100); // the header is read, the samples are not
        EXPECT_EQ(server.Register(1, &good), 0U);
    }
    {
        FaultInjector faults; // deleted between the check and the opening
        faults.fail(Call::openFile, ENOENT, 1, 100);
        faults.fail(Call::openFileWithoutLinks, ENOENT, 1, 100);
        EXPECT_EQ(server.Register(1, &good), 0U);
    }
    EXPECT_EQ(server.CreateNewClientId(), 1U); // none of these registered the client
    EXPECT_EQ(server.Register(1, &good), 1U);
    EXPECT_EQ(server.Register(1, &second), 1U);
    EXPECT_EQ(server.Register(1, &third), kRefused);
    EXPECT_EQ(server.Register(2, &good), 2U); // a client more is no file more
    EXPECT_EQ(namesOf(server, 1), (Names{"good.wav", "second.wav"}));
    EXPECT_EQ(namesOf(server, 2), Names{"good.wav"});
    EXPECT_EQ(namesOf(server, 3), Names{});
}

TEST(CFileServer, EqualChannelsAreHeldOnce)
{
    const TemporaryFolder folder;
    constexpr long frames = 50'001; // more than one block
    struct Case {
        const char* name;
        long differs; // the frame in which the channels are not the same
        unsigned int channels;
    };
    const Case cases[] = {
        {"equal.wav", -1, 1},
        {"last.wav", frames - 1, 2},
        {"block.wav", 16384, 2},
    };
    CFileServer server(10);
    for (const Case& each : cases) {
        SCOPED_TRACE(each.name);
        const auto sample = [&](long frame, int channel) {
            return frame == each.differs && channel == 1 ? 0.75F : ramp(frame) / 2;
        };
        const CFileRef ref = writeAudio(folder, each.name, 2, frames, sample);
        ASSERT_EQ(server.Register(1, &ref), 1U);
        const TFileInfo info = server.GetFileInfo(&ref);
        ASSERT_EQ(info.channels, each.channels);
        ASSERT_EQ(info.frames, static_cast<unsigned int>(frames));
        for (long frame = 0; frame < frames; ++frame)
            for (int channel = 0; channel < static_cast<int>(each.channels); ++channel)
                ASSERT_EQ(info.samples[frame * static_cast<long>(each.channels) + channel], sample(frame, channel))
                    << frame << " " << channel;
    }
}

TEST(CFileServer, MemoryThatIsNotThereIsNotTaken)
{
    const TemporaryFolder folder;
    // A sparse CAF file of 16-bit mono with 2^42 bytes.
    constexpr std::int64_t length = 1LL << 42;
    std::string image("caff\0\1\0\0desc\0\0\0\0\0\0\0\x20\x40\xE5\x88\x80\0\0\0\0lpcm\0\0\0\0\0\0\0\x02\0\0\0\1"
                      "\0\0\0\1\0\0\0\x10"
                      "data\xFF\xFF\xFF\xFF\xFF\xFF\xFF\xFF\0\0\0\0",
                      8 + 12 + 32 + 16);
    const CFileRef sparse = file(folder.write("sparse.caf", image));
    std::error_code error;
    fs::resize_file(folder / "sparse.caf", length, error);
    if (error)
        GTEST_SKIP() << "no files of that size";
    CFileServer server(2);
    EXPECT_EQ(server.Register(1, &sparse), 0U);
    // A number of frames that can be counted but does not fit in memory.
    const std::uint64_t frames = platform::availableMemory() / sizeof(float) + 1'000'000;
    fs::resize_file(folder / "sparse.caf", 68 + frames * 2);
    if (frames < UINT32_MAX) {
        EXPECT_EQ(server.Register(1, &sparse), 0U);
    }
    fs::resize_file(folder / "sparse.caf", 68 + 1000 * 2);
    EXPECT_EQ(server.Register(1, &sparse), 1U); // nothing else was wrong with it
    EXPECT_EQ(server.GetFileInfo(&sparse).frames, 1000U);
}

TEST(CFileServer, FilesThatLie)
{
    const TemporaryFolder folder;
    writeMono(folder, "short.wav", 1000);
    fs::resize_file(folder / "short.wav", fs::file_size(folder / "short.wav") - 1000);
    const CFileRef cut = file(folder / "short.wav");
    CFileServer server(5);
    ASSERT_EQ(server.Register(1, &cut), 1U); // what is there
    EXPECT_EQ(server.GetFileInfo(&cut).frames, 500U);

    Bytes image = readFile(folder / "short.wav");
    image[22] = image[23] = std::byte{0xFF}; // 65,535 channels
    const CFileRef wide = file(folder.write("wide.wav", image));
    EXPECT_EQ(server.Register(1, &wide), 0U);
}

TEST(CFileServer, FilesWithTheExtensionUbsAreNotLoaded)
{
    const TemporaryFolder folder;
    const CFileRef ref = file(folder.write("song.UBS", "whatever this is"));
    CFileServer server(1);
    EXPECT_EQ(server.Register(1, &ref), 1U);
    EXPECT_EQ(server.GetFileInfo(&ref).samples, nullptr);
    EXPECT_EQ(namesOf(server, 1), Names{"song.UBS"});
}

TEST(CFileServer, FollowsAFileThatWasReplaced)
{
    const TemporaryFolder folder;
    fs::create_directory(folder / "new");
    const CFileRef old = writeMono(folder, "a.wav");
    const CFileRef other = writeMono(folder, "b.wav");
    CFileServer server(5);
    server.Register(7, &other);
    server.Register(3, &old);
    server.Register(2, &old);
    const float* const samples = server.GetFileInfo(&old).samples;

    CFileRef was;
    const CFileRef refused[] = {writeMono(folder, "new/A.wav"), writeMono(folder, "new/b.wav", 11),
                                writeMono(folder, "new/a.wav", 10, 48000), file(folder / "new/missing.wav"),
                                CFileRef::None};
    for (const CFileRef& ref : refused)
        EXPECT_TRUE(server.UpdateAudioFileInfo(&ref, was).empty()) << std::string(ref);
    EXPECT_TRUE(server.UpdateAudioFileInfo(nullptr, was).empty());
    EXPECT_FALSE(was.IsValid());

    const CFileRef replacement = writeMono(folder, "new/a.wav");
    EXPECT_EQ(server.UpdateAudioFileInfo(&replacement, was), (std::vector<unsigned int>{3, 2}));
    EXPECT_EQ(std::string(was), std::string(old));
    EXPECT_FALSE(server.GetFileInfo(&old).ref.IsValid());
    EXPECT_EQ(server.GetFileInfo(&replacement).samples, samples);
    EXPECT_EQ(std::string(server.GetFileInfo(&replacement).ref), std::string(replacement));
    EXPECT_EQ(server.UpdateAudioFileInfo(&replacement, was), (std::vector<unsigned int>{3, 2})); // by itself
    EXPECT_EQ(server.UnRegister(3), 0U);
    EXPECT_EQ(namesOf(server, 2), Names{"a.wav"});
    server.UnRegister(2);
    EXPECT_FALSE(server.GetFileInfo(&replacement).ref.IsValid());
}

TEST(CFileServer, SharesCompressedFiles)
{
    const TemporaryFolder folder;
    const CFileRef ref = file(folder.write("a.ogg", "OggS, coded somehow"));
    CFileServer server(10);
    FakeDecoder::File coded{.formatId = fourCC("vorb"), .fileType = fourCC("OggS"), .frames = 20000};
    {
        const FakeDecoder::NoModule nothing;
        EXPECT_EQ(server.Register(1, &ref), 0U);
    }
    const FakeDecoder::Module module(coded);
    coded.framesThere = 19999; // it does not give what it promises
    EXPECT_EQ(server.Register(1, &ref), 0U);
    coded.framesThere = 20000;
    EXPECT_EQ(server.Register(1, &ref), 1U);
    const TFileInfo info = server.GetFileInfo(&ref);
    EXPECT_EQ(info.frames, 20000U);
    EXPECT_EQ(info.channels, 2U);
    EXPECT_EQ(info.sampleRate, 44100);
    for (std::uint32_t frame = 0; frame < info.frames; ++frame) {
        ASSERT_EQ(info.samples[2 * frame], static_cast<float>(frame));
        ASSERT_EQ(info.samples[2 * frame + 1], static_cast<float>(frame) + 0.5F);
    }
}

TEST(CFileServer, AnUpdateTakesNoOtherClientsSamples)
{
    const TemporaryFolder folder;
    fs::create_directory(folder / "new");
    const CFileRef old = writeMono(folder, "a.wav");
    const CFileRef replacement = writeMono(folder, "new/a.wav");
    CFileServer server(10);
    ASSERT_EQ(server.Register(1, &old), 1u);
    ASSERT_EQ(server.Register(2, &replacement), 1u);
    CFileRef updated;
    EXPECT_EQ(server.UpdateAudioFileInfo(&replacement, updated), std::vector<unsigned int>());
    EXPECT_EQ(server.GetFileInfoVector(2).size(), 1u);
    EXPECT_EQ(server.GetFileInfoVector(1).size(), 1u);
    EXPECT_EQ(server.UnRegister(2), 0u);
    EXPECT_EQ(server.UpdateAudioFileInfo(&replacement, updated), std::vector<unsigned int>{1});
}

TEST(CFileServer, ClientsSwapTheirPlaces)
{
    const TemporaryFolder folder;
    const CFileRef both = writeMono(folder, "both.wav"), one = writeMono(folder, "one.wav");
    CFileServer server(10);
    ASSERT_EQ(server.Register(1, &one), 1u);
    ASSERT_EQ(server.Register(1, &both), 1u);
    ASSERT_EQ(server.Register(2, &both), 2u);
    server.SwapClients(1, 2);
    EXPECT_EQ(namesOf(server, 1), Names{"both.wav"});
    EXPECT_EQ(namesOf(server, 2), (Names{"one.wav", "both.wav"}));
    server.SwapClients(2, 7); // also with one that is in no file
    EXPECT_EQ(namesOf(server, 2), Names());
    EXPECT_EQ(namesOf(server, 7), (Names{"one.wav", "both.wav"}));
    std::vector<unsigned int> ids{3, 9, 4};
    EXPECT_EQ(server.MaxClientId(ids), 9u);
    ids.clear();
    EXPECT_EQ(server.MaxClientId(ids), 0u);
}
