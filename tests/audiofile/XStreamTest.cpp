// The stream interface: files of libsndfile read from any position; checks on opening; properties; the registry.
// c/StreamClient.c compiles the same header as C.
#include "audiofile/XStream.h"

#include "AllocationCount.h"
#include "SoundFile.h"
#include "audiofile/XStreamSaver.h"
#include "media/userdata/AudioFileService.h"
#include "platform/core/Packed.h"
#include "platform/core/Status.h"
#include "support/FakeDecoder.h"
#include "support/FaultInjection.h"
#include "support/References.h"
#include "support/TemporaryFolder.h"

#include <bit>
#include <cstring>
#include <filesystem>
#include <random>

namespace {

XStreamDescription floats(std::uint32_t channels)
{
    const std::uint32_t flags = std::endian::native == std::endian::big ? 11 : 9;
    return {44100, fourCC("lpcm"), flags, 4 * channels, 1, 4 * channels, channels, 32, 0};
}

/// A stream that is closed on destruction.
struct Stream {
    XStreamRef handle = nullptr;
    std::int32_t status;
    explicit Stream(const std::string& path, std::uint32_t flags = 0, const XStreamDescription* client = nullptr,
                    const XStreamChannelLayout* layout = nullptr)
    {
        status = XStreamOpen(path.c_str(), flags, 0, 0, client, layout, &handle);
    }
    ~Stream() { XStreamClose(handle); }
    Stream(const Stream&) = delete;
    Stream& operator=(const Stream&) = delete;
};

/// The file that the stream has opened.
XStreamFileRef lentBy(const Stream& stream)
{
    platform::AudioHandle* file = nullptr;
    std::uint32_t size = sizeof file;
    EXPECT_EQ(XStreamGetProperty(stream.handle, fourCC("afil"), &size, &file), 0);
    EXPECT_NE(file, nullptr);
    return file;
}

FourCC fileTypeOf(const Stream& stream)
{
    FourCC type = 1;
    std::uint32_t size = 4;
    EXPECT_EQ(XStreamGetProperty(stream.handle, fourCC("#fmt"), &size, &type), 0);
    return type;
}

} // namespace

TEST(XStream, ReadsWhatLibsndfileReadsFromAnyPlace)
{
    const TemporaryFolder folder;
    const std::string path = folder / "sound";
    std::vector<int> formats(std::begin(kSoundFormats), std::end(kSoundFormats));
    formats.insert(formats.end(), std::begin(kSoundFormatsToRead), std::end(kSoundFormatsToRead));
    for (const int format : formats) {
        for (const int channels : {1, 2, 6}) {
            SCOPED_TRACE(std::to_string(format) + " " + std::to_string(channels));
            writeSound(path, format, channels, 20011);
            const Sound sound = readSound(path);
            const std::int64_t frames = sound.info.frames; // one more where it counts the pad byte
            const XStreamDescription client = floats(static_cast<std::uint32_t>(channels));
            const Stream stream(path, 0, &client);
            ASSERT_EQ(stream.status, 0);
            std::vector<float> block(static_cast<std::size_t>(512 * channels));
            std::mt19937 random(static_cast<unsigned>(format));
            std::int64_t position = 0;
            for (int i = 0; i < 60; ++i, position = static_cast<std::int64_t>(random()) % (frames + 100)) {
                std::uint32_t read = 1, bytes = 1;
                ASSERT_EQ(XStreamReadFramesSync(stream.handle, position, 512, &read, block.data(), &bytes), 0);
                ASSERT_EQ(read, std::clamp<std::int64_t>(frames - position, 0, 512));
                ASSERT_EQ(bytes, read * client.bytesPerFrame);
                ASSERT_TRUE(read == 0 || std::equal(block.begin(), block.begin() + std::int64_t{read} * channels,
                                                    sound.samples.begin() + position * channels))
                    << position;
            }
        }
    }
}

TEST(XStream, ReadingAllocatesNothing)
{
    const TemporaryFolder folder;
    const std::string path = folder / "sound";
    writeSound(path, SF_FORMAT_AIFF | SF_FORMAT_PCM_24, 2, 5000);
    for (const std::uint32_t channels : {1U, 2U}) {
        const XStreamDescription client = floats(channels);
        const Stream stream(path, 0, &client);
        std::vector<float> block(5000 * channels);
        const std::size_t before = allocationCount();
        for (std::int64_t position = 0; position < 5000; position += 512)
            ASSERT_EQ(XStreamReadFramesSync(stream.handle, position, 5000, nullptr, block.data(), nullptr), 0);
        EXPECT_EQ(allocationCount(), before);
    }
}

