// What a file's ends prove is what decoding gives, whatever happened to the file; otherwise they report nothing.
#include "Sounds.h"
#include "media/decoding/CompressedAudio.h"
#include "media/packets/HighFirstCRC.h"
#include "platform/core/Status.h"
#include "support/FaultInjection.h"
#include "support/URLs.h"

#include <gtest/gtest.h>

#include <ostream>
#include <random>
#include <tuple>

using namespace platform;

namespace {

std::string textOf(std::int32_t status, const CompressedAudio& audio)
{
    const StreamDescription& format = audio.format;
    const SoundFacts& facts = audio.facts;
    std::string text = std::to_string(status);
    for (const auto number :
         {std::uint64_t{audio.fileType}, std::uint64_t{format.formatId}, static_cast<std::uint64_t>(format.sampleRate),
          std::uint64_t{format.formatFlags}, std::uint64_t{format.bytesPerPacket},
          std::uint64_t{format.framesPerPacket}, std::uint64_t{format.bytesPerFrame},
          std::uint64_t{format.channelsPerFrame}, std::uint64_t{format.bitsPerChannel}, audio.frames,
          std::uint64_t{facts.speakers}, static_cast<std::uint64_t>(facts.profile), std::uint64_t{facts.tracks},
          facts.promisedFrames, facts.bitstreamRate})
        text += " " + std::to_string(number);
    return text;
}

struct Making {
    const char* command; // of IN, OUT
    const char* name;
    FourCC type;
};
void PrintTo(const Making& making, std::ostream* out)
{
    *out << making.command;
}

/// True if the ends agree with decoding, false if they report nothing.
bool isProven(const std::string& path, FourCC type)
{
    CompressedAudio byEnds, byDecoding;
    const std::int32_t status = describeByEnds(path, type, byEnds);
    if (status != kStatusOK) {
        EXPECT_EQ(status, AudioHandle::kFormatNotSupported);
        return false;
    }
    const std::int32_t decoded = describeByDecoding(*urlOf(path), type, byDecoding);
    EXPECT_EQ(textOf(status, byEnds), textOf(decoded, byDecoding));
    return true;
}

class FileEnds : public ::testing::TestWithParam<Making> {
protected:
    /// The path of the encoded sound; empty if the coding does not support it.
    std::string made(std::uint32_t frames, std::uint32_t channels, double rate, int bits)
    {
        writeSound(folder_ / "IN.wav", frames, channels, rate, bits);
        std::string command = GetParam().command;
        const std::string name = std::to_string(channels) + GetParam().name;
        for (const auto& [what, with] : {std::pair("IN", std::string("IN.wav")), std::pair("OUT", name)})
            command.replace(command.find(what), std::string_view(what).size(), with);
        return runs(folder_, command) && std::filesystem::exists(folder_ / name) ? folder_ / name : "";
    }
    TemporaryFolder folder_;
};

} // namespace

TEST_P(FileEnds, proveWhatDecodingGives)
{
    const FourCC type = GetParam().type;
    int proven = 0;
    // The last packet is full or shorter.
    const std::tuple<std::uint32_t, std::uint32_t, double, int> sounds[] = {
        {220501, 2, 44100, 16}, {40000, 1, 16000, 16}, {50003, 6, 48000, 24}, {700, 2, 44100, 16}};
    for (const auto& [frames, channels, rate, bits] : sounds) {
        SCOPED_TRACE(std::to_string(channels) + " channels, " + std::to_string(frames));
        const std::string path = made(frames, channels, rate, bits);
        const bool mayFail = channels == 6 || frames < 1000; // some programs have no such files
        proven += !path.empty() && isProven(path, type) ? 1 : mayFail ? 0 : -100;
    }
    EXPECT_GE(proven, 2);
}

