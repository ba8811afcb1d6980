#include "PackageOnDisk.h"
#include "project/ProjectMediaPaths.h"

namespace {

using namespace platform;

TEST(ProjectMediaPaths, StandardizedByTheText)
{
    for (const auto& [path, expected] :
         std::initializer_list<std::pair<const char*, const char*>>{{"/a/b", "/a/b"},
                                                                    {"/", "/"},
                                                                    {"/a/", "/a"},
                                                                    {"//a//b", "/a/b"},
                                                                    {"/a/./b/.", "/a/b"},
                                                                    {"/a/../b", "/b"},
                                                                    {"/../a", "/a"},
                                                                    {"/..", "/"},
                                                                    {"/a/.hidden", "/a/.hidden"},
                                                                    {"/a/...", "/a/..."},
                                                                    {"/a/b/../..", "/"}})
        EXPECT_EQ(standardizedPath(path), expected);
}

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
        {"/x/P.fuguex/", none, none},
        {"/x/P.fuguex", "/x/P.fuguex", "/x/P.fuguex"}, // no package: nothing is in it
        {"/x/P.fuguexa/b", "/x/P.fuguexa/b", "/x/P.fuguexa/b"},
        {"/x/Old.band/Media/a", "/x/Old.band/Media/a", "/x/Old.band/Media/a"},
        {"/samples//kick.wav", "/samples/kick.wav", "/samples/kick.wav"},
        {"Media/Audio Files/a.wav", "/m/Song.fuguex/Media/Audio Files/a.wav", "/m/Audio Files/a.wav"},
        {"Audio Files/a.wav", "/m/Song.fuguex/Media/Audio Files/a.wav", "/m/Audio Files/a.wav"},
        {"Media", "/m/Song.fuguex/Media/Media", "/m/Media"},
        {"media/a", "/m/Song.fuguex/Media/media/a", "/m/media/a"},
        {"../a.wav", "/m/Song.fuguex/a.wav", "/a.wav"},
        {"~/a.wav", "/m/Song.fuguex/Media/~/a.wav", "/m/~/a.wav"},
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

TEST(ProjectFileSet, KeepsEachPathOnce)
{
    ProjectFileSet set{"/a", "/b", "/a"};
    EXPECT_EQ(set.size(), 2U);
    const std::string_view first = *set.begin();
    const std::string large(1 << 20, 'x');
    EXPECT_TRUE(set.insert(large));
    for (int round = 0; round < 2; ++round)
        for (int i = 0; i < 100000; ++i)
            EXPECT_EQ(set.insert(std::to_string(i)), round == 0);
    EXPECT_EQ(set.size(), 100003U);
    EXPECT_TRUE(set.contains(large) && set.contains("99999") && !set.contains("100000") && !set.contains(""));
    const ProjectFileSet moved = std::move(set);
    EXPECT_EQ(first.data(), moved.begin()->data()); // texts stay where they are
    EXPECT_EQ(std::string_view(first.data()), "/a");
    EXPECT_FALSE(ProjectFileSet().contains("/a"));
    EXPECT_EQ((ProjectFileSet{"/a", "/b"}), (ProjectFileSet{"/b", "/a"}));
    EXPECT_FALSE((ProjectFileSet{"/a", "/b"} == ProjectFileSet{"/a", "/c"}));
}

TEST(ProjectMedia, EveryKindHasItsKey)
{
    const PackageOnDisk package;
    package.writeInfo({{"VariantNames", Dictionary{{"0", "a"}, {"1", "b"}}}, {"ActiveVariant", 1}});
    Dictionary first, second;
    const char* const keys[] = {"AudioFiles",    "ImpulsResponsesFiles", "SamplerInstrumentsFiles",
                                "PlaybackFiles", "GestiniopFiles",       "QuicksamplerFiles",
                                "VideoFiles",    "AlchemyFiles"};
    for (const std::string key : keys) {
        first[key] = Array{key + "/0", "both", 7, Array{}, key + "/./0"};
        second[key] = Array{key + "/1", "both"};
    }
    package.writeMetaData(first);
    package.writeMetaData(second, "Variations/001");
    const auto project = package.open();
    ASSERT_TRUE(project);
    using P = ProjectInformation;
    const struct {
        ProjectFileSet (P::*byIndex)(long);
        ProjectFileSet (P::*byAny)();
    } accessors[] = {
        {&P::audioFilesUsedByVariantIndex, &P::audioFilesUsedByAnyVariant},
        {&P::impulseResponsesFilesUsedByVariantIndex, &P::impulseResponsesFilesUsedByAnyVariant},
        {&P::samplerInstrumentsFilesUsedByVariantIndex, &P::samplerInstrumentsFilesUsedByAnyVariant},
        {&P::playbackFilesUsedByVariantIndex, &P::playbackFilesUsedByAnyVariant},
        {&P::gestiniopFilesUsedByVariantIndex, &P::gestiniopFilesUsedByAnyVariant},
        {&P::quicksamplerFilesUsedByVariantIndex, &P::quicksamplerFilesUsedByAnyVariant},
        {&P::videoFilesUsedByVariantIndex, &P::videoFilesUsedByAnyVariant},
        {&P::alchemy2FilesUsedByVariantIndex, &P::alchemy2FilesUsedByAnyVariant},
    };
    const std::string media = package / "Media/";
    for (std::size_t i = 0; i < std::size(keys); ++i) {
        const std::string base = media + keys[i];
        const auto& [byIndex, byAny] = accessors[i];
        const ProjectFileSet ofFirst = (*project.*byIndex)(0);
        const ProjectFileSet ofActive = (*project.*byIndex)(-1);
        const ProjectFileSet ofAny = (*project.*byAny)();
        EXPECT_EQ(ofFirst, (ProjectFileSet{base + "/0", media + "both"}));
        EXPECT_EQ(ofActive, (ProjectFileSet{base + "/1", media + "both"}));
        EXPECT_EQ(ofAny, (ProjectFileSet{base + "/0", base + "/1", media + "both"}));
    }
    EXPECT_EQ(project->relativeAlchemy2FilepathsUsedByVariantIndex(0),
              (std::vector<std::string>{"AlchemyFiles/0", "both", "AlchemyFiles/./0"}));
    EXPECT_EQ(project->allUsedFilesByVariantIndex(1).size(), std::size(keys) + 1);
    EXPECT_EQ(project->allUsedFilesByAnyVariant().size(), 2 * std::size(keys) + 1);
    EXPECT_TRUE(project->allUsedFilesByVariantIndex(5).empty());
}

TEST(ProjectMedia, MovedPackageAndProjectFolder)
{
    PackageOnDisk package;
    package.writeInfo({{"VariantNames", Dictionary{{"0", "a"}}}, {"HasProjectFolder", true}});
    Array paths;
    for (int i = 0; i < 100000; ++i)
        paths.emplace_back("/old/Song.fuguex/Media/" + std::to_string(i));
    paths.emplace_back("Media/Audio Files/a.wav");
    package.writeMetaData({{"AudioFiles", paths}});
    package.moveTo("Tune.fuguex");
    const ProjectFileSet files = package.open()->allUsedFilesByAnyVariant();
    EXPECT_EQ(files.size(), 100001U);
    EXPECT_TRUE(files.contains(package / "Media/99999"));
    EXPECT_TRUE(files.contains(package.folder() / "Audio Files/a.wav"));
}

} // namespace
