// Metadata chunks byte by byte: the content of valid ones, the treatment of invalid ones, and that writing restores
// what was read.
#include "audiofile/metadata/AIFFInstrumentChunk.h"
#include "audiofile/metadata/AcidChunk.h"
#include "audiofile/metadata/AssociatedDataList.h"
#include "audiofile/metadata/BroadcastExtension.h"
#include "audiofile/metadata/CAFInstrumentChunk.h"
#include "audiofile/metadata/CAFMarkers.h"
#include "audiofile/metadata/CAFStringTable.h"
#include "audiofile/metadata/CartChunk.h"
#include "audiofile/metadata/CommentList.h"
#include "audiofile/metadata/CueList.h"
#include "audiofile/metadata/InfoList.h"
#include "audiofile/metadata/InstrumentChunk.h"
#include "audiofile/metadata/MarkerList.h"
#include "audiofile/metadata/PlaylistChunk.h"
#include "audiofile/metadata/SamplerChunk.h"
#include "support/Hex.h"

#include <gtest/gtest.h>

#include <functional>
#include <random>

using namespace std::string_view_literals;

namespace {

/// What a kind writes after reading; none if it reads nothing.
using Rewrite = std::optional<Bytes> (*)(BytesView);

template <class Chunk, std::endian... order>
std::optional<Bytes> rewritten(BytesView bytes)
{
    const auto chunk = Chunk::read(bytes, order...);
    if (!chunk)
        return std::nullopt;
    if constexpr (requires { chunk->form(); })
        return chunk->write();
    else
        return chunk->write(order...);
}

struct Kind {
    const char* name;
    Rewrite rewrite;
    std::size_t shortest; // of a body that is read
};

constexpr auto little = std::endian::little, big = std::endian::big;
constexpr Kind kKinds[] = {
    {"acid", rewritten<AcidChunk, little>, 24},
    {"acid of RIFX", rewritten<AcidChunk, big>, 24},
    {"smpl", rewritten<SamplerChunk, little>, 36},
    {"smpl of RIFX", rewritten<SamplerChunk, big>, 36},
    {"inst", rewritten<InstrumentChunk>, 7},
    {"INST", rewritten<AIFFInstrumentChunk>, 20},
    {"cue ", rewritten<CueList, little>, 4},
    {"cue  of RIFX", rewritten<CueList, big>, 4},
    {"plst", rewritten<PlaylistChunk, little>, 4},
    {"plst of RIFX", rewritten<PlaylistChunk, big>, 4},
    {"INFO", rewritten<InfoList, little>, 4},
    {"INFO of RIFX", rewritten<InfoList, big>, 4},
    {"adtl", rewritten<AssociatedDataList, little>, 4},
    {"MARK", rewritten<MarkerList>, 2},
    {"COMT", rewritten<CommentList>, 2},
    {"bext", rewritten<BroadcastExtension, little>, 602},
    {"bext of RIFX", rewritten<BroadcastExtension, big>, 602},
    {"cart", rewritten<CartChunk, little>, 2048},
    {"cart of RIFX", rewritten<CartChunk, big>, 2048},
    {"CAF mark", rewritten<CAFMarkerList>, 8},
    {"CAF regn", rewritten<CAFRegionList>, 8},
    {"CAF strg", rewritten<CAFStringTable>, 4},
    {"CAF inst", rewritten<CAFInstrumentChunk>, 28},
};

/// Bytes whose counts and sizes are often small and often nonsense, after the form of a list.
Bytes randomBody(std::mt19937& random, std::string_view form, std::size_t shortest)
{
    Bytes bytes(bytesOf(form).begin(), bytesOf(form).end());
    const std::size_t size = std::max(bytes.size(), shortest - std::min<std::size_t>(shortest, 20)) + random() % 120;
    while (bytes.size() < size)
        bytes.push_back(static_cast<std::byte>(random() % 3 == 0 ? random() : random() % 5));
    return bytes;
}

} // namespace

