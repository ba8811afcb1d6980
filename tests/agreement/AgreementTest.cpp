// For every file, its description, its streams and its overview agree on type, rate, channels and frames, or say why
// not.
#include "agreement/Answers.h"

#include "platform/core/Status.h"
#include "support/ContainerBuilder.h"
#include "support/Media.h"
#include "support/Programs.h"
#include "support/QuietLog.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <random>
#include <tuple>

namespace {

namespace fs = std::filesystem;

class Agreement : public ::testing::Test {
protected:
    void expectAgreement(const std::string& path, const std::string& what)
    {
        constexpr int most = 30; // disagreements to show
        ++count_;
        const std::string why = disagreement(path);
        if (!why.empty() && ++failures_ <= most)
            ADD_FAILURE() << what << "\n  " << why;
    }
    void expectAgreement(BytesView content, const std::string& what)
    {
        expectAgreement(folder_.write("file", content), what);
    }

    /// Checks the file itself, its first parts of n/64, and copies with damaged headers.
    void expectAgreementOfVariants(const Bytes& content, const std::string& what)
    {
        constexpr std::size_t kCuts = 64, kMutants = 20, kHeader = 256, kBeginning = 16;
        expectAgreement(content, what);
        for (std::size_t i = 1; i < kCuts; ++i)
            expectAgreement(BytesView(content).first(content.size() * i / kCuts),
                            what + ", cut at " + std::to_string(i) + "/64");
        for (std::size_t i = 0; i < kMutants && !content.empty(); ++i) {
            std::minstd_rand random(static_cast<std::uint32_t>(i + 1));
            const auto below = [&](std::size_t end) { return random() % end; };
            Bytes mutant = content;
            for (std::size_t changes = 1 + below(3); changes > 0; --changes) {
                // Mostly in the header; some files have tables at their end.
                const std::size_t header = std::min(kHeader, mutant.size());
                const std::size_t at = below(4) > 0 ? below(header) : mutant.size() - 1 - below(header);
                const std::byte values[] = {mutant[at] ^ std::byte{1} << below(8), std::byte{0}, std::byte{0xFF},
                                            std::byte{0x7F}};
                mutant[at] = values[below(std::size(values))];
            }
            // A file that no longer begins like any format is left to guesses of the decoder's demultiplexers.
            const std::string path = folder_.write("file", mutant);
            const bool isChanged = !std::equal(
                mutant.begin(), mutant.begin() + static_cast<std::ptrdiff_t>(std::min(kBeginning, mutant.size())),
                content.begin());
            if (!isChanged || describedFile(path).status != kStatusParameterError)
                expectAgreement(path, what + ", mutant " + std::to_string(i + 1));
        }
    }

    void TearDown() override
    {
        EXPECT_EQ(failures_, 0) << "of " << count_ << " files";
        RecordProperty("files", count_);
    }

    TemporaryFolder folder_;

private:
    const QuietLog quiet_;
    int count_ = 0;
    int failures_ = 0;
};

/// A WAVE file with attacks, silence and noise.
Bytes source(int rate, int channels, int bits)
{
    const int frames = rate / 4;
    const int bytes = bits / 8;
    ByteWriter samples(std::endian::little);
    std::minstd_rand random(static_cast<std::uint32_t>(rate));
    for (int i = 0; i < frames * channels; ++i) {
        const int phase = i / channels % (rate / 10);
        const int noise = static_cast<int>(random() % 60000) - 30000;
        const int value = phase < rate / 40 ? noise / (1 + phase / 64) : phase < rate / 20 ? 0 : noise / 50;
        for (int byte = 2 - bytes; byte < 2; ++byte)
            samples.write(static_cast<std::uint8_t>(byte < 0 ? 0 : value >> (8 * byte) & 0xFF));
    }
    return ContainerBuilder("RIFF")
        .chunk("fmt ", waveFormat(1, channels, rate, bytes * channels, bits))
        .chunk("data", samples.view())
        .bytes();
}

} // namespace

