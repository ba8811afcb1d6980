#include "PackageOnDisk.h"
#include "platform/ApplicationInfo.h"

#include <cmath>
#include <cstdlib>
#include <functional>
#include <sys/stat.h>

namespace fs = std::filesystem;

namespace {

using namespace platform;
using Info = ProjectInformation;
constexpr auto no = CreateDirectories::no;
constexpr auto yes = CreateDirectories::yes;

/// Runs a script of another reader and writer of property lists.
void runPython(const std::string& script, const std::string& argument)
{
    const std::string command = "python3 - '" + argument + "'";
    std::FILE* python = popen(command.c_str(), "w");
    ASSERT_NE(python, nullptr);
    std::fputs(script.c_str(), python);
    ASSERT_EQ(pclose(python), 0) << script;
}

TEST(ProjectInformation, ReadsWhatAnotherWriterWrote)
{
    for (const char* format : {"FMT_XML", "FMT_BINARY"}) {
        const PackageOnDisk package;
        runPython(std::string("import os, plistlib, sys\nfmt = plistlib.") + format + R"(
os.makedirs(sys.argv[1] + '/Alternatives/001')
def dump(name, value):
    with open(sys.argv[1] + name, 'wb') as file:
        plistlib.dump(value, file, fmt=fmt)
dump('/Resources/ProjectInformation.plist', {
    'BundleVersion': 2, 'VariantNames': {'0': 'old'}, 'VariantNamesV2': {'0': '{PROJECT_NAME}', '1': 'Caf\xe9 mix'},
    'ActiveVariant': 1, 'HasProjectFolder': True, 'LastSavedFrom': 'Studio 1.2.3'})
dump('/Alternatives/001/MetaData.plist', {
    'SampleRate': 48000, 'BeatsPerMinute': 123.25, 'FrameRateIndex': 1, 'isTimeCodeBased': True, 'HasGrid': True,
    'SurroundFormatIndex': 2, 'SurroundModeIndex': 3, 'SignatureKey': -4, 'SongSignatureNumerator': 5,
    'SongSignatureDenominator': 8, 'NumberOfTracks': 77, 'SongKey': 'C#', 'SongGenderKey': 'minor', 'Version': 9,
    'ImpulsResponsesFiles': ['Media/a.wav']})
)",
                  package.path());
        const auto project = package.open();
        ASSERT_TRUE(project);
        EXPECT_EQ(project->alternativeNames(), (Dictionary{{"0", "Song"}, {"1", "Caf\u00E9 mix"}}));
        EXPECT_EQ(project->variationNameForIndex(1), "Caf\u00E9 mix");
        EXPECT_EQ(project->variationNameForIndex(2), std::nullopt);
        EXPECT_EQ(project->lastActiveVariation(), 1);
        EXPECT_TRUE(project->hasProjectFolder());
        for (const long index : {1L, -1L}) {
            EXPECT_EQ(project->sampleRate(index), 48000U);
            EXPECT_EQ(project->beatsPerMinute(index), 123.25);
            EXPECT_EQ(project->frameRateIndex(index), 1);
            EXPECT_TRUE(project->isTimeCodeBased(index));
            EXPECT_TRUE(project->hasGrid(index));
            EXPECT_EQ(project->surroundFormatIndex(index), 2);
            EXPECT_EQ(project->surroundModeIndex(index), 3);
            EXPECT_EQ(project->signKey(index), -4);
            EXPECT_EQ(project->timeSignatureNumerator(index), 5);
            EXPECT_EQ(project->timeSignatureDenominator(index), 8);
            EXPECT_EQ(project->numberOfTracks(index), 77);
            EXPECT_EQ(project->songKeyAsNonLocalizedString(index), "C#");
            EXPECT_EQ(project->songGenderAsNonLocalizedString(index), "minor");
            EXPECT_EQ(project->metaDataVersionOfVariant(index), 9);
            EXPECT_EQ(project->relativeImpulseResponsesFilepathsUsedByVariantIndex(index),
                      std::vector<std::string>{"Media/a.wav"});
        }
        EXPECT_EQ(project->maxMetaDataVersionOfAnyVariant(), 9);
        // The other alternative has no metadata.
        EXPECT_EQ(project->sampleRate(0), 0U);
        EXPECT_EQ(project->songKeyAsNonLocalizedString(0), std::nullopt);
        EXPECT_FALSE(project->isTimeCodeBased(0));
    }
}

