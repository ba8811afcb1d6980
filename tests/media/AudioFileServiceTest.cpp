// What the audio-file service reads, creates and refuses. Its edits: UserDataEditTest.cpp.
#include "media/userdata/AudioFileService.h"

#include "AudioContainers.h"
#include "platform/SystemCalls.h"
#include "platform/core/Status.h"
#include "support/FaultInjection.h"
#include "support/URLs.h"

#include <filesystem>

using namespace platform;
using namespace std::string_literals;

namespace {

std::uint64_t packetsOf(AudioFile& file)
{
    std::uint64_t packets = 0;
    EXPECT_EQ(file.audioDataPacketCount(packets), 0);
    return packets;
}

SampleFormat integers(int bits, std::endian order)
{
    return {.bits = bits, .isUnsigned = bits == 8 && order == std::endian::little, .order = order};
}

SampleFormat floats(int bits, std::endian order)
{
    return {.bits = bits, .isFloat = true, .order = order};
}

} // namespace

TEST(AudioFileService, CreatesWritesAndReadsLinearPCM)
{
    constexpr auto little = std::endian::little, big = std::endian::big;
    const struct {
        FourCC type;
        SampleFormat sample;
        bool succeeds;
    } cases[] = {
        {fourCC("WAVE"), integers(16, little), true},  {fourCC("WAVE"), integers(8, little), true},
        {fourCC("WAVE"), floats(32, little), true},    {fourCC("WAVE"), integers(16, big), false},
        {fourCC("WAVE"), integers(24, little), true},  {fourCC("AIFF"), integers(24, big), true},
        {fourCC("AIFF"), integers(8, big), true},      {fourCC("AIFF"), floats(32, big), false},
        {fourCC("AIFC"), floats(64, big), true},       {fourCC("AIFC"), integers(16, little), true},
        {fourCC("caff"), integers(24, big), true},     {fourCC("caff"), floats(32, little), true},
        {fourCC("REX2"), integers(16, little), false},
    };
    for (const auto& test : cases) {
        SCOPED_TRACE(fourCCText(test.type) + std::to_string(test.sample.bits));
        TemporaryFolder folder;
        const std::string path = folder / "file";
        std::int32_t status = 1;
        const auto format = StreamDescription::packedPCM(48000, 1, test.sample);
        auto file = AudioFile::create(*urlOf(path), test.type, format, &status);
        if (!test.succeeds) {
            EXPECT_EQ(status, kStatusParameterError);
            EXPECT_FALSE(std::filesystem::exists(path));
            continue;
        }
        ASSERT_EQ(status, 0);
        EXPECT_EQ(AudioFile::create(*urlOf(path), test.type, format, &status), nullptr);
        EXPECT_EQ(status, kStatusDuplicateName);

        // User data fits before the samples, so that these can still grow.
        std::string samples(5 * format.bytesPerFrame, '\0');
        for (std::size_t i = 0; i < samples.size(); ++i)
            samples[i] = static_cast<char>(i + 1);
        std::uint32_t packets = 3;
        ASSERT_EQ(file->writePackets(0, packets, samples.data()), 0);
        ASSERT_EQ(setItem(*file, fourCC("note"), 0, "item"), 0);
        packets = 2;
        ASSERT_EQ(file->writePackets(3, packets, samples.data() + 3 * format.bytesPerFrame), 0);
        file = openAudio(path, false);
        EXPECT_EQ(file->fileType(), test.type);
        StreamDescription found;
        EXPECT_EQ(file->dataFormat(found), 0);
        EXPECT_EQ(found, format);
        EXPECT_EQ(packetsOf(*file), 5u);
        std::string read(samples.size(), '\0');
        packets = 9;
        ASSERT_EQ(file->readPackets(1, packets, read.data()), 0);
        EXPECT_EQ(packets, 4u);
        EXPECT_EQ(read.substr(0, 4 * format.bytesPerFrame), samples.substr(format.bytesPerFrame));
        EXPECT_EQ(itemsOf(*file, fourCC("note")), std::vector<std::string>{"item"});
        walkContainer(readFile(path));
        // No speakers are stated: encoders turn a channel mask of 0 into files that decoders refuse.
        EXPECT_NE(loadBE<std::uint16_t>(readFile(path).data() + 56), 0xFEFF);
    }
}