TEST_F(Agreement, OnExamplesAndSeeds)
{
    const fs::path examples = mediaPath("");
    for (const fs::path& place : {examples, examples.parent_path().parent_path().parent_path() / "fuzz/corpus"}) {
        for (const fs::directory_entry& entry : fs::recursive_directory_iterator(place))
            if (entry.is_regular_file() && entry.file_size() < (1U << 20))
                expectAgreement(readFile(entry.path()), entry.path().filename().string());
    }
    for (const char* name : {"drum-8.wav", "kick-24-rf64.wav", "tone-fl32.aifc", "tone-16.aiff", "pluck-24-le.caf"}) {
        Bytes content = readFile(mediaPath(name));
        content.resize(std::min<std::size_t>(content.size(), 20000));
        expectAgreementOfVariants(content, name);
    }
}

TEST_F(Agreement, OnHeadersThatAreOdd)
{
    constexpr std::uint32_t open = 0xFFFFFFFF;
    const Bytes sound(2000, std::byte{0x11}), format = waveFormat(1, 1, 8000, 2, 16);
    const auto wave = [&](const Bytes& fmt) { return ContainerBuilder("RIFF").chunk("fmt ", fmt); };
    const auto waveOf = [&](int tag, int channels, int align, int bits) {
        return wave(waveFormat(tag, channels, 8000, align, bits)).chunk("data", sound).bytes();
    };
    const auto extensible = [&](std::uint16_t tag, std::string_view guid) {
        Bytes fmt = waveFormat(0xFFFE, 1, 8000, 2, 16);
        ByteWriter out(std::endian::little);
        out.write(std::uint16_t{22});
        out.write(std::uint16_t{16});
        out.write(std::uint32_t{4});
        out.write(tag);
        out.write(bytesOf(guid));
        fmt.insert(fmt.end(), out.view().begin(), out.view().end());
        return wave(fmt).chunk("data", sound).bytes();
    };
    const auto aiff = [&](std::string_view type, int bits, std::uint32_t frames = 1000) {
        ByteWriter common;
        common.write<std::int16_t>(1);
        common.write(frames);
        common.write(static_cast<std::int16_t>(bits));
        common.write(std::uint16_t{0x400B});
        common.write(std::uint64_t{0xFA00000000000000});
        common.write(bytesOf(type));
        return ContainerBuilder("FORM", type.empty() ? "AIFF" : "AIFC").chunk("COMM", common.view());
    };
    const auto ssnd = [&](std::uint32_t offset) {
        ByteWriter body;
        body.write(offset);
        body.writeZeros(4);
        body.write(sound);
        return Bytes(body.view().begin(), body.view().end());
    };
    const auto caf = [&](std::uint32_t flags, std::uint32_t packet, std::uint32_t bits, std::string_view id = "lpcm",
                         std::uint32_t channels = 1) {
        return ContainerBuilder("caff").chunk("desc", cafDescription(8000, id, {flags, packet, 1, channels, bits}));
    };
    std::vector<std::pair<std::string, Bytes>> files{
        {"WAVE of 0, RIFF of 36", wave(format).chunk("data", sound, 0).bytes(36)},
        {"WAVE of 0, RIFF of 0", wave(format).chunk("data", sound, 0).bytes(0)},
        {"WAVE of 0, whole RIFF", wave(format).chunk("data", sound, 0).bytes()},
        {"open WAVE", wave(format).chunk("data", sound, open).bytes(open)},
        {"whole WAVE in a container of 4", wave(format).chunk("data", sound).bytes(4)},
        {"whole WAVE in a container of 20", wave(format).chunk("data", sound).bytes(20)},
        {"RF64 of 0", ContainerBuilder("RF64").ds64(0, 0).chunk("fmt ", format).chunk("data", sound, open).bytes(open)},
        {"only an open \"data\"", ContainerBuilder("RIFF").chunk("data", sound, open).bytes(open)},
        {"no \"data\"", wave(format).bytes()},
        {"two formats", wave(Bytes(4)).chunk("fmt ", format).chunk("data", sound).bytes()},
        {"\"fmt \" of 14 bytes", wave(Bytes(format.begin(), format.begin() + 14)).chunk("data", sound).bytes()},
        {"\"fmt \" of 12 bytes", wave(Bytes(format.begin(), format.begin() + 12)).chunk("data", sound).bytes()},
        {"no known GUID", extensible(1, std::string_view("\1\2\3\4\5\6\7\10\11\12\13\14\15\16", 14))},
        {"GUID", extensible(1, std::string_view("\0\0\0\0\x10\0\x80\0\0\xAA\0\x38\x9B\x71", 14))},
        {"Ambisonic GUID", extensible(1, std::string_view("\0\0\x21\x07\xD3\x11\x86\x44\xC8\xC1\xCA\0\0\0", 14))},
        {"AIFF of 0", aiff("", 16, 0).chunk("SSND", ssnd(0), 0).bytes(46)},
        {"AIFF of 8", aiff("", 16, 0).chunk("SSND", ssnd(0), 8).bytes(0)},
        {"open AIFF", aiff("", 16, 0).chunk("SSND", ssnd(0), open).bytes(open)},
        {"AIFF in a container of 4", aiff("", 16).chunk("SSND", ssnd(0)).bytes(4)},
        {"AIFF, offset beyond its chunk", aiff("", 16).chunk("SSND", ssnd(0xFFFFFF)).bytes()},
        {"AIFF, offset", aiff("", 16).chunk("SSND", ssnd(10)).bytes()},
        {"AIFF without \"SSND\"", aiff("", 16).bytes()},
        {"AIFF of no frames without \"SSND\"", aiff("", 16, 0).bytes()},
        {"AIFC without \"SSND\"", aiff("NONE", 16, 0).bytes()},
        {"AIFC of packets without \"SSND\"", aiff("ima4", 16, 0).bytes()},
        {"AIFC, \"COMM\" without a type", aiff("", 16).chunk("SSND", ssnd(0)).bytes()},
        {"CAF of 0", caf(2, 2, 16).chunk("data", sound, 0).bytes()},
        {"open CAF", caf(2, 2, 16).chunk("data", sound, -1).bytes()},
        {"CAF of -2", caf(2, 2, 16).chunk("data", sound, -2).bytes()},
        {"CAF of 65,536 channels", caf(2, 131072, 16, "lpcm", 65536).chunk("data", sound).bytes()},
        {"CAF of half of all channels", caf(2, 0xFFFFFFFE, 16, "lpcm", 0x7FFFFFFF).chunk("data", sound).bytes()},
    };
    for (const int tag : {1, 3, 6, 7, 2, 0x11, 0x31, 0x50, 0x55, 0xFF})
        for (const int align : {0, 1, 2, 3, 4, 5, 8, 10, 65535})
            for (const int bits : {0, 1, 4, 8, 12, 16, 20, 24, 32, 64, 65535})
                files.emplace_back("WAVE tag " + std::to_string(tag) + " align " + std::to_string(align) + " bits " +
                                       std::to_string(bits),
                                   waveOf(tag, align == 10 ? 2 : 1, align, bits));
    for (const char* type : {"",     "NONE", "twos", "sowt", "raw ", "in16", "in24", "in32", "42ni",
                             "42n1", "ni24", "23ni", "ni32", "fl32", "FL32", "fl64", "FL64", "alaw",
                             "ulaw", "ALAW", "ULAW", "ima4", "MAC3", "MAC6", "GSM ", "G722", "abcd"})
        for (const int bits : {-1, 0, 4, 8, 12, 16, 24, 32, 64, 32767})
            for (const std::uint32_t frames : {0U, 7U, 1000U, 100000U})
                files.emplace_back("AIFC " + std::string(type) + " bits " + std::to_string(bits) + " frames " +
                                       std::to_string(frames),
                                   aiff(type, bits, frames).chunk("SSND", ssnd(0)).bytes());
    for (const char* id : {"lpcm", "ulaw", "alaw", "ima4", "aac ", "alac", "abcd"})
        for (const std::uint32_t packet : {0U, 1U, 2U, 3U, 4U, 5U, 8U, 34U})
            for (const std::uint32_t bits : {0U, 8U, 12U, 16U, 24U, 32U, 64U, 0xFFFFFFFFU})
                for (const std::uint32_t flags : {0U, 1U, 3U})
                    files.emplace_back("CAF " + std::string(id) + " packets of " + std::to_string(packet) + " bits " +
                                           std::to_string(bits) + " flags " + std::to_string(flags),
                                       caf(flags, packet, bits, id).chunk("data", sound).bytes());
    for (const auto& [what, content] : files)
        expectAgreement(content, what);
}