TEST(ProjectInformation, WritesWhatAnotherReaderReads)
{
    setApplicationInfo({"Studio", "2.1 (77)"});
    const TemporaryFolder folder;
    const URLRef bundle = urlOf(folder / "Song.fuguex");
    const Dictionary info{{"VariantNames", Dictionary{{"0", "Song"}, {"1", "Song (Song mix)"}, {"2", 5}}},
                          {"Other", Array{1}}};
    Error error;
    ASSERT_TRUE(Info::writeInfoDictionaryToProjectBundleURL(info, bundle, &error)) << error.description;
    runPython(R"(
import plistlib, sys
with open(sys.argv[1] + '/Song.fuguex/Resources/ProjectInformation.plist', 'rb') as file:
    raw = file.read()
assert raw.startswith(b'bplist00')
assert plistlib.loads(raw) == {
    'BundleVersion': 2, 'LastSavedFrom': 'Studio 2.1 (77)', 'Other': [1],
    'VariantNames': {'0': 'Song', '1': 'Song (Song mix)', '2': 5},
    'VariantNamesV2': {'0': '{PROJECT_NAME}', '1': '{PROJECT_NAME} ({PROJECT_NAME} mix)', '2': 5}}, plistlib.loads(raw)
)",
              folder.path().string());
    // Into the file itself: a second name keeps seeing it.
    const std::string file = folder / "Song.fuguex/Resources/ProjectInformation.plist";
    fs::create_hard_link(file, folder / "second");
    ASSERT_TRUE(Info::writeInfoDictionaryToURL(Dictionary{}, urlOf(file, false)));
    EXPECT_EQ(readFile(folder / "second"), readFile(file));
    EXPECT_EQ(Info::infoDictionaryWithContentsOfURL(urlOf(file, false)), Dictionary{});
}

TEST(ProjectInformation, WriteFailuresAreTold)
{
    const PackageOnDisk package;
    package.write("file", "no folder");
    Error error;
    EXPECT_FALSE(Info::writeInfoDictionaryToProjectBundleURL({}, nullptr, &error));
    EXPECT_EQ(error.domain, ErrorDomain::status);
    EXPECT_FALSE(Info::writeInfoDictionaryToProjectBundleURL({}, urlOf(package / "file"), &error));
    EXPECT_EQ(error.domain, ErrorDomain::system);
    EXPECT_EQ(error.code, ENOTDIR);
    EXPECT_FALSE(Info::writeInfoDictionaryToProjectBundleURL({{"x", Value()}}, package.url(), &error));
    EXPECT_FALSE(Info::writeInfoDictionaryToURL({}, urlOf(package.path()), &error)); // a folder
    EXPECT_EQ(error.code, EISDIR);
}

TEST(ProjectInformation, NamesFollowThePackage)
{
    setApplicationInfo({"Studio", "3"});
    const struct {
        Dictionary info, names;
        Value tokens, version;
    } cases[] = {
        {{{"BundleVersion", 2},
          {"VariantNames", Dictionary{{"0", "Song"}}},
          {"VariantNamesV2", Dictionary{{"0", "{PROJECT_NAME}"}}}},
         {{"0", "Tune"}},
         Dictionary{{"0", "{PROJECT_NAME}"}},
         2},
        {{{"BundleVersion", 3}, {"VariantNamesV2", Dictionary{{"0", "a {PROJECT_NAME}{PROJECT_NAME}"}}}},
         {{"0", "a TuneTune"}},
         Dictionary{{"0", "a {PROJECT_NAME}{PROJECT_NAME}"}},
         3},
        {{{"BundleVersion", 1}, {"VariantNames", Dictionary{{"0", "Tune 1"}}}},
         {{"0", "Tune 1"}},
         Dictionary{{"0", "{PROJECT_NAME} 1"}},
         2},
        {{{"BundleVersion", 1.0}, {"VariantNames", Dictionary{{"0", "Tune"}}}},
         {{"0", "Tune"}},
         Dictionary{{"0", "{PROJECT_NAME}"}},
         2},
        {{{"VariantNames", Dictionary{{"0", "Song"}}}, {"VariantNamesV2", Dictionary{{"0", "{PROJECT_NAME}"}}}},
         {{"0", "Song"}},
         Dictionary{{"0", "{PROJECT_NAME}"}},
         Value()},
        {{{"BundleVersion", 2}, {"VariantNames", Dictionary{{"0", "Song"}}}, {"VariantNamesV2", "text"}},
         {{"0", "Song"}},
         "text",
         2},
        {{{"BundleVersion", "2"}, {"VariantNames", Dictionary{{"0", "Song"}}}}, {{"0", "Song"}}, Value(), "2"},
    };
    for (const auto& test : cases) {
        PackageOnDisk package;
        package.writeInfo(test.info);
        package.moveTo("Tune.FugueX");
        const auto project = package.open();
        ASSERT_TRUE(project);
        EXPECT_EQ(project->alternativeNames(), test.names);
        const auto value = [&](const char* key) {
            const auto found = project->projectInfo().find(std::string_view(key));
            return found == project->projectInfo().end() ? Value() : found->second;
        };
        EXPECT_EQ(value("VariantNamesV2"), test.tokens);
        EXPECT_EQ(value("BundleVersion"), test.version);
    }
}