TEST(MetadataLayouts, AnyBytesAreReadWithoutHarmAndWrittenAsTheyWere)
{
    std::mt19937 random(20);
    for (const Kind& kind : kKinds)
        for (int round = 0; round < 1000; ++round) {
            const std::string_view name = kind.name;
            const bool isList = name.starts_with("INFO") || name == "adtl";
            const Bytes bytes = randomBody(random, isList ? name.substr(0, 4) : "", kind.shortest);
            const auto written = kind.rewrite(bytes);
            ASSERT_EQ(written.has_value(), bytes.size() >= kind.shortest) << kind.name << " " << toHex(bytes);
            ASSERT_EQ(toHex(written.value_or(bytes)), toHex(bytes)) << kind.name;
        }
    EXPECT_FALSE(InfoList::read(bytesOf("adtl")));
    EXPECT_FALSE(AssociatedDataList::read(bytesOf("INFO")));
}

TEST(MetadataLayouts, Acid)
{
    const Bytes bytes = fromHex("02000000 3c00 0080 00000000 08000000 0400 0300 0000f042 ff");
    const auto acid = AcidChunk::read(bytes);
    ASSERT_TRUE(acid);
    EXPECT_TRUE(acid->has(AcidChunk::kRootNoteSet));
    EXPECT_FALSE(acid->has(AcidChunk::kOneShot));
    EXPECT_EQ(acid->rootNote, 60);
    EXPECT_EQ(acid->unknown, 0x8000);
    EXPECT_EQ(acid->beats, 8u);
    EXPECT_EQ(acid->meterNumerator, 3);
    EXPECT_EQ(acid->meterDenominator, 4);
    EXPECT_EQ(acid->tempo, 120.0F);
    EXPECT_EQ(toHex(acid->behind), "ff");
    EXPECT_EQ(toHex(acid->write(big)), hex("00000002 003c 8000 00000000 00000008 0004 0003 42f00000 ff"));
}

TEST(MetadataLayouts, Sampler)
{
    const std::string fields = "01000000 02000000 07580000 40000000 00000080 1e000000 04030201";
    const std::string loop = "05000000 01000000 0a000000 0b000000 00000040 03000000";
    const auto sampler = SamplerChunk::read(fromHex(fields + "02000000 03000000" + loop + loop + "aabbcc dd"));
    ASSERT_TRUE(sampler);
    EXPECT_EQ(sampler->manufacturer, 1u);
    EXPECT_EQ(sampler->product, 2u);
    EXPECT_EQ(sampler->samplePeriod, 22535u);
    EXPECT_EQ(sampler->midiUnityNote, 64u);
    EXPECT_EQ(sampler->midiPitchFraction, 0x80000000u);
    EXPECT_EQ(sampler->smpteFormat, 30u);
    EXPECT_EQ(sampler->smpteOffset, 0x01020304u);
    ASSERT_EQ(sampler->loops.size(), 2u);
    EXPECT_EQ(sampler->loops[1].cueId, 5u);
    EXPECT_EQ(sampler->loops[1].type, SamplerLoop::kAlternating);
    EXPECT_EQ(sampler->loops[1].start, 10u);
    EXPECT_EQ(sampler->loops[1].end, 11u);
    EXPECT_EQ(sampler->loops[1].fraction, 0x40000000u);
    EXPECT_EQ(sampler->loops[1].playCount, 3u);
    EXPECT_EQ(toHex(sampler->samplerData), "aabbcc");
    EXPECT_EQ(toHex(sampler->behind), "dd");

    const auto cut = SamplerChunk::read(fromHex(fields + "ffffffff ffffffff" + loop + "aabbccdd"));
    ASSERT_TRUE(cut);
    EXPECT_EQ(cut->loops.size(), 1u);
    EXPECT_EQ(cut->missingLoops, 0xFFFFFFFEu);
    EXPECT_EQ(cut->missingSamplerData, 0xFFFFFFFFu);
    EXPECT_EQ(toHex(cut->behind), "aabbccdd");
}