TEST(AudioFileService, ReadsAndWritesWithinTheSamplesOnly)
{
    TemporaryFolder folder;
    const Bytes bytes = buildContainer(
        fourCC("WAVE"), {formatChunk(fourCC("WAVE")), dataChunk(fourCC("WAVE")), {fourCC("note"), "text"}});
    const auto file = openAudio(folder.write("file", bytes));
    std::string buffer(100, 'x');
    std::uint32_t count = 1;
    EXPECT_EQ(file->readPackets(8, count, buffer.data()), kStatusEndOfFile);
    EXPECT_EQ(count, 0u);
    EXPECT_EQ(file->readPackets(~0ull, count = 1, buffer.data()), kStatusEndOfFile);
    EXPECT_EQ(file->readBytes(15, count = 50, buffer.data()), 0);
    EXPECT_EQ(count, 1u);
    EXPECT_EQ(file->writePackets(9, count = 1, buffer.data()), kStatusParameterError) << "a gap";
    EXPECT_EQ(file->writePackets(7, count = 2, buffer.data()), kStatusEndOfFile) << "a chunk follows";
    EXPECT_EQ(file->writeBytes(14, count = 2, "xx"), 0);
    EXPECT_EQ(walkContainer(readFile(folder / "file"))[1].second, testSamples.substr(0, 14) + "xx");
    const auto reader = openAudio(folder / "file", false);
    EXPECT_EQ(reader->writeBytes(0, count = 2, buffer.data()), kStatusWritePermission);
    EXPECT_EQ(setItem(*reader, fourCC("note"), 0, "text"), kStatusWritePermission);
}

TEST(AudioFileService, GrowsPast4GiBWhereThereIsAReservation)
{
    TemporaryFolder folder;
    for (bool isReserved : {true, false}) {
        Chunks chunks{formatChunk(fourCC("WAVE")), {fourCC("data"), "12"}};
        if (isReserved)
            chunks.insert(chunks.begin(), {fourCC("JUNK"), std::string(28, '\0')});
        Bytes bytes = buildContainer(fourCC("WAVE"), chunks);
        const std::uint32_t size = 0xFFFFFF00;
        storeLE(bytes.data() + 4, static_cast<std::uint32_t>(bytes.size() - 10 + size));
        storeLE(bytes.data() + bytes.size() - 6, size);
        const std::string path = folder.write("file", bytes);
        std::filesystem::resize_file(path, bytes.size() - 2 + size); // sparse
        const auto file = openAudio(path);
        const std::string samples(1000, 's');
        std::uint32_t packets = 500;
        const std::int32_t status = file->writePackets(size / 2, packets, samples.data());
        EXPECT_EQ(status, isReserved ? 0 : kStatusFileTooBig);
        EXPECT_EQ(setItem(*file, fourCC("note"), 0, std::string(500, 'n')), isReserved ? 0 : kStatusFileTooBig);
        const auto again = openAudio(path, false);
        EXPECT_EQ(packetsOf(*again), size / 2 + (isReserved ? 500 : 0));
        EXPECT_EQ(itemsOf(*again, fourCC("note")).size(), isReserved ? 1u : 0u);
        std::string read(2, '\0');
        EXPECT_EQ(again->readPackets(size / 2 + 499, packets = 1, read.data()), isReserved ? 0 : kStatusEndOfFile);
        EXPECT_EQ(read, isReserved ? "ss" : "\0\0"s);
    }
}

