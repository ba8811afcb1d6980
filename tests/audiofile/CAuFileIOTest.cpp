// The older audio-file class: its files read by libsndfile and vice versa, its chunks, its oddities.
#include "audiofile/CAuFileIO.h"

#include "SoundFile.h"
#include "audiofile/CAudioFileIO.h"
#include "platform/core/Packed.h"
#include "platform/core/Status.h"
#include "support/FaultInjection.h"
#include "support/References.h"
#include "support/TemporaryFolder.h"

#include <climits>
#include <cstring>
#include <filesystem>

namespace {

CChunkData chunkOf(FourCC id, std::string_view body)
{
    CChunkData chunk;
    chunk.id = id;
    chunk.size = static_cast<std::int64_t>(body.size());
    chunk.data = std::make_unique<char[]>(body.size());
    std::memcpy(chunk.data.get(), body.data(), body.size());
    return chunk;
}

constexpr struct {
    FourCC type;
    int bits;
    std::uint32_t flags;
    bool isSwapped;
} kFiles[] = {
    {fourCC("WAVE"), 8, 12, true},  {fourCC("WAVE"), 16, 12, false}, {fourCC("WAVE"), 24, 12, false},
    {fourCC("WAVE"), 32, 9, false}, {fourCC("AIFF"), 8, 14, false},  {fourCC("AIFF"), 16, 14, true},
    {fourCC("AIFF"), 24, 14, true}, {fourCC("AIFC"), 16, 14, true},  {fourCC("AIFC"), 32, 11, true},
    {fourCC("caff"), 16, 14, true}, {fourCC("caff"), 24, 14, true},  {fourCC("caff"), 32, 11, true},
};

} // namespace

TEST(CAuFileIO, LibsndfileReadsWhatItWrote)
{
    const TemporaryFolder folder;
    const std::string path = folder / "audio";
    for (const auto& test : kFiles) {
        for (const int channels : {1, 2}) {
            SCOPED_TRACE(fourCCText(test.type) + std::to_string(test.bits) + " " + std::to_string(channels));
            std::filesystem::remove(path);
            CAuFileIO file;
            ASSERT_EQ(file.CreateAndOpen(::file(path), 0, channels, test.bits, 44100, test.type, nullptr), 0);
            EXPECT_EQ(file.DataFormat().formatFlags, test.flags);
            EXPECT_EQ(file.Swapped(), test.isSwapped);
            EXPECT_EQ(file.FileType(), test.type);
            auto samples = testWave(static_cast<std::size_t>(3000 * channels));
            ASSERT_EQ(file.WriteFloat(samples.data(), 0, 2000), 0);
            ASSERT_EQ(file.WriteFloat(samples.data() + 2000 * channels, 2000, 1000), 0);
            EXPECT_EQ(file.NumFrames(), 0); // as counted when it was opened
            CChunkData note = chunkOf(fourCC("note"), "behind");
            EXPECT_EQ(file.AddChunk(note, 0), 1);
            file.Close();

            const Sound sound = readSound(path);
            EXPECT_EQ(sound.info.samplerate, 44100);
            ASSERT_EQ(sound.samples.size(), samples.size());
            const float step = test.bits == 32 ? 0 : std::ldexp(1.0F, 1 - test.bits);
            for (std::size_t i = 0; i < samples.size(); ++i)
                ASSERT_NEAR(sound.samples[i], samples[i], step) << i;
        }
    }
}

TEST(CAuFileIO, ReadsWhatLibsndfileWrote)
{
    const TemporaryFolder folder;
    const std::string path = folder / "audio";
    constexpr long frames = 20011; // several pieces
    for (const int format : kSoundFormats) {
        SCOPED_TRACE(format);
        writeSound(path, format, 2, frames);
        const Sound sound = readSound(path);
        CAuFileIO file;
        ASSERT_EQ(file.Open(::file(path), false), 0);
        EXPECT_EQ(file.NumFrames(), frames);
        EXPECT_EQ(file.NumChannels(), 2U);
        EXPECT_EQ(file.SampleRate(), 44100U);
        EXPECT_EQ(file.BytesToFrames(static_cast<unsigned long long>(file.FramesToBytes(77)) + 1), 77);
        std::vector<float> samples(2 * frames);
        long read = frames;
        EXPECT_EQ(file.ReadFloat(samples.data(), 0, read), 0);
        EXPECT_EQ(read, frames);
        EXPECT_EQ(samples, sound.samples);
        read = 100;
        EXPECT_EQ(file.ReadFloat(samples.data(), frames - 7, read), 0); // past the end
        EXPECT_EQ(read, 7);
        EXPECT_TRUE(std::equal(samples.begin(), samples.begin() + 14, sound.samples.end() - 14));
    }
}

