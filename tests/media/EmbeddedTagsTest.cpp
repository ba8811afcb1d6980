#include "media/tags/EmbeddedTags.h"

#include "support/Media.h"
#include "support/MemoryBytes.h"
#include "support/Programs.h"
#include "support/TemporaryFolder.h"

#include <algorithm>
#include <gtest/gtest.h>

using platform::EmbeddedTag;

namespace {

/// "ID3v2 TIT2 TITLE=value|value" for each entry; for data its size, kind and description.
std::vector<std::string> wordsOf(const std::vector<EmbeddedTag>& tags)
{
    std::vector<std::string> words;
    for (const EmbeddedTag& tag : tags) {
        std::string line = tag.system + " " + tag.key + " " + tag.name + "=";
        for (const std::string& value : tag.values)
            line += (&value == &tag.values.front() ? "" : "|") + value;
        if (tag.values.empty())
            line += "(" + std::to_string(tag.size) + " " + tag.mimeType + " " + tag.pictureKind + " " +
                    tag.description + ")";
        words.push_back(line);
    }
    return words;
}

std::vector<std::string> tagsOf(const Bytes& bytes, std::int32_t expected = kStatusOK)
{
    std::vector<EmbeddedTag> tags;
    EXPECT_EQ(platform::readEmbeddedTags(MemoryBytes(bytes), bytes.size(), tags, nullptr), expected);
    return wordsOf(tags);
}

bool has(const std::vector<std::string>& words, const std::string& word)
{
    return std::find(words.begin(), words.end(), word) != words.end();
}

std::string bigEndian(std::size_t size)
{
    std::string bytes;
    for (int shift = 24; shift >= 0; shift -= 8)
        bytes += static_cast<char>(size >> shift);
    return bytes;
}

/// A size in ID3v2.4, with seven bits per byte.
std::string syncSafe(std::size_t size)
{
    std::string bytes;
    for (int shift = 21; shift >= 0; shift -= 7)
        bytes += static_cast<char>((size >> shift) & 0x7F);
    return bytes;
}

std::string frame(const std::string& id, const std::string& body)
{
    return id + syncSafe(body.size()) + std::string(2, '\0') + body;
}

std::string id3(const std::string& frames)
{
    return "ID3" + std::string("\4\0\0", 3) + syncSafe(frames.size()) + frames;
}

std::string chapter(const std::string& id, const std::string& inner)
{
    const std::string times = bigEndian(1000) + bigEndian(2500) + std::string(8, '\xFF');
    return frame("CHAP", id + '\0' + times + inner);
}

Bytes asBytes(const std::string& text)
{
    const BytesView view = bytesOf(text);
    return {view.begin(), view.end()};
}

} // namespace

TEST(EmbeddedTags, FilesOfEncodersGiveWhatWasWritten)
{
    struct Case {
        const char* file;
        const char* options;
        std::vector<std::string> wanted;
    };
    const Case cases[] = {
        {"a.mp3",
         "-c:a libmp3lame -write_id3v1 1",
         {"ID3v2 TIT2 TITLE=Gänge", "ID3v2 TPE1 ARTIST=One", "ID3v2 TXXX:BARCODE BARCODE=123",
          "ID3v1 title TITLE=Gänge"}},
        {"a.flac", "", {"Vorbis comment TITLE TITLE=Gänge", "Vorbis comment BARCODE BARCODE=123"}},
        {"a.ogg", "-c:a libvorbis", {"Vorbis comment TITLE TITLE=Gänge", "Vorbis comment BARCODE BARCODE=123"}},
        {"a.opus", "-c:a libopus", {"Vorbis comment TITLE TITLE=Gänge"}},
        {"a.m4a", "-c:a aac", {"MP4 ©nam TITLE=Gänge", "MP4 ©ART ARTIST=One", "MP4 trkn TRACKNUMBER=3/9"}},
        {"a.wma", "", {"ASF Title TITLE=Gänge", "ASF BARCODE =123"}},
        {"a.wv", "-c:a wavpack", {"APE title TITLE=Gänge", "APE BARCODE BARCODE=123"}},
        {"a.aac", "-c:a aac -write_id3v2 1", {"ID3v2 TIT2 TITLE=Gänge"}},
        {"a.wav", "", {}},
    };
    const TemporaryFolder folder;
    for (const Case& one : cases) {
        SCOPED_TRACE(one.file);
        ASSERT_TRUE(
            runs(folder,
                 "ffmpeg -nostdin -f lavfi -i sine=d=0.3:r=44100 -metadata title=Gänge -metadata artist=One -metadata "
                 "track=3/9 -metadata BARCODE=123 " +
                     std::string(one.options) + " " + one.file));
        const std::vector<std::string> words = tagsOf(readFile(folder / one.file));
        for (const std::string& wanted : one.wanted)
            EXPECT_TRUE(has(words, wanted)) << wanted << " among:\n" << testing::PrintToString(words);
        EXPECT_EQ(words.empty(), one.wanted.empty());
    }
}