TEST_P(FileEnds, proveNothingElseOfVariants)
{
    constexpr std::size_t kCuts = 64, kMutants = 48, kEnds = 256;
    const FourCC type = GetParam().type;
    const Bytes content = readFile(made(900001, 2, 44100, 16));
    ASSERT_GT(content.size(), kEnds);
    for (std::size_t i = 1; i < kCuts; ++i) {
        SCOPED_TRACE("cut at " + std::to_string(i) + "/64");
        isProven(folder_.write("cut", BytesView(content).first(content.size() * i / kCuts)), type);
    }
    int proven = 0;
    std::minstd_rand random(7);
    const auto below = [&](std::size_t end) { return random() % end; };
    for (std::size_t i = 0; i < kMutants; ++i) {
        SCOPED_TRACE("mutant " + std::to_string(i));
        Bytes mutant = content;
        for (std::size_t changes = 1 + below(3); changes > 0; --changes) {
            const std::size_t at = i % 3 == 0   ? below(kEnds)
                                   : i % 3 == 1 ? content.size() - 1 - below(kEnds)
                                                : below(content.size());
            const std::byte values[] = {mutant[at] ^ std::byte{1} << below(8), std::byte{0}, std::byte{0xFF}};
            mutant[at] = values[below(std::size(values))];
        }
        proven += isProven(folder_.write("mutant", mutant), type) ? 1 : 0;
    }
    EXPECT_GT(proven, 0); // damaged where nothing depends on it
    // Data appended, the same file appended, a part removed, a part repeated.
    const auto part = [&](double from, double to) {
        const auto at = [&](double place) {
            return content.begin() + static_cast<std::ptrdiff_t>(place * static_cast<double>(content.size()));
        };
        return Bytes(at(from), at(to));
    };
    const auto joined = [](Bytes first, const Bytes& second) {
        first.insert(first.end(), second.begin(), second.end());
        return first;
    };
    for (const Bytes& variant :
         {joined(content, Bytes(7)), joined(content, content), joined(part(0, 0.1), part(0.2, 1)),
          joined(part(0, 0.6), part(0.4, 1)), joined(part(0, 0.9), part(0.95, 1))})
        isProven(folder_.write("variant", variant), type);
}

TEST_P(FileEnds, tellOfReadsThatFail)
{
    const std::string path = made(220501, 2, 44100, 16);
    CompressedAudio audio;
    int calls = 0;
    for (int failing = 0; failing <= calls; ++failing) {
        FaultInjector faults;
        if (failing > 0)
            faults.fail(Call::pread, EIO, failing);
        const std::int32_t status = describeByEnds(path, GetParam().type, audio);
        EXPECT_EQ(status, failing > 0 ? kStatusIOError : kStatusOK) << failing;
        calls = failing == 0 ? faults.calls(Call::pread) : calls;
    }
    EXPECT_GT(calls, 1);
}

INSTANTIATE_TEST_SUITE_P(Programs, FileEnds,
                         ::testing::Values(Making{"oggenc -q3 IN -o OUT", "a.ogg", fourCC("ogg ")},
                                           Making{"ffmpeg -i IN -c:a libvorbis OUT", "b.ogg", fourCC("ogg ")},
                                           Making{"opusenc IN OUT", "a.opus", fourCC("ogg ")},
                                           Making{"opusenc --framesize 60 IN OUT", "b.opus", fourCC("ogg ")},
                                           Making{"ffmpeg -i IN -c:a libopus OUT", "c.opus", fourCC("ogg ")},
                                           Making{"flac --ogg IN -o OUT", "a.oga", fourCC("ogg ")},
                                           Making{"ffmpeg -i IN -c:a flac OUT", "b.oga", fourCC("ogg ")},
                                           Making{"wavpack -h IN -o OUT", "a.wv", fourCC("wvpk")},
                                           Making{"wavpack -m -w Title=a IN -o OUT", "b.wv", fourCC("wvpk")},
                                           Making{"wavpack -b256 IN -o OUT", "c.wv", fourCC("wvpk")},
                                           Making{"ffmpeg -i IN OUT", "a.tta", fourCC("tta ")},
                                           Making{"ffmpeg -i IN -c:a mp2 OUT", "a.mp2", fourCC("MPG2")},
                                           Making{"twolame -v IN OUT", "b.mp2", fourCC("MPG2")},
                                           Making{"ffmpeg -i IN -ar 48000 OUT", "a.ac3", fourCC("ac-3")},
                                           Making{"ffmpeg -i IN -ar 44100 OUT", "b.ac3", fourCC("ac-3")}));