TEST_F(Agreement, OnMP3WhoseFirstFramesMislead)
{
    folder_.write("IN.wav", source(48000, 2, 16));
    ASSERT_TRUE(runs(folder_, "lame --quiet -t -b 128 IN.wav bare.mp3 && lame --quiet -b 128 IN.wav told.mp3"));
    constexpr std::size_t frame = 384; // bytes of a frame
    const Bytes bare = readFile(folder_ / "bare.mp3"), told = readFile(folder_ / "told.mp3");
    const auto join = [](Bytes ahead, std::size_t padding, const Bytes& file) {
        ahead.resize(ahead.size() + padding);
        ahead.insert(ahead.end(), file.begin(), file.end());
        return ahead;
    };
    const auto flip = [](Bytes file, std::size_t at, unsigned bits) {
        file[at] ^= static_cast<std::byte>(bits);
        return file;
    };
    const Bytes other{std::byte{0xFF}, std::byte{0xFB}, std::byte{0x90}, std::byte{0x64}}; // 44.1 kHz, 417 bytes
    const Bytes same(bare.begin(), bare.begin() + 4);
    const std::int64_t all = static_cast<std::int64_t>(bare.size() / frame) * 1152, lessOne = all - 1152;
    const std::int64_t sound = 12000; // if the describing frame is understood
    const std::pair<const char*, std::pair<Bytes, std::int64_t>> files[] = {
        {"a header of another stream ahead", {join(other, 100, bare), all}},
        {"a header of the stream ahead", {join(same, 100, bare), all}},
        {"two frames of another stream ahead", {join(join(other, 413, other), 50, bare), all}},
        {"a header ahead of a frame that tells", {join(other, 100, told), sound}},
        {"no sync", {flip(bare, 0, 0xFF), lessOne}},
        {"another version", {flip(bare, 1, 0x08), lessOne}},
        {"another layer", {flip(bare, 1, 0x06), lessOne}},
        {"another bit rate", {flip(bare, 2, 0x10), lessOne}},
        {"another sample rate", {flip(bare, 2, 0x0C), lessOne}},
        {"cut ahead", {Bytes(bare.begin() + 100, bare.end()), lessOne}},
        {"zeros over the start", {join({}, 300, Bytes(bare.begin() + 300, bare.end())), lessOne}},
        {"another sample rate where it tells", {flip(told, 2, 0x0C), all}},
        {"another version where it tells", {flip(told, 1, 0x08), all}},
        {"another sample rate behind what it tells", {flip(told, frame + 2, 0x0C), sound}},
        {"other channels behind what it tells", {flip(told, frame + 3, 0xC0), sound}},
    };
    for (const auto& [what, file] : files) {
        expectAgreement(file.first, what);
        const Answer answer = describedFile(folder_ / "file");
        EXPECT_EQ(std::pair(answer.frames, answer.rate), std::pair(file.second, 48000.0)) << what;
        std::ignore = folder_.write("file.mp3", file.first);
        // It drops a frame or two where it resynchronizes, or plays what surrounds the sound.
        const std::string judge = "mpg123 -q -w OUT.wav file.mp3; lost=$((" + std::to_string(file.second) +
                                  " - $(soxi -s OUT.wav))); test $lost -gt -3456 -a $lost -lt 3456";
        EXPECT_TRUE(runs(folder_, judge)) << what << ", by mpg123";
    }
}