TEST(AudioFileService, UserDataAreAddressedByTypeAndIndex)
{
    TemporaryFolder folder;
    const std::string path = folder.write("file", buildContainer(fourCC("caff"), {formatChunk(fourCC("caff")),
                                                                                  {fourCC("midi"), "one"},
                                                                                  {fourCC("free"), "filler"},
                                                                                  dataChunk(fourCC("caff")),
                                                                                  {fourCC("midi"), ""}}));
    const Bytes before = readFile(path);
    const auto file = openAudio(path);
    EXPECT_EQ(itemsOf(*file, fourCC("midi")), (std::vector<std::string>{"one", ""}));
    EXPECT_EQ(itemsOf(*file, fourCC("desc")).size(), 1u) << "can be read";
    EXPECT_EQ(itemsOf(*file, fourCC("free")).size(), 0u);
    std::uint32_t size = 2;
    std::string start(2, '\0');
    EXPECT_EQ(file->userData(fourCC("midi"), 0, size, start.data()), 0);
    EXPECT_EQ(start, "on");
    EXPECT_EQ(file->userData(fourCC("midi"), 2, size, start.data()), kStatusParameterError);
    EXPECT_EQ(file->userDataSize(fourCC("none"), 0, size), kStatusParameterError);
    EXPECT_EQ(setItem(*file, fourCC("midi"), 3, "x"), kStatusParameterError) << "no gap in the indices";
    EXPECT_EQ(file->setUserData(fourCC("midi"), 0, 1, nullptr), kStatusParameterError);
    for (FourCC type : {fourCC("desc"), fourCC("data"), fourCC("pakt"), fourCC("free"), 0u}) {
        EXPECT_EQ(setItem(*file, type, 0, "x"), kStatusParameterError) << fourCCText(type);
        EXPECT_EQ(file->removeUserData(type, 0), kStatusParameterError) << fourCCText(type);
    }
    EXPECT_EQ(readFile(path), before);
    // An edit through another handle is noticed.
    ASSERT_EQ(openAudio(path)->removeUserData(fourCC("midi"), 0), 0);
    EXPECT_EQ(itemsOf(*file, fourCC("midi")), std::vector<std::string>{""});
}

TEST(AudioFileService, HostileFilesCostNothing)
{
    TemporaryFolder folder;
    std::int32_t status = 0;
    EXPECT_EQ(openAudio(folder / "none", false, &status), nullptr);
    EXPECT_EQ(status, kStatusFileNotFound);
    EXPECT_EQ(openAudio(folder.path().string(), false, &status), nullptr);
    EXPECT_EQ(status, kStatusParameterError);
    for (const std::string& bytes : {""s, "RIFF"s, "RIFF\0\0\0\0WAV"s, "FORM\0\0\0\4ILBM"s, "text, no audio at all"s}) {
        EXPECT_EQ(openAudio(folder.write("file", bytes), false, &status), nullptr) << bytes;
        EXPECT_EQ(status, kStatusParameterError);
    }
    // 20 bytes that claim 4 GiB, negative sizes, a size that overflows: opened, bounded by the file, not extended.
    for (const std::string& bytes :
         {"RIFF\xFF\xFF\xFF\xFFWAVEnote\xFF\xFF\xFF\xFF"s,
          "FORM\x7F\xFF\xFF\xFF"
          "AIFFnote\xFF\xFF\xFF\xFF"s,
          "caff\0\1\0\0note\xFF\xFF\xFF\xFF\xFF\xFF\xFF\xFE"s, "caff\0\1\0\0note\x7F\xFF\xFF\xFF\xFF\xFF\xFF\xFF"s,
          "RF64\xFF\xFF\xFF\xFFWAVEds64\x1C\0\0\0"s + std::string(28, '\xFF') + "data\xFF\xFF\xFF\xFF"}) {
        const auto file = openAudio(folder.write("file", bytes));
        ASSERT_NE(file, nullptr);
        for (const std::string& item : itemsOf(*file, fourCC("note")))
            EXPECT_LE(item.size(), bytes.size());
        StreamDescription format;
        EXPECT_EQ(file->dataFormat(format), kStatusIOError);
    }
}