TEST(ProjectInformation, DisplayNames)
{
    const TemporaryFolder folder;
    fs::create_directory(folder / "There.band");
    for (const auto& [name, shown] :
         std::initializer_list<std::pair<const char*, const char*>>{{"There.band", "There"},
                                                                    {"A.b.FUGUEX", "A.b"},
                                                                    {"Song.fuguex.txt", "Song.fuguex.txt"},
                                                                    {".fuguex", ".fuguex"},
                                                                    {"fuguex", "fuguex"},
                                                                    {"\u00DCber.fuguex", "\u00DCber"}})
        EXPECT_EQ(Info::projectDisplayNameWithoutExtension(urlOf(folder / name)), shown);
    EXPECT_EQ(Info::projectDisplayNameWithoutExtension(nullptr), std::nullopt);
}

TEST(ProjectInformation, AlternativesAreFoundInThreeGenerations)
{
    const struct {
        std::vector<std::string> there;
        long index;
        const char *found, *accepted;
    } cases[] = {
        {{}, 0, nullptr, "Alternatives/000"},
        {{"Variants/000"}, 0, "Variants/000", "Variants/000"},
        {{"Variants/000", "Variations/000"}, 0, "Variations/000", "Variations/000"},
        {{"Variants/007", "Variations/007", "Alternatives/007"}, 7, "Alternatives/007", "Alternatives/007"},
        {{"Alternatives/000"}, 1, nullptr, "Alternatives/001"},
        {{"Alternatives/1000"}, 1000, "Alternatives/1000", "Alternatives/1000"},
        {{}, 4294967295, nullptr, "Alternatives/4294967295"},
        {{"Alternatives/000"}, 4294967296, nullptr, nullptr},
        {{"Alternatives/4294967295"}, -1, nullptr, nullptr},
    };
    for (const auto& test : cases) {
        const PackageOnDisk package;
        for (const std::string& folder : test.there)
            fs::create_directories(package / folder);
        const auto expected = [&](const char* found) {
            return found == nullptr ? std::nullopt : std::optional(package / found);
        };
        EXPECT_EQ(Info::pathForVariant(test.index, package.url(), AcceptMissing::no), expected(test.found));
        EXPECT_EQ(Info::pathForVariant(test.index, package.url(), AcceptMissing::yes), expected(test.accepted));
    }
    EXPECT_EQ(Info::URLForVariant(0, nullptr, AcceptMissing::yes), nullptr);
}

