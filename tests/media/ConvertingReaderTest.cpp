// Frames in the caller's format: linear PCM read by the library, others through the seam of the decoder module.
#include "media/decoding/ConvertingReader.h"

#include "AudioContainers.h"
#include "ReaderFrames.h"
#include "support/FakeDecoder.h"
#include "support/FaultInjection.h"

#include <cmath>

using namespace platform;

TEST(ConvertingReader, ConvertsSamplesAndChannels)
{
    const TemporaryFolder folder;
    const SampleFormat floats{.bits = 32, .isFloat = true, .order = std::endian::native};
    const SampleFormat doubles{.bits = 64, .isFloat = true, .order = std::endian::native};
    const struct {
        std::uint32_t channels, wanted;
        std::vector<std::int16_t> samples;
        std::vector<float> expected;
    } cases[] = {
        {1, 1, {16384, -32768}, {0.5F, -1}},
        {2, 2, {16384, 8192, 0, -8192}, {0.5F, 0.25F, 0, -0.25F}},
        {1, 3, {16384, 8192}, {0.5F, 0.5F, 0.5F, 0.25F, 0.25F, 0.25F}},          // one to all
        {2, 1, {16384, 8192, 8192, -8192}, {0.375F, 0}},                         // all to one
        {3, 2, {16384, 8192, 4096, 0, 1024, 4096}, {0.5F, 0.25F, 0, 1 / 32.0F}}, // the surplus left out
        {2, 4, {16384, 8192}, {0.5F, 0.25F, 0, 0}},                              // the missing silent
    };
    for (const auto& test : cases) {
        SCOPED_TRACE(std::to_string(test.channels) + " to " + std::to_string(test.wanted));
        const auto format = StreamDescription::packedPCM(44100, test.channels, {.bits = 16});
        const std::string path = writeAudio(folder, fourCC("WAVE"), format, test.samples);
        const auto reader = openReader(path);
        ASSERT_EQ(reader->setClientFormat(StreamDescription::packedPCM(44100, test.wanted, floats)), 0);
        EXPECT_EQ(readFrom<float>(*reader, 0, 100), test.expected);
        ASSERT_EQ(reader->setClientFormat(StreamDescription::packedPCM(44100, test.wanted, doubles)), 0);
        EXPECT_EQ(readFrom<double>(*reader, 0, 100), std::vector<double>(test.expected.begin(), test.expected.end()));
    }
}

TEST(ConvertingReader, RefusesClientFormatsThatMakeNoSense)
{
    const TemporaryFolder folder;
    const auto good = StreamDescription::packedPCM(44100, 2, {.bits = 16});
    const auto reader = openReader(writeAudio(folder, fourCC("WAVE"), good, std::vector<std::int16_t>(8, 1)));
    const auto refuses = [&](auto change) {
        StreamDescription format = good;
        change(format);
        EXPECT_EQ(reader->setClientFormat(format), AudioHandle::kFormatNotSupported);
        EXPECT_EQ(reader->clientFormat(), good);
    };
    using D = StreamDescription;
    refuses([](D& format) { format.sampleRate = std::nan(""); });
    refuses([](D& format) { format.formatId = fourCC("aac "); });
    refuses([](D& format) { format.formatFlags |= 32; }); // not interleaved
    refuses([](D& format) { format.formatFlags = 8; });   // unsigned
    refuses([](D& format) { format.channelsPerFrame = 0; });
    refuses([](D& format) { format.channelsPerFrame = 0x80000001; }); // twice that is 2
    refuses([](D& format) { format.bytesPerFrame = format.bytesPerPacket = 6; });
    refuses([](D& format) { format.framesPerPacket = 0; });
    refuses([](D& format) { format.bitsPerChannel = 12; });
    refuses([](D& format) { format.bitsPerChannel = 0xFFFFFFFF; });

    AudioBuffer buffers[2] = {{2, 8, nullptr}, {2, 8, nullptr}};
    for (const std::size_t count : {0U, 1U, 2U}) { // nowhere, to no memory, to a buffer for each channel
        std::uint32_t frames = 2;
        EXPECT_EQ(reader->read(frames, {buffers, count}), kStatusParameterError) << count;
        EXPECT_EQ(frames, 0U);
    }
    char memory[8];
    AudioBuffer mono{1, 8, memory}, small{2, 7, memory};
    std::uint32_t frames = 2;
    EXPECT_EQ(reader->read(frames, {&mono, 1}), kStatusParameterError);
    frames = 2;
    EXPECT_EQ(reader->read(frames, {&small, 1}), 0); // as many as there is room for
    EXPECT_EQ(frames, 1U);
}