TEST(EmbeddedTags, PicturesCommentsAndBytesOfProgramsAreTold)
{
    const std::string picture = std::string(1, '\0') + "image/png" + std::string("\0\3cover\0", 8) + "PNGDATA";
    const std::string tag =
        id3(frame("APIC", picture) + frame("COMM", std::string("\3", 1) + "engnotes" + '\0' + "Hello CHAPTER") +
            frame("PRIV", std::string("some.owner\0\1\2\3", 14)) + frame("ZZZZ", "unknown") +
            frame("TALB", std::string(1, '\0') + "G\xC3\xA4nge") + frame("TCOM", std::string(1, '\0') + "G\xE4nge") +
            frame("CTOC", std::string("toc\0\3\2ch1\0ch2\0", 14)) +
            chapter("ch1", frame("TIT2", std::string("\3", 1) + "Opening")));
    const std::vector<std::string> expected = {"ID3v2 APIC =(7 image/png Front Cover cover)",
                                               "ID3v2 COMM:eng:notes COMMENT:NOTES=Hello CHAPTER",
                                               "ID3v2 PRIV:some.owner =(3   )",
                                               "ID3v2 ZZZZ =(7   )",
                                               "ID3v2 TALB ALBUM=Gänge",
                                               "ID3v2 TCOM COMPOSER=Gänge",
                                               "ID3v2 CTOC:toc =ch1|ch2",
                                               "ID3v2 CHAP:ch1 =1000 ms|2500 ms|Opening"};
    EXPECT_EQ(tagsOf(asBytes(tag)), expected);
    // A DSF file points at the tag.
    const std::string header =
        "DSD " + std::string("\x1C\0\0\0\0\0\0\0", 8) + std::string(8, '\0') + std::string("\x1C\0\0\0\0\0\0\0", 8);
    EXPECT_EQ(tagsOf(asBytes(header + tag)), expected);
}

// Some hundred KB of either used to overflow the stack.
TEST(EmbeddedTags, WhatIsNestedDeepDoesNotEndTheProcess)
{
    std::string chapters; // built from the outside, to avoid copying inner ones each time
    constexpr std::size_t kDepth = 100000, kChapter = 10 + 2 + 16;
    for (std::size_t level = 0; level < kDepth; ++level)
        chapters +=
            "CHAP" + syncSafe((kDepth - level) * kChapter - 10) + std::string(2, '\0') + 'a' + std::string(17, '\0');
    EXPECT_EQ(tagsOf(asBytes(id3(chapters))).size(), 1u);

    std::string boxes = bigEndian(16) + "ftypM4A " + bigEndian(0);
    for (std::size_t level = 0; level < kDepth; ++level)
        boxes += bigEndian((kDepth - level) * 8) + "moov";
    EXPECT_EQ(tagsOf(asBytes(boxes), kStatusParameterError).size(), 0u);
}

TEST(EmbeddedTags, AReadThatFailsIsAnError)
{
    const TemporaryFolder folder;
    ASSERT_TRUE(runs(
        folder, "ffmpeg -nostdin -f lavfi -i sine=d=1 -metadata title=x a.mp3 && ffmpeg -nostdin -i a.mp3 a.flac"));
    for (const char* name : {"a.mp3", "a.flac"}) {
        const Bytes bytes = readFile(folder / name);
        std::vector<EmbeddedTag> tags;
        EXPECT_EQ(platform::readEmbeddedTags(MemoryBytes(bytes, 40), bytes.size(), tags, nullptr), kStatusIOError)
            << name;
        EXPECT_TRUE(tags.empty());
    }
}

// Sizes in tags are not trusted: files cut and changed at random still give an answer.
TEST(EmbeddedTags, DamagedFilesGiveSomeAnswer)
{
    const TemporaryFolder folder;
    ASSERT_TRUE(runs(
        folder,
        "for e in mp3 flac ogg m4a wma wv opus; do ffmpeg -nostdin -f lavfi -i sine=d=0.1 -metadata title=x -metadata "
        "track=3 a.$e || exit 1; done"));
    std::uint32_t random = 1;
    const auto next = [&] { return (random = random * 1664525 + 1013904223) >> 8; };
    for (const char* extension : {"mp3", "flac", "ogg", "m4a", "wma", "wv", "opus"})
        for (int round = 0; round < 300; ++round) {
            Bytes bytes = readFile(folder / (std::string("a.") + extension));
            for (int change = 0; change < 8; ++change)
                bytes[next() % std::min<std::size_t>(bytes.size(), 1500)] = static_cast<std::byte>(next());
            if (round % 3 == 0)
                bytes.resize(next() % bytes.size());
            std::vector<EmbeddedTag> tags;
            platform::readEmbeddedTags(MemoryBytes(bytes), bytes.size(), tags, nullptr);
        }
}