TEST(ProjectInformation, LocationsAndTheirFolders)
{
    using Location = std::function<URLRef(const URLRef&, CreateDirectories)>;
    const auto variant = [](URLRef (*location)(const URLRef&, long, CreateDirectories)) -> Location {
        return [location](const URLRef& bundle, CreateDirectories create) { return location(bundle, 2, create); };
    };
    const struct {
        Location location;
        const char *path, *created;
    } cases[] = {
        {&Info::projectInformationURLForBundleURL, "Resources/ProjectInformation.plist", "Resources"},
        {&Info::alternativesBaseURLForBundleURL, "Alternatives", "Alternatives"},
        {&Info::mediaURLForBundleURL, "Media", "Media"},
        {variant(Info::variantBaseURLForBundleURL), "Alternatives/002", "Alternatives/002"},
        {variant(Info::metaDataURLForBundleURL), "Alternatives/002/MetaData.plist", "Alternatives/002"},
        {variant(Info::windowImageURLForBundleURL), "Alternatives/002/WindowImage.jpg", "Alternatives/002"},
        {variant(Info::oldDisplayStateURLForBundleURL), "Alternatives/002/DisplayState.plist", "Alternatives/002"},
        {variant(Info::displayStateArchiveURLForBundleURL), "Alternatives/002/DisplayStateArchive", "Alternatives/002"},
        {variant(Info::displayStateMobileURLForBundleURL), "Alternatives/002/DisplayStateMobile.plist",
         "Alternatives/002"},
        {variant(Info::projectDataURLForBundleURL), "Alternatives/002/ProjectData", "Alternatives/002"},
        {variant(Info::ARAFilesURLForBundleURL), "Alternatives/002/ARA Files", "Alternatives/002/ARA Files"},
        {variant(Info::backupsBaseURLForBundleURL), "Alternatives/002/Project File Backups",
         "Alternatives/002/Project File Backups"},
    };
    for (const auto& test : cases) {
        const TemporaryFolder folder;
        const std::string bundle = folder / "New.fuguex";
        EXPECT_EQ(test.location(nullptr, yes), nullptr);
        ASSERT_TRUE(test.location(urlOf(bundle), no)) << test.path;
        EXPECT_EQ(test.location(urlOf(bundle), no)->posixPath(), bundle + '/' + test.path);
        EXPECT_FALSE(fs::exists(bundle));
        ASSERT_TRUE(test.location(urlOf(bundle), yes)) << test.path;
        EXPECT_TRUE(fs::is_directory(bundle + '/' + test.created)) << test.path;
        EXPECT_EQ(fs::exists(bundle + '/' + test.path), std::string_view(test.path) == test.created);
        // A package that is a file has no room for folders.
        fs::remove_all(bundle);
        folder.write("New.fuguex", "a file");
        EXPECT_EQ(test.location(urlOf(bundle), yes), nullptr) << test.path;
    }
}

TEST(ProjectInformation, MetaDataFallsBackToItsCopyAndIsKept)
{
    const PackageOnDisk package;
    package.writeInfo({{"VariantNames", Dictionary{{"0", "a"}, {"1", "b"}}}});
    package.writeList("Alternatives/000/MetaData.bak", Dictionary{{"SampleRate", 44100}});
    package.write("Alternatives/001/MetaData.plist", "nonsense");
    package.writeList("Alternatives/001/MetaData.bak", Dictionary{{"SampleRate", 44100}});
    const auto project = package.open();
    ASSERT_TRUE(project);
    EXPECT_EQ(project->sampleRate(0), 44100U);
    EXPECT_EQ(project->loadMetaDataForVariant(1), nullptr); // readable, but no property list
    EXPECT_EQ(project->loadMetaDataForVariant(-1), nullptr);
    EXPECT_EQ(project->loadMetaDataForVariant(99999999999), nullptr);
    // What was read stays; what failed is tried again.
    fs::remove(package / "Alternatives/000/MetaData.bak");
    package.writeMetaData({{"SampleRate", 96000}}, "Alternatives/001");
    EXPECT_EQ(project->sampleRate(0), 44100U);
    EXPECT_EQ(project->sampleRate(1), 96000U);
}