TEST(CAuFileIO, ARangeThatCannotBeReadIsZero)
{
    const TemporaryFolder folder;
    const std::string path = folder / "audio";
    writeSound(path, SF_FORMAT_WAV | SF_FORMAT_PCM_16, 2, 40000);
    CAuFileIO file;
    ASSERT_EQ(file.Open(::file(path), false), 0);
    std::vector<float> samples(2 * 40000 + 1);
    const auto isZeroed = [&](long frames) {
        return std::all_of(samples.begin(), samples.begin() + 2 * frames, [](float sample) { return sample == 0; }) &&
               samples[static_cast<std::size_t>(2 * frames)] == 7;
    };
    FaultInjector faults;
    for (const int nth : {1, 2}) {
        samples.assign(samples.size(), 7);
        faults.fail(Call::pread, EIO, nth);
        long frames = 40000;
        EXPECT_EQ(file.ReadFloat(samples.data(), 0, frames), kStatusIOError);
        EXPECT_TRUE(isZeroed(40000));
    }
    samples.assign(samples.size(), 7);
    long frames = 10;
    EXPECT_EQ(file.ReadFloat(samples.data(), 40000, frames), kStatusEndOfFile);
    EXPECT_TRUE(isZeroed(10));
    EXPECT_EQ(frames, 10);
    for (const long start : {-1L, LONG_MIN}) {
        samples.assign(samples.size(), 7);
        EXPECT_EQ(file.ReadFloat(samples.data(), start, frames), kStatusParameterError);
        EXPECT_TRUE(isZeroed(10)) << start;
    }
    EXPECT_EQ(file.ReadFloat(nullptr, 0, frames), kStatusParameterError);
    file.Close();
    samples.assign(samples.size(), 7);
    EXPECT_EQ(file.ReadFloat(samples.data(), 0, frames), kStatusNotOpen);
    EXPECT_TRUE(isZeroed(10));
}

TEST(CAuFileIO, OpensAndStaysOpen)
{
    const TemporaryFolder folder;
    const std::string path = folder / "audio";
    writeSound(path, SF_FORMAT_AIFF | SF_FORMAT_PCM_16, 1, 100);
    int status = 1;
    CAuFileIO file(status, ::file(path), false);
    EXPECT_EQ(status, 0);
    EXPECT_EQ(file.OpenMode(), 1);
    {
        FaultInjector calls;
        EXPECT_EQ(file.Open(false), 0);
        EXPECT_EQ(calls.calls(Call::openFile) + calls.calls(Call::openFileWithoutLinks), 0);
        EXPECT_EQ(file.Open(true), 0);
        EXPECT_GT(calls.calls(Call::openFile), 0);
    }
    EXPECT_EQ(file.OpenMode(), 3);
    file.Close();
    EXPECT_EQ(file.OpenMode(), 3);
    EXPECT_EQ(file.BitDepth(), 16U);
    file.CloseFileAndInit();
    EXPECT_EQ(file.OpenMode(), -1);
    EXPECT_EQ(file.BitDepth() + file.FileType() + static_cast<unsigned>(file.NumFrames()), 0U);
    EXPECT_EQ(file.Open(false), 0); // the reference stayed

    EXPECT_EQ(file.Open(::file(folder / "none"), true), kStatusFileNotFound);
    EXPECT_EQ(file.OpenMode(), 3); // the one that was wanted
    EXPECT_EQ(file.BitDepth(), 0U);
    EXPECT_EQ(file.Open(CFileRef(), false), kStatusParameterError);

    platform::FileHandle handle;
    ASSERT_TRUE(::file(path).GetFSRef(&handle));
    EXPECT_EQ(file.Open(&handle, false), 0);
    EXPECT_EQ(file.NumFrames(), 100);
    EXPECT_EQ(file.Open(static_cast<const platform::FileHandle*>(nullptr), false), kStatusParameterError);

    for (const int format :
         {SF_FORMAT_WAV | SF_FORMAT_IMA_ADPCM, SF_FORMAT_CAF | SF_FORMAT_ALAC_16, SF_FORMAT_AIFF | SF_FORMAT_ULAW}) {
        writeSound(path, format, 1, 100);
        EXPECT_EQ(file.Open(::file(path), true), -208);
        EXPECT_EQ(file.OpenMode(), -1);
        EXPECT_EQ(file.NumChannels() + file.FileType(), 0U);
    }
}

