#include "files/AudioFileNames.h"
#include "support/References.h"

#include <gtest/gtest.h>

#include <cstring>

namespace {

constexpr std::size_t kSize = 2048;

/// A C string of a given capacity, surrounded by bytes that must not change.
class Name {
public:
    explicit Name(std::string_view text, std::size_t capacity = kSize) : capacity_(capacity)
    {
        std::memset(bytes_, '#', sizeof bytes_);
        text.substr(0, capacity > 0 ? capacity - 1 : 0).copy(text_(), capacity);
        if (capacity > 0)
            text_()[std::min(text.size(), capacity - 1)] = '\0';
    }
    ~Name()
    {
        EXPECT_EQ(std::string(bytes_, kGuard), std::string(kGuard, '#'));
        EXPECT_EQ(std::string(text_() + capacity_, kGuard), std::string(kGuard, '#'));
    }
    operator char*() { return text_(); }

private:
    static constexpr std::size_t kGuard = 8;
    char* text_() { return bytes_ + kGuard; }
    char bytes_[kSize + 2 * kGuard];
    std::size_t capacity_;
};

} // namespace

TEST(StereoNames, TheSuffixIsFoundAndCut)
{
    struct Case {
        const char* name;
        int flags, result;
        const char* left; // the remaining name
    };
    const Case cases[] = {
        {"Bass.R.AIF", 0, 1, "Bass.R.AIF"},
        {"Bass.war", 0, 9, "Bass.war"}, // row 6 has it too, and is shadowed
        {"Bass.L.wav", kStereoCut, 6, "Bass"},
        {"Bass.r.CAF", kStereoCut | kStereoPosition, 4, "Bass"},
        {".air", kStereoCut | kStereoPosition, 0, ""},
        {"Bass.L.mp4", kStereoCut, -1, "Bass.L.mp4"},
        {"Bass.wav", kStereoOrPlain, -2, "Bass"},
        {"Bass.L.MP3", kStereoOrPlain, 16, "Bass.L.MP3"},
        {"Bass.flac", kStereoOrPlain, -1, "Bass.flac"},
        {"", 7, -1, ""},
    };
    for (const Case& each : cases) {
        SCOPED_TRACE(each.name);
        Name name(each.name);
        EXPECT_EQ(CFileUtilHasStereoExtension(name, each.flags), each.result);
        EXPECT_STREQ(name, each.left);
    }
    EXPECT_EQ(CFileUtilHasStereoExtension(nullptr, 7), -1);
}

TEST(StereoNames, SuffixesByTheirIndex)
{
    char out[8] = "before";
    for (const auto& [index, suffix] : {std::pair{3, ".air"}, {0, ".L.aif"}, {21, ".R.m4a"}, {4, ""}}) {
        EXPECT_STREQ(CFileUtilGetStereoExtension(out, index), suffix);
        EXPECT_STREQ(out, suffix);
        EXPECT_STREQ(CFileUtilGetStereoExtension(nullptr, index), suffix);
    }
    for (const int index : {-1, kStereoSuffixes, 1000}) {
        std::strcpy(out, "before");
        EXPECT_EQ(CFileUtilGetStereoExtension(out, index), nullptr);
        EXPECT_STREQ(out, "");
    }
}

TEST(StereoNames, ThePartnerHasTheOtherSuffixOfTheRow)
{
    const std::pair<const char*, const char*> pairs[] = {
        {"/x/Loop.L.aif", "/x/Loop.R.aif"}, {"/x/Loop.air", "/x/Loop.ail"}, {"/x/Loop.r.WAV", "/x/Loop.L.wav"}};
    for (const auto& [name, expected] : pairs) {
        CFileRef partner;
        EXPECT_TRUE(CFileUtilGetStereoPartner(file(name), &partner));
        EXPECT_STREQ(partner.GetPath(), expected);
    }
}

TEST(KnownExtensions, AreCutUntilNoneIsLeft)
{
    const std::pair<const char*, const char*> names[] = {
        {"a.wav.aif", "a"},           {"x.WAR.caf.m4a", "x"}, {".wav.aif", ".wav"},
        {"x.wav.flac", "x.wav.flac"}, {".aif", ".aif"},       {"", ""},
    };
    for (const auto& [before, after] : names) {
        SCOPED_TRACE(before);
        Name name(before);
        const bool changes = std::strcmp(before, after) != 0;
        EXPECT_EQ(CFileUtilCutKnownAudioFileExtension(name), changes);
        EXPECT_STREQ(name, after);
    }
    CFileRef none;
    EXPECT_FALSE(CFileUtilCutKnownAudioFileExtension(&none));
    EXPECT_FALSE(CFileUtilHasKnownAudioFileExtension(none));

    // With a base, only the name is cut, and the result has no base.
    const platform::URLRef base = platform::URL::createWithString("file:///base/");
    CFileRef based(platform::URL::createWithString("Loop.wav", base));
    EXPECT_TRUE(CFileUtilCutKnownAudioFileExtension(&based));
    EXPECT_EQ(based.URL()->string(), "Loop");
}