TEST(MetadataLayouts, Instruments)
{
    const auto wave = InstrumentChunk::read(fromHex("3c ce c0 01 7f 02 7e"));
    ASSERT_TRUE(wave);
    EXPECT_EQ(wave->unshiftedNote, 60);
    EXPECT_EQ(wave->fineTune, -50);
    EXPECT_EQ(wave->gain, -64);
    EXPECT_EQ(wave->lowNote, 1);
    EXPECT_EQ(wave->highNote, 127);
    EXPECT_EQ(wave->lowVelocity, 2);
    EXPECT_EQ(wave->highVelocity, 126);

    const auto aiff = AIFFInstrumentChunk::read(fromHex("3c ce 01 7f 02 7e fffa 0001 0002 0003 0002 0004 0005"));
    ASSERT_TRUE(aiff);
    EXPECT_EQ(aiff->baseNote, 60);
    EXPECT_EQ(aiff->detune, -50);
    EXPECT_EQ(aiff->highNote, 127);
    EXPECT_EQ(aiff->highVelocity, 126);
    EXPECT_EQ(aiff->gain, -6);
    EXPECT_EQ(aiff->sustainLoop.mode, AIFFLoop::kForward);
    EXPECT_EQ(aiff->sustainLoop.beginMarker, 2);
    EXPECT_EQ(aiff->sustainLoop.endMarker, 3);
    EXPECT_EQ(aiff->releaseLoop.mode, AIFFLoop::kForwardBackward);
    EXPECT_EQ(aiff->releaseLoop.endMarker, 5);
}

TEST(MetadataLayouts, Cues)
{
    const auto cues = CueList::read(fromHex("02000000 07000000 01000000 64617461 02000000 03000000 04000000 aa"));
    ASSERT_TRUE(cues);
    ASSERT_EQ(cues->points.size(), 1u);
    EXPECT_EQ(cues->missingPoints, 1u);
    const CuePoint* const point = cues->find(7);
    ASSERT_TRUE(point);
    EXPECT_EQ(point->position, 1u);
    EXPECT_EQ(point->dataChunkId, fourCC("data"));
    EXPECT_EQ(point->chunkStart, 2u);
    EXPECT_EQ(point->blockStart, 3u);
    EXPECT_EQ(point->sampleOffset, 4u);
    EXPECT_EQ(cues->find(8), nullptr);
    CueList turned = *cues;
    turned.missingPoints = 0;
    EXPECT_EQ(toHex(turned.write(big)), hex("00000001 00000007 00000001 64617461 00000002 00000003 00000004 aa"));
}

TEST(MetadataLayouts, ListsOfEveryPadding)
{
    constexpr auto iart = fourCC("IART"), inam = fourCC("INAM");
    const std::string head = "494e464f", artist = "49415254 03000000 614200", title = "494e414d 02000000 6300";
    for (const auto& [bytes, artistRead, titleRead] :
         {std::tuple{head + artist + "00" + title, "aB", "c"},
          std::tuple{head + artist + "7f" + title, "aB", "c"},         // a pad byte that is not zero
          std::tuple{head + artist + title, "aB", "c"},                // none
          std::tuple{head + title + artist, "aB", "c"},                // none at the end
          std::tuple{head + title + "49415254 ffffffff 61", "a", "c"}, // cut
          std::tuple{head + title + artist + "00 aabbccddeeff11", "aB", "c"}}) {
        const auto list = InfoList::read(fromHex(bytes));
        ASSERT_TRUE(list);
        EXPECT_EQ(list->find(iart), artistRead) << bytes;
        EXPECT_EQ(list->find(inam), titleRead) << bytes;
        EXPECT_EQ(toHex(list->write()), hex(bytes));
    }

    // An edit changes only what it names; an item cut at the end becomes whole if another follows.
    auto list = InfoList::read(fromHex(head + title + title + "49415254 ff000000 61")).value();
    list.set(inam, "new");
    list.set(fourCC("ICMT"), "");
    EXPECT_EQ(toHex(list.write()),
              hex(head + "494e414d 04000000 6e657700 49415254 01000000 61 00 49434d54 01000000 00 00"));
    EXPECT_TRUE(list.erase(iart));
    EXPECT_FALSE(list.erase(iart));
    EXPECT_EQ(list.items().size(), 2u);
    EXPECT_EQ(InfoList::words(iart), "Artist");
    EXPECT_EQ(InfoList::words(fourCC("ZZZZ")), "");
}

