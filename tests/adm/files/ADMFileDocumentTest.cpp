// Documents of files as hosts get them: as JSON to the byte what the command prints, and errors that say where.
#include "adm/files/ADMFileDocument.h"
#include "adm/Documents.h"
#include "platform/core/Status.h"
#include "support/ContainerBuilder.h"
#include "support/Programs.h"

#include <gtest/gtest.h>

namespace {

class ADMFileDocument : public testing::Test {
protected:
    static CFileRef ref(const std::string& path) { return CFileRef(path.c_str(), false); }
    /// The code of the error of our domain; 0 where there is a document.
    std::int64_t codeFor(const std::string& path)
    {
        error = {};
        const auto document = readADMDocument(ref(path), {}, &error);
        EXPECT_EQ(document != nullptr, error.domain.empty()) << path;
        return error.domain == kADMErrorDomain ? error.code : 0;
    }

    TemporaryFolder folder;
    platform::Error error;
};

std::string channelOf(int number)
{
    const std::string digits = std::to_string(1000 + number);
    const std::string position = "<position coordinate='azimuth'>" + std::to_string(number / 7.0) +
                                 "</position><position coordinate='elevation'>1e-7</position>";
    return "<audioChannelFormat audioChannelFormatID='AC_0003" + digits + "' audioChannelFormatName='\xC3\xA9" +
           digits + "' typeLabel='0003'>" + block("AB_0003" + digits + "_00000001", position) + "</audioChannelFormat>";
}

std::int64_t code(ADMFileError each)
{
    return static_cast<std::int64_t>(each);
}

} // namespace

TEST_F(ADMFileDocument, IsTheJSONThatTheCommandPrints)
{
    // Long enough for several pieces of output, with names that need escapes and numbers of every size.
    std::string elements;
    for (int i = 0; i < 300; ++i)
        elements += channelOf(i);
    elements += named("audioContent", "ACO_1001", "audioContentLanguage='d&quot;\\\xC2\xAD\xF0\x9F\x8E\xB5&#9;'");
    const std::string many = folder.write("many \xC3\xA9.xml", enveloped(elements));
    for (const std::string& path : {mediaPath("harbour.xml"), mediaPath("harbour-bw64.wav"), std::string(many)}) {
        const auto json = readADMDocumentAsJson(ref(path), path, {}, &error);
        ASSERT_TRUE(json) << error.description;
        ASSERT_TRUE(runs(folder, std::string("'" KTFILES_COMMAND "' adm --json '") + path + "' > printed"));
        const Bytes printed = readFile(folder / "printed");
        EXPECT_TRUE(textOf(printed) == "[\n" + *json + "\n]\n") << path;
    }
}

TEST_F(ADMFileDocument, IsReadOfTheChunkToo)
{
    const std::string text = enveloped(channelOf(0));
    const std::string wave = folder.write(
        "file.wav",
        ContainerBuilder("RIFF").format().chunk("axml", text + std::string(3, '\0')).chunk("data", 4).bytes());
    const auto document = readADMDocument(ref(wave), {}, &error);
    ASSERT_TRUE(document) << error.description;
    EXPECT_EQ(document->audioChannelFormats().size(), 1u);
    const auto source = ADMSource::open(ref(wave));
    ASSERT_TRUE(source);
    EXPECT_EQ(source->size(), std::ssize(text)) << "the NULs behind it are room";
    std::optional<Bytes> tracks;
    EXPECT_TRUE(source->readTrackChunk(tracks) && !tracks);
}

TEST_F(ADMFileDocument, SaysWhyThereIsNone)
{
    EXPECT_EQ(codeFor(folder.write("empty", "")), code(ADMFileError::unknownFile));
    EXPECT_EQ(codeFor(folder.write("text", "no document")), code(ADMFileError::otherFile));
    EXPECT_EQ(codeFor(folder.write("bare.wav", ContainerBuilder("RIFF").format().chunk("data", 4).bytes())),
              code(ADMFileError::noChunk));
    EXPECT_EQ(codeFor(folder.write("cut.wav", ContainerBuilder("RIFF").format().chunk("axml", "<a/>", 400).bytes())),
              code(ADMFileError::badChunk));
    EXPECT_EQ(
        codeFor(folder.write("broken.xml", enveloped("\n<audioObject audioObjectID='AO_1001' audioObjectName='N'>"))),
        code(ADMFileError::badDocument));
    EXPECT_EQ(*platform::find<std::int64_t>(error.userInfo, "line"), 3);
    EXPECT_EQ(*platform::find<std::string>(error.userInfo, "name"), ADMDiagnostic::kParseError);
    EXPECT_EQ(codeFor(folder / "missing"), 0);
    EXPECT_EQ(NSErrorToOSErr(&error), kStatusFileNotFound);
}