TEST(XStream, AReadRequestIsFilledInOnSuccessOnly)
{
    const TemporaryFolder folder;
    writeSound(folder / "sound", SF_FORMAT_WAV | SF_FORMAT_PCM_16, 2, 100);
    const Stream stream(folder / "sound");
    std::vector<char> memory(4000);
    int calls = 0;
    XStreamReadRequest request{};
    request.position = 90;
    request.framesRequested = 50;
    request.completion = [](void* user) { ++*static_cast<int*>(user); };
    request.userPointer = &calls;
    request.completionState = &calls;
    request.buffer = memory.data();
    EXPECT_EQ(XStreamReadFrames(stream.handle, &request), 0);
    EXPECT_EQ(request.framesRead, 10U);
    EXPECT_EQ(request.bytesRead, 40U); // of the file's own format
    EXPECT_EQ(request.framesRequested, 50U);
    EXPECT_EQ(request.completionState, nullptr);
    EXPECT_EQ(calls, 1);

    request.completionState = &calls;
    const XStreamReadRequest before = request;
    FaultInjector faults;
    faults.fail(Call::pread, EIO);
    EXPECT_EQ(XStreamReadFrames(stream.handle, &request), kStatusIOError);
    EXPECT_EQ(std::memcmp(&before, &request, sizeof request), 0);
    EXPECT_EQ(calls, 1);

    std::uint32_t frames = 7, bytes = 7;
    faults.fail(Call::pread, EIO);
    EXPECT_EQ(XStreamReadFramesSync(stream.handle, 0, 5, &frames, memory.data(), &bytes), kStatusIOError);
    EXPECT_EQ(frames + bytes, 0U);
    EXPECT_EQ(XStreamReadFramesSync(stream.handle, -1, 5, &frames, memory.data(), &bytes), kStatusBeforeStart);
    EXPECT_EQ(XStreamReadFramesSync(stream.handle, 0, 0x40000001, &frames, memory.data(), &bytes),
              kStatusParameterError); // 4 GiB and 4 bytes
    request.completion = nullptr;
    EXPECT_EQ(XStreamReadFrames(stream.handle, &request), 0);
    EXPECT_EQ(request.completionState, &calls);
}

TEST(XStream, ArgumentsThatAreMissing)
{
    const TemporaryFolder folder;
    writeSound(folder / "sound", SF_FORMAT_WAV | SF_FORMAT_PCM_16, 1, 100);
    const std::string path = folder / "sound";
    const Stream stream(path);
    XStreamRef other = &other;
    XStreamReadRequest request{};
    char memory[64];
    std::uint32_t size = 64;
    const XStreamDescription client = floats(1);
    const CFileRef parent(folder.path().c_str(), true);
    const std::int32_t statuses[] = {
        XStreamOpen(nullptr, 0, 0, 0, nullptr, nullptr, &other),
        XStreamOpen(path.c_str(), 0, 0, 0, nullptr, nullptr, nullptr),
        XStreamOpen("", 0, 0, 0, nullptr, nullptr, &other),
        XStreamOpenWithFileRef(file(path), 0, 0, 0, nullptr, nullptr, nullptr),
        XStreamOpenWithFileRef(CFileRef(), 0, 0, 0, nullptr, nullptr, &other),
        XStreamOpenWithFileRef(nullptr, 0, 0, 0, nullptr, nullptr, &other),
        XStreamCreateWithFileRef(parent, nullptr, 0, 0, fourCC("WAVE"), &client, 0, 0, &other),
        XStreamCreateWithFileRef(parent, "new", 0, 0, fourCC("WAVE"), nullptr, 0, 0, &other),
        XStreamCreateWithFileRef(parent, "new", 0, 0, fourCC("WAVE"), &client, 0, 0, nullptr),
        XStreamCreateWithFileRef(nullptr, "new", 0, 0, fourCC("WAVE"), &client, 0, 0, &other),
        XStreamClose(nullptr),
        XStreamCloseFile(nullptr),
        XStreamCloseFile(stream.handle),
        XStreamCloseFile(lentBy(stream)),
        XStreamReadFrames(stream.handle, nullptr),
        XStreamReadFrames(nullptr, &request),
        XStreamReadFramesSync(nullptr, 0, 1, nullptr, memory, nullptr),
        XStreamReadFramesSync(stream.handle, 0, 1, nullptr, nullptr, nullptr),
        XStreamGetProperty(nullptr, fourCC("ffmt"), &size, memory),
        XStreamGetProperty(stream.handle, fourCC("ffmt"), nullptr, memory),
        XStreamGetProperty(stream.handle, fourCC("ffmt"), &size, nullptr),
        XStreamSetProperty(nullptr, fourCC("cfmt"), 40, &client),
        XStreamSetProperty(stream.handle, fourCC("cfmt"), 40, nullptr),
        XStreamGetPropertyInfo(nullptr, fourCC("ffmt"), nullptr, nullptr),
    };
    for (const std::int32_t& status : statuses)
        EXPECT_EQ(status, kStatusParameterError) << &status - statuses;
    EXPECT_EQ(other, nullptr);
    for (const auto function : {XStreamWriteFrames, XStreamReadPackets, XStreamWritePackets})
        EXPECT_EQ(function(nullptr, nullptr), -4);
}