TEST(MetadataLayouts, AssociatedData)
{
    const std::string bytes = "6164746c 6c61626c 07000000 01000000 414200 00 6e6f7465 06000000 01000000 4300"
                              "6c747874 16000000 02000000 e8030000 72676e20 0100 0200 0300 0400 5200"
                              "66696c65 02000000 aabb 6c61626c 02000000 0100";
    const auto list = AssociatedDataList::read(fromHex(bytes));
    ASSERT_TRUE(list);
    EXPECT_EQ(list->labels(), (std::vector<CueText>{{1, "AB"}}));
    EXPECT_EQ(list->noteOf(1), "C");
    EXPECT_EQ(list->labelOf(2), std::nullopt);
    ASSERT_EQ(list->ranges().size(), 1u);
    const CueRange range = list->ranges()[0];
    EXPECT_EQ(range.cueId, 2u);
    EXPECT_EQ(range.sampleLength, 1000u);
    EXPECT_EQ(range.purpose, fourCC("rgn "));
    EXPECT_EQ(range.country, 1);
    EXPECT_EQ(range.codePage, 4);
    EXPECT_EQ(range.text, "R");

    AssociatedDataList made;
    made.setLabel(1, "AB");
    made.setNote(1, "x");
    made.setNote(1, "C");
    made.setRange(range);
    EXPECT_EQ(toHex(made.write()), hex(bytes.substr(0, bytes.find("66696c65"))));
    made.eraseCue(1);
    EXPECT_EQ(made.items().size(), 1u);
    AssociatedDataList turned(big);
    turned.setLabel(1, "");
    EXPECT_EQ(toHex(turned.write()), hex("6164746c 6c61626c 00000005 00000001 00 00"));
    EXPECT_EQ(AssociatedDataList::read(turned.write(), big)->labelOf(1), "");
}

TEST(MetadataLayouts, MarkersOfEveryPadding)
{
    for (const auto& [bytes, isPadded, missing] :
         {std::tuple{"0002 0001 00000064 02 4142 00 0002 000000c8 01 43", true, 0},
          std::tuple{"0002 0001 00000064 02 4142 7f 0002 000000c8 01 43 ee", true, 0}, // a pad byte that is not zero
          std::tuple{"0002 0001 00000064 02 4142 0002 000000c8 01 43", false, 0},
          std::tuple{"0003 0001 00000064 02 4142 00 0002 000000c8 01 43 0003 0000", true, 1}}) {
        const auto list = MarkerList::read(fromHex(bytes));
        ASSERT_TRUE(list);
        EXPECT_EQ(list->namesArePadded, isPadded) << bytes;
        EXPECT_EQ(list->missingMarkers, missing) << bytes;
        ASSERT_EQ(list->markers.size(), 2u) << bytes;
        EXPECT_EQ(list->markers[0].name, "AB");
        const AIFFMarker* const second = list->find(2);
        ASSERT_TRUE(second);
        EXPECT_EQ(second->position, 200u);
        EXPECT_EQ(second->name, "C");
        EXPECT_EQ(list->find(9), nullptr);
        EXPECT_EQ(toHex(list->write()), hex(bytes));
    }
    MarkerList made;
    made.markers = {{1, 0, std::string(300, 'a')}};
    EXPECT_EQ(MarkerList::read(made.write())->markers[0].name, std::string(255, 'a'));
}

TEST(MetadataLayouts, BroadcastExtensionOfVersion2)
{
    Bytes bytes(602);
    const auto put = [&](std::size_t offset, BytesView what) {
        std::ranges::copy(what, bytes.begin() + static_cast<std::ptrdiff_t>(offset));
    };
    put(0, bytesOf(std::string(256, 'd'))); // no NUL behind it
    put(256, bytesOf("originator"));
    put(288, bytesOf("reference\0garbage"sv));
    put(320, bytesOf("2026-11-2210:44:00"));
    put(338, fromHex("01000000 02000000 0200"));
    put(348, fromHex("060a2b34"));
    put(412, fromHex("04f7 f401 9cff ff7f 00f8"));
    put(602 - 2, fromHex("0102"));
    for (const char c : "A=PCM,F=48000\r\n\r\nA=MPEG1L2\n\0x\r\n"sv)
        bytes.push_back(static_cast<std::byte>(c));
    auto bext = BroadcastExtension::read(bytes).value();
    EXPECT_EQ(bext.description.text(), std::string(256, 'd'));
    EXPECT_EQ(bext.originator.text(), "originator");
    EXPECT_EQ(bext.originatorReference.text(), "reference");
    EXPECT_EQ(bext.originationDate.text(), "2026-11-22");
    EXPECT_EQ(bext.originationTime.text(), "10:44:00");
    EXPECT_EQ(bext.timeReference(), 0x200000001u);
    EXPECT_TRUE(bext.hasUMID() && bext.hasLoudness());
    EXPECT_EQ(bext.loudnessValue, -2300);
    EXPECT_EQ(bext.loudnessRange, 500);
    EXPECT_EQ(bext.maxTruePeakLevel, -100);
    EXPECT_EQ(bext.maxMomentaryLoudness, BroadcastExtension::kNoLoudness);
    EXPECT_EQ(bext.maxShortTermLoudness, -2048);
    EXPECT_EQ(bext.codingHistoryLines(), (std::vector<std::string>{"A=PCM,F=48000", "A=MPEG1L2"}));

    // An edit writes only what it names.
    EXPECT_FALSE(bext.originator.set(std::string(33, 'x')));
    EXPECT_TRUE(bext.originator.set("somebody"));
    bext.setTimeReference(0x300000004u);
    put(256, bytesOf("somebody\0\0"sv));
    put(338, fromHex("04000000 03000000"));
    EXPECT_EQ(toHex(bext.write()), toHex(bytes));
}

