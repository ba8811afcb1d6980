#include "Documents.h"
#include "adm/ADMAudioBlockFormat_DirectSpeaker.h"
#include "adm/ADMAudioBlockFormat_Object.h"
#include "platform/Log.h"
#include "platform/core/Status.h"

#include <gtest/gtest.h>

namespace {

TEST(ADMDocument, AWholeDocument)
{
    const auto document = documentOf(kWholeDocument);
    ASSERT_TRUE(document->parse());
    EXPECT_EQ(document->parseError(), nullptr);
    EXPECT_EQ(document->parser(), nullptr);
    const ADMAudioProgramme& programme = *document->audioProgrammes().begin();
    EXPECT_EQ(programme.start(), 1000000);
    EXPECT_EQ(programme.maxDuckingDepth(), -12);
    EXPECT_EQ(programme.audioProgrammeLabels(), (ADMLabels{{"de", "Nachrichten"}}));
    EXPECT_EQ(programme.documentPosition(), (platform::XMLPosition{4, 3}));
    const ADMAudioContent& content = *programme.audioContents().at(0);
    EXPECT_EQ(content.audioContentName(), "C & D");
    EXPECT_EQ(content.mixedContentKind(), 3);
    const ADMAudioObject& bed = *content.audioObjects().at(0);
    EXPECT_TRUE(bed.disallowDucking());
    const ADMAudioObject& circle = *bed.audioObjects().at(0);
    EXPECT_EQ(circle.audioObjects().at(0), &circle);
    const ADMAudioTrackUID& uid = *bed.audioTrackUIDs().at(0);
    EXPECT_EQ(uid.audioTrackFormat()->audioStreamFormat()->audioChannelFormat()->audioChannelFormatID(), "AC_00011001");
    EXPECT_EQ(uid.audioTrackFormat()->audioStreamFormat()->audioTrackFormats().at(0), uid.audioTrackFormat());
    EXPECT_EQ(uid.audioChannelFormat(), nullptr);
    const ADMAudioChannelFormat& fly = *uid.audioPackFormat()->audioChannelFormats().at(1);
    ASSERT_EQ(fly.audioBlockFormat().size(), 2U);
    const auto& polar = dynamic_cast<const ADMAudioBlockFormat_Object&>(*fly.audioBlockFormat()[0]);
    EXPECT_EQ(polar.duration(), 500000);
    EXPECT_EQ(polar.position(), (ADMPosition{false, 0, 0, 0, 30, -1.5, 1}));
    const auto& cartesian = dynamic_cast<const ADMAudioBlockFormat_Object&>(*fly.audioBlockFormat()[1]);
    EXPECT_EQ(cartesian.audioBlockFormatID(), "AB_00031001_0000000a");
    EXPECT_EQ(cartesian.rtime(), 50);
    EXPECT_EQ(cartesian.exactRtime(), 50); // without the option
    EXPECT_EQ(cartesian.gainUnit(), 1);
}

TEST(ADMDocument, NoDataIsNoDocument)
{
    static std::string logged;
    const platform::LogHandler before = platform::setLogHandler([](const char* line) { logged = line; });
    EXPECT_EQ(ADMDocument::initWithADMData(std::nullopt), nullptr);
    platform::setLogHandler(before);
    EXPECT_EQ(logged, "ImportADM: nil data pointer passed to ADMDocument");
    const auto empty = ADMDocument::initWithADMData(Bytes());
    EXPECT_FALSE(empty->parse());
    EXPECT_NE(empty->parseError(), nullptr);
    EXPECT_FALSE(ADMDocument(nullptr).parse());
}

TEST(ADMDocument, EveryElementTwiceIsReplaced)
{
    std::string body(kWholeDocument.substr(kWholeDocument.find("<ebuCoreMain")));
    const auto document = documentOf("<envelope>" + body + body + "</envelope>");
    ASSERT_TRUE(document->parse());
    EXPECT_EQ(document->audioObjects().size(), 2U);
    EXPECT_EQ(document->audioObjects().begin()->audioObjectID(), "AO_1001");
    EXPECT_GT(document->audioObjects().begin()->documentPosition().line, 50U); // the second one
    EXPECT_EQ(document->audioChannelFormats().find("AC_00031001")->audioBlockFormat().size(), 2U);
    const ADMAudioContent& content = *document->audioContents().begin();
    EXPECT_EQ(content.audioObjects().at(0), document->audioObjects().find("AO_1001"));
}

TEST(ADMDocument, SubElementsAreFlattened)
{
    // An inner sub-element is given to the ADM element before the outer one; elements within others still count.
    const auto document = documentOf(enveloped(
        R"(<position coordinate="X">stray</position>
        <audioProgramme audioProgrammeID="APR_1001" audioProgrammeName="P">dropped
          <audioContentIDRef>ACO_<audioContentIDRef>ACO_1002</audioContentIDRef>1001</audioContentIDRef>
          <wrapper><audioContent audioContentID="ACO_1001" audioContentName="1"/></wrapper>
          <audioContent audioContentID="ACO_1002" audioContentName="2"><x:audioObjectIDRef>AO_9</x:audioObjectIDRef></audioContent>
          <AudioContentIDRef>ACO_1003</AudioContentIDRef>
        </audioProgramme>)"));
    ASSERT_TRUE(document->parse());
    const ADMAudioProgramme& programme = *document->audioProgrammes().begin();
    EXPECT_EQ(programme.audioContentIDs(), (std::vector<std::string>{"ACO_1002", "ACO_1001"}));
    EXPECT_EQ(programme.audioContents().at(0)->audioContentName(), "2");
    EXPECT_TRUE(document->audioContents().find("ACO_1002")->audioObjectIDRefs().empty()); // a prefix makes another name
}

TEST(ADMDocument, ShapesOfText)
{
    const auto document =
        documentOf("\xEF\xBB\xBF" +
                   enveloped("<!-- <audioObject> --><?p i?>\r\n"
                             "<audioObject audioObjectID=\"AO_&#x31;001\"\r\n audioObjectName=\"&lt;&#10;&quot;>\">"
                             "<gain>0.<![CDATA[5]]></gain><mute>&#49;</mute>\r\n"
                             "<audioObjectLabel language='fr'>\xC3\xA9 &amp; \r\n</audioObjectLabel>"
                             "</audioObject>"));
    ASSERT_TRUE(document->parse());
    const ADMAudioObject& object = *document->audioObjects().find("AO_1001");
    EXPECT_EQ(object.audioObjectName(), "<\n\">");
    EXPECT_EQ(object.gain(), 0.5);
    EXPECT_TRUE(object.mute());
    EXPECT_EQ(object.audioObjectLabels().at("fr"), "\xC3\xA9 & \n");
}

TEST(ADMDocument, ProblemsLeaveTheParseByName)
{
    const struct {
        const char* elements;
        const char* problem;
    } rows[] = {
        {R"(<audioProgramme audioProgrammeID="ACO_1001" audioProgrammeName="P"/>)",
         "WrongIDPrefix: prefix 'ACO' is not a valid prefix for audioProgramme"},
        {R"(<audioObject audioObjectID="AO_1001"/>)",
         "MalformedDefinition: Required attribute 'audioObjectName' not found"},
        {R"(<audioProgramme audioProgrammeID="APR_1001" audioProgrammeName="P"><audioContentIDRef>ACO_1</audioContentIDRef></audioProgramme>)",
         "MissingDefinition: 'ACO_1' referenced, but not defined"},
        {R"(<audioProgramme audioProgrammeID="APR_1001" audioProgrammeName="P"><audioContentIDRef/></audioProgramme>)",
         "MissingDefinition: '' referenced, but not defined"},
        {R"(<audioBlockFormat audioBlockFormatID="AB_00010001_00000001"/>)",
         "MalformedDefinition: audioBlockFormat 'AB_00010001_00000001' is not within an audioChannelFormat"},
        {R"(<audioObject audioObjectID="AO_1" audioObjectName="O"><audioBlockFormat audioBlockFormatID="AB_00010001_00000001"/></audioObject>)",
         "MalformedDefinition: audioBlockFormat 'AB_00010001_00000001' is not within an audioChannelFormat"},
        {R"(<audioChannelFormat audioChannelFormatID="AC_1" audioChannelFormatName="C" typeLabel="3"><audioBlockFormat audioBlockFormatID="AB_00030001_00000001"/></audioChannelFormat>)",
         "MalformedDefinition: audioBlockFormat 'AB_00030001_00000001' is missing azimuth and/or elevation polar "
         "coordinate"},
    };
    for (const auto& row : rows) {
        const auto document = documentOf(enveloped(row.elements));
        EXPECT_EQ(raised([&] { document->parse(); }), row.problem);
        EXPECT_EQ(document->parser(), nullptr);
        EXPECT_EQ(document->parseError(), nullptr);
    }
}

TEST(ADMDocument, FindingElements)
{
    const auto document = documentOf(
        enveloped(R"(<audioPackFormat audioPackFormatID="AP_00010002" audioPackFormatName="P" typeLabel="1"/>)"));
    ASSERT_TRUE(document->parse());
    EXPECT_EQ(document->findADMElementRef("AP_00010002"), document->audioPackFormats().find("AP_00010002"));
    EXPECT_EQ(document->findADMElementRef(std::nullopt), nullptr);
    EXPECT_EQ(document->findADMElementRef("AP_00010002", ""), nullptr);
    const struct {
        const char* id;
        std::optional<std::string_view> prefix;
        const char* problem;
    } rows[] = {
        {"ap_00010002", {}, "MissingDefinition: 'ap_00010002' referenced, but not defined"},
        {"AP_00010002", "AC", "MissingDefinition: 'AP_00010002' referenced, but not defined"},
        {"AB_00010002_00000001", {}, "MissingDefinition: 'AB_00010002_00000001' referenced, but not defined"},
        {"AVS_0001_0001", {}, "MissingDefinition: 'AVS_0001_0001' referenced, but not defined"},
        {"nothing", {}, "MalformedIDString: unsupported prefix in ID nothing"},
        {"nothing", "AO", "MissingDefinition: 'nothing' referenced, but not defined"},
    };
    for (const auto& row : rows)
        EXPECT_EQ(raised([&] { document->findADMElementRef(row.id, row.prefix); }), row.problem);
}

TEST(ADMDocument, CutAtEveryByte)
{
    // Elements that were complete stay, nothing leaks, and nothing but the whole document is taken for whole.
    const std::string_view text = kWholeDocument.substr(0, kWholeDocument.rfind('>') + 1);
    std::size_t most = 0;
    for (std::size_t size = 0; size < text.size(); ++size) {
        const auto document = documentOf(text.substr(0, size));
        ASSERT_FALSE(document->parse()) << size;
        ASSERT_NE(document->parseError(), nullptr) << size;
        ASSERT_GE(document->audioObjects().size(), most) << size;
        most = document->audioObjects().size();
        for (const ADMAudioContent& content : document->audioContents())
            ASSERT_TRUE(content.audioObjects().empty()) << size; // nothing is resolved
    }
    EXPECT_EQ(most, 2U);
}

class Lenient : public testing::Test {
protected:
    /// Parses, and keeps what was told as "line:column kind ID: text".
    bool parse(std::string_view text, const ADMDocumentOptions& options)
    {
        document = documentOf(text);
        document->setOptions(options);
        document->setDiagnosticsHandler([this](const ADMDiagnostic& each) {
            told.push_back(std::to_string(each.position.line) + ":" + std::to_string(each.position.column) + " " +
                           each.kind + " " + each.elementID + ": " + each.text);
        });
        return document->parse();
    }
    std::unique_ptr<ADMDocument> document;
    std::vector<std::string> told;
};

constexpr std::string_view kProblems = R"(<all>
  <audioObject audioObjectID="AO_1001"
      audioObjectName="O"><audioTrackUIDRef>ATU_00000000</audioTrackUIDRef>
    <audioTrackUIDRef>ATU_00000009</audioTrackUIDRef><audioTrackUIDRef>ATU_00000001</audioTrackUIDRef>
  </audioObject>
  <audioTrackUID UID="ATU_00000001"/>
  <audioChannelFormat audioChannelFormatID="AC_00041001" audioChannelFormatName="H" typeLabel="0004">
 &#233;&amp; <audioBlockFormat audioBlockFormatID="AB_00041001_00000001"><order>1</order><audioObject/><gain>2</gain></audioBlockFormat>
    <audioBlockFormat audioBlockFormatID="AB_00011001_00000002" rtime="00:00:00.5" duration="00:00:01.25"/>
  </audioChannelFormat>
</all>)";

TEST_F(Lenient, EverythingLetPassIsTold)
{
    ASSERT_TRUE(parse(kProblems, {true, true, true, true}));
    EXPECT_EQ(told, (std::vector<std::string>{
                        "8:14 UnsupportedDefinition AB_00041001_00000001: type '4' not supported for audioBlockFormat",
                        "2:3 MissingDefinition AO_1001: 'ATU_00000009' referenced, but not defined"}));
    const auto& uids = document->audioObjects().find("AO_1001")->audioTrackUIDs();
    EXPECT_EQ(uids,
              (std::vector<ADMAudioTrackUID*>{nullptr, nullptr, document->audioTrackUIDs().find("ATU_00000001")}));
    const auto& blocks = document->audioChannelFormats().begin()->audioBlockFormat();
    ASSERT_EQ(blocks.size(), 1U);
    EXPECT_EQ(blocks[0]->gain(), 1); // nothing of the block that was left out went elsewhere
    EXPECT_EQ(blocks[0]->rtime(), 50);
    EXPECT_EQ(blocks[0]->exactRtime(), 500000);
    EXPECT_EQ(blocks[0]->exactDuration(), 1250000);
}

TEST_F(Lenient, AHandlerAloneChangesNothing)
{
    EXPECT_EQ(raised([&] { parse(kProblems, {}); }),
              "UnsupportedDefinition: type '4' not supported for audioBlockFormat");
    EXPECT_EQ(told.size(), 1U);
    told.clear();
    EXPECT_EQ(raised([&] { parse(kProblems, {.skipUnsupportedBlocks = true, .silentTrack = true}); }),
              "MissingDefinition: 'ATU_00000009' referenced, but not defined");
    EXPECT_EQ(told.size(), 2U);
}

TEST_F(Lenient, ProblemsHaveTheirPlaces)
{
    const struct {
        const char* text;
        const char* told;
    } rows[] = {
        {"<a>\n <b></a>", "2:9 ParseError : Opening and ending tag mismatch: b line 2 and a"},
        {"<a>\n\n  <audioTrackUID\n   UID='ATU_1'/></a>", "3:3 MalformedIDString ATU_1: malformed identifier ATU_1"},
        {"<audioChannelFormat audioChannelFormatID='AC_1' audioChannelFormatName='C' typeLabel='3'>\n"
         "<audioBlockFormat audioBlockFormatID='AB_00030001_00000001'>\n <position>1</position></audioBlockFormat>"
         "</audioChannelFormat>",
         "3:2 MalformedDefinition AB_00030001_00000001: cartesian audioBlockFormat position is missing coordinate "
         "attribute"},
        {"<audioChannelFormat audioChannelFormatID='AC_1' audioChannelFormatName='C' typeLabel='3'>\n"
         "  <audioBlockFormat audioBlockFormatID='AB_00030001_00000001'>\n</audioBlockFormat></audioChannelFormat>",
         "2:3 MalformedDefinition AB_00030001_00000001: audioBlockFormat 'AB_00030001_00000001' is missing azimuth "
         "and/or "
         "elevation polar coordinate"},
    };
    for (const auto& row : rows) {
        told.clear();
        raised([&] { parse(row.text, {}); });
        EXPECT_EQ(told, std::vector<std::string>{row.told});
    }
}

TEST_F(Lenient, ProgressCanCancel)
{
    const std::string text = enveloped("<audioTrackUID UID=\"ATU_00000001\"/>" + std::string(300000, ' '));
    std::vector<std::uint64_t> progress;
    for (const bool goOn : {true, false}) {
        document = documentOf(text);
        document->setProgressHandler([&](std::uint64_t bytes) {
            progress.push_back(bytes);
            return goOn || bytes < 100000;
        });
        EXPECT_EQ(document->parse(), goOn);
        EXPECT_EQ(document->audioTrackUIDs().size(), 1U);
    }
    ASSERT_EQ(progress.size(), 7U);
    EXPECT_EQ(progress[4], text.size());
    EXPECT_EQ(platform::kXMLErrorDomain == document->parseError()->domain, false);
    EXPECT_EQ(document->parseError()->code, kStatusUserCancelled);
}

} // namespace