TEST(CAuFileIO, WritesOnlyWhereItMay)
{
    const TemporaryFolder folder;
    const std::string path = folder / "audio";
    writeSound(path, SF_FORMAT_AIFF | SF_FORMAT_PCM_16, 1, 100);
    CAuFileIO file;
    float samples[8] = {};
    std::int16_t data[2] = {0x0102, 0x0304};
    CChunkData note = chunkOf(fourCC("note"), "text");
    EXPECT_EQ(file.WriteFloat(samples, 0, 8), -54);
    EXPECT_EQ(file.WriteData(data, 0, 2), -1);
    EXPECT_EQ(file.AddChunk(note, 0), -1);
    EXPECT_EQ(file.RemoveChunk(fourCC("note")), -1);
    EXPECT_EQ(file.FindChunk(fourCC("note"), note), -1);
    ASSERT_EQ(file.Open(::file(path), false), 0);
    EXPECT_EQ(file.WriteFloat(samples, 0, 8), -54);
    EXPECT_EQ(file.WriteFloat(nullptr, 0, 8), -54);
    EXPECT_EQ(file.AddChunk(note, 0), -1);
    EXPECT_EQ(file.RemoveChunk(fourCC("note")), -1);
    EXPECT_EQ(file.WriteData(data, 0, 2), kStatusWritePermission);
    ASSERT_EQ(file.Open(true), 0);
    EXPECT_EQ(file.WriteFloat(nullptr, 0, 8), kStatusParameterError);
    EXPECT_EQ(file.WriteFloat(samples, 0, LONG_MAX), kStatusParameterError);
    EXPECT_EQ(file.WriteFloat(samples, 101, 1), kStatusParameterError); // a gap
    EXPECT_EQ(file.WriteData(data, LONG_MAX, 2), kStatusParameterError);
    file.Close();
    EXPECT_EQ(file.WriteFloat(samples, 0, 8), kStatusNotOpen);
    EXPECT_EQ(file.AddChunk(note, 0), -1);
    EXPECT_EQ(file.FindChunk(fourCC("note"), note), -2);
}

TEST(CAuFileIO, DataIsWrittenInTheFilesOrderAndLeftInIt)
{
    const TemporaryFolder folder;
    for (const auto type : {fourCC("WAVE"), fourCC("caff")}) {
        const std::string path = folder / fourCCText(type);
        CAuFileIO file;
        ASSERT_EQ(file.CreateAndOpen(::file(path).URL(), 0, 2, 16, 48000, type, nullptr), 0);
        std::int16_t data[4] = {0x0102, 0x0304, 0x0506, 0x0708};
        ASSERT_EQ(file.WriteData(data, 0, 2), 0);
        const auto order = type == fourCC("WAVE") ? std::endian::little : std::endian::big;
        EXPECT_EQ(data[0], order == std::endian::native ? 0x0102 : 0x0201);
        std::int16_t more[2] = {0x1112, 0x1314};
        ASSERT_EQ(file.WriteData(more, 1, 1), 0);
        float samples[4];
        long frames = 2;
        ASSERT_EQ(file.ReadFloat(samples, 0, frames), 0);
        EXPECT_EQ(samples[1], 0x0304 / 32768.0F);
        EXPECT_EQ(samples[2], 0x1112 / 32768.0F);
    }
}

