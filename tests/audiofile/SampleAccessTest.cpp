#include "audiofile/AudioFileLimits.h"
#include "audiofile/CAudioFileIO.h"

#include "SoundFile.h"
#include "platform/core/ByteWriter.h"
#include "support/FaultInjection.h"
#include "support/Media.h"
#include "support/Programs.h"
#include "support/TemporaryFolder.h"

#include <gtest/gtest.h>

#include <cerrno>
#include <climits>
#include <filesystem>
#include <vector>

namespace {

constexpr long kFrames = 1001;
constexpr int kChannels = 2;

// Samples that every format can represent: multiples of 1/128.
std::vector<float> testSamples()
{
    std::vector<float> samples(static_cast<std::size_t>(kFrames * kChannels));
    for (std::size_t i = 0; i < samples.size(); ++i)
        samples[i] = static_cast<float>(static_cast<int>(i * 37 % 256) - 128) / 128;
    return samples;
}

std::vector<float> readAll(CAudioFileIO& file)
{
    std::vector<float> samples(static_cast<std::size_t>(file.Info().frames * file.Info().channels));
    long delivered = 0;
    EXPECT_EQ(file.ReadFrames(samples.data(), 0, static_cast<long>(file.Info().frames), &delivered), kStatusOK);
    EXPECT_EQ(delivered, file.Info().frames);
    return samples;
}

void expectTestSamples(const std::string& path)
{
    CAudioFileIO file;
    ASSERT_EQ(file.Open(CFileRef(path.c_str(), false), 0), kStatusOK) << path;
    EXPECT_EQ(file.Info().frames, kFrames) << path;
    EXPECT_EQ(file.Info().channels, kChannels) << path;
    EXPECT_EQ(file.Info().sampleRate, 44100) << path;
    EXPECT_EQ(readAll(file), testSamples()) << path;
}

/// Writes the raw test samples for other programs; false if one of the programs is missing.
bool writeRaw(const TemporaryFolder& folder, const char* programs)
{
    const std::vector<float> samples = testSamples();
    ByteWriter raw(std::endian::little);
    for (const float sample : samples)
        raw.write(sample);
    folder.write("base.f32", raw.view());
    return runs(folder, std::string("for p in ") + programs + "; do command -v $p || exit 1; done");
}

TEST(SampleAccess, ReadsWhatFFmpegWrites)
{
    const TemporaryFolder folder;
    if (!writeRaw(folder, "ffmpeg"))
        GTEST_SKIP() << "no ffmpeg";
    std::string command = "ffmpeg -y -f f32le -ar 44100 -ac 2 -i base.f32";
    std::vector<std::string> files;
    const auto add = [&](const std::string& extension, const std::string& options,
                         std::initializer_list<const char*> codecs) {
        for (const char* codec : codecs) {
            files.push_back(std::to_string(files.size()) + codec + '.' + extension);
            command += " " + options + " -c:a pcm_" + codec + " " + files.back();
        }
    };
    add("wav", "", {"u8", "s16le", "s24le", "s32le", "f32le", "f64le"});
    add("wav", "-rf64 always -write_bext 1", {"s16le", "s24le", "f32le"});
    add("aiff", "", {"s8", "s16be", "s24be", "s32be", "s16le", "f32be", "f64be"});
    add("caf", "", {"s8", "s16le", "s16be", "s24le", "s24be", "s32le", "s32be", "f32le", "f32be", "f64le", "f64be"});
    ASSERT_TRUE(runs(folder, command)) << command;
    for (const std::string& file : files)
        expectTestSamples(folder / file);
}

std::int32_t createStereo(CAudioFileIO& file, const std::string& path, FourCC type, int bits, bool option)
{
    const CFileRef ref(path.c_str(), false);
    return file.CreateAndOpenCommon(ref, 0, kAudioBusStereo, 0, bits, 44100, type, option);
}

// Creates a file of the test samples in two writes.
void create(const std::string& path, FourCC type, int bits, bool option)
{
    const std::vector<float> samples = testSamples();
    CAudioFileIO file;
    ASSERT_EQ(createStereo(file, path, type, bits, option), kStatusOK);
    ASSERT_EQ(file.WriteFrames(samples.data(), 0, 600), kStatusOK);
    ASSERT_EQ(file.WriteFrames(samples.data() + 500 * kChannels, 500, kFrames - 500), kStatusOK);
    ASSERT_EQ(file.Close(), kStatusOK);
}

TEST(SampleAccess, OtherProgramsReadWhatIsWritten)
{
    const TemporaryFolder folder;
    if (!writeRaw(folder, "sox ffmpeg"))
        GTEST_SKIP() << "no sox or ffmpeg";
    const Bytes expected = readFile(folder / "base.f32");
    for (const auto& [type, extension] : {std::pair{kWAVE, ".wav"}, {kAIFF, ".aiff"}, {kCaff, ".caf"}})
        for (const int bits : {8, 16, 24, 32, -32, 64}) {
            const std::string name = "x" + std::to_string(bits) + extension;
            create(folder / name, type, bits, bits != 16);
            expectTestSamples(folder / name);
            EXPECT_EQ(readSound(folder / name).samples, testSamples()) << name;
            ASSERT_TRUE(runs(folder, "ffmpeg -y -i " + name + " -f f32le ffmpeg.f32")) << name;
            EXPECT_EQ(readFile(folder / "ffmpeg.f32"), expected) << name;
            if (type == kCaff)
                continue;
            ASSERT_TRUE(runs(folder, "sox " + name + " -t f32 sox.f32")) << name;
            EXPECT_EQ(readFile(folder / "sox.f32"), expected) << name;
        }
}

TEST(SampleAccess, DeliversWhatIsThere)
{
    const TemporaryFolder folder;
    create(folder / "a.wav", kWAVE, 24, false);
    const CFileRef ref((folder / "a.wav").c_str(), false);
    CAudioFileIO file(ref, 0);
    std::vector<float> got(20, 9.0F);
    const struct {
        long long frame;
        long count;
        std::int32_t status;
        long delivered;
    } rows[] = {{kFrames - 3, 10, kStatusEndOfFile, 3},
                {kFrames, 1, kStatusEndOfFile, 0},
                {1LL << 62, 1, kStatusEndOfFile, 0},
                {kFrames, 0, kStatusOK, 0}};
    for (const auto& row : rows) {
        long delivered = -1;
        EXPECT_EQ(file.ReadFrames(got.data(), row.frame, row.count, &delivered), row.status) << row.frame;
        EXPECT_EQ(delivered, row.delivered) << row.frame;
    }
    EXPECT_EQ(got[5], testSamples().back());
    EXPECT_EQ(got[6], 9.0F);
    EXPECT_EQ(file.ReadFrames(got.data(), -1, 1), kStatusParameterError);
    // If the file is cut after opening: whole frames, and an error.
    std::filesystem::resize_file(ref.GetPath(), static_cast<std::uintmax_t>(file.Info().dataOffset) + 6 * 4 + 5);
    long delivered = -1;
    EXPECT_EQ(file.ReadFrames(got.data(), 0, 10, &delivered), kStatusEndOfFile);
    EXPECT_EQ(delivered, 4);
}

TEST(SampleAccess, OverwritesButNeverGrowsIntoWhatIsNotItsOwn)
{
    const TemporaryFolder folder;
    const std::vector<float> samples(100, 0.5F);
    // Frames can be overwritten in any file; a header with foreign chunks is not rebuilt.
    for (const char* name :
         {"surround-24.wav", "kick-24-rf64.wav", "tone-16.aiff", "tone-sowt.aifc", "bell-16-be.caf"}) {
        Bytes expected = readFile(mediaPath(name));
        const std::string path = folder.write(name, expected);
        CAudioFileIO file(CFileRef(path.c_str(), false), kFileIOReadWrite);
        EXPECT_EQ(file.WriteFrames(samples.data(), file.Info().frames, 1), kStatusParameterError) << name;
        EXPECT_EQ(file.WriteFrames(samples.data(), file.Info().frames + 1, 1), kStatusParameterError) << name;
        EXPECT_EQ(file.WriteFrames(samples.data(), -1, 1), kStatusParameterError) << name;
        EXPECT_EQ(file.WriteFrames(samples.data(), 7, -1), kStatusParameterError) << name;
        EXPECT_EQ(file.WriteFrames(nullptr, 7, 1), kStatusParameterError) << name;
        EXPECT_EQ(file.WriteFrames(nullptr, 7, 0), kStatusOK) << name;
        EXPECT_EQ(file.WriteFrames(samples.data(), 7, 1), kStatusOK) << name;
        float back[8] = {};
        EXPECT_EQ(file.ReadFrames(back, 7, 1), kStatusOK);
        EXPECT_EQ(back[0], 0.5F) << name;
        const auto frame = static_cast<std::size_t>(file.Info().bytesPerFrame);
        const std::size_t at = static_cast<std::size_t>(file.Info().dataOffset) + 7 * frame;
        file.Close();
        Bytes after = readFile(path);
        ASSERT_EQ(after.size(), expected.size());
        std::copy_n(after.begin() + static_cast<std::ptrdiff_t>(at), frame,
                    expected.begin() + static_cast<std::ptrdiff_t>(at));
        EXPECT_EQ(after, expected) << name;
    }
    // A chunk after the samples stays intact.
    create(folder / "own.wav", kWAVE, 16, false);
    CAudioFileIO file(CFileRef((folder / "own.wav").c_str(), false), kFileIOReadWrite);
    ASSERT_EQ(file.AddChunk(fourCC("note"), bytesOf("hello!"), false), 1);
    EXPECT_EQ(file.WriteFrames(samples.data(), kFrames, 1), kStatusParameterError);
    EXPECT_EQ(file.WriteFrames(samples.data(), kFrames - 1, 1), kStatusOK);
    EXPECT_EQ(file.RemoveChunk(fourCC("note")), 0);
    EXPECT_EQ(file.WriteFrames(samples.data(), kFrames, 1), kStatusOK);
}

TEST(SampleAccess, StopsAtTheLimitsOfTheContainer)
{
    const TemporaryFolder folder;
    const float silence[4] = {};
    const auto statusAtLimit = [&](FourCC type, bool option, long beyond) {
        CAudioFileIO file;
        const std::string path = folder / ("limit" + std::to_string(beyond));
        EXPECT_EQ(createStereo(file, path, type, 16, option), kStatusOK);
        const long most = static_cast<long>((MaxAudioFileSize(type, option) - file.Info().dataOffset) / 4);
        EXPECT_EQ(file.SetNumFrames(most - 1), kStatusOK); // sparse
        const std::int32_t status = file.WriteFrames(silence, most - 1, beyond);
        file.Close();
        std::filesystem::remove(path);
        return status;
    };
    EXPECT_EQ(statusAtLimit(kAIFF, false, 1), kStatusOK);
    EXPECT_EQ(statusAtLimit(kAIFF, false, 2), kStatusFileTooBig);
    EXPECT_EQ(statusAtLimit(kWAVE, false, 1), kStatusOK);
    EXPECT_EQ(statusAtLimit(kWAVE, false, 2), kStatusFileTooBig);

    const std::string path = folder / "long.wav";
    const long frames = 0x40000000; // 4 GiB
    CAudioFileIO file;
    ASSERT_EQ(createStereo(file, path, kWAVE, 16, true), kStatusOK);
    ASSERT_EQ(file.SetNumFrames(frames - 100), kStatusOK);
    const std::vector<float> samples = testSamples();
    ASSERT_EQ(file.WriteFrames(samples.data(), frames - 100, kFrames), kStatusOK);
    EXPECT_EQ(file.WriteFrames(samples.data(), 0, LONG_MAX), kStatusFileTooBig);
    ASSERT_EQ(file.Close(), kStatusOK);
    ASSERT_EQ(file.Open(CFileRef(path.c_str(), false), 0), kStatusOK);
    EXPECT_EQ(fourCCText(file.Info().containerId), "RF64");
    EXPECT_EQ(file.Info().frames, frames - 100 + kFrames);
    std::vector<float> back(samples.size());
    EXPECT_EQ(file.ReadFrames(back.data(), frames - 100, kFrames), kStatusOK);
    EXPECT_EQ(back, samples);
}

TEST(SampleAccess, ADiskThatIsFullLosesNoFrameThatWasWritten)
{
    const TemporaryFolder folder;
    const std::string path = folder / "full.wav";
    create(path, kWAVE, 24, false);
    const std::vector<float> samples(2 * 40000, 0.5F);
    CAudioFileIO file(CFileRef(path.c_str(), false), kFileIOReadWrite);
    {
        FaultInjector faults;
        faults.fail(Call::pwrite, ENOSPC, 2);
        EXPECT_EQ(file.WriteFrames(samples.data(), kFrames, 40000), kStatusDiskFull);
    }
    const std::int64_t written = 65536 / 3 / 2; // the last sample of the piece was half a frame
    EXPECT_EQ(file.Info().frames, kFrames + written);
    EXPECT_EQ(file.WriteFrames(samples.data(), kFrames + written, 10), kStatusOK); // goes on once there is room
    file.Close();
    file.Open(CFileRef(path.c_str(), false), 0);
    EXPECT_EQ(file.Info().frames, kFrames + written + 10);
}

} // namespace