TEST(FileEndsOfOgg, areInDoubtWhereThereAreSeveralStreams)
{
    const TemporaryFolder folder;
    writeSound(folder / "IN.wav", 100000, 2, 44100, 16);
    ASSERT_TRUE(runs(folder, "oggenc -s 1 IN.wav -o a.ogg && oggenc -s 2 IN.wav -o b.ogg && "
                             "cat a.ogg b.ogg > chained.ogg && ffmpeg -i a.ogg -map 0 -map 0 -c copy two.ogg"));
    EXPECT_TRUE(isProven(folder / "a.ogg", fourCC("ogg ")));
    EXPECT_FALSE(isProven(folder / "chained.ogg", fourCC("ogg ")));
    EXPECT_FALSE(isProven(folder / "two.ogg", fourCC("ogg ")));
}

// FLAC has its own checksums, and decoders do not cut its last frame.
TEST(FileEndsOfOgg, areInDoubtWhereAPageIsRightAndItsContentIsNot)
{
    const TemporaryFolder folder;
    writeSound(folder / "IN.wav", 100000, 2, 44100, 16);
    ASSERT_TRUE(runs(folder, "flac --ogg IN.wav -o a.oga"));
    const Bytes content = readFile(folder / "a.oga");
    const std::size_t page = textOf(BytesView(content)).rfind("OggS");
    const auto isProvenWith = [&](std::size_t at, unsigned bits) {
        Bytes changed = content;
        changed[at] ^= static_cast<std::byte>(bits);
        storeLE<std::uint32_t>(changed.data() + page + 22, 0);
        storeLE(changed.data() + page + 22, highFirstCRC<32, 0x04C11DB7>(BytesView(changed).subspan(page)));
        return isProven(folder.write("b.oga", changed), fourCC("ogg "));
    };
    EXPECT_TRUE(isProvenWith(content.size() - 1, 0));
    EXPECT_FALSE(isProvenWith(content.size() - 1, 1));
    EXPECT_FALSE(isProvenWith(page + 6, 1));    // 100,000 becomes 100,001,
    EXPECT_FALSE(isProvenWith(page + 6, 0x20)); // or 99,968
}

TEST(FileEndsOfWavPack, askWhatCorrectsThem)
{
    const TemporaryFolder folder;
    writeSound(folder / "IN.wav", 220501, 2, 44100, 16);
    ASSERT_TRUE(runs(folder, "wavpack -c -b256 IN.wav -o a.wv"));
    EXPECT_TRUE(isProven(folder / "a.wv", fourCC("wvpk")));
    const Bytes corrections = readFile(folder / "a.wvc");
    std::minstd_rand random(3);
    int proven = 0;
    for (int i = 0; i < 16; ++i) {
        SCOPED_TRACE(i);
        Bytes mutant = corrections;
        mutant[random() % mutant.size()] ^= std::byte{0x10};
        mutant.resize(i % 4 == 0 ? mutant.size() / 2 : mutant.size());
        std::ignore = folder.write("a.wvc", mutant);
        proven += isProven(folder / "a.wv", fourCC("wvpk")) ? 1 : 0;
    }
    EXPECT_LT(proven, 13); // no half of a file
}

TEST(FileEndsOfTTA, standBetweenTags)
{
    const TemporaryFolder folder;
    writeSound(folder / "IN.wav", 100000, 2, 44100, 16);
    ASSERT_TRUE(runs(folder, "ffmpeg -i IN.wav a.tta && { printf 'ID3\\003\\0\\0\\0\\0\\0\\012'; head -c 10 /dev/zero; "
                             "cat a.tta; printf TAG; head -c 125 /dev/zero; } > tagged.tta"));
    EXPECT_TRUE(isProven(folder / "tagged.tta", fourCC("tta ")));
}

// Like decoders, which search for a second frame that resembles the first.
TEST(FileEndsOfLayerII, areInDoubtWhereTheFirstFramesDiffer)
{
    const TemporaryFolder folder;
    writeSound(folder / "IN.wav", 100000, 2, 44100, 16);
    ASSERT_TRUE(runs(folder, "twolame -b 192 IN.wav a.mp2"));
    Bytes content = readFile(folder / "a.mp2");
    ASSERT_TRUE(isProven(folder / "a.mp2", fourCC("MPG2")));
    content[3] ^= std::byte{0x80}; // the mode
    EXPECT_FALSE(isProven(folder.write("b.mp2", content), fourCC("MPG2")));
}
