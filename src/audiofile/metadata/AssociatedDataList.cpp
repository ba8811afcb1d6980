#include "audiofile/metadata/AssociatedDataList.h"

namespace {

constexpr FourCC kRange = fourCC("ltxt");

/// Whether the item is of the kind and speaks of the point.
auto speaksOf(FourCC id, std::uint32_t cueId, std::endian order)
{
    return [=](const ListItem& item) {
        return item.id == id && item.body.size() >= sizeof cueId &&
               load<std::uint32_t>(item.body.data(), order) == cueId;
    };
}

Bytes withText(ByteWriter fields, std::string_view text)
{
    fields.write(textAndNUL(text));
    return fields.take();
}

} // namespace

std::optional<AssociatedDataList> AssociatedDataList::read(BytesView body, std::endian order)
{
    AssociatedDataList list(order);
    return list.readItems(body) ? std::optional(std::move(list)) : std::nullopt;
}

std::vector<CueText> AssociatedDataList::texts(FourCC id) const
{
    std::vector<CueText> texts;
    for (const ListItem& item : items()) {
        ByteReader reader(item.body, order());
        const auto cueId = reader.read<std::uint32_t>();
        if (item.id == id && reader.ok())
            texts.push_back({cueId, textUpToNUL(reader.rest())});
    }
    return texts;
}

std::vector<CueRange> AssociatedDataList::ranges() const
{
    std::vector<CueRange> ranges;
    for (const ListItem& item : items()) {
        ByteReader reader(item.body, order());
        const auto fields = takeRecord<CueRangeFields>(reader, order());
        if (item.id == kRange && fields)
            ranges.push_back({*fields, textUpToNUL(reader.rest())});
    }
    return ranges;
}

std::optional<std::string> AssociatedDataList::textOf(FourCC id, std::uint32_t cueId) const
{
    const auto found = std::ranges::find_if(items(), speaksOf(id, cueId, order()));
    return found == items().end() ? std::nullopt
                                  : std::optional(textUpToNUL(BytesView(found->body).subspan(sizeof cueId)));
}

void AssociatedDataList::setText(FourCC id, std::uint32_t cueId, std::string_view text)
{
    ByteWriter writer(order());
    writer.write(cueId);
    put(id, cueId, withText(std::move(writer), text));
}

void AssociatedDataList::setRange(const CueRange& range)
{
    ByteWriter writer(order());
    putRecord<CueRangeFields>(writer, range, order());
    put(kRange, range.cueId, range.text.empty() ? writer.take() : withText(std::move(writer), range.text));
}

void AssociatedDataList::put(FourCC id, std::uint32_t cueId, Bytes body)
{
    const auto found = std::ranges::find_if(items(), speaksOf(id, cueId, order()));
    const auto index = static_cast<std::size_t>(found - items().begin());
    if (found == items().end())
        insert(index, id, std::move(body));
    else
        replaceBody(index, std::move(body));
}

void AssociatedDataList::eraseCue(std::uint32_t cueId)
{
    for (std::size_t index = items().size(); index-- > 0;)
        for (const FourCC id : {fourCC("labl"), fourCC("note"), kRange})
            if (speaksOf(id, cueId, order())(items()[index])) {
                erase(index);
                break;
            }
}
