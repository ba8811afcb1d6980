// Each layout of metadata chunks on any bytes: what is read is written back to the byte, and edited lists are read as
// they were edited. The first byte says which layout.
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

#include <cstdlib>

namespace {

void require(bool condition)
{
    if (!condition)
        std::abort();
}

template <class Chunk, std::endian... order>
void isWrittenAsRead(BytesView bytes)
{
    const auto chunk = Chunk::read(bytes, order...);
    if (!chunk)
        return;
    if constexpr (requires { chunk->form(); })
        require(std::ranges::equal(chunk->write(), bytes));
    else
        require(std::ranges::equal(chunk->write(order...), bytes));
}

void editInfo(BytesView bytes)
{
    auto list = InfoList::read(bytes);
    if (!list)
        return;
    list->set(fourCC("IART"), "somebody");
    list->set(fourCC("ZZZZ"), "");
    const auto again = InfoList::read(list->write());
    require(again && again->find(fourCC("IART")) == "somebody" && again->find(fourCC("ZZZZ")) == "");
    list->erase(fourCC("IART"));
    require(!InfoList::read(list->write())->find(fourCC("IART")));
}

void editAssociatedData(BytesView bytes)
{
    auto list = AssociatedDataList::read(bytes);
    if (!list)
        return;
    list->setLabel(7, "name");
    list->setRange({{.cueId = 7,
                     .sampleLength = 100,
                     .purpose = fourCC("rgn "),
                     .country = {},
                     .language = {},
                     .dialect = {},
                     .codePage = {}},
                    "text"});
    const auto again = AssociatedDataList::read(list->write());
    require(again && again->labelOf(7) == "name" && again->ranges() == list->ranges());
    require(again->labels().size() >= 1 && again->notes() == list->notes());
    list->eraseCue(7);
    require(!list->labelOf(7) && !list->noteOf(7));
}

void readTexts(BytesView bytes)
{
    if (const auto table = CAFStringTable::read(bytes))
        for (const CAFStringEntry& entry : table->entries)
            table->textOf(entry);
    if (const auto bext = BroadcastExtension::read(bytes))
        bext->codingHistoryLines();
    // Counts that lie are mended: once written, pairs no longer change.
    const CAFTextPairs pairs(bytes);
    require(CAFTextPairs(pairs.payload()).pairs() == pairs.pairs());
}

constexpr auto little = std::endian::little, big = std::endian::big;
constexpr void (*kLayouts[])(BytesView) = {
    isWrittenAsRead<AcidChunk, little>,
    isWrittenAsRead<AcidChunk, big>,
    isWrittenAsRead<SamplerChunk, little>,
    isWrittenAsRead<SamplerChunk, big>,
    isWrittenAsRead<InstrumentChunk>,
    isWrittenAsRead<AIFFInstrumentChunk>,
    isWrittenAsRead<CueList, little>,
    isWrittenAsRead<CueList, big>,
    isWrittenAsRead<PlaylistChunk, little>,
    isWrittenAsRead<PlaylistChunk, big>,
    isWrittenAsRead<InfoList, little>,
    isWrittenAsRead<InfoList, big>,
    isWrittenAsRead<AssociatedDataList, little>,
    isWrittenAsRead<AssociatedDataList, big>,
    isWrittenAsRead<MarkerList>,
    isWrittenAsRead<CommentList>,
    isWrittenAsRead<BroadcastExtension, little>,
    isWrittenAsRead<CartChunk, little>,
    isWrittenAsRead<CAFMarkerList>,
    isWrittenAsRead<CAFRegionList>,
    isWrittenAsRead<CAFStringTable>,
    isWrittenAsRead<CAFInstrumentChunk>,
    editInfo,
    editAssociatedData,
    readTexts,
};

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    if (size != 0)
        kLayouts[*data % std::size(kLayouts)](std::as_bytes(std::span(data + 1, size - 1)));
    return 0;
}