TEST(XStream, OpensPathsOfAtMost1023Bytes)
{
    const TemporaryFolder folder;
    std::string longest = folder.path();
    while (longest.size() < 900) {
        longest += "/" + std::string(99, 'd');
        std::filesystem::create_directory(longest);
    }
    longest += "/" + std::string(1023 - longest.size() - 1, 'f');
    writeSound(longest, SF_FORMAT_WAV | SF_FORMAT_PCM_16, 1, 100);
    std::filesystem::copy_file(longest, longest + "f");
    XStreamRef stream = nullptr;
    ASSERT_EQ(XStreamOpenWithFileRef(file(longest), 0xFFFFFF00, 0, 0, nullptr, nullptr, &stream), 0);
    EXPECT_EQ(XStreamClose(stream), 0);
    FaultInjector calls;
    EXPECT_EQ(XStreamOpenWithFileRef(file(longest + "f"), 0, 0, 0, nullptr, nullptr, &stream), kStatusParameterError);
    EXPECT_EQ(stream, nullptr);
    EXPECT_EQ(calls.calls(Call::openFile) + calls.calls(Call::openFileWithoutLinks), 0);
}

TEST(XStream, ClientFormatAndLayoutAreSetOrTheStreamIsNotOpened)
{
    const TemporaryFolder folder;
    const std::string path = folder / "sound";
    writeSound(path, SF_FORMAT_WAV | SF_FORMAT_PCM_16, 2, 100);
    XStreamDescription client = floats(1);
    XStreamChannelLayout mono{0x00640001, 0, 0, {}}, stereo{0x00650002, 0, 0, {}};
    EXPECT_EQ(Stream(path, 0, &client, &mono).status, 0);
    const Stream wrong(path, 0, &client, &stereo);
    EXPECT_EQ(wrong.status, kStatusParameterError);
    EXPECT_EQ(wrong.handle, nullptr);
    EXPECT_EQ(Stream(path, 0, nullptr, &mono).status, 0); // without a format it is not looked at
    client.formatId = fourCC("aac ");
    const Stream coded(path, 0, &client);
    EXPECT_EQ(coded.status, 0x666D743F);
    EXPECT_EQ(coded.handle, nullptr);
    EXPECT_EQ(Stream(folder / "none").status, kStatusFileNotFound);
}

TEST(XStream, AtAnotherRatePlacesAndCountsAreOfThatRate)
{
    const TemporaryFolder folder;
    const std::string path = folder / "sound";
    writeSound(path, SF_FORMAT_WAV | SF_FORMAT_PCM_16, 1, 441);
    XStreamDescription client = floats(1);
    client.sampleRate = 48000;
    {
        const FakeDecoder::NoModule nothing; // which only unusual ratios need
        XStreamDescription unusual = client;
        unusual.sampleRate = 44099;
        const Stream refused(path, 0, &unusual);
        EXPECT_EQ(refused.status, 0x666D743F);
        EXPECT_EQ(refused.handle, nullptr);
    }
    if (platform::decoderModule() == nullptr)
        GTEST_SKIP() << "the decoder module is not built";
    const Stream stream(path, 0, &client);
    ASSERT_EQ(stream.status, 0);
    float whole[500], block[100];
    std::uint32_t read = 0;
    ASSERT_EQ(XStreamReadFramesSync(stream.handle, 0, 500, &read, whole, nullptr), 0);
    EXPECT_EQ(read, 480U);
    ASSERT_EQ(XStreamReadFramesSync(stream.handle, 450, 100, &read, block, nullptr), 0);
    EXPECT_EQ(read, 30U);
    EXPECT_EQ(std::memcmp(block, whole + 450, 30 * sizeof(float)), 0);
    std::int64_t frames = 0;
    std::uint32_t size = sizeof frames;
    EXPECT_EQ(XStreamGetProperty(stream.handle, fourCC("#frm"), &size, &frames), 0);
    EXPECT_EQ(frames, 441);
    const std::size_t before = allocationCount();
    for (std::int64_t position = 0; position < 480; position += 48)
        ASSERT_EQ(XStreamReadFramesSync(stream.handle, position, 48, nullptr, block, nullptr), 0);
    EXPECT_EQ(allocationCount(), before);
}