TEST(AudioFileService, CAFWhosePacketsHoldNoFramesIsReadByItsBits)
{
    TemporaryFolder folder;
    Chunks chunks{formatChunk(fourCC("caff")), dataChunk(fourCC("caff"))};
    chunks[0].second[23] = 0; // frames in a packet
    const auto file = openAudio(folder.write("file", buildContainer(fourCC("caff"), chunks)));
    ASSERT_NE(file, nullptr);
    StreamDescription format;
    EXPECT_EQ(file->dataFormat(format), kStatusOK); // and nothing is divided by 0
    EXPECT_EQ(format.framesPerPacket, 1U);
    EXPECT_EQ(format.bytesPerFrame, format.channelsPerFrame * format.bitsPerChannel / 8);
}

// EBU Tech 3306: a table holds the sizes of chunks other than "data" by id.
TEST(AudioFileService, RF64SizesOfOtherChunksStandInATableOfThree)
{
    TemporaryFolder folder;
    for (const std::uint32_t stated : {0u, 2u, 3u, 9u}) { // 9 are more than the chunk holds
        const FourCC rf64 = fourCC("RF64");
        Bytes bytes = buildContainer(rf64, {formatChunk(rf64), dataChunk(rf64), {fourCC("note"), "text"}});
        Bytes table(3 * 12);
        for (std::size_t i = 0; i < 3; ++i) {
            storeBE(table.data() + 12 * i, i == 2 ? fourCC("note") : fourCC("none"));
            storeLE(table.data() + 12 * i + 4, i == 2 ? std::uint64_t{4} : 1000);
        }
        storeLE(bytes.data() + bytes.size() - 8, 0xFFFFFFFFu);
        storeLE(bytes.data() + 16, 28 + 36u);
        storeLE(bytes.data() + 20, std::uint64_t{bytes.size() + 36 - 8});
        storeLE(bytes.data() + 44, stated);
        bytes.insert(bytes.begin() + 48, table.begin(), table.end());
        Bytes more(8 + 6); // so that a size missing from the table differs from the end of the file
        storeBE(more.data(), fourCC("more"));
        storeLE(more.data() + 4, 6u);
        bytes.insert(bytes.end(), more.begin(), more.end());
        storeLE(bytes.data() + 20, std::uint64_t{bytes.size() - 8});
        const auto file = openAudio(folder.write("file", bytes), false);
        ASSERT_NE(file, nullptr);
        EXPECT_EQ(itemsOf(*file, fourCC("more")).size(), stated >= 3 ? 1u : 0u) << stated;
        if (stated >= 3) {
            EXPECT_EQ(itemsOf(*file, fourCC("note")), std::vector<std::string>{"text"}) << stated;
        }
    }
}

TEST(AudioFileService, ManyTinyChunksAreScannedInLinearTime)
{
    TemporaryFolder folder;
    Chunks chunks{formatChunk(fourCC("caff"))};
    chunks.resize(100000, {fourCC("uuid"), "tiny"});
    chunks.push_back(dataChunk(fourCC("caff")));
    static int reads;
    reads = 0;
    const SystemCallGuard guard;
    static SystemCalls real;
    real = guard.real();
    systemCalls().pread = [](int descriptor, void* to, std::size_t count, std::int64_t position) {
        ++reads;
        return real.pread(descriptor, to, count, position);
    };
    const auto file = openAudio(folder.write("file", buildContainer(fourCC("caff"), chunks)));
    EXPECT_LT(reads, 1000) << "1.6 MB in windows";
    EXPECT_EQ(itemsOf(*file, fourCC("uuid")).size(), 99999u);
    EXPECT_LT(reads, 102000);
    EXPECT_EQ(packetsOf(*file), 8u);
}
