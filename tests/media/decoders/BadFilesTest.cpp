// Damaged files, files that are no audio, and files with other content besides: a status, and no output on standard
// error.
#include "Sounds.h"
#include "platform/core/Status.h"

#include <gtest/gtest.h>

#include <cmath>
#include <cstring>
#include <fcntl.h>
#include <random>
#include <regex>
#include <unistd.h>

using namespace platform;

namespace {

/// Captures standard error during its lifetime, from any library.
class StandardError {
public:
    explicit StandardError(const TemporaryFolder& folder) : path_(folder / "stderr"), kept_(dup(STDERR_FILENO))
    {
        const int file = ::open(path_.c_str(), O_CREAT | O_TRUNC | O_WRONLY | O_CLOEXEC, 0600);
        dup2(file, STDERR_FILENO);
        close(file);
    }
    ~StandardError()
    {
        dup2(kept_, STDERR_FILENO);
        close(kept_);
    }
    StandardError(const StandardError&) = delete;
    StandardError& operator=(const StandardError&) = delete;
    std::string text() const { return std::string(textOf(readFile(path_))); }

private:
    std::string path_;
    int kept_;
};

/// Opens and reads everything, some of it twice. True if it opened; promised frames must be delivered.
bool readsThrough(const std::string& path)
{
    std::int32_t status = 1;
    const auto reader = openReader(path, &status);
    if (!reader) {
        EXPECT_NE(status, 0) << "no status";
        return false;
    }
    const std::uint64_t count = reader->frameCount();
    const std::uint32_t frameSize = reader->clientFormat().bytesPerFrame;
    EXPECT_LT(count, 1u << 22) << "a file of some seconds";
    Bytes buffer(std::size_t{4096} * frameSize);
    for (const std::uint64_t start : {std::uint64_t{0}, count / 2}) {
        std::uint64_t at = start;
        EXPECT_EQ(reader->seek(static_cast<std::int64_t>(at)), 0);
        for (std::uint32_t frames = 1; frames > 0; at += frames) {
            AudioBuffer block{reader->clientFormat().channelsPerFrame, static_cast<std::uint32_t>(buffer.size()),
                              buffer.data()};
            frames = 4096;
            if (const std::int32_t failed = reader->read(frames, {&block, 1}); failed != 0)
                return failed != 0;
        }
        EXPECT_EQ(at, std::max(start, count));
    }
    return true;
}

std::size_t openDescriptors()
{
    const std::filesystem::directory_iterator all("/proc/self/fd");
    return static_cast<std::size_t>(std::distance(begin(all), end(all)));
}

/// A file to derive mutants from.
struct Original {
    const char* name;
    const char* command;
};

const Original originals[] = {
    {"a.mp3", "lame --quiet -V 4 source.wav a.mp3"},   {"a.m4a", "ffmpeg -i source.wav -c:a aac a.m4a"},
    {"a.flac", "ffmpeg -i source.wav a.flac"},         {"a.aac", "ffmpeg -i source.wav -c:a aac -f adts a.aac"},
    {"a.caf", "ffmpeg -i source.wav -c:a alac a.caf"}, {"a.wv", "wavpack -q --blocksize=512 source.wav -o a.wv"},
    {"a.wav", "sox -D source.wav -e ima-adpcm a.wav"},
};

std::ostream& operator<<(std::ostream& out, const Original& original)
{
    return out << original.name;
}

class Mutants : public testing::TestWithParam<Original> {};

} // namespace

