#include "PackageOnDisk.h"
#include "platform/ApplicationInfo.h"

#include <cmath>
#include <cstdio>
#include <sys/stat.h>

namespace fs = std::filesystem;

namespace {

using namespace platform;
using Info = ProjectInformation;

/// Runs a script that reads and writes property lists independently.
void runPython(const std::string& script, const std::string& argument)
{
    const std::string command = "python3 - '" + argument + "'";
    std::FILE* python = popen(command.c_str(), "w");
    ASSERT_NE(python, nullptr);
    std::fputs(script.c_str(), python);
    ASSERT_EQ(pclose(python), 0) << script;
}

struct Number {
    const char* key;
    std::int64_t (*read)(Info& project, long index);
    int value;
};

template <auto accessor>
std::int64_t numberOf(Info& project, long index)
{
    return static_cast<std::int64_t>((project.*accessor)(index));
}

const Number kNumbers[] = {
    {"SampleRate", numberOf<&Info::sampleRate>, 48000},
    {"BeatsPerMinute", numberOf<&Info::beatsPerMinute>, 123},
    {"SurroundFormatIndex", numberOf<&Info::surroundFormatIndex>, 2},
    {"SignatureKey", numberOf<&Info::signKey>, -4},
    {"SongSignatureNumerator", numberOf<&Info::timeSignatureNumerator>, 5},
    {"NumberOfTracks", numberOf<&Info::numberOfTracks>, 77},
    {"Version", numberOf<&Info::metaDataVersionOfVariant>, 9},
};

TEST(ProjectInformation, ReadsWhatAnotherWriterWrote)
{
    for (const char* format : {"FMT_XML", "FMT_BINARY"}) {
        const PackageOnDisk package;
        std::string numbers;
        for (const Number& number : kNumbers)
            numbers += std::string("'") + number.key + "': " + std::to_string(number.value) + ", ";
        runPython(std::string("import os, plistlib, sys\nfmt = plistlib.") + format + R"(
os.makedirs(sys.argv[1] + '/Alternatives/001')
def dump(name, value):
    with open(sys.argv[1] + name, 'wb') as file:
        plistlib.dump(value, file, fmt=fmt)
dump('/Resources/ProjectInformation.plist', {
    'BundleVersion': 2, 'VariantNames': {'0': 'old'}, 'VariantNamesV2': {'0': '{PROJECT_NAME}', '1': 'Caf\xe9 mix'},
    'ActiveVariant': 1, 'HasProjectFolder': True, 'LastSavedFrom': 'Studio 1.2.3'})
dump('/Alternatives/001/MetaData.plist', {)" +
                      numbers +
                      "'SongKey': 'C#', 'SongGenderKey': 'minor', 'ImpulsResponsesFiles': ['Media/a.wav']})\n",
                  package.path());
        const auto project = package.open();
        ASSERT_TRUE(project);
        EXPECT_EQ(project->alternativeNames(), (Dictionary{{"0", "Song"}, {"1", "Caf\u00E9 mix"}}));
        EXPECT_EQ(project->variationNameForIndex(1), "Caf\u00E9 mix");
        EXPECT_EQ(project->variationNameForIndex(2), std::nullopt);
        EXPECT_EQ(project->lastActiveVariation(), 1);
        EXPECT_TRUE(project->hasProjectFolder());
        for (const long index : {1L, -1L}) {
            for (const Number& number : kNumbers)
                EXPECT_EQ(number.read(*project, index), number.value) << number.key;
            EXPECT_EQ(project->songKeyAsNonLocalizedString(index), "C#");
            EXPECT_EQ(project->songGenderAsNonLocalizedString(index), "minor");
            EXPECT_EQ(project->relativeImpulseResponsesFilepathsUsedByVariantIndex(index),
                      std::vector<std::string>{"Media/a.wav"});
        }
        EXPECT_EQ(project->maxMetaDataVersionOfAnyVariant(), 9);
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
    // Writes into the file itself: a second name still leads to it.
    const std::string file = folder / "Song.fuguex/Resources/ProjectInformation.plist";
    fs::create_hard_link(file, folder / "second");
    ASSERT_TRUE(Info::writeInfoDictionaryToURL(Dictionary{}, urlOf(file)));
    EXPECT_EQ(readFile(folder / "second"), readFile(file));
    EXPECT_EQ(Info::infoDictionaryWithContentsOfURL(urlOf(file)), Dictionary{});
}

TEST(ProjectInformation, NamesFollowThePackage)
{
    setApplicationInfo({"Studio", "3"});
    const Value none;
    const struct {
        Value version;
        const char *names, *tokens; // of alternative 0, as stored
        const char* shown;
        Value tokensRead, versionRead;
    } cases[] = {
        {2, "Song", "{PROJECT_NAME}", "Tune", "{PROJECT_NAME}", 2},
        {3, nullptr, "a {PROJECT_NAME}{PROJECT_NAME}", "a TuneTune", "a {PROJECT_NAME}{PROJECT_NAME}", 3},
        {1, "Tune 1", nullptr, "Tune 1", "{PROJECT_NAME} 1", 2},
        {1.0, "Tune", nullptr, "Tune", "{PROJECT_NAME}", 2},
        {none, "Song", "{PROJECT_NAME}", "Song", "{PROJECT_NAME}", none},
        {2, "Song", nullptr, "Song", none, 2},
        {"2", "Song", nullptr, "Song", none, "2"},
    };
    for (const auto& test : cases) {
        PackageOnDisk package;
        Dictionary info;
        if (!test.version.isNull())
            info["BundleVersion"] = test.version;
        for (const auto& [key, name] : {std::pair{"VariantNames", test.names}, {"VariantNamesV2", test.tokens}})
            if (name != nullptr)
                info[key] = Dictionary{{"0", name}};
        package.writeInfo(info);
        package.moveTo("Tune.FugueX");
        const auto project = package.open();
        ASSERT_TRUE(project);
        EXPECT_EQ(project->variationNameForIndex(0), test.shown);
        const auto value = [](const Dictionary& dictionary, std::string_view key) {
            const auto found = dictionary.find(key);
            return found == dictionary.end() ? Value() : found->second;
        };
        const Value tokens = value(project->projectInfo(), "VariantNamesV2");
        EXPECT_EQ(tokens.isNull() ? none : value(*tokens.get<Dictionary>(), "0"), test.tokensRead);
        EXPECT_EQ(value(project->projectInfo(), "BundleVersion"), test.versionRead);
    }
}

TEST(ProjectInformation, AlternativesAreFoundInThreeGenerations)
{
    const struct {
        std::vector<std::string> there;
        long index;
        const char *found, *accepted;
    } cases[] = {
        {{"Variants/000", "Variations/000"}, 0, "Variations/000", "Variations/000"},
        {{"Variants/007", "Variations/007", "Alternatives/007"}, 7, "Alternatives/007", "Alternatives/007"},
        {{"Alternatives/000"}, 1, nullptr, "Alternatives/001"},
        {{"Alternatives/1000"}, 1000, "Alternatives/1000", "Alternatives/1000"},
        {{}, 4294967295, nullptr, "Alternatives/4294967295"},
        {{"Alternatives/000"}, 4294967296, nullptr, nullptr},
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
    EXPECT_EQ(project->sampleRate(1), 44100U); // readable, but no property list
    EXPECT_EQ(project->loadMetaDataForVariant(2), nullptr);
    EXPECT_EQ(project->loadMetaDataForVariant(-1), nullptr);
    EXPECT_EQ(project->loadMetaDataForVariant(99999999999), nullptr);
    // What was read is kept; what failed is tried again.
    fs::remove(package / "Alternatives/000/MetaData.bak");
    package.writeMetaData({{"SampleRate", 96000}}, "Alternatives/002");
    EXPECT_EQ(project->sampleRate(0), 44100U);
    EXPECT_EQ(project->sampleRate(2), 96000U);
}

TEST(ProjectInformation, OneValueThatCannotBeReadCostsNoOther)
{
    const PackageOnDisk package;
    const std::string odd = "<key>Own</key><integer>18446744073709551615</integer><key>Empty</key><real/>"
                            "<key>Day</key><date>2026-11-21T12:30:00.5+01:00</date>";
    const auto list = [&](const std::string& more) { return "<plist><dict>" + odd + more + "</dict></plist>"; };
    package.write("Resources/ProjectInformation.plist",
                  list("<key>VariantNames</key><dict><key>0</key><string>a</string></dict>"));
    package.write("Alternatives/000/MetaData.plist",
                  list("<key>SampleRate</key><integer>96000</integer><key>AudioFiles</key><array><string>a</string>"
                       "<real/><string>b</string></array>"));
    const auto project = package.open();
    ASSERT_TRUE(project);
    EXPECT_EQ(project->variationNameForIndex(0), "a");
    EXPECT_EQ(project->sampleRate(0), 96000U);
    EXPECT_EQ(project->filesUsedByAnyVariant(ProjectMediaKind::audio).size(), 2U);
    // A caller who will write the dictionary back must not lose what it cannot represent.
    EXPECT_FALSE(Info::infoDictionaryFromProjectBundleURL(package.url()));
}

TEST(ProjectInformation, ValuesOfTheWrongShapeReadAsAbsent)
{
    for (const Value& value :
         {Value("text"), Value(Bytes(3)), Value(Array{1, 2}), Value(Dictionary{{"a", 1}}), Value(std::nan(""))}) {
        const PackageOnDisk package;
        Dictionary info, metaData;
        for (const char* key :
             {"BundleVersion", "VariantNamesV2", "ActiveVariant", "HasProjectFolder", "LastSavedFrom"})
            info[key] = value;
        info["VariantNames"] = Dictionary{{"0", value}, {"007", value}, {"-3", value}, {"x", value}};
        for (const Number& number : kNumbers)
            metaData[number.key] = value;
        for (const char* key : {"AudioFiles", "ImpulsResponsesFiles", "VideoFiles"})
            metaData[key] = value;
        metaData["SongKey"] = metaData["SongGenderKey"] = value.get<std::string>() != nullptr ? Value(4) : value;
        // Only the binary form can hold a NaN.
        package.write("Resources/ProjectInformation.plist", *writePropertyList(info, PropertyListFormat::binary));
        package.write("Alternatives/000/MetaData.plist", *writePropertyList(metaData, PropertyListFormat::binary));
        const auto project = package.open();
        ASSERT_TRUE(project);
        EXPECT_EQ(project->lastActiveVariation(), 0);
        EXPECT_FALSE(project->hasProjectFolder());
        EXPECT_EQ(project->variationIndexesSorted(), (std::vector<std::string>{"0", "007", "-3", "x"}));
        for (const Number& number : kNumbers)
            for (const long index : {0L, 7L}) // and one without metadata
                EXPECT_EQ(number.read(*project, index), 0) << number.key;
        EXPECT_EQ(project->songKeyAsNonLocalizedString(0), std::nullopt);
        EXPECT_EQ(project->songGenderAsNonLocalizedString(0), std::nullopt);
        EXPECT_TRUE(project->allUsedFilesByAnyVariant().empty());
    }
}

TEST(ProjectInformation, NoPackageNoObject)
{
    const TemporaryFolder folder;
    folder.write("File.fuguex", "file");
    const auto list = [&](const std::string& name) {
        fs::create_directories(folder / (name + ".fuguex/Resources"));
        return name + ".fuguex/Resources/ProjectInformation.plist";
    };
    list("Empty");
    folder.write(list("List"), *writePropertyList(Array{1}, PropertyListFormat::xml));
    ASSERT_EQ(mkfifo((folder / list("Fifo")).c_str(), 0600), 0);
    fs::resize_file(folder.write(list("Huge"), ""), std::uintmax_t{1} << 40);
    fs::create_symlink("ProjectInformation.plist", folder / list("Circle"));
    for (const char* name :
         {"File.fuguex", "Empty.fuguex", "List.fuguex", "Fifo.fuguex", "Huge.fuguex", "Circle.fuguex", "None.fuguex"})
        EXPECT_EQ(Info::initWithProjectURL(urlOf(folder / name)), nullptr) << name;
    EXPECT_EQ(Info::initWithProjectURL(nullptr), nullptr);
    EXPECT_EQ(Info::initWithProjectURL(URL::createWithString("http://host/Song.fuguex")), nullptr);
    EXPECT_EQ(Info::initWithProjectURL(URL::createWithString("file://host/Song.fuguex")), nullptr);
}

} // namespace
