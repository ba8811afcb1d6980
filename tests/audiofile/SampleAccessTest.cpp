#include "audiofile/AudioFileLimits.h"
#include "audiofile/CAudioFileIO.h"

#include "support/FaultInjection.h"
#include "support/TemporaryFolder.h"

#include <gtest/gtest.h>

#include <cerrno>
#include <climits>
#include <cstdlib>
#include <filesystem>
#include <vector>

namespace {

constexpr long kFrames = 1001;
constexpr int kChannels = 2;

// Samples that every format holds exactly: multiples of 1/128.
std::vector<float> testSamples()
{
    std::vector<float> samples(static_cast<std::size_t>(kFrames * kChannels));
    for (std::size_t i = 0; i < samples.size(); ++i)
        samples[i] = static_cast<float>(static_cast<int>(i * 37 % 256) - 128) / 128;
    return samples;
}

bool runs(const TemporaryFolder& folder, const std::string& command)
{
    const std::string line = "cd '" + folder.path().string() + "' && { " + command + "; } >/dev/null 2>&1 </dev/null";
    return std::system(line.c_str()) == 0;
}

bool hasTool(const char* name)
{
    return std::system((std::string("command -v ") + name + " >/dev/null 2>&1").c_str()) == 0;
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

void writeRaw(const TemporaryFolder& folder)
{
    const std::vector<float> samples = testSamples();
    folder.write("base.f32", std::as_bytes(std::span(samples)));
}

TEST(SampleAccess, ReadsWhatFFmpegWrites)
{
    if (!hasTool("ffmpeg"))
        GTEST_SKIP() << "no ffmpeg";
    const TemporaryFolder folder;
    writeRaw(folder);
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

TEST(SampleAccess, ReadsWhatSoXWrites)
{
    if (!hasTool("sox"))
        GTEST_SKIP() << "no sox";
    const TemporaryFolder folder;
    writeRaw(folder);
    const char* made[][2] = {{"u8.wav", "-b 8"},    {"s16.wav", "-b 16"},          {"s24.wav", "-b 24"},
                             {"s32.wav", "-b 32"},  {"f32.wav", "-e float -b 32"}, {"f64.wav", "-e float -b 64"},
                             {"s8.aiff", "-b 8"},   {"s16.aiff", "-b 16"},         {"s24.aiff", "-b 24"},
                             {"s32.aiff", "-b 32"}, {"s16.aifc", "-b 16"}};
    for (const auto& [file, options] : made) {
        ASSERT_TRUE(runs(folder, std::string("sox -D -t f32 -r 44100 -c 2 base.f32 ") + options + " " + file)) << file;
        expectTestSamples(folder / file);
    }
    // Into a pipe the sizes cannot be filled in afterwards.
    ASSERT_TRUE(runs(folder, "sox -D -t f32 -r 44100 -c 2 base.f32 -t wav -b 16 - | cat > pipe.wav"));
    expectTestSamples(folder / "pipe.wav");
}

TEST(SampleAccess, ReadsWhatLibsndfileWrites)
{
    if (!hasTool("sox") || !hasTool("sndfile-convert"))
        GTEST_SKIP() << "no sndfile-convert";
    const TemporaryFolder folder;
    writeRaw(folder);
    ASSERT_TRUE(runs(folder, "sox -D -t f32 -r 44100 -c 2 base.f32 -b 16 base.wav"));
    const char* made[][2] = {{"u8.wav", "-pcmu8"},
                             {"24.wav", "-pcm24"},
                             {"double.wav", "-float64"},
                             {"8.aif", "-pcms8"},
                             {"sowt.aif", "-pcm16 -endian=little"},
                             {"in24.aif", "-pcm24 -endian=little"},
                             {"32.aif", "-pcm32"},
                             {"float.aif", "-float32"},
                             {"double.aif", "-float64"},
                             {"16.caf", "-pcm16"},
                             {"24le.caf", "-pcm24 -endian=little"},
                             {"floatle.caf", "-float32 -endian=little"},
                             {"24.rf64", "-pcm24"}};
    for (const auto& [file, options] : made) {
        ASSERT_TRUE(runs(folder, std::string("sndfile-convert ") + options + " base.wav " + file)) << file;
        expectTestSamples(folder / file);
    }
}

std::int32_t createStereo(CAudioFileIO& file, const std::string& path, FourCC type, int bits, bool option)
{
    const CFileRef ref(path.c_str(), false);
    return file.CreateAndOpenCommon(ref, 0, kAudioBusStereo, 0, bits, 44100, type, option);
}

// Creates a file of the test samples, written in two pieces.
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
    if (!hasTool("sox") || !hasTool("ffmpeg") || !hasTool("sndfile-convert"))
        GTEST_SKIP() << "no sox, ffmpeg or sndfile-convert";
    const TemporaryFolder folder;
    const struct {
        FourCC type;
        const char* extension;
    } types[] = {{kWAVE, ".wav"}, {kAIFF, ".aiff"}, {kCaff, ".caf"}};
    std::string inputs;
    std::string outputs;
    std::vector<std::string> files;
    for (const auto& [type, extension] : types)
        for (const int bits : {8, 16, 24, 32, -32, 64}) {
            const std::string name = "x" + std::to_string(bits) + extension;
            create(folder / name, type, bits, bits != 16);
            expectTestSamples(folder / name);
            inputs += " -i " + name;
            outputs += " -map " + std::to_string(files.size()) + " -f f32le " + name + ".ffmpeg";
            files.push_back(name);
        }
    ASSERT_TRUE(runs(folder, "ffmpeg -y" + inputs + outputs));
    const std::vector<float> samples = testSamples();
    const Bytes expected(std::as_bytes(std::span(samples)).begin(), std::as_bytes(std::span(samples)).end());
    for (const std::string& name : files) {
        EXPECT_EQ(readFile(folder / (name + ".ffmpeg")), expected) << name;
        ASSERT_TRUE(runs(folder, "sndfile-convert -float64 " + name + " sndfile.wav")) << name;
        expectTestSamples(folder / "sndfile.wav");
        if (name.ends_with(".caf"))
            continue;
        ASSERT_TRUE(runs(folder, "sox " + name + " -t f32 sox.f32")) << name;
        EXPECT_EQ(readFile(folder / "sox.f32"), expected) << name;
    }
}

TEST(SampleAccess, DeliversWhatIsThere)
{
    const TemporaryFolder folder;
    create(folder / "a.wav", kWAVE, 24, false);
    CAudioFileIO file(CFileRef((folder / "a.wav").c_str(), false), 0);
    std::vector<float> got(20, 9.0F);
    long delivered = -1;
    EXPECT_EQ(file.ReadFrames(got.data(), kFrames - 3, 10, &delivered), kStatusEndOfFile);
    EXPECT_EQ(delivered, 3);
    EXPECT_EQ(got[5], testSamples().back());
    EXPECT_EQ(got[6], 9.0F);
    for (const long long frame : {static_cast<long long>(kFrames), 1LL << 62}) {
        EXPECT_EQ(file.ReadFrames(got.data(), frame, 1, &delivered), kStatusEndOfFile);
        EXPECT_EQ(delivered, 0);
    }
    EXPECT_EQ(file.ReadFrames(got.data(), -1, 1), kStatusParameterError);
    EXPECT_EQ(file.ReadFrames(nullptr, 0, 1), kStatusParameterError);
    EXPECT_EQ(file.ReadFrames(nullptr, kFrames, 0), kStatusOK);
    EXPECT_EQ(file.WriteFrames(got.data(), 0, 1), kStatusWritePermission);
    file.Close();
    EXPECT_EQ(file.ReadFrames(got.data(), 0, 1), kStatusNotOpen);
    EXPECT_EQ(file.WriteFrames(got.data(), 0, 1), kStatusNotOpen);

    CAudioFileIO compressed(CFileRef(KTFILES_MEDIA "/tone-adpcm.wav", false), 0);
    EXPECT_EQ(compressed.ReadFrames(got.data(), 0, 1), kStatusParameterError);

    // Cut after it was opened: whole frames, and an error.
    ASSERT_EQ(file.Open(CFileRef((folder / "a.wav").c_str(), false), 0), kStatusOK);
    std::filesystem::resize_file(folder / "a.wav", static_cast<std::uintmax_t>(file.Info().dataOffset) + 6 * 4 + 5);
    EXPECT_EQ(file.ReadFrames(got.data(), 0, 10, &delivered), kStatusEndOfFile);
    EXPECT_EQ(delivered, 4);
}

TEST(SampleAccess, AppendsToFilesOfItsOwn)
{
    const TemporaryFolder folder;
    const std::vector<float> more(30, 0.25F);
    for (const FourCC type : {kWAVE, kAIFF, kCaff})
        for (const bool option : {false, true}) {
            const std::string path = folder / "own";
            std::filesystem::remove(path);
            create(path, type, 8, option);
            for (int round = 0; round < 2; ++round) { // also behind the pad byte of an odd number of bytes
                CAudioFileIO file(CFileRef(path.c_str(), false), kFileIOReadWrite);
                ASSERT_EQ(file.WriteFrames(more.data(), file.Info().frames, 15), kStatusOK);
                ASSERT_EQ(file.Close(), kStatusOK);
            }
            CAudioFileIO file(CFileRef(path.c_str(), false), 0);
            EXPECT_EQ(file.Info().frames, kFrames + 30);
            std::vector<float> expected = testSamples();
            expected.insert(expected.end(), 60, 0.25F);
            EXPECT_EQ(readAll(file), expected);
        }
}

TEST(SampleAccess, OverwritesButNeverGrowsIntoWhatIsNotItsOwn)
{
    const TemporaryFolder folder;
    const std::vector<float> samples(100, 0.5F);
    // Frames are overwritten in any file; a header with chunks of others is not built anew.
    for (const char* name :
         {"surround-24.wav", "kick-24-rf64.wav", "tone-16.aiff", "tone-sowt.aifc", "bell-16-be.caf"}) {
        Bytes expected = readFile(std::string(KTFILES_MEDIA "/") + name);
        const std::string path = folder.write(name, expected);
        CAudioFileIO file(CFileRef(path.c_str(), false), kFileIOReadWrite);
        EXPECT_EQ(file.WriteFrames(samples.data(), file.Info().frames, 1), kStatusParameterError) << name;
        EXPECT_EQ(file.WriteFrames(samples.data(), file.Info().frames + 1, 1), kStatusParameterError) << name;
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
    // A chunk behind the samples stays whole.
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