TEST(CAuFileIO, ChunksAreUserDataThatTheContainerClassFinds)
{
    const TemporaryFolder folder;
    const std::string path = folder / "audio";
    for (const int format : {SF_FORMAT_WAV | SF_FORMAT_PCM_16, SF_FORMAT_AIFF | SF_FORMAT_PCM_16}) {
        writeSound(path, format, 1, 100);
        const Sound before = readSound(path);
        CAuFileIO file;
        ASSERT_EQ(file.Open(::file(path), true), 0);
        CChunkData chunk = chunkOf(fourCC("basc"), "old");
        EXPECT_FALSE(file.IsVireoLoop());
        EXPECT_EQ(file.AddChunk(chunk, 0), 1);
        chunk = chunkOf(fourCC("basc"), "replaced");
        EXPECT_EQ(file.AddChunk(chunk, 1), 1);
        EXPECT_TRUE(file.IsVireoLoop());
        CChunkData empty = chunkOf(fourCC("none"), "");
        EXPECT_EQ(file.AddChunk(empty, 0), 1);

        CChunkData found = chunkOf(fourCC("prev"), "previous");
        EXPECT_EQ(file.FindChunk(fourCC("none"), found), -2); // it is empty
        EXPECT_EQ(found.size, 8);
        EXPECT_EQ(file.FindChunk(fourCC("basc"), found), 1);
        EXPECT_EQ(textOf(found.bytes()), "replaced");
        EXPECT_EQ(found.id, fourCC("basc"));
        EXPECT_EQ(found.position, -1);
        EXPECT_EQ(found.next, -1);
        CAudioFileIO other(::file(path), 0);
        EXPECT_EQ(other.FindChunk(fourCC("basc"), found), 1);
        EXPECT_EQ(textOf(found.bytes()), "replaced");
        EXPECT_EQ(readSound(path).samples, before.samples);

        EXPECT_EQ(file.RemoveChunk(fourCC("basc")), 0);
        EXPECT_LT(file.RemoveChunk(fourCC("basc")), 0);
        EXPECT_FALSE(file.IsVireoLoop());
        chunk.size = -1;
        EXPECT_EQ(file.AddChunk(chunk, 0), -1);
    }
    // An item that exists but cannot be read.
    CChunkData chunk = chunkOf(fourCC("note"), std::string(100000, 'n'));
    CAuFileIO file;
    ASSERT_EQ(file.Open(::file(path), true), 0);
    ASSERT_EQ(file.AddChunk(chunk, 0), 1);
    std::uint32_t id = fourCC("note");
    ASSERT_EQ(file.FindChunk(static_cast<long>(id), chunk), 1);
    FaultInjector faults;
    faults.fail(Call::pread, EIO);
    EXPECT_EQ(file.FindChunk(static_cast<long>(id), chunk), -3);
    EXPECT_EQ(chunk.size + chunk.position + chunk.next, 0);
    EXPECT_EQ(chunk.data, nullptr);
}

TEST(CAuFileIO, AFileThatCannotBeCreatedChangesNothing)
{
    const TemporaryFolder folder;
    const std::string path = folder / "audio";
    writeSound(path, SF_FORMAT_WAV | SF_FORMAT_PCM_16, 1, 100);
    CAuFileIO file;
    ASSERT_EQ(file.Open(::file(path), false), 0);
    const auto create = [&](const std::string& name, int channels, int bits, long rate, FourCC type) {
        return file.CreateAndOpen(::file(folder / name), 0, channels, bits, rate, type, nullptr);
    };
    EXPECT_EQ(create("audio", 1, 16, 44100, fourCC("WAVE")), kStatusDuplicateName);
    EXPECT_EQ(create("new", 1, 32, 44100, fourCC("AIFF")), kStatusParameterError); // floats
    EXPECT_EQ(create("new", 0, 16, 44100, fourCC("WAVE")), kStatusParameterError);
    EXPECT_EQ(create("new", -1, 16, 44100, fourCC("WAVE")), kStatusParameterError);
    EXPECT_EQ(create("new", 1, 12, 44100, fourCC("WAVE")), kStatusParameterError);
    EXPECT_EQ(create("new", 1, 16, 0, fourCC("WAVE")), kStatusParameterError);
    EXPECT_EQ(create("new", 1, 16, 44100, fourCC("Ogg ")), kStatusParameterError);
    EXPECT_EQ(file.NumFrames(), 100);
    EXPECT_EQ(file.OpenMode(), 1);
    EXPECT_FALSE(std::filesystem::exists(folder / "new"));
    EXPECT_EQ(file.CreateAndOpen(platform::URLRef(), 0, 1, 16, 44100, fourCC("WAVE"), nullptr), kStatusParameterError);
    EXPECT_EQ(create("new", 1, 16, 44100, fourCC("WAVE")), 0);
    EXPECT_EQ(file.NumFrames(), 0); // nothing is left of the file before
}

TEST(CAuFileIO, ByteOrderTurnsLittleEndianOfWAVEElseBig)
{
    const TemporaryFolder folder;
    for (const int container : {int{SF_FORMAT_WAV}, int{SF_FORMAT_AIFF}, 0}) {
        CAuFileIO file;
        if (container != 0) {
            writeSound(folder / "audio", container | SF_FORMAT_PCM_16, 1, 1);
            ASSERT_EQ(file.Open(::file(folder / "audio"), false), 0);
        }
        int number = 0x01020304;
        unsigned int natural = 0x01020304;
        short little = 0x0102;
        unsigned short least = 0x0102;
        file.ByteOrder(number), file.ByteOrder(natural), file.ByteOrder(little), file.ByteOrder(least);
        const auto order = container == SF_FORMAT_WAV ? std::endian::little : std::endian::big;
        EXPECT_EQ(number, inByteOrder(0x01020304, order));
        EXPECT_EQ(natural, inByteOrder(0x01020304U, order));
        EXPECT_EQ(little, inByteOrder<short>(0x0102, order));
        EXPECT_EQ(least, inByteOrder<unsigned short>(0x0102, order));
    }
}
