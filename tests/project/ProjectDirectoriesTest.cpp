#include "project/ProjectDirectories.h"
#include "PackageOnDisk.h"
#include "support/References.h"

#include <functional>

namespace fs = std::filesystem;

namespace {

using namespace platform;

/// Rows: values 0 to 19. Columns: inside the package, in a project folder, older kinds 1 and 6, 2, 4. "A/" is the
/// alternative's folder, "." the project folder itself.
constexpr const char* kNames[20][5] = {
    {nullptr, nullptr, nullptr, nullptr, nullptr},
    {"A/Previews", "A/Previews", nullptr, nullptr, nullptr},
    {"Media/Impulse Responses", "Impulse Responses", "Impulse Responses", "Impulse Responses", "Impulse Responses"},
    {"Media/Gestiniop Samples", "Gestiniop Samples", "Gestiniop Samples", nullptr, nullptr},
    {"Media/Bounces", "Bounces", "Bounces", "Bounces", "Bounces"},
    {"Media/Sampler Instruments", "Sampler Instruments", nullptr, "Sampler", nullptr},
    {"Media/Samples", "Samples", nullptr, "Sampler/Sampler Files", nullptr},
    {"Media/Audio Files", "Audio Files", "Audio Files", nullptr, nullptr},
    {"Media/Playback", "Playback", "Playback", "Playback", "Playback"},
    {"Media/ReCycle Audio", "ReCycle Audio", "ReCycle Audio", "ReCycle Audio", "ReCycle Audio"},
    {"A/Undo Data.nosync", "A/Undo Data.nosync", "Undo Data", "Undo Data", "Undo Data"},
    {"Media/Movie Files", "Movie Files", "Movie Files", "Movie Files", "Movie Files"},
    {"Media/Fade Files.nosync", "Fade Files", "Fade Files", "Fade Files", "Fade Files"},
    {"Media/Freeze Files.nosync", "Freeze Files", "Freeze Files", "Freeze Files", "Freeze Files"},
    {"Media", ".", nullptr, nullptr, nullptr},
    {"A/ARA Files", "A/ARA Files", "ARA Plug-In Files", "ARA Plug-In Files", "ARA Plug-In Files"},
    {nullptr, nullptr, nullptr, nullptr, nullptr},
    {nullptr, nullptr, nullptr, nullptr, nullptr},
    {"Media/Alchemy Samples", "Alchemy Samples", "Alchemy Samples", "Alchemy Samples", "Alchemy Samples"},
    {"Media/Samples/Quick Sampler", "Samples/Quick Sampler", nullptr, nullptr, nullptr},
};

/// A project of each kind, created for each case.
struct Kind {
    const char* name;
    int column; // of kNames, for the layout that the project decides on
    std::function<void(const std::string&)> make;
};

const Kind kKinds[] = {
    {"Song.fuguex", 0, [](const std::string& path) { fs::create_directories(path); }},
    {"Song.fuguex", 1,
     [](const std::string& path) {
         fs::create_directories(path + "/Resources");
         ASSERT_TRUE(
             ProjectInformation::writeInfoDictionaryToProjectBundleURL({{"HasProjectFolder", true}}, urlOf(path)));
     }},
    {"Song.band", 0, [](const std::string&) {}}, // not there yet
    {"Song.concert", 0, [](const std::string& path) { fs::create_directories(path); }},
    {"Song", 2, [](const std::string&) {}},
    {"Song.concert", 2, [](const std::string& path) { fs::create_directories(path + "/isProject"); }},
    {"Song.concert", 2,
     [](const std::string& path) {
         fs::create_directories(path);
         fs::create_symlink("nothing", path + "/isProject"); // an entry all the same
     }},
    {"Song.band", 3, [](const std::string& path) { fs::create_directories(path); }},
    {"Song.mwand", 4, [](const std::string&) {}},
};

std::string expectedPath(const TemporaryFolder& folder, const Kind& kind, int column, const char* name)
{
    const std::string package = folder / kind.name, text = name;
    if (text.starts_with("A/"))
        return package + "/Alternatives/012" + text.substr(1);
    const std::string base = column == 1 ? folder.path().string() : package;
    return text == "." ? base : base + '/' + text;
}

TEST(ProjectDirectories, EveryTypeAndLayout)
{
    for (const Kind& kind : kKinds)
        for (const int layout : {0, 1, 2})
            for (int value = 0; value <= 20; ++value) {
                const TemporaryFolder folder;
                kind.make(folder / kind.name);
                const CFileRef base = directory(folder / kind.name);
                const int column = layout == 0 || kind.column > 1 ? kind.column : layout - 1;
                const char* name = value < 20 ? kNames[value][column] : nullptr;
                const auto ask = [&](bool create) {
                    return GetProjectDirectoryRefForBase(base, static_cast<TTypeDir_Prj>(value), create,
                                                         static_cast<fugueXProjectType_t>(layout), 12);
                };
                const bool wasThere = base.Exists();
                const CFileRef found = ask(false);
                EXPECT_EQ(found.IsValid(), name != nullptr) << kind.name << ' ' << layout << ' ' << value;
                EXPECT_EQ(base.Exists(), wasThere);
                const CFileRef created = ask(true);
                EXPECT_EQ(created.IsValid(), name != nullptr);
                if (name == nullptr) {
                    EXPECT_EQ(base.Exists(), wasThere || column != 1); // the base alone, which may be the folder around
                    continue;
                }
                const std::string expected = expectedPath(folder, kind, column, name);
                EXPECT_STREQ(found.GetPath(), expected.c_str());
                EXPECT_STREQ(created.GetPath(), expected.c_str());
                EXPECT_TRUE(created.IsFolder());
                EXPECT_EQ(fs::exists((folder / kind.name) + "/Media"), column == 0) << expected;
            }
}

TEST(ProjectBundle, EnclosingPackages)
{
    const TemporaryFolder folder;
    fs::create_directories(folder / "Outer.fuguex/Media/Inner.BAND/Media");
    fs::create_directory(folder / ".fuguex");
    folder.write("File.fuguex", "");
    const struct {
        const char *item, *package;
        bool isIn;
    } cases[] = {
        {"Outer.fuguex", "Outer.fuguex", false},
        {"Outer.fuguex/Media/a.wav", "Outer.fuguex", true}, // there or not
        {"Outer.fuguex/Media/Inner.BAND/Media/x/y", "Outer.fuguex/Media/Inner.BAND", true},
        {"Outer.fuguex/../a.wav", nullptr, false},
        {"File.fuguex/a", nullptr, false},
        {".fuguex/a", nullptr, false},
    };
    for (const auto& test : cases) {
        const CFileRef item((folder / test.item).c_str(), false);
        const URLRef url = GetProjectBundleURL(item.URL());
        const CFileRef ref = CFileUtilEnclosingProjectBundle(item);
        EXPECT_EQ(CFileUtilIsInDocumentBundle(item), test.isIn) << test.item;
        EXPECT_EQ(url != nullptr, test.package != nullptr) << test.item;
        EXPECT_EQ(ref.IsValid(), test.package != nullptr) << test.item;
        if (test.package != nullptr && url) {
            EXPECT_EQ(url->posixPath(), folder / test.package);
            EXPECT_EQ(std::string(ref), folder / test.package);
        }
    }
}

} // namespace