TEST(XStream, CodedFilesAreCheckedWhenTheyAreOpened)
{
    const TemporaryFolder folder;
    const std::string path = folder.write("file", "coded");
    const struct {
        const char* formatId;
        std::optional<std::int64_t> validFrames;
        std::uint32_t flags;
        std::int32_t status;
    } cases[] = {
        {".mp3", 1000, 0, 0},
        {".mp3", 0, 0, -66566},
        {".mp3", 0, 1, 0},
        {".mp3", 0, 2, -66566},
        {".mp3", {}, 0, 0},
        {"aac ", 0, 0, 0},
        {"sac1", 1000, 0, 0x666D743F},
        {"sal1", 1000, 1, 0x666D743F},
    };
    for (const auto& test : cases) {
        SCOPED_TRACE(test.formatId);
        FakeDecoder::File file;
        file.formatId = loadBE<FourCC>(test.formatId);
        file.validFrames = test.validFrames;
        const FakeDecoder::Module module(file);
        const Stream stream(path, test.flags);
        EXPECT_EQ(stream.status, test.status);
        EXPECT_EQ(stream.handle != nullptr, test.status == 0);
    }
}

TEST(XStream, TheFileTypeQueryMapsItsCodes)
{
    const TemporaryFolder folder;
    const struct {
        int format;
        const char* type;
    } files[] = {{SF_FORMAT_WAV | SF_FORMAT_PCM_16, "WAVE"},
                 {SF_FORMAT_AIFF | SF_FORMAT_PCM_16, "AIFF"},
                 {SF_FORMAT_AIFF | SF_FORMAT_FLOAT, "AIFF"}, // AIFC
                 {SF_FORMAT_CAF | SF_FORMAT_PCM_16, "caff"}};
    for (const auto& test : files) {
        writeSound(folder / "sound", test.format, 1, 10);
        const Stream stream(folder / "sound");
        EXPECT_EQ(fileTypeOf(stream), loadBE<FourCC>(test.type));
        char type[8];
        for (std::uint32_t size : {0U, 3U, 8U})
            EXPECT_EQ(XStreamGetProperty(stream.handle, fourCC("#fmt"), &size, type), 0x2173697A);
    }
    const std::string path = folder.write("file", "coded");
    FakeDecoder::File file;
    const FakeDecoder::Module module(file);
    for (const auto& [type, expected] : {std::pair{"m4af", "M4A "}, {"mp4f", "mpg4"}, {"MPG3", "MPG3"}}) {
        file.fileType = loadBE<FourCC>(type);
        EXPECT_EQ(fileTypeOf(Stream(path)), loadBE<FourCC>(expected));
    }
    file.hasFile = false;
    EXPECT_EQ(fileTypeOf(Stream(path)), 0U);
}

TEST(XStream, PropertiesOfTheReaderComeFirstThenThoseOfItsFile)
{
    const TemporaryFolder folder;
    writeSound(folder / "sound", SF_FORMAT_WAV | SF_FORMAT_PCM_16, 1, 10);
    const Stream stream(folder / "sound");
    XStreamDescription format{};
    std::uint32_t size = sizeof format;
    EXPECT_EQ(XStreamGetProperty(stream.handle, fourCC("ffmt"), &size, &format), 0);
    EXPECT_EQ(format.bitsPerChannel, 16U);
    std::uint64_t packets = 0;
    EXPECT_EQ(XStreamGetProperty(stream.handle, fourCC("pcnt"), &(size = 8), &packets), 0);
    EXPECT_EQ(packets, 10U);
    EXPECT_EQ(XStreamGetProperty(stream.handle, fourCC("pcnt"), &(size = 7), &packets), 0x2173697A);
    EXPECT_EQ(XStreamGetProperty(stream.handle, fourCC("none"), &(size = 8), &packets),
              platform::AudioFile::kUnsupportedProperty);
    const XStreamDescription client = floats(1);
    EXPECT_EQ(XStreamSetProperty(stream.handle, fourCC("cfmt"), 40, &client), 0);
    EXPECT_EQ(XStreamSetProperty(stream.handle, fourCC("cfmt"), 36, &client), 0x2173697A);
    // The file service receives the stream, which does not belong to it.
    EXPECT_EQ(XStreamSetProperty(stream.handle, fourCC("pcnt"), 8, &packets), kStatusParameterError);
    std::uint32_t isWritable = 1;
    EXPECT_EQ(XStreamGetPropertyInfo(stream.handle, fourCC("pcnt"), &size, &isWritable), kStatusParameterError);
    EXPECT_EQ(size + isWritable, 0U);

    FakeDecoder::File file;
    file.hasFile = false;
    const FakeDecoder::Module module(file);
    const Stream coded(folder.write("file", "coded"));
    EXPECT_EQ(XStreamGetProperty(coded.handle, fourCC("pcnt"), &(size = 8), &packets), kStatusParameterError);
    EXPECT_EQ(XStreamSetProperty(coded.handle, fourCC("pcnt"), 8, &packets), kStatusParameterError);
}