TEST(ConvertingReader, TakesALayoutOfTheClientsChannels)
{
    const TemporaryFolder folder;
    const auto format = StreamDescription::packedPCM(44100, 1, {.bits = 16});
    const auto reader = openReader(writeAudio(folder, fourCC("WAVE"), format, std::vector<std::int16_t>(8, 1)));
    const auto set = [&](std::uint32_t tag, std::uint32_t bitmap, std::uint32_t count, std::uint32_t size) {
        ChannelLayout layout{tag, bitmap, count, {}};
        return reader->setProperty(ConvertingReader::clientLayoutProperty, size, &layout);
    };
    std::uint32_t size = 32;
    ChannelLayout layout;
    EXPECT_EQ(reader->property(ConvertingReader::clientLayoutProperty, size, &layout),
              ConvertingReader::kPropertyNotSupported);
    EXPECT_EQ(set(0x00640001, 0, 0, 32), 0);
    EXPECT_EQ(reader->property(ConvertingReader::clientLayoutProperty, size, &layout), 0);
    EXPECT_EQ(layout.tag, 0x00640001U);
    EXPECT_EQ(set(0, 0, 1, 32), 0);
    EXPECT_EQ(set(0x10000, 8, 0, 12), 0);
    EXPECT_EQ(set(0x00650002, 0, 0, 32), kStatusParameterError); // two channels
    EXPECT_EQ(set(0x10000, 3, 0, 32), kStatusParameterError);
    EXPECT_EQ(set(0, 0, 2, 32), AudioHandle::kBadPropertySize); // the second description is not there
    EXPECT_EQ(set(0, 0, 1, 11), AudioHandle::kBadPropertySize);
}

TEST(ConvertingReader, TellsSizesOfItsPropertiesAndWhichMayBeSet)
{
    const TemporaryFolder folder;
    FakeDecoder::File coded{.validFrames = 900};
    const FakeDecoder::Module module(coded);
    const auto format = StreamDescription::packedPCM(44100, 1, {.bits = 16});
    const auto linear = openReader(writeAudio(folder, fourCC("WAVE"), format, std::vector<std::int16_t>(8, 1)));
    const auto decoded = openReader(folder.write("file", "coded"));
    ASSERT_TRUE(linear && decoded);
    const struct {
        FourCC id;
        std::uint32_t sizeOfLinear, sizeOfCoded; // 0: not supported
        bool isWritable;
    } cases[] = {
        {ConvertingReader::fileFormatProperty, 40, 40, false}, {ConvertingReader::clientFormatProperty, 40, 40, true},
        {ConvertingReader::frameCountProperty, 8, 8, false},   {ConvertingReader::audioFileProperty, 8, 8, false},
        {ConvertingReader::packetTableProperty, 0, 16, false}, {fourCC("none"), 0, 0, false},
    };
    for (const auto& expected : cases)
        for (ConvertingReader* reader : {linear.get(), decoded.get()}) {
            const std::uint32_t there = reader == linear.get() ? expected.sizeOfLinear : expected.sizeOfCoded;
            std::uint32_t size = 99;
            bool isWritable = !expected.isWritable;
            EXPECT_EQ(reader->propertyInfo(expected.id, size, isWritable),
                      there > 0 ? kStatusOK : ConvertingReader::kPropertyNotSupported)
                << fourCCText(expected.id);
            EXPECT_EQ(size, there) << fourCCText(expected.id);
            EXPECT_EQ(isWritable, expected.isWritable) << fourCCText(expected.id);
        }
    std::uint32_t size = 99;
    bool isWritable = false;
    EXPECT_EQ(linear->propertyInfo(ConvertingReader::clientLayoutProperty, size, isWritable), 0);
    EXPECT_EQ(size, 0u); // none was set
    EXPECT_TRUE(isWritable);
}

TEST(ConvertingReader, WidensSamplesOfOddBits)
{
    const TemporaryFolder folder;
    Chunks chunks{formatChunk(fourCC("AIFF")), dataChunk(fourCC("AIFF"))};
    chunks[0].second[7] = 12; // in 16, from the top
    const auto reader = openReader(folder.write("12.aiff", buildContainer(fourCC("AIFF"), chunks)));
    ASSERT_TRUE(reader);
    EXPECT_EQ(reader->fileFormat().bitsPerChannel, 12U);
    EXPECT_EQ(reader->clientFormat().bitsPerChannel, 16U);
    EXPECT_EQ(readFrom<char>(*reader, 0, 9), std::vector<char>(testSamples.begin(), testSamples.end()));
}

