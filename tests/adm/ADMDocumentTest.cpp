#include "Documents.h"
#include "adm/ADMAudioBlockFormat_DirectSpeaker.h"
#include "adm/ADMAudioBlockFormat_Object.h"
#include "platform/Log.h"
#include "platform/core/Status.h"

#include <gtest/gtest.h>

namespace {

TEST(ADMDocument, LinksOfAWholeDocument)
{
    const auto document = documentOf(wholeDocument());
    ASSERT_TRUE(document->parse());
    EXPECT_EQ(document->parseError(), nullptr);
    EXPECT_EQ(document->parser(), nullptr);
    const ADMAudioProgramme& programme = *document->audioProgrammes().begin();
    EXPECT_EQ(programme.documentPosition(), (platform::XMLPosition{4, 3}));
    ASSERT_EQ(programme.audioContents().size(), 2U);
    const ADMAudioObject& narrator = *programme.audioContents()[0]->audioObjects().at(0);
    const ADMAudioTrackUID& uid = *narrator.audioTrackUIDs().at(0);
    const ADMAudioStreamFormat& stream = *uid.audioTrackFormat()->audioStreamFormat();
    EXPECT_EQ(stream.audioTrackFormats().at(0), uid.audioTrackFormat());
    EXPECT_EQ(uid.audioChannelFormat(), nullptr);
    EXPECT_EQ(uid.audioPackFormat(), narrator.audioPackFormats().at(0));
    EXPECT_EQ(stream.audioChannelFormat(), uid.audioPackFormat()->audioChannelFormats().at(0));
    const ADMAudioObject& gulls = *programme.audioContents()[1]->audioObjects().at(1);
    const ADMAudioChannelFormat& moving = *gulls.audioTrackUIDs().at(0)->audioChannelFormat();
    ASSERT_EQ(moving.audioBlockFormat().size(), 8U);
    const auto& last = dynamic_cast<const ADMAudioBlockFormat_Object&>(*moving.audioBlockFormat()[7]);
    EXPECT_EQ(last.duration(), 50000);
    EXPECT_EQ(last.position(), (ADMPosition{false, 0, 0, 0, 45, 35, 0.65F}));
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
    const std::string whole = wholeDocument(), body = whole.substr(whole.find("<ebuCoreMain"));
    const auto document = documentOf("<envelope>" + body + body + "</envelope>");
    ASSERT_TRUE(document->parse());
    EXPECT_EQ(document->audioObjects().size(), 4U);
    const ADMAudioObject& narrator = *document->audioObjects().begin();
    EXPECT_EQ(narrator.audioObjectID(), "AO_1001");
    EXPECT_GT(narrator.documentPosition().line, 110U); // the second one
    EXPECT_EQ(document->audioChannelFormats().find("AC_00031002")->audioBlockFormat().size(), 8U);
    EXPECT_EQ(document->audioContents().begin()->audioObjects().at(0), &narrator);
}

// Elements that a failed parse left open do not become part of the next one.
TEST(ADMDocument, ASecondParseStartsAnew)
{
    const auto parse = [](ADMDocument& document, const std::string& text) {
        const BytesView bytes = bytesOf(text);
        platform::MemoryInputStream stream(Bytes(bytes.begin(), bytes.end()));
        return document.parseStream(stream);
    };
    const std::string object = named("audioObject", "AO_1001", "", "<gain>0.5</gain>");
    for (const std::string& broken : {enveloped("<audioContent audioContentID='ACO_1001' audioContentName='c'>"),
                                      enveloped(named("audioContent", "ACO_1001", "", "<dialogue>1<x>")),
                                      enveloped(channel("<audioBlockFormat audioBlockFormatID='AB_00020001_00000001'>"
                                                        "<gain>"))}) {
        ADMDocument document(nullptr);
        document.setOptions({.skipUnsupportedBlocks = true});
        EXPECT_FALSE(parse(document, broken.substr(0, broken.find("</audioFormatExtended>"))));
        EXPECT_NE(document.parseError(), nullptr);
        ASSERT_TRUE(parse(document, enveloped("<stray>text</stray>" + object)));
        EXPECT_EQ(document.parseError(), nullptr);
        EXPECT_TRUE(document.currentElements().empty());
        EXPECT_TRUE(document.currentGenericElements().empty());
        ASSERT_EQ(document.audioObjects().size(), 1U);
        EXPECT_EQ(document.audioObjects().begin()->gain(), 0.5F);
        EXPECT_TRUE(document.audioContents().empty());
    }
}

TEST(ADMDocument, LookingUpWithoutAPrefixFindsNothing)
{
    const auto document = documentOf(enveloped(named("audioObject", "AO_1001")));
    ASSERT_TRUE(document->parse());
    EXPECT_EQ(document->findADMElementRef("AO_1001", ""), nullptr);
    EXPECT_EQ(document->findADMElementRef(std::nullopt, "AO"), nullptr);
    EXPECT_EQ(document->findADMElementRef("AO_1001"), &*document->audioObjects().begin());
    EXPECT_EQ(raised([&] { document->findADMElementRef("AO_1001", "AC"); }),
              "MissingDefinition: 'AO_1001' referenced, but not defined");
}

TEST(ADMDocument, OffsetsOfAnObjectByTheirCoordinates)
{
    std::string offsets;
    int value = 0;
    for (const char* coordinate : {"azimuth", "elevation", "distance", "X", "Y", "Z", "W"})
        offsets += "<positionOffset coordinate='" + std::string(coordinate) + "'>" + std::to_string(++value) +
                   "</positionOffset>";
    const auto document = documentOf(enveloped(named("audioObject", "AO_1001", "", offsets)));
    ASSERT_TRUE(document->parse());
    const ADMAudioObject& object = *document->audioObjects().begin();
    EXPECT_EQ(object.polarOffset(), (ADMPolarOffset{1, 2, 3}));
    EXPECT_EQ(object.cartesianOffset(), (ADMCartesianOffset{4, 5, 6}));
}

TEST(ADMDocument, SubElementsAreFlattened)
{
    // An inner sub-element goes to the ADM element before the outer one does; nested elements still count.
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
    EXPECT_TRUE(document->audioContents().find("ACO_1002")->audioObjectIDRefs().empty()); // another name by its prefix
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
    const std::string speaker = "AB_00010001_00000001";
    const std::pair<std::string, std::string> rows[] = {
        {named("audioProgramme", "ACO_1001"), "WrongIDPrefix: prefix 'ACO' is not a valid prefix for audioProgramme"},
        {named("audioContent", "apr_1001"), "WrongIDPrefix: prefix 'APR' is not a valid prefix for audioContent"},
        {"<audioTrackUID UID='AO_1001'/>", "WrongIDPrefix: prefix 'AO' is not a valid prefix for audioTrackUID"},
        {channel(block("AC_00030001")), "WrongIDPrefix: prefix 'AC' is not a valid prefix for audioBlockFormat"},
        {"<audioTrackUID UID='ATU_1'/>", "MalformedIDString: malformed identifier ATU_1"},
        {channel(block("AB_00030001")), "MalformedIDString: unsupported prefix in ID AB_00030001"},
        {named("audioObject", ""), "MalformedDefinition: Required attribute 'audioObjectID' not found"},
        {"<audioObject audioObjectID='AO_1'/>", "MalformedDefinition: Required attribute 'audioObjectName' not found"},
        {channel(block("")), "MalformedDefinition: Required attribute 'audioBlockFormatID' not found"},
        {named("audioPackFormat", "AP_1"), "MalformedDefinition: unsupported type for node AP_1"},
        {named("audioStreamFormat", "AS_7", "formatLabel='0002'"),
         "UnsupportedDefinition: unsupported data format 0002 found in AS_7"},
        {named("audioStreamFormat", "AS_7", "formatDefinition='AAC'"),
         "UnsupportedDefinition: unsupported data format FFFF found in AS_7"},
        {channel(block("AB_00020001_00000001")), "UnsupportedDefinition: type '2' not supported for audioBlockFormat"},
        {channel(block("AB_10010001_00000001")),
         "UnsupportedDefinition: type '4097' not supported for audioBlockFormat"},
        {named("audioProgramme", "APR_1001", "", "<audioContentIDRef>ACO_1</audioContentIDRef>"),
         "MissingDefinition: 'ACO_1' referenced, but not defined"},
        {named("audioProgramme", "APR_1001", "", "<audioContentIDRef/>"),
         "MissingDefinition: '' referenced, but not defined"},
        {block(speaker), "MalformedDefinition: audioBlockFormat '" + speaker + "' is not within an audioChannelFormat"},
        {named("audioObject", "AO_1", "", block(speaker)),
         "MalformedDefinition: audioBlockFormat '" + speaker + "' is not within an audioChannelFormat"},
    };
    for (const auto& [elements, problem] : rows) {
        const auto document = documentOf(enveloped(elements));
        EXPECT_EQ(raised([&] { document->parse(); }), problem);
        EXPECT_EQ(document->parser(), nullptr);
        EXPECT_EQ(document->parseError(), nullptr);
    }
}

TEST(ADMDocument, CutAtEveryByte)
{
    // Complete elements are kept, nothing leaks, and only the whole document counts as whole.
    const std::string whole = wholeDocument();
    const std::string_view text = std::string_view(whole).substr(0, whole.rfind('>') + 1);
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
    EXPECT_EQ(most, 4U);
}

class Lenient : public testing::Test {
protected:
    /// Parses, and records problems as "line:column kind ID: text".
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
    EXPECT_EQ(blocks[0]->gain(), 1); // nothing of the omitted block was assigned elsewhere
    EXPECT_EQ(blocks[0]->rtime(), 50);
    EXPECT_EQ(blocks[0]->exactRtime(), 500000);
    EXPECT_EQ(blocks[0]->exactDuration(), 1250000);
}

TEST_F(Lenient, AHandlerAloneChangesNothing)
{
    for (const auto& [options, problems] :
         {std::pair{ADMDocumentOptions(), 1U}, {{.skipUnsupportedBlocks = true, .silentTrack = true}, 2U}}) {
        told.clear();
        EXPECT_TRUE(told.empty() && raised([&, &options = options] {
                                        parse(kProblems, options);
                                    }).find("Definition: ") != std::string::npos);
        EXPECT_EQ(told.size(), problems);
    }
    EXPECT_EQ(document->audioChannelFormats().begin()->audioBlockFormat()[0]->exactRtime(), 50);
}

TEST_F(Lenient, ProblemsHaveTheirPlaces)
{
    const std::string id = "AB_00030001_00000001", skipped = "AB_00040001_00000001",
                      noAzimuth = " MalformedDefinition " + id + ": audioBlockFormat '" + id +
                                  "' is missing azimuth and/or elevation polar coordinate";
    const std::pair<std::string, std::vector<std::string>> rows[] = {
        {"<a>\n <b></a>", {"2:9 ParseError : Opening and ending tag mismatch: b line 2 and a"}},
        {"<a>\n\n  <audioTrackUID\n   UID='ATU_1'/></a>", {"3:3 MalformedIDString ATU_1: malformed identifier ATU_1"}},
        {channel("\n" + block(id, "\n <position>1</position>")),
         {"3:2 MalformedDefinition " + id + ": cartesian audioBlockFormat position is missing coordinate attribute"}},
        {channel("\n  " + block(id, "\n")), {"2:3" + noAzimuth}},
        {channel("\n " + block(id, "\n  " + block(skipped))), // a block that is left out, within another
         {"3:3 UnsupportedDefinition " + skipped + ": type '4' not supported for audioBlockFormat", "2:2" + noAzimuth}},
    };
    for (const auto& [text, expected] : rows) {
        told.clear();
        raised([&, &text = text] { parse(text, {.skipUnsupportedBlocks = true}); });
        EXPECT_EQ(told, expected);
    }
}

TEST_F(Lenient, OnlyATrackIsSilent)
{
    EXPECT_EQ(raised([&] {
                  parse(named("audioContent", "ACO_1001", "", "<audioObjectIDRef>ATU_00000000</audioObjectIDRef>"),
                        {.silentTrack = true});
              }),
              "MissingDefinition: 'ATU_00000000' referenced, but not defined");
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
