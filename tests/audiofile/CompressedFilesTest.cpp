// Files other than editable containers: damaged compressed ones, files that are no audio, linear PCM.
#include "audiofile/CAudioFileIO.h"

#include "MemoryAudioFile.h"
#include "SoundFile.h"
#include "support/TemporaryFolder.h"

namespace {

AudioFileInfo describe(const CFileRef& ref, std::int32_t& status)
{
    CFileIO file;
    EXPECT_EQ(file.OpenRead(ref, 0), kStatusOK);
    AudioFileInfo info;
    status = GetAudioFileInfo(file, 0, info);
    return info;
}

} // namespace

TEST(CompressedFiles, BrokenAndForeignOnes)
{
    const TemporaryFolder folder;
    std::int32_t status = 0;
    writeSound(folder / "a.flac", SF_FORMAT_FLAC | SF_FORMAT_PCM_16, 1, 30011);
    const Bytes flac = readFile(folder / "a.flac");
    EXPECT_EQ(describe(flac, &status).frames, 30011); // in memory, too
    EXPECT_EQ(describe(flac).sourceBits, 16);
    EXPECT_EQ(status, kStatusOK);
    EXPECT_EQ(describe(BytesView(flac).first(25), &status).frames, 0);
    EXPECT_EQ(status, kStatusEndOfFile);
    EXPECT_LE(describe(BytesView(flac).first(60)).frames, 6 * 65535); // what that many bytes can hold
    float frame = 0;
    CAudioFileIO file;
    const auto block = std::make_shared<KTMem>(flac.size());
    std::copy(flac.begin(), flac.end(), block->data());
    file.SetCache(block);
    ASSERT_EQ(file.Open(CFileRef(), kFileIOMemory), kStatusOK);
    EXPECT_EQ(file.ReadFrames(&frame, 0, 1), kStatusParameterError); // the decoder could not open it
    for (const char* content : {"", "O", "OggS", "OggS and nothing else", "text, of more than 16 bytes"}) {
        const CFileRef ref(folder.write("file", content).c_str(), false);
        const AudioFileInfo info = describe(ref, status);
        EXPECT_NE(status, kStatusOK) << content;
        EXPECT_EQ(info.frames, 0) << content;
        EXPECT_EQ(file.Open(ref, 0), kStatusOK) << content;
        EXPECT_NE(file.ReadFrames(&frame, 0, 1), kStatusOK) << content;
    }
}

TEST(CompressedFiles, LinearPCMInContainersThatAreOnlyRead)
{
    const TemporaryFolder folder;
    const std::string path = folder / "sound";
    constexpr long frames = 2011;
    for (const int format : kSoundFormatsToRead) {
        SCOPED_TRACE(format);
        writeSound(path, format, 2, frames);
        const Bytes before = readFile(path);
        const Sound sound = readSound(path);
        CAudioFileIO file;
        ASSERT_EQ(file.OpenReadWrite(CFileRef(path.c_str(), false), 0), kStatusOK);
        EXPECT_TRUE(file.Info().IsLinearPCM());
        EXPECT_EQ(file.Info().frames, frames);
        EXPECT_EQ(file.Info().sampleRate, 44100);
        std::vector<float> samples(2 * frames);
        EXPECT_EQ(file.ReadFrames(samples.data(), 0, frames), kStatusOK);
        EXPECT_EQ(samples, sound.samples);
        // They cannot be extended, and have no place for chunks.
        EXPECT_NE(file.WriteFrames(samples.data(), frames, 10), kStatusOK);
        EXPECT_EQ(file.AddChunk(fourCC("note"), bytesOf("abcd"), false), 0);
        EXPECT_EQ(file.Close(), kStatusOK);
        EXPECT_EQ(readFile(path), before);
    }
}