TEST(MetadataLayouts, Comments)
{
    for (const auto& [bytes, missing] :
         {std::tuple{"0002 e7287000 0001 0003 414243 00 00000000 0000 0001 44 ff", 0},
          std::tuple{"0002 e7287000 0001 0003 414243 00 00000000 0000 0001 44", 0},
          std::tuple{"0009 e7287000 0001 0003 414243 00 00000000 0000 0001 44 00 e728", 7}}) {
        const auto list = CommentList::read(fromHex(bytes));
        ASSERT_TRUE(list && list->comments.size() == 2) << bytes;
        EXPECT_EQ(list->comments[0].timeStamp, 0xE7287000u);
        EXPECT_EQ(list->comments[0].marker, 1);
        EXPECT_EQ(list->comments[0].text, "ABC");
        EXPECT_EQ(list->comments[1].text, "D");
        EXPECT_EQ(list->missingComments, missing);
        EXPECT_EQ(toHex(list->write()), hex(bytes));
    }
}

TEST(MetadataLayouts, MarkersAndTextsOfCAF)
{
    const std::string marker = "72626567 4059000000000000 00000007 01020304 00000005 00000002";
    const auto marks = CAFMarkerList::read(fromHex("00000002 00000002" + marker + "ff"));
    ASSERT_TRUE(marks && marks->markers.size() == 1);
    EXPECT_EQ(marks->timecodeType, 2u);
    EXPECT_EQ(marks->missingMarkers, 1u);
    EXPECT_EQ(marks->markers[0].type, fourCC("rbeg"));
    EXPECT_EQ(marks->markers[0].framePosition, 100.0);
    EXPECT_EQ(marks->markers[0].id, 7u);
    EXPECT_EQ(marks->markers[0].timecode.frames, 4);
    EXPECT_EQ(marks->markers[0].timecode.subFrameSampleOffset, 5u);
    EXPECT_EQ(marks->markers[0].channel, 2u);

    const auto regions = CAFRegionList::read(
        fromHex("00000000 00000002 00000001 00000003 00000001" + marker + "00000002 00000000 00000002" + marker));
    ASSERT_TRUE(regions && regions->regions.size() == 2);
    EXPECT_EQ(regions->regions[0].flags, CAFRegion::kLoops | CAFRegion::kPlaysForward);
    EXPECT_EQ(regions->regions[1].markers.size(), 1u);
    EXPECT_EQ(regions->regions[1].missingMarkers, 1u);

    const auto texts = CAFStringTable::read(fromHex("00000003 00000007 0000000000000000 00000008 0000000000000003"
                                                    "00000009 7fffffffffffffff 416200 4300"));
    ASSERT_TRUE(texts);
    EXPECT_EQ(texts->find(7), "Ab");
    EXPECT_EQ(texts->find(8), "C");
    EXPECT_EQ(texts->find(9), std::nullopt);
    EXPECT_EQ(texts->find(10), std::nullopt);

    const auto instrument =
        CAFInstrumentChunk::read(fromHex("42700000 01 7f 02 7e c0c00000 00000001 00000002 ffffffff 00000004"));
    ASSERT_TRUE(instrument);
    EXPECT_EQ(instrument->baseNote, 60.0F);
    EXPECT_EQ(instrument->highVelocity, 126);
    EXPECT_EQ(instrument->gain, -6.0F);
    EXPECT_EQ(instrument->sustainRegion, 2u);
    EXPECT_EQ(instrument->instrumentId, 4u);
}
