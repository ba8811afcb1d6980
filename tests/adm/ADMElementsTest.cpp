#include "Documents.h"

#include <gtest/gtest.h>

#include <ctime>

using platform::XMLAttributes;

namespace {

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
    const std::pair<std::string_view, float> rows[] = {{"-30.000000", -30},
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
                                                       {"-", 0},
                                                       {"-1e999", -infinity},
                                                       {"1e-999", 0},
                                                       {"179.9000000", 179.9F},
                                                       {"123.456789", 123.456789F},
                                                       {"16777217", 16777217.0F},
                                                       {"0.1.2", 0.1F}};
    for (const auto& [text, value] : rows)
        EXPECT_EQ(gain(text), value) << text;
    for (std::int64_t i = 0; i < 20000; ++i) { // against the C library
        const std::string text = std::to_string(i * 7919 % 1000) + "." + std::to_string(i * 104729 % 1000003);
        ASSERT_EQ(gain(text), std::strtof(text.c_str(), nullptr)) << text;
    }
}

TEST(ADMElements, GainUnitIsResetByEveryGain)
{
    ADMAudioObject object({{"audioObjectID", "AO_1001"}, {"audioObjectName", "O"}});
    for (const auto& [unit, number] : {std::pair{"dB", 1}, {"", 0}, {"dB", 1}, {"db", 0}}) {
        object.setSubElement("gain", "-6", {{"gainUnit", unit}});
        EXPECT_EQ(object.gain(), -6);
        EXPECT_EQ(object.gainUnit(), number);
    }
}

TEST(ADMElements, ATrackFormatHasOneStreamFormat)
{
    ADMAudioTrackFormat track({{"audioTrackFormatID", "AT_00010001_01"}, {"audioTrackFormatName", "T"}});
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
    ADMAudioTrackUID uid({{"UID", "ATU_00000001"}}); // a later reference replaces an earlier one
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

/// Resolves nothing, and records announcements and questions.
struct Listener : ADMElementResolver {
    ADMElement* findADMElementRef(std::optional<std::string_view> id, std::optional<std::string_view> prefix) override
    {
        if (id)
            asked.push_back(std::string(*id) + " " + std::string(*prefix));
        return nullptr;
    }
    void expectADMElementRef(std::string_view id, std::string_view prefix) override
    {
        told.push_back(std::string(id) + " " + std::string(prefix));
    }
    std::vector<std::string> asked, told;
};

TEST(ADMElements, EveryReferenceIsAnnouncedOnceAndAskedForInOrder)
{
    ADMAudioObject object({{"audioObjectID", "AO_1001"}, {"audioObjectName", "O"}});
    ADMAudioTrackUID track({{"UID", "ATU_00000001"}});
    std::vector<std::string> ids, expected{"AP_00031001 AP"};
    for (int i = 0; i < 30; ++i)
        expected.push_back(ids.emplace_back("ATU_" + std::to_string(10000000 + i)) + " ATU");
    object.setAudioPackFormatIDRefs({"AP_00031001"});
    object.setAudioTrackUIDRefs(ids);
    track.setAudioPackFormatIDRef("AP_00031002");
    expected.push_back("AP_00031002 AP");
    Listener listener;
    for (ADMElement* element : std::initializer_list<ADMElement*>{&object, &track}) {
        element->announceIDRefsToResolver(listener);
        element->resolveIDRefsWithResolver(listener);
    }
    EXPECT_EQ(listener.asked, expected);
    EXPECT_EQ(listener.told, expected);
    EXPECT_EQ(object.audioTrackUIDs().size(), ids.size());
}

/// Resolves every reference to the same element.
struct Misleading : ADMDocument {
    Misleading() : ADMDocument(nullptr) {}
    ADMElement* findADMElementRef(std::optional<std::string_view>, std::optional<std::string_view>) override
    {
        return &found;
    }
    ADMAudioContent found{{{"audioContentID", "ACO_1001"}, {"audioContentName", "C"}}};
};

TEST(ADMElements, WhatADerivedDocumentFindsIsTakenForNoOtherClass)
{
    Misleading document;
    auto made = std::make_unique<ADMAudioObject>(
        platform::XMLAttributes{{"audioObjectID", "AO_1001"}, {"audioObjectName", "O"}});
    const ADMAudioObject& object = *made;
    made->setAudioPackFormatIDRefs({"AP_00031001"});
    document.addAudioObject(std::move(made));
    document.resolveIDRefs();
    ASSERT_EQ(object.audioPackFormats().size(), 1u);
    EXPECT_EQ(object.audioPackFormats()[0], nullptr);
}

/// Different IDs for different numbers, all with the same hash: the standard library's function inverted.
std::string collidingID(std::uint64_t number)
{
    const auto text = [](std::uint64_t word) { return std::string(reinterpret_cast<const char*>(&word), sizeof word); };
    constexpr std::uint64_t factor = 0xC6A4A7935BD1E995, inverse = 0x5F7A0EA7E59B19BD;
    const auto mixed = [](std::uint64_t word) { return word ^ word >> 47; };
    const std::uint64_t start = 0xC70F6907 ^ 16 * factor;
    const std::uint64_t afterFirst = (start ^ mixed(number * factor) * factor) * factor;
    return text(number) + text(mixed(afterFirst * inverse) * inverse);
}

/// Processor time of entering so many, each twice.
double timeOfEntering(ADMElementTable<ADMAudioObject>& table, std::uint64_t count, std::string (*idOf)(std::uint64_t))
{
    const std::clock_t start = std::clock();
    for (const bool again : {false, true})
        for (std::uint64_t i = 0; i < count; ++i)
            table.insert(idOf(i), std::make_unique<ADMAudioObject>(XMLAttributes(
                                      {{"audioObjectID", again ? "second" : "first"}, {"audioObjectName", "O"}})));
    return static_cast<double>(std::clock() - start);
}

TEST(ADMElementTable, IDsMadeToCollideCostNoMoreThanOthers)
{
    using Hash = std::hash<std::string>;
    ASSERT_EQ(Hash()(collidingID(1)), Hash()(collidingID(2))) << "the standard library has another function";
    constexpr std::uint64_t count = 50000; // a hundred times as long, were each compared with each
    ADMElementTable<ADMAudioObject> table, usual;
    const double took = timeOfEntering(table, count, collidingID);
    EXPECT_LT(took, 10 * timeOfEntering(usual, count, [](std::uint64_t i) { return "AO_" + std::to_string(i); }));
    EXPECT_EQ(table.size(), count);
    for (std::uint64_t i = 0; i < count; ++i)
        ASSERT_EQ(table.find(collidingID(i))->audioObjectID(), "second");
    EXPECT_EQ(table.find(collidingID(count)), nullptr);
}

} // namespace