TEST_P(Mutants, GiveAStatusOrTheirFrames)
{
    constexpr int mutants = 1000;
    const TemporaryFolder folder;
    writeSound(folder / "source.wav", 8820, 2, 44100, 16);
    ASSERT_TRUE(runs(folder, GetParam().command));
    const Bytes original = readFile(folder / GetParam().name);
    ASSERT_TRUE(readsThrough(folder / GetParam().name));
    const std::size_t descriptors = openDescriptors();
    std::mt19937 random(21);
    int opened = 0;
    std::string said;
    {
        const StandardError standardError(folder);
        for (int i = 0; i < mutants && !testing::Test::HasFailure(); ++i) {
            Bytes mutant = original;
            if (i % 4 == 0)
                mutant.resize(random() % mutant.size());
            // Headers are at the start of some files and at the end of others.
            const std::size_t near = i % 2 == 0 ? mutant.size() : std::min<std::size_t>(mutant.size(), 400);
            for (unsigned flips = i % 4 == 0 ? 0 : 1 + random() % 8; flips > 0; --flips)
                mutant[random() % near] ^= static_cast<std::byte>(1 << random() % 8);
            opened += readsThrough(folder.write(GetParam().name, BytesView(mutant))) ? 1 : 0;
        }
        said = standardError.text();
    }
    // FFmpeg logs this without a context, so only the process could suppress it.
    said = std::regex_replace(said, std::regex("Ignoring attempt to set invalid timebase [^\n]*\n"), "");
    EXPECT_EQ(said, "");
    EXPECT_EQ(openDescriptors(), descriptors);
    EXPECT_GT(opened, mutants / 10);
    RecordProperty("opened", opened);
}

INSTANTIATE_TEST_SUITE_P(Of, Mutants, testing::ValuesIn(originals),
                         [](const testing::TestParamInfo<Original>& test) { return std::string(test.param.name + 2); });

