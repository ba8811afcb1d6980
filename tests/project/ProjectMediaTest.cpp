#include "PackageOnDisk.h"
#include "project/ProjectMediaPaths.h"

#include <set>

namespace {

using namespace platform;

TEST(ProjectMediaPaths, Rule)
{
    const std::string_view none;
    const struct {
        std::string_view stored, inside, folder; // with media inside the package, and with a project folder
    } cases[] = {
        {"/old/place/Project.fuguex/Media/Audio Files/a.wav", "/m/Song.fuguex/Media/Audio Files/a.wav",
         "/m/Song.fuguex/Media/Audio Files/a.wav"},
        {"Project.FUGUEX/Media/a.wav", "/m/Song.fuguex/Media/a.wav", "/m/Song.fuguex/Media/a.wav"},
        {"/o/Outer.fuguex/Media/Inner.fuguex/b", "/m/Song.fuguex/Media/Inner.fuguex/b",
         "/m/Song.fuguex/Media/Inner.fuguex/b"},
        {"/x/P.fuguex/a/../b", "/m/Song.fuguex/b", "/m/Song.fuguex/b"},
        {"/x/P.fuguex/../../etc/passwd", none, none},
        {"/x/P.fuguex/../Song.fuguex2/a", none, none},
        {"/x/P.fuguex", "/x/P.fuguex", "/x/P.fuguex"}, // no package: nothing is in it
        {"/x/Old.band/Media/a", "/x/Old.band/Media/a", "/x/Old.band/Media/a"},
        {"/samples/link/../kick.wav", "/samples/link/../kick.wav", "/samples/link/../kick.wav"}, // the link leads away
        {"Media/Audio Files/a.wav", "/m/Song.fuguex/Media/Audio Files/a.wav", "/m/Audio Files/a.wav"},
        {"Audio Files/a.wav", "/m/Song.fuguex/Media/Audio Files/a.wav", "/m/Audio Files/a.wav"},
        {"../a.wav", "/m/Song.fuguex/a.wav", "/a.wav"},
        {"a/./b//c/.", "/m/Song.fuguex/Media/a/b/c", "/m/a/b/c"},
        {"../../../../a/.hidden", "/a/.hidden", "/a/.hidden"},
        {"", none, none},
        {std::string_view("/a\0b", 4), none, none},
    };
    const ProjectMediaPaths inside("/m/Song.fuguex", false), folder("/m/Song.fuguex", true);
    for (const auto& test : cases) {
        std::string path = "of before";
        EXPECT_EQ(inside.makeAbsolute(test.stored, path) ? path : "", test.inside) << test.stored;
        EXPECT_EQ(folder.makeAbsolute(test.stored, path) ? path : "", test.folder) << test.stored;
    }
}

TEST(ProjectMedia, MovedPackageAndProjectFolder)
{
    PackageOnDisk package;
    package.writeInfo({{"VariantNames", Dictionary{{"0", "a"}}}, {"HasProjectFolder", true}});
    package.writeMetaData({{"AudioFiles", Array{"/old/Song.fuguex/Media/9", "Media/Audio Files/a.wav"}}});
    package.moveTo("Tune.fuguex");
    const ProjectFileSet files = package.open()->allUsedFilesByAnyVariant();
    EXPECT_EQ(files, (ProjectFileSet{package / "Media/9", package.folder() / "Audio Files/a.wav"}));
}

TEST(ProjectFileSet, HoldsWhatAStandardSetHolds)
{
    ProjectFileSet files;
    std::set<std::string> expected;
    std::string large(300'000, 'x'); // more than a block of texts
    std::vector<std::string> given;
    for (int i = 0; i < 5000; ++i) {
        const std::string path = "/media/" + std::to_string(i * 7919 % 3000);
        EXPECT_EQ(files.insert(path), expected.insert(path).second) << path;
        given.push_back(path);
    }
    ProjectFileSet together;
    for (const std::size_t count : {0u, 1u, 33u, 5000u}) // some of them twice
        together.insert(std::span(given).first(count));
    EXPECT_TRUE(std::equal(files.begin(), files.end(), together.begin(), together.end())) << "in the same order";
    EXPECT_FALSE(files.contains("/media/3000"));
    EXPECT_FALSE(files.contains("/media/"));
    EXPECT_FALSE(files.contains(large));
    EXPECT_TRUE(files.insert(large) && files.contains(large));
    expected.insert(large);
    EXPECT_EQ(files.size(), expected.size());
    EXPECT_EQ(std::set<std::string>(files.begin(), files.end()), expected);
    for (const std::string& path : expected)
        EXPECT_TRUE(files.contains(path));
    EXPECT_FALSE(ProjectFileSet().contains(""));
    EXPECT_FALSE((ProjectFileSet{"/a", "/b"} == ProjectFileSet{"/a", "/c"}));
    EXPECT_FALSE((ProjectFileSet{"/a"} == ProjectFileSet{"/a", "/c"}));
}

} // namespace