TEST(ConvertingReader, RefusesWhatItCannotDecode)
{
    const TemporaryFolder folder;
    Chunks compressed{formatChunk(fourCC("caff")), dataChunk(fourCC("caff"))};
    compressed[0].second.replace(8, 4, "aac ");
    Chunks wide{formatChunk(fourCC("caff")), dataChunk(fourCC("caff"))};
    wide[0].second.replace(16, 16, std::string("\xFF\xFF\xFF\xFE\0\0\0\1\x7F\xFF\xFF\xFF\0\0\0\x10", 16));
    const std::string content[] = {
        std::string(textOf(buildContainer(fourCC("caff"), compressed))),
        std::string(textOf(buildContainer(fourCC("caff"), wide))), // frames of 4 GiB
        "ID3 and more, but nothing that is known",
        "",
    };
    for (const std::string& bytes : content) {
        std::int32_t status = 0;
        Error error;
        EXPECT_EQ(openReader(folder.write("file", bytes), &status, &error), nullptr);
        EXPECT_NE(status, kStatusOK);
        EXPECT_EQ(error.code, status);
        const FakeDecoder::NoModule nothing;
        EXPECT_EQ(openReader(folder / "file", &status, &error), nullptr);
        EXPECT_EQ(status, AudioHandle::kFormatNotSupported);
        EXPECT_EQ(error.code, status);
        EXPECT_NE(error.description.find("install libktfiles-ffmpeg"), std::string::npos) << error.description;
    }
    std::int32_t status = 0;
    Error error;
    EXPECT_EQ(openReader(folder / "none", &status, &error), nullptr);
    EXPECT_EQ(status, kStatusFileNotFound);
    EXPECT_EQ(error.description, StatusText(status));
    EXPECT_EQ(openReader(folder.path(), &status), nullptr);
    EXPECT_EQ(status, kStatusParameterError);
    const Chunks formatless{dataChunk(fourCC("WAVE"))};
    EXPECT_EQ(openReader(folder.write("wav", buildContainer(fourCC("WAVE"), formatless)), &status), nullptr);
    EXPECT_EQ(status, kStatusIOError);
}

TEST(ConvertingReader, ReadsThroughADecoderOfTheModule)
{
    const TemporaryFolder folder;
    const std::string path = folder.write("file", "coded");
    FakeDecoder::File file;
    const FakeDecoder::Module module(file);
    const auto reader = openReader(path);
    ASSERT_TRUE(reader);
    ASSERT_EQ(reader->setClientFormat(
                  StreamDescription::packedPCM(44100, 1, {.bits = 32, .isFloat = true, .order = std::endian::native})),
              0);
    const auto values = readFrom<float>(*reader, 0, 20); // three calls of the decoder
    ASSERT_EQ(values.size(), 20U);
    EXPECT_EQ(values[19], 19.25F);
    EXPECT_EQ(readFrom<float>(*reader, 20, 20)[0], 20.25F);
    EXPECT_EQ(file.seeks, 0); // going on is no seek
    EXPECT_EQ(readFrom<float>(*reader, 990, 20).size(), 10U);
    EXPECT_EQ(file.seeks, 1);

    // A failure keeps the position, and the decoder is brought back to it.
    file.failingSeek = 2;
    EXPECT_EQ(reader->seek(5), kStatusIOError);
    EXPECT_EQ(readFrom<float>(*reader, 100, 2)[0], 100.25F);
    file.broken = 130;
    ASSERT_EQ(reader->seek(120), 0);
    float values2[20];
    AudioBuffer buffer{1, sizeof values2, values2};
    std::uint32_t frames = 20;
    EXPECT_EQ(reader->read(frames, {&buffer, 1}), kStatusIOError);
    EXPECT_EQ(frames, 0U);
    file.broken = 0;
    EXPECT_EQ(readFrom<float>(*reader, 120, 2)[0], 120.25F);
}

TEST(ConvertingReader, TellsOfReadsThatFail)
{
    const TemporaryFolder folder;
    const auto format = StreamDescription::packedPCM(44100, 1, {.bits = 16});
    const std::string path = writeAudio(folder, fourCC("WAVE"), format, std::vector<std::int16_t>(50000, 3));
    FaultInjector faults;
    const auto reader = openReader(path);
    ASSERT_EQ(reader->setClientFormat(StreamDescription::packedPCM(44100, 1, {.bits = 8})), 0);
    std::vector<char> memory(50000);
    for (const int nth : {1, 2}) { // the first piece, and one that follows
        faults.fail(Call::pread, EIO, nth);
        AudioBuffer buffer{1, 50000, memory.data()};
        std::uint32_t frames = 50000;
        EXPECT_EQ(reader->read(frames, {&buffer, 1}), kStatusIOError);
        EXPECT_EQ(frames, 0U);
        EXPECT_EQ(buffer.byteSize, 0U);
    }
    EXPECT_EQ(readFrom<char>(*reader, 0, 50000).size(), 50000U);
}