TEST(Extensions, AreEnsuredSetAndAppended)
{
    enum class Do { ensure, set, append };
    struct Case {
        Do what;
        const char *name, *extension;
        int capacity;
        const char* result;
        bool changes = true; // result of ensuring
    };
    const Case cases[] = {
        {Do::ensure, "song.AIF", "aif", 64, "song.AIF", false},
        {Do::ensure, "song.AIF", ".wav", 64, "song.wav"},
        {Do::ensure, "songaif", "aif", 64, "songaif.aif"}, // no dot ahead of it
        {Do::ensure, "song.wav", "", 64, "song"},
        {Do::ensure, "abcdef", "wav", 8, "abc.wav"},
        {Do::set, "abcdefg", "wav", 8, "abc.wav"},
        {Do::set, "mywav", "wav", 64, "mywav"}, // Kept: the dot is not asked for
        {Do::set, "wav", "wav", 64, "wav.wav"},
        {Do::set, "song.wav", "", 64, "song.wav"}, // every name ends with nothing
        {Do::append, "song.wav", "wav", 64, "song.wav.wav"},
        {Do::append, "abcd", "wav", 8, "abc.wav"},
        {Do::append, "ab", "aupreset", 8, ".aupres"},
        {Do::append, "ab", "aupreset", 2, "."},
        {Do::append, "ab", "wav", 1, ""},
        {Do::append, "abcdefghij", "wav", 8, "abc.wav"}, // a name that fills its buffer
        {Do::ensure, "abc.wav", "wav", 8, "abc.wav", false},
        {Do::ensure, "abcd.wav", "wav", 8, "abc.wav"}, // cut off by its buffer, "abcd.wa" ends otherwise
        {Do::append, "ab", "wav", 0, nullptr},
    };
    for (const Case& each : cases) {
        SCOPED_TRACE(std::string(each.name) + " + " + (each.extension != nullptr ? each.extension : "null"));
        Name name(each.name, static_cast<std::size_t>(each.capacity));
        if (each.what == Do::ensure) {
            EXPECT_EQ(CFileUtilEnsureExtension(name, each.extension, each.capacity), each.changes);
        } else if (each.what == Do::set) {
            CFileUtilSetExtension(name, each.extension, each.capacity);
        } else {
            CFileUtilSetNewExtension(name, each.extension, each.capacity);
        }
        if (each.result != nullptr) {
            EXPECT_STREQ(name, each.result);
        }
    }
}

TEST(Extensions, AreCut)
{
    struct Case {
        const char *name, *extension, *result; // null: nothing is cut
    };
    const Case cases[] = {
        {"Take.12", nullptr, nullptr},
        {"Take.12b", nullptr, "Take"},
        {"Drums.aupreset", nullptr, "Drums"},
        {"Drums.longext", nullptr, nullptr},
        {"Drums.sixext", nullptr, "Drums"},
        {"...", nullptr, nullptr},
        {".mid", nullptr, ""},
        {"Song.WAV", ".wav", "Song"},
        {"Song.wav", "wav", "Song."},
        {".wav", ".wav", nullptr},
        {"Take.12", ".12", "Take"},
    };
    for (const Case& each : cases) {
        SCOPED_TRACE(each.name);
        Name name(each.name);
        EXPECT_EQ(CFileUtilCutExtension(name, each.extension), each.result != nullptr);
        EXPECT_STREQ(name, each.result != nullptr ? each.result : each.name);
    }
    EXPECT_FALSE(CFileUtilCutExtension(nullptr, nullptr));
}

TEST(Extensions, OfANameWithoutAnEndGetOne)
{
    char name[] = {'a', 'b', 'c', 'd', 'e', 'f', 'g', 'h', '#'};
    CFileUtilSetNewExtension(name, "wav", 8);
    EXPECT_STREQ(name, "abc.wav");
    EXPECT_EQ(name[8], '#');
}