TEST(BadFiles, WhatIsNoAudioIsNotSupported)
{
    const TemporaryFolder folder;
    ASSERT_TRUE(runs(folder, "ffmpeg -f lavfi -i testsrc=size=64x48:rate=5 -t 2 -c:v mpeg4 silent.mkv"));
    ASSERT_TRUE(runs(folder, "ffmpeg -f lavfi -i testsrc=size=64x48:rate=5 -t 2 -c:v mpeg4 silent.mp4"));
    ASSERT_TRUE(runs(folder, "ffmpeg -f lavfi -i testsrc=size=64x48:rate=5 -frames:v 1 picture.png"));
    Bytes noise(100'000);
    std::mt19937 random(4);
    for (std::byte& byte : noise)
        byte = static_cast<std::byte>(random());
    folder.write("noise", BytesView(noise));
    folder.write("zeros.bin", BytesView(Bytes(100'000)));
    folder.write("empty.flac", "");
    folder.write("text.txt", "What is written here is no sound, whatever it says of sounds.\n");
    // Names of files and networks that a player would follow.
    folder.write("list.m3u8", "#EXTM3U\n#EXT-X-TARGETDURATION:1\n#EXTINF:1,\nsound.flac\n#EXT-X-ENDLIST\n");
    folder.write("list.ffconcat", "ffconcat version 1.0\nfile sound.flac\n");
    folder.write("list.sdp", "v=0\no=- 0 0 IN IP4 127.0.0.1\nc=IN IP4 127.0.0.1\nm=audio 9 RTP/AVP 0\n");
    writeSound(folder / "source.wav", 8820, 2, 44100, 16);
    ASSERT_TRUE(runs(folder, "ffmpeg -i source.wav sound.flac"));
    std::string said;
    {
        const StandardError standardError(folder);
        for (const char* name : {"silent.mkv", "silent.mp4", "picture.png", "noise", "zeros.bin", "empty.flac",
                                 "text.txt", "list.m3u8", "list.ffconcat", "list.sdp"}) {
            std::int32_t status = 0;
            Error error;
            EXPECT_FALSE(openReader(folder / name, &status, &error)) << name;
            EXPECT_EQ(status, AudioHandle::kFormatNotSupported) << name;
            EXPECT_EQ(error.description, "no audio that can be decoded") << name;
        }
        said = standardError.text();
    }
    EXPECT_EQ(said, "");
}

// After a break, the sound stays where it was; the gap is silent and counted.
TEST(BadFiles, ABrokenPacketIsSilenceAndMovesNothing)
{
    constexpr std::uint32_t frames = 100'000;
    const TemporaryFolder folder;
    writeSound(folder / "source.wav", frames, 1, 44100, 16);
    ASSERT_TRUE(runs(folder,
                     "ffmpeg -i source.wav a.flac && ffmpeg -i source.wav -c:a alac a.m4a && "
                     "ffmpeg -i source.wav a.tta && ffmpeg -i source.wav a.wv && oggenc -Q source.wav -o a.ogg && "
                     "ffmpeg -i source.wav -c:a flac a.mka"));
    for (const std::string name : {"a.flac", "a.m4a", "a.tta", "a.wv", "a.ogg", "a.mka"}) {
        const Bytes whole = allFramesOf(*openReader(folder / name), 4096);
        Bytes broken = readFile(folder / name);
        for (std::size_t i = 0; i < (name == "a.ogg" || name == "a.mka" ? 8u : 600u); ++i) // less than a packet
            broken[broken.size() / 2 + i] = std::byte{0x55};
        const auto reader = openReader(folder.write(name, BytesView(broken)));
        ASSERT_TRUE(reader) << name;
        EXPECT_EQ(reader->frameCount(), frames) << name;
        const Bytes all = allFramesOf(*reader, 4096);
        ASSERT_EQ(all.size(), whole.size()) << name;
        // Packets of TTA last a second, and most pages of Ogg do.
        const auto head = static_cast<std::ptrdiff_t>(whole.size() / 4);
        const auto tail = static_cast<std::ptrdiff_t>(whole.size() / 112 * 8);
        EXPECT_TRUE(std::equal(all.begin(), all.begin() + head, whole.begin())) << name;
        EXPECT_TRUE(std::equal(all.end() - tail, all.end(), whole.end() - tail)) << name;
        const std::uint32_t frameSize = reader->clientFormat().bytesPerFrame;
        std::uint64_t different = 0;
        for (std::size_t at = 0; at < all.size(); at += frameSize)
            different += std::memcmp(all.data() + at, whole.data() + at, frameSize) != 0 ? 1u : 0u;
        EXPECT_GT(different, 500u) << name;
        EXPECT_GE(reader->missingFrames(), different * 9 / 10) << name;
        EXPECT_LE(reader->missingFrames(), different + 10) << name; // of which some were silent
        std::uint64_t missing = 0;
        std::uint32_t size = sizeof missing;
        EXPECT_EQ(reader->property(ConvertingReader::missingFramesProperty, size, &missing), 0) << name;
        EXPECT_EQ(missing, reader->missingFrames()) << name;
        const std::uint64_t middle = frames / 2;
        const Bytes after = framesOf(*reader, middle, 3000);
        EXPECT_TRUE(
            std::equal(after.begin(), after.end(),
                       all.begin() + static_cast<std::ptrdiff_t>(middle * reader->clientFormat().bytesPerFrame)))
            << name;
    }
}

// A valid frame in the place of another: only the checksum of the whole sound reveals it.
TEST(BadFiles, FLACIsComparedWithItsChecksum)
{
    using Checksum = ConvertingReader::Checksum;
    const TemporaryFolder folder;
    for (const int bits : {8, 16, 24}) {
        writeSound(folder / "source.wav", 20'000, 2, 44100, 24);
        const std::string flac = "sox -D source.wav -b " + std::to_string(bits) + " a.flac";
        ASSERT_TRUE(runs(folder, flac)) << bits;
        Bytes bytes = readFile(folder / "a.flac");
        for (const bool isOther : {false, true}) {
            if (isOther)
                bytes[26] ^= std::byte{1}; // of the MD5, behind the stream's marker
            const auto reader = openReader(folder.write("b.flac", BytesView(bytes)));
            ASSERT_TRUE(reader) << bits;
            reader->compareChecksum();
            EXPECT_EQ(reader->checksum(), Checksum::notCompared) << bits;
            framesOf(*reader, 10'000, 20'000);
            EXPECT_EQ(reader->checksum(), Checksum::notCompared) << bits;
            for (int again = 0; again < 2; ++again) {
                allFramesOf(*reader, 3000);
                EXPECT_EQ(reader->checksum(), isOther ? Checksum::differs : Checksum::same) << bits;
            }
            EXPECT_EQ(reader->missingFrames(), 0u) << bits;
        }
    }
}

TEST(BadFiles, AFileCutShortGivesWhatIsThere)
{
    constexpr std::uint32_t frames = 400'000; // enough for the end to be looked for, not decoded to
    const TemporaryFolder folder;
    writeSound(folder / "source.wav", frames, 1, 44100, 16);
    ASSERT_TRUE(runs(folder, "ffmpeg -i source.wav a.flac && ffmpeg -i source.wav -c:a libvorbis a.ogg"));
    for (const char* name : {"a.flac", "a.ogg"}) {
        const Bytes whole = allFramesOf(*openReader(folder / name), 4096);
        Bytes cut = readFile(folder / name);
        cut.resize(cut.size() * 2 / 3);
        const auto reader = openReader(folder.write(name, BytesView(cut)));
        ASSERT_TRUE(reader) << name;
        EXPECT_LT(reader->frameCount(), frames * 9 / 10) << name;
        EXPECT_GT(reader->frameCount(), frames / 2) << name;
        const Bytes all = allFramesOf(*reader, 4096);
        EXPECT_EQ(all.size(), reader->frameCount() * reader->clientFormat().bytesPerFrame) << name;
        EXPECT_TRUE(std::equal(all.begin(), all.end(), whole.begin())) << name;
    }
}

TEST(BadFiles, AFileThatIsGoneHasAStatus)
{
    const TemporaryFolder folder;
    std::int32_t status = 0;
    EXPECT_FALSE(openReader(folder / "none.flac", &status));
    EXPECT_EQ(status, kStatusFileNotFound);
}

// Two concatenated files: the first one decides.
TEST(BadFiles, AChangeOfChannelsMidwayKeepsTheFormat)
{
    const TemporaryFolder folder;
    writeSound(folder / "one.wav", 48'000, 1, 48000, 16);
    writeSound(folder / "two.wav", 48'000, 2, 48000, 16);
    ASSERT_TRUE(runs(folder,
                     "for f in one two; do ffmpeg -i $f.wav -b:a 192k $f.ac3; done; cat one.ac3 two.ac3 > a.ac3; "
                     "cat two.ac3 one.ac3 > b.ac3"));
    const std::uint64_t count = openReader(folder / "one.ac3")->frameCount();
    for (const char* name : {"a.ac3", "b.ac3"}) {
        const auto reader = openReader(folder / name);
        ASSERT_TRUE(reader) << name;
        const std::uint32_t channels = reader->clientFormat().channelsPerFrame;
        EXPECT_EQ(channels, name[0] == 'a' ? 1u : 2u);
        EXPECT_EQ(reader->frameCount(), 2 * count) << name;
        std::vector<float> second(10'000 * std::size_t{channels});
        const Bytes frames = framesOf(*reader, count + 20'000, 10'000);
        ASSERT_EQ(frames.size(), second.size() * sizeof(float)) << name;
        std::memcpy(second.data(), frames.data(), frames.size());
        for (std::uint32_t c = 0; c < channels; ++c) {
            float peak = 0;
            for (std::size_t i = c; i < second.size(); i += channels)
                peak = std::max(peak, std::abs(second[i]));
            EXPECT_GT(peak, 0.2F) << name << " channel " << c;
        }
    }
}

// A file whose protected sound has its own id.
TEST(BadFiles, LockedSoundIsNotSupported)
{
    const TemporaryFolder folder;
    writeSound(folder / "source.wav", 20'000, 2, 44100, 16);
    ASSERT_TRUE(runs(folder, "ffmpeg -i source.wav -c:a aac a.m4a && ffmpeg -i source.wav -c:a alac a.caf"));
    struct Lock {
        const char *file, *plain, *locked;
    };
    for (const Lock& lock : {Lock{"a.m4a", "mp4a", "drms"}, Lock{"a.m4a", "mp4a", "enca"},
                             Lock{"a.caf", "alac", "sac1"}, Lock{"a.caf", "alac", "sal1"}}) {
        Bytes bytes = readFile(folder / lock.file);
        const std::size_t at =
            textOf(bytes).find(lock.plain, 20); // behind "ftyp", in the sample's or file's description
        ASSERT_NE(at, std::string_view::npos);
        std::copy_n(bytesOf(lock.locked).begin(), 4, bytes.begin() + static_cast<std::ptrdiff_t>(at));
        std::int32_t status = 0;
        EXPECT_FALSE(openReader(folder.write("locked", BytesView(bytes)), &status)) << lock.locked;
        EXPECT_EQ(status, AudioHandle::kFormatNotSupported) << lock.locked;
    }
}

// It opens, so that callers see what its table says.
TEST(BadFiles, AnMP3WithoutValidFramesOpensAndHasNone)
{
    const TemporaryFolder folder;
    writeSound(folder / "source.wav", 1500, 2, 44100, 16);
    ASSERT_TRUE(runs(folder, "lame --quiet -b 128 source.wav a.mp3"));
    Bytes bytes = readFile(folder / "a.mp3");
    const std::size_t tag = textOf(bytes).find("LAME");
    ASSERT_LT(tag, bytes.size());
    for (std::size_t i = 0; i < 3; ++i) // delay and padding, 12 bits each
        bytes[tag + 21 + i] = std::byte{0xFF};
    const auto reader = openReader(folder.write("a.mp3", BytesView(bytes)));
    ASSERT_TRUE(reader);
    PacketTable table{.validFrames = 1};
    std::uint32_t size = sizeof table;
    EXPECT_EQ(reader->property(ConvertingReader::packetTableProperty, size, &table), 0);
    EXPECT_EQ(table.validFrames, 0);
    EXPECT_EQ(reader->frameCount(), 0u);
    EXPECT_TRUE(framesOf(*reader, 0, 100).empty());
}

namespace {

/// Checksum of an Ogg page whose checksum field is 0.
std::uint32_t oggChecksum(BytesView page)
{
    std::uint32_t sum = 0;
    for (const std::byte byte : page) {
        sum ^= static_cast<std::uint32_t>(byte) << 24;
        for (int bit = 0; bit < 8; ++bit)
            sum = sum << 1 ^ (sum >> 31 != 0 ? 0x04C11DB7u : 0u);
    }
    return sum;
}

} // namespace

// Intact pages with impossible times.
TEST(BadFiles, TimesBeyondReasonAreNone)
{
    const TemporaryFolder folder;
    writeSound(folder / "source.wav", 300'000, 2, 44100, 16);
    ASSERT_TRUE(runs(folder, "ffmpeg -i source.wav -c:a libvorbis a.ogg"));
    const Bytes original = readFile(folder / "a.ogg");
    std::vector<std::size_t> pages;
    for (std::size_t at = 0; (at = textOf(original).find("OggS", at)) != std::string_view::npos; ++at)
        pages.push_back(at);
    ASSERT_GT(pages.size(), 5u);
    for (const std::size_t index : {std::size_t{2}, pages.size() / 2, pages.size() - 2, pages.size() - 1})
        for (const std::uint64_t time :
             {std::uint64_t{1} << 40, std::uint64_t{1} << 62, ~std::uint64_t{0} >> 1, std::uint64_t{1} << 63}) {
            Bytes bytes = original;
            const std::size_t page = pages[index];
            const std::size_t end = index + 1 < pages.size() ? pages[index + 1] : bytes.size();
            std::memcpy(bytes.data() + page + 6, &time, sizeof time);
            std::memset(bytes.data() + page + 22, 0, 4);
            const std::uint32_t sum = oggChecksum(BytesView(bytes).subspan(page, end - page));
            std::memcpy(bytes.data() + page + 22, &sum, sizeof sum);
            readsThrough(folder.write("b.ogg", BytesView(bytes))); // which expects a length of a few seconds
        }
}
