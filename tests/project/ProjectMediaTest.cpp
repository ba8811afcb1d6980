#include "PackageOnDisk.h"
#include "project/ProjectMediaPaths.h"

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

} // namespace