struct Encoding {
    const char* extension;
    const char* command; // with IN and OUT
};

void PrintTo(const Encoding& encoding, std::ostream* out)
{
    *out << encoding.extension;
}

class AgreementOnFilesOf : public Agreement, public ::testing::WithParamInterface<std::vector<Encoding>> {};

TEST_P(AgreementOnFilesOf, WholeCutAndDamaged)
{
    struct Source {
        const char* name;
        Bytes content;
    };
    const Source sources[] = {
        {"stereo.wav", source(44100, 2, 16)}, {"mono.wav", source(16000, 1, 16)}, {"six.wav", source(48000, 6, 24)}};
    for (const Source& made : sources)
        folder_.write(made.name, made.content);
    for (const Encoding& encoding : GetParam()) {
        int made = 0;
        for (const Source& from : sources) {
            std::string command = encoding.command;
            const std::string to = std::string("made.") + encoding.extension;
            command.replace(command.find("IN"), 2, from.name).replace(command.find("OUT"), 3, to);
            fs::remove(folder_ / to);
            // Not every coding supports every rate, or six channels.
            if (!runs(folder_, command) || !fs::exists(folder_ / to) || fs::file_size(folder_ / to) == 0)
                continue;
            const Bytes content = readFile(folder_ / to);
            // Files that begin like a coding that the library reads itself, but no container, are known by their first
            // bytes only.
            if (made++ == 0)
                expectAgreementOfVariants(content, command);
            else
                expectAgreement(content, command);
        }
        EXPECT_GT(made, 0) << encoding.command;
    }
}

