// Each layout of metadata chunks on any bytes: what is read is written back to the byte, and what is edited is read as
// it was edited. The first byte is the letter of the layout, which mutations leave as it is; KTFILES_FUZZ_LAYOUT=LETTER
// in the environment has all of a run go to one of them.
#include "audiofile/metadata/AIFFInstrumentChunk.h"
#include "audiofile/metadata/AcidChunk.h"
#include "audiofile/metadata/AssociatedDataList.h"
#include "audiofile/metadata/BroadcastExtension.h"
#include "audiofile/metadata/CAFInstrumentChunk.h"
#include "audiofile/metadata/CAFMarkers.h"
#include "audiofile/metadata/CAFStringTable.h"
#include "audiofile/metadata/CAFTextPairs.h"
#include "audiofile/metadata/CartChunk.h"
#include "audiofile/metadata/CommentList.h"
#include "audiofile/metadata/CueList.h"
#include "audiofile/metadata/InfoList.h"
#include "audiofile/metadata/InstrumentChunk.h"
#include "audiofile/metadata/MarkerList.h"
#include "audiofile/metadata/PlaylistChunk.h"
#include "audiofile/metadata/SamplerChunk.h"

#include <algorithm>
#include <cstdlib>

namespace {

void require(bool condition)
{
    if (!condition)
        std::abort();
}

/// Writes what was read, and gives what comes of `edit` back as it is read again. Null: not of this layout.
template <class Chunk, std::endian... order>
std::optional<Chunk> edited(BytesView bytes, auto edit)
{
    auto chunk = Chunk::read(bytes, order...);
    if (!chunk)
        return std::nullopt;
    const auto written = [&] {
        if constexpr (requires { chunk->form(); })
            return chunk->write();
        else
            return chunk->write(order...);
    };
    require(std::ranges::equal(written(), bytes));
    edit(*chunk);
    const Bytes changed = written();
    auto again = Chunk::read(changed, order...);
    require(again.has_value());
    return again;
}

/// Of a field that is set nothing but its own bytes is another.
template <class Chunk, auto member, std::endian... order>
void setsField(BytesView bytes)
{
    const auto again = edited<Chunk, order...>(bytes, [](Chunk& chunk) { chunk.*member = 42; });
    if (!again)
        return;
    require((*again).*member == 42);
    auto back = *again;
    back.*member = (*Chunk::read(bytes, order...)).*member;
    require(std::ranges::equal(back.write(order...), bytes));
}

template <std::endian order>
void editBroadcast(BytesView bytes)
{
    const auto set = [](BroadcastExtension& bext) {
        bext.setTimeReference(0x123456789AB);
        require(bext.description.set("said") && !bext.originationDate.set("too long a date"));
        bext.loudnessValue = -2300;
    };
    const auto again = edited<BroadcastExtension, order>(bytes, set);
    if (!again)
        return;
    require(again->timeReference() == 0x123456789AB && again->description.text() == "said");
    auto expected = *BroadcastExtension::read(bytes, order);
    set(expected);
    require(*again == expected && again->codingHistoryLines() == expected.codingHistoryLines());
}

template <std::endian order>
void editCues(BytesView bytes)
{
    CuePoint added;
    added.id = 77;
    added.sampleOffset = 1000;
    const auto again = edited<CueList, order>(bytes, [&](CueList& list) {
        list.missingPoints = 0;
        list.points.insert(list.points.begin(), added);
    });
    require(!again || (!again->points.empty() && again->points.front() == added && again->find(77) != nullptr));
}

template <std::endian order>
void editSampler(BytesView bytes)
{
    const auto again = edited<SamplerChunk, order>(bytes, [](SamplerChunk& sampler) {
        sampler.missingLoops = 0;
        sampler.loops.emplace(sampler.loops.begin())->end = 99;
    });
    require(!again || (!again->loops.empty() && again->loops.front().end == 99U));
}

template <std::endian order>
void editInfo(BytesView bytes)
{
    const auto again = edited<InfoList, order>(bytes, [](InfoList& list) {
        list.set(fourCC("IART"), "somebody");
        list.set(fourCC("ZZZZ"), "");
        list.setAt(fourCC("IART"), 1, "another");
        list.setAt(fourCC("IKEY"), 0, "first");
    });
    if (!again)
        return;
    require(again->find(fourCC("IART")) == "somebody" && again->find(fourCC("ZZZZ")) == "");
    require(again->find(fourCC("IKEY")) == "first");
    const auto without = edited<InfoList, order>(again->write(), [](InfoList& list) {
        require(list.eraseAt(fourCC("IART"), 1) && list.erase(fourCC("IART")) && !list.erase(fourCC("IART")));
    });
    require(without && !without->find(fourCC("IART")) && without->items().size() + 2 == again->items().size());
}

template <std::endian order>
void editAssociatedData(BytesView bytes)
{
    const auto before = AssociatedDataList::read(bytes, order);
    const CueRange range{{.cueId = 7,
                          .sampleLength = 100,
                          .purpose = fourCC("rgn "),
                          .country = {},
                          .language = {},
                          .dialect = {},
                          .codePage = {}},
                         "text"};
    const auto again = edited<AssociatedDataList, order>(bytes, [&](AssociatedDataList& list) {
        list.setLabel(7, "name");
        list.setNote(7, "remark");
        list.setRange(range);
        list.addLabel(0xFFFF0007, "added");
    });
    if (!again)
        return;
    require(again->labelOf(7) == "name" && again->noteOf(7) == "remark");
    const auto ranges = again->ranges();
    require(std::ranges::find(ranges, range) != ranges.end() && ranges.size() <= before->ranges().size() + 1);
    const auto without = edited<AssociatedDataList, order>(again->write(), [](AssociatedDataList& list) {
        list.changeRanges([](CueRangeFields& fields) { fields.sampleLength = 5; });
        list.eraseCue(7);
    });
    require(without && !without->labelOf(7) && !without->noteOf(7));
    for (const CueRange& other : without->ranges())
        require(other.sampleLength == 5U && other.cueId != 7U);
}

void editMarkers(BytesView bytes)
{
    const AIFFMarker added{.id = 9, .position = 1000, .name = "added"};
    const auto again = edited<MarkerList>(bytes, [&](MarkerList& list) {
        list.missingMarkers = 0;
        list.behind.clear();
        list.namesArePadded = true;
        if (list.markers.size() < MarkerList::kMostMarkers)
            list.markers.insert(list.markers.begin(), added);
    });
    require(!again || again->markers.size() == MarkerList::kMostMarkers ||
            (again->markers.front().name == added.name && again->markers.front().position == added.position));
}

void editComments(BytesView bytes)
{
    const auto again = edited<CommentList>(bytes, [](CommentList& list) {
        list.missingComments = 0;
        if (list.comments.size() < CommentList::kMostComments)
            list.comments.insert(list.comments.begin(), {.timeStamp = 5, .marker = 1, .text = "odd"});
    });
    require(!again || again->comments.size() == CommentList::kMostComments || again->comments.front().text == "odd");
}

template <class List, auto items, auto missing>
void editCAFList(BytesView bytes)
{
    const auto before = List::read(bytes);
    const auto again = edited<List>(bytes, [](List& list) {
        list.*missing = 0;
        (list.*items).emplace((list.*items).begin());
    });
    require(!again || (again.value().*items).size() == ((*before).*items).size() + 1);
}

void readStrings(BytesView bytes)
{
    const auto table = edited<CAFStringTable>(bytes, [](CAFStringTable&) {});
    if (!table)
        return;
    for (const CAFStringEntry& entry : table->entries)
        table->textOf(entry);
}

void editTextPairs(BytesView bytes)
{
    // Counts that lie are mended: once written, pairs no longer change.
    const CAFTextPairs pairs(bytes);
    CAFTextPairs again(pairs.payload());
    require(again.pairs() == pairs.pairs());
    again.set("title", "said");
    const CAFTextPairs set(again.payload());
    require(set.find("title") != nullptr && *set.find("title") == "said");
    again.erase("title");
    require(CAFTextPairs(again.payload()).find("title") == nullptr);
}

constexpr auto little = std::endian::little, big = std::endian::big;

struct Layout {
    char letter; // that stays, since it stands in the seeds; a capital of the big-endian form
    void (*run)(BytesView bytes);
};
constexpr Layout kLayouts[] = {
    {'a', setsField<AcidChunk, &AcidChunk::rootNote, little>},
    {'A', setsField<AcidChunk, &AcidChunk::rootNote, big>},
    {'b', editBroadcast<little>},
    {'B', editBroadcast<big>},
    {'c', editCues<little>},
    {'C', editCues<big>},
    {'d', editAssociatedData<little>},
    {'D', editAssociatedData<big>},
    {'i', editInfo<little>},
    {'I', editInfo<big>},
    {'k', setsField<InstrumentChunk, &InstrumentChunk::lowNote>},
    {'p', editCAFList<PlaylistChunk, &PlaylistChunk::segments, &PlaylistChunk::missingSegments>},
    {'s', editSampler<little>},
    {'S', editSampler<big>},
    {'t', setsField<CartChunk, &CartChunk::levelReference, little>},
    {'T', setsField<CartChunk, &CartChunk::levelReference, big>},
    {'e', editComments},
    {'m', editMarkers},
    {'n', setsField<AIFFInstrumentChunk, &AIFFInstrumentChunk::gain>},
    {'f', editCAFList<CAFMarkerList, &CAFMarkerList::markers, &CAFMarkerList::missingMarkers>},
    {'g', editCAFList<CAFRegionList, &CAFRegionList::regions, &CAFRegionList::missingRegions>},
    {'h', setsField<CAFInstrumentChunk, &CAFInstrumentChunk::lowNote>},
    {'j', readStrings},
    {'l', editTextPairs},
};

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    if (size == 0)
        return 0;
    const auto* const layout = std::ranges::find(kLayouts, static_cast<char>(*data), &Layout::letter);
    if (layout != std::end(kLayouts))
        layout->run(std::as_bytes(std::span(data + 1, size - 1)));
    return 0;
}

/// The fuzzer's own; not there when seeds are replayed.
extern "C" __attribute__((weak)) std::size_t LLVMFuzzerMutate(std::uint8_t* data, std::size_t size, std::size_t most);

/// Mutates the chunk, not the letter ahead of it.
extern "C" std::size_t LLVMFuzzerCustomMutator(std::uint8_t* data, std::size_t size, std::size_t most, unsigned seed)
{
    static const char* const only = std::getenv("KTFILES_FUZZ_LAYOUT");
    if (most < 2)
        return size;
    if (only != nullptr && *only != 0)
        *data = static_cast<std::uint8_t>(*only);
    else if (size == 0)
        *data = static_cast<std::uint8_t>(kLayouts[seed % std::size(kLayouts)].letter);
    return 1 + LLVMFuzzerMutate(data + 1, std::max<std::size_t>(size, 1) - 1, most - 1);
}
