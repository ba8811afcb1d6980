#include "Documents.h"

#include <gtest/gtest.h>

#include <functional>

using platform::XMLAttributes;

namespace {

ADMAudioTrackFormat trackFormat()
{
    return ADMAudioTrackFormat({{"audioTrackFormatID", "AT_00010001_01"}, {"audioTrackFormatName", "T"}});
}

TEST(ADMElements, DefaultsOfWhatIsNotGiven)
{
    const ADMAudioProgramme programme({{"audioProgrammeID", "APR_100F"}, {"audioProgrammeName", "P"}, {"start", ""}});
    EXPECT_EQ(programme.index(), 0x100FU);
    EXPECT_EQ(programme.start(), 0);
    EXPECT_EQ(programme.end(), kADMInvalidTime);
    EXPECT_EQ(programme.maxDuckingDepth(), 0);
    EXPECT_FALSE(programme.audioProgrammeLanguage());

    const ADMAudioContent content({{"audioContentID", "ACO_1001"}, {"audioContentName", "C"}});
    EXPECT_EQ(content.dialogueMode(), 2);
    EXPECT_EQ(content.dialogueContentKind(), 0);

    const ADMAudioObject object({{"audioObjectID", "no ID at all"}, {"audioObjectName", "O"}});
    EXPECT_EQ(object.start(), 0);
    EXPECT_EQ(object.duration(), kADMInvalidTime);
    EXPECT_EQ(object.dialogueMode(), 2);
    EXPECT_EQ(object.importance(), 10);
    EXPECT_FALSE(object.interact() || object.disallowDucking() || object.headLocked() || object.mute());
    EXPECT_EQ(object.gain(), 1);
    EXPECT_EQ(object.gainUnit(), 0);
    EXPECT_EQ(object.polarOffset(), ADMPolarOffset());

    const ADMAudioTrackUID uid({{"UID", "atu_0000000a"}});
    EXPECT_EQ(uid.index(), 10U);
    EXPECT_EQ(uid.sampleRate(), 0);
    EXPECT_FALSE(uid.audioTrackFormatIDRef() || uid.audioTrackFormat() != nullptr);
}

TEST(ADMElements, NumbersAndFlagsOfAttributes)
{
    const auto object = [](std::string_view name, std::string_view value) {
        return ADMAudioObject({{"audioObjectID", "AO_1001"}, {"audioObjectName", "O"}, {name, value}});
    };
    EXPECT_EQ(object("importance", " -7x").importance(), -7);
    EXPECT_EQ(object("importance", "many").importance(), 0);
    EXPECT_EQ(object("importance", "99999999999999999999").importance(), std::numeric_limits<std::int64_t>::max());
    EXPECT_TRUE(object("disableDucking", "1").disallowDucking());
    EXPECT_FALSE(object("disallowDucking", "1").disallowDucking());
    for (const char* yes : {"yes", "Y", "true", "T", "1", "9x"})
        EXPECT_TRUE(object("interact", yes).interact()) << yes;
    for (const char* no : {"0", "no", "false", " 1", "01", "-1"})
        EXPECT_FALSE(object("interact", no).interact()) << no;
    EXPECT_EQ(ADMAudioProgramme(
                  {{"audioProgrammeID", "APR_1001"}, {"audioProgrammeName", "P"}, {"maxDuckingDepth", "-5000000000"}})
                  .maxDuckingDepth(),
              std::numeric_limits<std::int32_t>::min());
}

TEST(ADMElements, FloatsReadAlikeByEitherRoad)
{
    ADMAudioObject object({{"audioObjectID", "AO_1001"}, {"audioObjectName", "O"}});
    const auto gain = [&](std::string_view text) {
        object.addSubElement_gain(text, {});
        return object.gain();
    };
    const float infinity = std::numeric_limits<float>::infinity();
    const struct {
        std::string_view text;
        float value;
    } rows[] = {
        {"-30.000000", -30},
        {"0.707107", 0.707107F},
        {" +1.5e-3 x", 0.0015F},
        {".5", 0.5F},
        {"5.", 5},
        {"", 0},
        {"loud", 0},
        {"-inf", 0},
        {"nan", 0},
        {"0x10", 0},
        {"--1", 0},
        {"1e50", infinity},
        {"-1e999", -infinity},
        {"1e-999", 0},
        {"-", 0},
        {"179.9000000", 179.9F},
        {"123.456789", 123.456789F},
        {"16777217", 16777217.0F},
        {"0.1.2", 0.1F},
    };
    for (const auto& row : rows)
        EXPECT_EQ(gain(row.text), row.value) << row.text;
    for (std::int64_t i = 0; i < 20000; ++i) { // against the C library
        const std::string text = std::to_string(i * 7919 % 1000) + "." + std::to_string(i * 104729 % 1000003);
        ASSERT_EQ(gain(text), std::strtof(text.c_str(), nullptr)) << text;
    }
}

TEST(ADMElements, WhatIsRaised)
{
    const struct {
        std::function<void()> make;
        const char* problem;
    } rows[] = {
        {[] {
             ADMAudioProgramme({{"audioProgrammeID", "ACO_1001"}, {"audioProgrammeName", "P"}});
         },
         "WrongIDPrefix: prefix 'ACO' is not a valid prefix for audioProgramme"},
        {[] {
             ADMAudioContent({{"audioContentID", "apr_1001"}, {"audioContentName", "C"}});
         },
         "WrongIDPrefix: prefix 'APR' is not a valid prefix for audioContent"},
        {[] {
             ADMAudioTrackUID({{"UID", "AO_1001"}});
         },
         "WrongIDPrefix: prefix 'AO' is not a valid prefix for audioTrackUID"},
        {[] {
             ADMAudioTrackUID({{"UID", "ATU_1"}});
         },
         "MalformedIDString: malformed identifier ATU_1"},
        {[] {
             ADMAudioObject({{"audioObjectID", ""}, {"audioObjectName", "O"}});
         },
         "MalformedDefinition: Required attribute 'audioObjectID' not found"},
        {[] {
             ADMAudioPackFormat({{"audioPackFormatID", "AP_1"}, {"audioPackFormatName", "P"}});
         },
         "MalformedDefinition: unsupported type for node AP_1"},
        {[] {
             ADMAudioStreamFormat(
                 {{"audioStreamFormatID", "AS_7"}, {"audioStreamFormatName", "S"}, {"formatLabel", "0002"}});
         },
         "UnsupportedDefinition: unsupported data format 0002 found in AS_7"},
        {[] {
             ADMAudioStreamFormat(
                 {{"audioStreamFormatID", "AS_7"}, {"audioStreamFormatName", "S"}, {"formatDefinition", "AAC"}});
         },
         "UnsupportedDefinition: unsupported data format FFFF found in AS_7"},
    };
    for (const auto& row : rows)
        EXPECT_EQ(raised(row.make), row.problem);
}

TEST(ADMElements, GainUnitIsResetByEveryGain)
{
    ADMAudioObject object({{"audioObjectID", "AO_1001"}, {"audioObjectName", "O"}});
    object.setSubElement("gain", "-6", {{"gainUnit", "dB"}});
    EXPECT_EQ(object.gain(), -6);
    EXPECT_EQ(object.gainUnit(), 1);
    object.setSubElement("gain", "0.5", {});
    EXPECT_EQ(object.gainUnit(), 0);
    object.setSubElement("gain", "0.5", {{"gainUnit", "db"}});
    EXPECT_EQ(object.gainUnit(), 0);
}

TEST(ADMElements, OffsetsLabelsAndDialogue)
{
    ADMAudioObject object({{"audioObjectID", "AO_1001"}, {"audioObjectName", "O"}});
    object.setSubElement("positionOffset", "1.5", {{"coordinate", "elevation"}});
    object.setSubElement("positionOffset", "-2", {{"coordinate", "Z"}});
    object.setSubElement("positionOffset", "3", {{"coordinate", "x"}});
    object.setSubElement("positionOffset", "4", {});
    EXPECT_EQ(object.polarOffset(), (ADMPolarOffset{0, 1.5, 0}));
    EXPECT_EQ(object.cartesianOffset(), (ADMCartesianOffset{0, 0, -2}));
    object.setSubElement("audioObjectLabel", "one", {{"language", "en"}});
    object.setSubElement("audioObjectLabel", "none", {{"language", ""}});
    object.setSubElement("audioObjectLabel", "two", {{"language", "en"}});
    EXPECT_EQ(object.audioObjectLabels(), (ADMLabels{{"en", "two"}}));

    ADMAudioContent content({{"audioContentID", "ACO_1001"}, {"audioContentName", "C"}});
    content.setSubElement("dialogue", "1", {{"dialogueContentKind", "5"}, {"mixedContentKind", "x"}});
    EXPECT_EQ(content.dialogueMode(), 1);
    EXPECT_EQ(content.dialogueContentKind(), 5);
    content.setSubElement("dialogue", "", {});
    EXPECT_EQ(content.dialogueMode(), 0);
    EXPECT_EQ(content.dialogueContentKind(), 0);
    content.setSubElement("Dialogue", "1", {}); // names are exact
    EXPECT_EQ(content.dialogueMode(), 0);
}

TEST(ADMElements, ATrackFormatHasOneStreamFormat)
{
    ADMAudioTrackFormat track = trackFormat();
    track.setSubElement("audioStreamFormatIDRef", "AS_1", {});
    track.setSubElement("audioStreamFormatIDRef", "AS_1", {});
    try {
        track.setSubElement("audioStreamFormatIDRef", "AS_2", {});
        ADD_FAILURE();
    } catch (const ADMException& problem) {
        EXPECT_EQ(problem.name(), kADMExceptionMalformedDefinition);
        EXPECT_EQ(problem.reason(), "only one audioStreamFormatIDRef expected");
        EXPECT_EQ(problem.userInfo(), (platform::Dictionary{{"audioTrackFormat", "AT_00010001_01"}}));
    }
    ADMAudioTrackUID uid({{"UID", "ATU_00000001"}}); // where a later reference replaces the earlier one
    uid.setSubElement("audioTrackFormatIDRef", "AT_1", {});
    uid.setSubElement("audioTrackFormatIDRef", "AT_2", {});
    EXPECT_EQ(uid.audioTrackFormatIDRef(), "AT_2");
}

TEST(ADMElements, DescriptionsNameTheirParts)
{
    ADMAudioPackFormat pack({{"audioPackFormatID", "AP_1"}, {"audioPackFormatName", "N"}, {"typeLabel", "1001"}});
    ADMAudioPackFormat inner({{"audioPackFormatID", "AP_2"}, {"audioPackFormatName", "N"}, {"typeLabel", "1"}});
    pack.setAudioPackFormats({&inner, nullptr, &pack});
    const auto withoutAddress = [](std::string text) {
        const std::size_t at = text.find("0x");
        return text.erase(at, text.find(',') - at);
    };
    EXPECT_EQ(withoutAddress(pack.description()),
              "<AudioPackFormat: , ID: AP_1, Name: N, Type: Custom_1001, importance = 10, absoluteDistance = 0.000000\n"
              "audioChannelFormats=(), audioPackFormats=(AP_2, (null), AP_1)>");
    EXPECT_EQ(withoutAddress(ADMAudioTrackUID({{"UID", "ATU_00000001"}, {"bitDepth", "24"}}).description()),
              "<ADMAudioTrackUID: , ID: ATU_00000001, sampleRate: 0, bitDepth: 24,\n audioTrackFormat: (null),\n "
              "audioChannelFormat: (null),\n audioPackFormat: (null)>");
    EXPECT_EQ(
        withoutAddress(ADMAudioObject({{"audioObjectID", "AO_1"}, {"audioObjectName", "N"}, {"duration", "0:0:1.0"}})
                           .description()),
        "<AudioObject: , ID: AO_1, Name: N, start: 00:00:00.00000, duration: 00:00:01.00000, gain = 1, headLocked = "
        "NO, mute = NO\naudioPackFormats=(), audioObjects=(), audioTrackUIDs=()>");
}

TEST(ADMElementTable, ManyIDsOfAnyLength)
{
    ADMElementTable<ADMAudioObject> table;
    const auto name = [](int i) { return std::string(static_cast<std::size_t>(i % 40), 'x') + std::to_string(i); };
    const auto object = [](const std::string& id) {
        return std::make_unique<ADMAudioObject>(XMLAttributes({{"audioObjectID", id}, {"audioObjectName", id}}));
    };
    for (int i = 0; i < 3000; ++i)
        table.insert(name(i), object(name(i)));
    const ADMAudioObject* first = table.find(name(7));
    for (const int again : {7, 39}) // a short ID and a long one
        table.insert(name(again), object("another"));
    EXPECT_EQ(table.size(), 3000U);
    EXPECT_EQ(first->audioObjectID(), name(7)); // others may link to it
    int i = 0;
    for (const ADMAudioObject& each : table) {
        EXPECT_EQ(each.audioObjectID(), i == 7 || i == 39 ? "another" : name(i));
        EXPECT_EQ(table.find(name(i)), &each);
        ++i;
    }
    EXPECT_EQ(table.find("x"), nullptr);
    EXPECT_EQ(table.find(std::string(100, 'x')), nullptr);
}

} // namespace
