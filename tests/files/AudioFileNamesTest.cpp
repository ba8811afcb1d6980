#include "files/AudioFileNames.h"

#include <gtest/gtest.h>

#include <cstring>

namespace {

constexpr std::size_t kSize = 2048;

/// A C string of some capacity, with bytes around it that nobody may touch.
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

CFileRef file(const char* path)
{
    return CFileRef(path, false);
}

} // namespace

TEST(StereoNames, TheSuffixIsFoundAndCut)
{
    struct Case {
        const char* name;
        int flags, result;
        const char* left; // what is left of the name
    };
    const Case cases[] = {
        {"Bass.R.AIF", 0, 1, "Bass.R.AIF"},
        {"Bass.war", 0, 9, "Bass.war"}, // row 6 has it too, and is shadowed
        {"Bass.L.wav", kStereoCut, 6, "Bass"},
        {"Bass.AIL", kStereoCut, 2, "Bass"},
        {"Bass.L.m4a", kStereoPosition, 4, "Bass.L.m4a"},
        {"Bass.r.CAF", kStereoCut | kStereoPosition, 4, "Bass"},
        {".air", kStereoCut | kStereoPosition, 0, ""},
        {"Bass.L.mp4", kStereoCut, -1, "Bass.L.mp4"},
        {"Bass.L.aiff", kStereoCut, -1, "Bass.L.aiff"},
        {"Bass.wav", kStereoOrPlain, -2, "Bass"},
        {"Bass.aiff", kStereoOrPlain, -2, "Bass"},
        {"Bass.mp4", kStereoOrPlain, -2, "Bass"},
        {"Bass.L.MP3", kStereoOrPlain, 16, "Bass.L.MP3"},
        {"Bass.flac", kStereoOrPlain, -1, "Bass.flac"},
        {"Bass", 0, -1, "Bass"},
        {"x", 7, -1, "x"},
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

TEST(StereoNames, OfConstantNamesOnly255BytesCount)
{
    const std::string stem(249, 'x');
    EXPECT_EQ(CFileUtilHasStereoExtension((stem + ".L.aif").c_str()), 0);
    EXPECT_EQ(CFileUtilGetPointExt((stem + ".L.aif").c_str()), 249);
    EXPECT_EQ(CFileUtilGetPointExt((stem + "x.L.aif").c_str()), -1);
    EXPECT_EQ(CFileUtilHasStereoExtension((stem + ".L.aif.txt").c_str()), 0); // cut to its first 255 bytes
    EXPECT_EQ(CFileUtilGetPointExt(nullptr), -1);
}

TEST(StereoNames, SuffixesByTheirIndex)
{
    char out[7] = "before";
    EXPECT_EQ(CFileUtilGetStereoExtension(out, 3), out);
    EXPECT_STREQ(out, ".air");
    EXPECT_STREQ(CFileUtilGetStereoExtension(nullptr, 20), ".L.m4a");
    EXPECT_STREQ(CFileUtilGetStereoExtension(out, 18), "");
    for (const int index : {-1, kStereoSuffixes, 1 << 30}) {
        std::strcpy(out, "x");
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
    CFileRef untouched = file("/before");
    EXPECT_FALSE(CFileUtilGetStereoPartner(file("/x/Loop.aif"), &untouched));
    EXPECT_FALSE(CFileUtilGetStereoPartner(CFileRef::None, &untouched));
    EXPECT_STREQ(untouched.GetPath(), "/before");
    EXPECT_TRUE(CFileUtilGetStereoPartner(file("/Loop.L.aif"), nullptr));

    const auto pathOfLength = [](std::size_t length) { return '/' + std::string(length - 5, 'x') + ".ail"; };
    EXPECT_TRUE(CFileUtilGetStereoPartner(file(pathOfLength(1023).c_str()), nullptr));
    EXPECT_FALSE(CFileUtilGetStereoPartner(file(pathOfLength(1024).c_str()), nullptr));
}

TEST(KnownExtensions, AreCutUntilNoneIsLeft)
{
    const std::pair<const char*, const char*> names[] = {
        {"Loop.L.aif", "Loop.L"},
        {"a.wav.aif", "a"},
        {"x.mp4", "x"},
        {"x.AIFF", "x"},
        {"Loop.ail", "Loop"},
        {"x.WAR.caf.m4a", "x"},
        {".wav.aif", ".wav"},
        {"x.wav.flac", "x.wav.flac"},
        {".aif", ".aif"},
        {"...", "..."},
        {"", ""},
        {"aif", "aif"},
    };
    for (const auto& [before, after] : names) {
        SCOPED_TRACE(before);
        Name name(before);
        const bool changes = std::strcmp(before, after) != 0;
        EXPECT_EQ(CFileUtilCutKnownAudioFileExtension(name), changes);
        EXPECT_STREQ(name, after);
        const std::string path = std::string("/x/") + before;
        EXPECT_EQ(CFileUtilHasKnownAudioFileExtension(file(path.c_str())), changes);
        // The path of a reference without a base is cut, so that a name which is nothing but an extension goes too.
        CFileRef ref = file(path.c_str());
        const bool isBare = std::string_view(before) == ".aif" || std::string_view(before) == ".wav.aif";
        EXPECT_EQ(CFileUtilCutKnownAudioFileExtension(&ref), changes || isBare);
        EXPECT_EQ(std::string(ref), isBare ? "/x" : std::string(file((std::string("/x/") + after).c_str())));
    }
    CFileRef none;
    EXPECT_FALSE(CFileUtilCutKnownAudioFileExtension(&none));
    EXPECT_FALSE(CFileUtilHasKnownAudioFileExtension(none));

    // With a base it is the name that is cut, and what comes of it stands alone.
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
        bool changes = true; // what ensuring returns
    };
    const Case cases[] = {
        {Do::ensure, "song.AIF", "aif", 64, "song.AIF", false},
        {Do::ensure, "song.AIF", ".wav", 64, "song.wav"},
        {Do::ensure, "song", "aif", 64, "song.aif"},
        {Do::ensure, "songaif", "aif", 64, "songaif.aif"}, // no dot ahead of it
        {Do::ensure, ".aif", "aif", 64, ".aif", false},
        {Do::ensure, "song.wav", "", 64, "song"},
        {Do::ensure, "song.", nullptr, 64, "song.", false},
        {Do::ensure, "abcdef", "wav", 8, "abc.wav"},
        {Do::set, "abcdefg", "wav", 8, "abc.wav"},
        {Do::set, "song.wav", "wav", 64, "song.wav"},
        {Do::set, "mywav", "wav", 64, "mywav"}, // Kept: the dot is not asked for
        {Do::set, "song.WAV", "wav", 64, "song.wav"},
        {Do::set, "wav", "wav", 64, "wav.wav"},
        {Do::set, "song.L.aif", ".caf", 64, "song.L.caf"},
        {Do::set, "song.wav", nullptr, 64, "song"},
        {Do::set, "song.wav", "", 64, "song.wav"}, // every name ends with nothing
        {Do::append, "song.wav", "wav", 64, "song.wav.wav"},
        {Do::append, "song", "..wav", 64, "song..wav"},
        {Do::append, "song", "", 64, "song"},
        {Do::append, "song", nullptr, 64, "song"},
        {Do::append, "abc", "wav", 8, "abc.wav"},
        {Do::append, "abcd", "wav", 8, "abc.wav"},
        {Do::append, "ab", "aupreset", 8, ".aupres"},
        {Do::append, "ab", "aupreset", 2, "."},
        {Do::append, "ab", "wav", 1, ""},
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

TEST(Extensions, OfReferences)
{
    CFileRef ref = file("/x/song.AIF");
    EXPECT_FALSE(CFileUtilEnsureExtension(&ref, "aif"));
    EXPECT_STREQ(ref.GetPath(), "/x/song.AIF");
    EXPECT_TRUE(CFileUtilEnsureExtension(&ref, "wav"));
    EXPECT_STREQ(ref.GetPath(), "/x/song.wav");
    CFileUtilSetExtension(&ref, "caf");
    EXPECT_STREQ(ref.GetPath(), "/x/song.caf");
    // A name that fills the whole buffer is shortened by what the extension needs.
    const std::string longest(1023, 'x');
    ASSERT_TRUE(ref.Set(('/' + longest).c_str(), false));
    EXPECT_TRUE(CFileUtilEnsureExtension(&ref, "wav"));
    EXPECT_EQ(std::string(ref), '/' + longest.substr(4) + ".wav");
    ASSERT_TRUE(ref.Set(('/' + longest + 'x').c_str(), false));
    EXPECT_FALSE(CFileUtilEnsureExtension(&ref, "wav"));
    EXPECT_EQ(std::string(ref).size(), 1025U);
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
        {"Drums.AuPreset", nullptr, "Drums"},
        {"Drums.longext", nullptr, nullptr},
        {"Drums.sixext", nullptr, "Drums"},
        {"a.mid", nullptr, "a"},
        {"a.", nullptr, nullptr},
        {"a", nullptr, nullptr},
        {"...", nullptr, nullptr},
        {".mid", nullptr, ""},
        {"a.b.c", nullptr, "a.b"},
        {"Song.WAV", ".wav", "Song"},
        {"Song.wav", "wav", "Song."},
        {".wav", ".wav", nullptr},
        {"Song.aif", ".wav", nullptr},
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