INSTANTIATE_TEST_SUITE_P(
    Programs, AgreementOnFilesOf,
    ::testing::Values(std::vector<Encoding>{{"wav", "sndfile-convert -pcmu8 IN OUT"},
                                            {"wav", "sndfile-convert -float64 IN OUT"},
                                            {"wav", "sndfile-convert -ima-adpcm IN OUT"},
                                            {"wav", "sndfile-convert -ms-adpcm IN OUT"},
                                            {"wav", "sndfile-convert -ulaw IN OUT"},
                                            {"aifc", "sndfile-convert -ima-adpcm IN OUT"},
                                            {"aiff", "sndfile-convert -pcms8 IN OUT"},
                                            {"aifc", "sndfile-convert -alaw IN OUT"},
                                            {"aifc", "sndfile-convert -float32 IN OUT"}},
                      std::vector<Encoding>{{"caf", "sndfile-convert -pcm24 IN OUT"},
                                            {"caf", "sndfile-convert -ulaw IN OUT"},
                                            {"caf", "sndfile-convert -alac16 IN OUT"},
                                            {"caf", "sndfile-convert -alac24 IN OUT"},
                                            {"w64", "sndfile-convert -pcm16 IN OUT"},
                                            {"au", "sndfile-convert -pcm16 IN OUT"},
                                            {"flac", "sndfile-convert -pcm16 IN OUT"},
                                            {"ogg", "sndfile-convert -vorbis IN OUT"}},
                      std::vector<Encoding>{{"wav", "sox IN -e ima-adpcm OUT"},
                                            {"wav", "sox IN -r 8000 -c 1 -e gsm-full-rate OUT"},
                                            {"wav", "sox IN -e ms-adpcm OUT"},
                                            {"wav", "sox IN -b 32 -e signed OUT"},
                                            {"aifc", "sox IN -b 24 OUT"},
                                            {"wav", "sox IN -B OUT"},
                                            {"wav", "sox IN -B -b 24 OUT"},
                                            {"au", "sox IN -e mu-law OUT"},
                                            {"au", "sox IN -b 8 -e signed OUT"},
                                            {"au", "sox IN -b 64 -e float OUT"},
                                            {"voc", "sox IN -b 8 -e unsigned OUT"}},
                      std::vector<Encoding>{{"wav", "ffmpeg -i IN -c:a adpcm_ima_wav OUT"},
                                            {"wav", "ffmpeg -i IN -c:a adpcm_ms OUT"},
                                            {"wav", "ffmpeg -i IN -c:a libmp3lame OUT"},
                                            {"wav", "ffmpeg -i IN -c:a pcm_s64le OUT"},
                                            {"wav", "ffmpeg -i IN -f wav -rf64 always OUT"},
                                            {"w64", "ffmpeg -i IN -c:a pcm_f32le OUT"},
                                            {"aifc", "ffmpeg -i IN -c:a adpcm_ima_qt OUT"},
                                            {"caf", "ffmpeg -i IN -c:a adpcm_ima_qt OUT"},
                                            {"caf", "ffmpeg -i IN -c:a alac OUT"},
                                            {"mp2", "ffmpeg -i IN -c:a mp2 OUT"}},
                      std::vector<Encoding>{{"aac", "ffmpeg -i IN -c:a aac OUT"},
                                            {"aac", "ffmpeg -i IN -c:a aac -ar 24000 -write_id3v2 1 OUT"},
                                            {"m4a", "ffmpeg -i IN -c:a aac OUT"},
                                            {"m4a", "ffmpeg -i IN -c:a alac OUT"},
                                            {"mov", "ffmpeg -i IN -c:a pcm_s16be OUT"},
                                            {"mp4", "ffmpeg -i IN -c:a aac -movflags frag_keyframe+empty_moov OUT"},
                                            {"mka", "ffmpeg -i IN -c:a flac OUT"},
                                            {"ac3", "ffmpeg -i IN -c:a ac3 OUT"},
                                            {"eac3", "ffmpeg -i IN -c:a eac3 OUT"},
                                            {"latm", "ffmpeg -i IN -c:a aac -f latm OUT"},
                                            {"thd", "ffmpeg -i IN -c:a truehd -strict -2 OUT"},
                                            {"dts", "ffmpeg -i IN -ar 48000 -c:a dca -strict -2 OUT"},
                                            {"wma", "ffmpeg -i IN -c:a wmav2 OUT"},
                                            {"tta", "ffmpeg -i IN -c:a tta OUT"}},
                      std::vector<Encoding>{{"sox", "sox IN OUT"},
                                            {"ircam", "sox IN OUT"},
                                            {"sds", "sox IN -c 1 OUT"},
                                            {"maud", "sox IN OUT"},
                                            {"wve", "sox IN -r 8000 -c 1 OUT"},
                                            {"pvf", "sndfile-convert -pcm16 IN OUT"},
                                            {"paf", "sndfile-convert -pcm16 IN OUT"},
                                            {"avr", "sndfile-convert -pcm16 IN OUT"},
                                            {"adx", "ffmpeg -i IN OUT"},
                                            {"nut", "ffmpeg -i IN OUT"},
                                            {"ts", "ffmpeg -i IN -c:a mp2 OUT"},
                                            {"mpg", "ffmpeg -i IN -c:a mp2 OUT"}},
                      std::vector<Encoding>{{"mp3", "lame --quiet IN OUT"},
                                            {"mp3", "lame --quiet -t -b 96 IN OUT"},
                                            {"mp3", "lame --quiet -V5 --id3v2-only --tt title IN OUT"},
                                            {"mp2", "twolame IN OUT"},
                                            {"ogg", "oggenc -q5 IN -o OUT"},
                                            {"opus", "opusenc IN OUT"},
                                            {"flac", "flac -8 IN -o OUT"},
                                            {"ogg", "flac --ogg IN -o OUT"},
                                            {"mpc", "mpcenc IN OUT"},
                                            {"wv", "wavpack -h IN -o OUT"},
                                            {"wv", "wavpack -b256 -c IN -o OUT"},
                                            {"ogg", "ffmpeg -i IN -c:a libvorbis OUT"},
                                            {"opus", "ffmpeg -i IN -c:a libopus OUT"},
                                            {"oga", "ffmpeg -i IN -c:a flac OUT"}}));