TEST(XStream, CreatesFilesInAFolder)
{
    const TemporaryFolder folder;
    const CFileRef parent(folder.path().c_str(), true);
    const XStreamDescription format{48000, fourCC("lpcm"), 12, 4, 1, 4, 2, 16, 0};
    const auto create = [&](std::uint32_t flags, XStreamFileRef& file) {
        return XStreamCreateWithFileRef(parent, "n\u00E9w.wav", flags, 0, fourCC("WAVE"), &format, 0, 0, &file);
    };
    XStreamFileRef file = nullptr;
    ASSERT_EQ(create(0, file), 0);
    const std::int16_t samples[] = {1, 2, 3, 4};
    std::uint32_t packets = 2, size = 0, isWritable = 1;
    auto& handle = static_cast<platform::AudioFile&>(*static_cast<platform::AudioHandle*>(file));
    EXPECT_EQ(handle.writePackets(0, packets, samples), 0);
    EXPECT_EQ(XStreamGetPropertyInfo(file, fourCC("dfmt"), &size, &isWritable), 0);
    EXPECT_EQ(size, 40U);
    EXPECT_EQ(isWritable, 0U);
    EXPECT_EQ(XStreamClose(file), kStatusParameterError); // no stream
    EXPECT_EQ(XStreamCloseFile(file), 0);
    EXPECT_EQ(readSound(folder / "n\u00E9w.wav").info.frames, 2);

    EXPECT_EQ(create(0x100, file), kStatusDuplicateName); // only the low byte counts
    EXPECT_EQ(file, nullptr);
    EXPECT_EQ(create(1, file), 0);
    EXPECT_EQ(XStreamCloseFile(file), 0);
    EXPECT_EQ(readSound(folder / "n\u00E9w.wav").info.frames, 0);
    EXPECT_TRUE(parent == CFileRef(folder.path().c_str(), true)); // a copy was appended to
}

TEST(XStreamSaver, TheLatestOfEqualReferencesIsFound)
{
    const TemporaryFolder folder;
    const std::string path = folder / "sound", other = folder / "other";
    writeSound(path, SF_FORMAT_WAV | SF_FORMAT_PCM_16, 1, 10);
    XStreamRef stream = nullptr;
    EXPECT_EQ(XStreamSaver::GetFirstXStreamObject(), nullptr);
    FaultInjector calls;
    {
        ASSERT_EQ(XStreamOpen(path.c_str(), 0, 0, 0, nullptr, nullptr, &stream), 0);
        const XStreamSaver first(stream, file(path));
        auto second = std::make_unique<XStreamSaver>(nullptr, file(path));
        const XStreamSaver third(nullptr, file(other));
        EXPECT_EQ(XStreamSaver::GetFirstXStreamObject(), &third);
        EXPECT_EQ(XStreamSaver::FindXStreamObject(file(path)), second.get());
        EXPECT_EQ(XStreamSaver::FindXStreamObject(file(folder / "none")), nullptr);
        second.reset(); // from the middle
        EXPECT_EQ(third.GetNextXStreamObject(), &first);
        EXPECT_EQ(XStreamSaver::FindXStreamObject(file(path)), &first);
        EXPECT_EQ(calls.calls(Call::close), 0);
    }
    EXPECT_EQ(calls.calls(Call::close), 1); // the stream's file
    EXPECT_EQ(XStreamSaver::GetFirstXStreamObject(), nullptr);
}