TEST(ProjectInformation, ValuesOfTheWrongShapeReadAsAbsent)
{
    const std::vector<Value> wrong = {Value("text"),      Value(Bytes(3)),
                                      Value(Array{1, 2}), Value(Dictionary{{"a", 1}}),
                                      Value(Date{5}),     Value(std::nan(""))};
    for (const Value& value : wrong) {
        const PackageOnDisk package;
        Dictionary info, metaData;
        for (const char* key :
             {"BundleVersion", "VariantNamesV2", "ActiveVariant", "HasProjectFolder", "LastSavedFrom"})
            info[key] = value;
        info["VariantNames"] = Dictionary{{"0", value}, {"007", value}, {"-3", value}, {"x", value}};
        for (const char* key :
             {"SampleRate", "BeatsPerMinute", "FrameRateIndex", "isTimeCodeBased", "HasGrid", "SurroundFormatIndex",
              "SurroundModeIndex", "SignatureKey", "SongSignatureNumerator", "SongSignatureDenominator",
              "NumberOfTracks", "Version", "AudioFiles", "ImpulsResponsesFiles", "VideoFiles"})
            metaData[key] = value;
        metaData["SongKey"] = metaData["SongGenderKey"] = value.get<std::string>() != nullptr ? Value(4) : value;
        // Only the binary form holds a number that is none.
        package.write("Resources/ProjectInformation.plist", *writePropertyList(info, PropertyListFormat::binary));
        package.write("Alternatives/000/MetaData.plist", *writePropertyList(metaData, PropertyListFormat::binary));
        const auto project = package.open();
        ASSERT_TRUE(project);
        EXPECT_EQ(project->lastActiveVariation(), 0);
        EXPECT_FALSE(project->hasProjectFolder());
        EXPECT_EQ(project->variationIndexesSorted(), (std::vector<std::string>{"0", "007", "-3", "x"}));
        EXPECT_EQ(project->sampleRate(0), 0U);
        EXPECT_EQ(project->beatsPerMinute(0), 0);
        EXPECT_EQ(project->frameRateIndex(0) + project->surroundFormatIndex(0) + project->surroundModeIndex(0) +
                      project->signKey(0) + project->timeSignatureNumerator(0) + project->timeSignatureDenominator(0) +
                      project->numberOfTracks(0) + project->maxMetaDataVersionOfAnyVariant(),
                  0);
        EXPECT_FALSE(project->isTimeCodeBased(0) || project->hasGrid(0));
        EXPECT_EQ(project->songKeyAsNonLocalizedString(0), std::nullopt);
        EXPECT_EQ(project->songGenderAsNonLocalizedString(0), std::nullopt);
        EXPECT_TRUE(project->allUsedFilesByAnyVariant().empty());
    }
    const PackageOnDisk package;
    package.writeInfo({{"VariantNames", "text"}, {"ActiveVariant", -7}});
    package.writeMetaData({{"SampleRate", -1}, {"BeatsPerMinute", 120}});
    const auto project = package.open();
    ASSERT_TRUE(project);
    EXPECT_TRUE(project->variationIndexesSorted().empty());
    EXPECT_EQ(project->sampleRate(0), 0U);
    EXPECT_EQ(project->beatsPerMinute(0), 120);
    EXPECT_EQ(project->beatsPerMinute(-1), 0); // the active one has a negative index itself
}

TEST(ProjectInformation, IndexesSortAsNumbers)
{
    const PackageOnDisk package;
    Dictionary names;
    for (const char* key : {"10", "9", "1000", "007", "7", "99999999999999999999", "-1", ""})
        names[key] = "n";
    package.writeInfo({{"VariantNames", names}});
    EXPECT_EQ(package.open()->variationIndexesSorted(),
              (std::vector<std::string>{"007", "7", "9", "10", "1000", "", "-1", "99999999999999999999"}));
}

TEST(ProjectInformation, NoPackageNoObject)
{
    const TemporaryFolder folder;
    const std::string file = folder.write("File.fuguex", "file");
    fs::create_directories(folder / "Empty.fuguex");
    fs::create_directories(folder / "List.fuguex/Resources");
    folder.write("List.fuguex/Resources/ProjectInformation.plist",
                 *writePropertyList(Array{1}, PropertyListFormat::xml));
    fs::create_directories(folder / "Fifo.fuguex/Resources");
    ASSERT_EQ(mkfifo((folder / "Fifo.fuguex/Resources/ProjectInformation.plist").c_str(), 0600), 0);
    fs::create_directories(folder / "Huge.fuguex/Resources");
    fs::resize_file(folder.write("Huge.fuguex/Resources/ProjectInformation.plist", ""), std::uintmax_t{1} << 40);
    fs::create_directories(folder / "Circle.fuguex/Resources");
    fs::create_symlink("ProjectInformation.plist", folder / "Circle.fuguex/Resources/ProjectInformation.plist");
    for (const char* name :
         {"File.fuguex", "Empty.fuguex", "List.fuguex", "Fifo.fuguex", "Huge.fuguex", "Circle.fuguex", "None.fuguex"})
        EXPECT_EQ(Info::initWithProjectURL(urlOf(folder / name)), nullptr) << name;
    EXPECT_EQ(Info::initWithProjectURL(nullptr), nullptr);
    EXPECT_EQ(Info::initWithProjectURL(URL::createWithString("http://host/Song.fuguex")), nullptr);
    EXPECT_EQ(Info::initWithProjectURL(URL::createWithString("file://host/Song.fuguex")), nullptr);
}

} // namespace
