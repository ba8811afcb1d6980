#include "audiofile/metadata/InfoList.h"

#include <algorithm>
#include <array>
#include <utility>

namespace {

// Sorted by id. The first edition of the standard registers 23; the others have been in wide use since.
constexpr auto kWords = std::to_array<std::pair<FourCC, std::string_view>>({
    {fourCC("CODE"), "Encoded by"},
    {fourCC("DTIM"), "Date and time original"},
    {fourCC("GENR"), "Genre"},
    {fourCC("IARL"), "Archival location"},
    {fourCC("IART"), "Artist"},
    {fourCC("IAS1"), "First language"},
    {fourCC("IAS2"), "Second language"},
    {fourCC("IAS3"), "Third language"},
    {fourCC("IAS4"), "Fourth language"},
    {fourCC("IAS5"), "Fifth language"},
    {fourCC("IAS6"), "Sixth language"},
    {fourCC("IAS7"), "Seventh language"},
    {fourCC("IAS8"), "Eighth language"},
    {fourCC("IAS9"), "Ninth language"},
    {fourCC("IBPM"), "Beats per minute"},
    {fourCC("IBSU"), "Base URL"},
    {fourCC("ICAS"), "Default audio stream"},
    {fourCC("ICDS"), "Costume designer"},
    {fourCC("ICMS"), "Commissioned by"},
    {fourCC("ICMT"), "Comment"},
    {fourCC("ICNM"), "Cinematographer"},
    {fourCC("ICNT"), "Country"},
    {fourCC("ICOP"), "Copyright"},
    {fourCC("ICRD"), "Date created"},
    {fourCC("ICRP"), "Cropped"},
    {fourCC("IDIM"), "Dimensions"},
    {fourCC("IDIT"), "Date and time original"},
    {fourCC("IDPI"), "Dots per inch"},
    {fourCC("IDST"), "Distributed by"},
    {fourCC("IEDT"), "Edited by"},
    {fourCC("IENC"), "Encoded by"},
    {fourCC("IENG"), "Engineer"},
    {fourCC("IFRM"), "Number of parts"},
    {fourCC("IGNR"), "Genre"},
    {fourCC("IKEY"), "Keywords"},
    {fourCC("ILGT"), "Lightness"},
    {fourCC("ILGU"), "Logo URL"},
    {fourCC("ILIU"), "Logo icon URL"},
    {fourCC("ILNG"), "Language"},
    {fourCC("ILYC"), "Lyrics"},
    {fourCC("IMBI"), "More information banner image"},
    {fourCC("IMBU"), "More information banner URL"},
    {fourCC("IMED"), "Medium"},
    {fourCC("IMIT"), "More information text"},
    {fourCC("IMIU"), "More information URL"},
    {fourCC("IMUS"), "Music by"},
    {fourCC("INAM"), "Title"},
    {fourCC("IPDS"), "Production designer"},
    {fourCC("IPLT"), "Palette setting"},
    {fourCC("IPRD"), "Product"},
    {fourCC("IPRO"), "Produced by"},
    {fourCC("IPRT"), "Part"},
    {fourCC("IRIP"), "Ripped by"},
    {fourCC("IRTD"), "Rating"},
    {fourCC("ISBJ"), "Subject"},
    {fourCC("ISFT"), "Software"},
    {fourCC("ISGN"), "Secondary genre"},
    {fourCC("ISHP"), "Sharpness"},
    {fourCC("ISMP"), "Time code"},
    {fourCC("ISRC"), "Source"},
    {fourCC("ISRF"), "Source form"},
    {fourCC("ISTD"), "Production studio"},
    {fourCC("ISTR"), "Starring"},
    {fourCC("ITCH"), "Technician"},
    {fourCC("ITRK"), "Track number"},
    {fourCC("IWMU"), "Watermark URL"},
    {fourCC("IWRI"), "Written by"},
    {fourCC("LANG"), "Language"},
    {fourCC("LOCA"), "Location"},
    {fourCC("PRT1"), "Part"},
    {fourCC("PRT2"), "Number of parts"},
    {fourCC("RATE"), "Rate"},
    {fourCC("STAR"), "Starring"},
    {fourCC("TAPE"), "Tape name"},
    {fourCC("TCDO"), "End time code"},
    {fourCC("TCOD"), "Start time code"},
    {fourCC("TITL"), "Title"},
    {fourCC("TLEN"), "Length in milliseconds"},
    {fourCC("TORG"), "Organisation"},
    {fourCC("TRCK"), "Track number"},
    {fourCC("TURL"), "URL"},
    {fourCC("TVER"), "Version"},
    {fourCC("VMAJ"), "Vendor's major version"},
    {fourCC("VMIN"), "Vendor's minor version"},
    {fourCC("YEAR"), "Year"},
});
static_assert(std::ranges::is_sorted(kWords, std::ranges::less_equal(), [](const auto& row) { return row.first; }));

} // namespace

std::optional<InfoList> InfoList::read(BytesView body, std::endian order)
{
    InfoList list(order);
    return list.readItems(body) ? std::optional(std::move(list)) : std::nullopt;
}

std::optional<std::string> InfoList::find(FourCC id) const
{
    const auto found = std::ranges::find(items(), id, &ListItem::id);
    return found == items().end() ? std::nullopt : std::optional(textUpToNUL(found->body));
}

void InfoList::set(FourCC id, std::string_view text)
{
    const auto found = std::ranges::find(items(), id, &ListItem::id);
    const auto index = static_cast<std::size_t>(found - items().begin());
    if (found == items().end())
        return insert(index, id, textAndNUL(text));
    replaceBody(index, textAndNUL(text));
    for (std::size_t other = items().size() - 1; other > index; --other)
        if (items()[other].id == id)
            ListChunk::erase(other);
}

bool InfoList::erase(FourCC id)
{
    const std::size_t before = items().size();
    for (std::size_t index = before; index-- > 0;)
        if (items()[index].id == id)
            ListChunk::erase(index);
    return items().size() != before;
}

std::size_t InfoList::place(FourCC id, std::size_t index) const
{
    const auto found =
        std::ranges::find_if(items(), [&](const ListItem& item) { return item.id == id && index-- == 0; });
    return static_cast<std::size_t>(found - items().begin());
}

void InfoList::setAt(FourCC id, std::size_t index, std::string_view text)
{
    if (const std::size_t at = place(id, index); at == items().size())
        insert(at, id, textAndNUL(text));
    else
        replaceBody(at, textAndNUL(text));
}

bool InfoList::eraseAt(FourCC id, std::size_t index)
{
    const std::size_t at = place(id, index);
    if (at == items().size())
        return false;
    ListChunk::erase(at);
    return true;
}

std::vector<FourCC> InfoList::knownIds()
{
    std::vector<FourCC> ids;
    for (const auto& row : kWords)
        ids.push_back(row.first);
    return ids;
}

std::string_view InfoList::words(FourCC id)
{
    const auto row = std::ranges::lower_bound(kWords, id, {}, &std::pair<FourCC, std::string_view>::first);
    return row != kWords.end() && row->first == id ? row->second : std::string_view();
}
