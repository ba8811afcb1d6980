#include "audiofile/metadata/AssociatedDataList.h"

namespace {

constexpr FourCC kRange = fourCC("ltxt"), kFile = fourCC("file");

/// The cue point that an item describes; none for items of other kinds and for one that ends before its id.
std::optional<std::uint32_t> cueIdOf(const ListItem& item, std::endian order)
{
    const bool speaks = item.id == fourCC("labl") || item.id == fourCC("note") || item.id == kRange || item.id == kFile;
    return speaks && item.body.size() >= sizeof(std::uint32_t)
               ? std::optional(load<std::uint32_t>(item.body.data(), order))
               : std::nullopt;
}

/// Whether the item is of this kind and describes this cue point.
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

Bytes cueText(std::uint32_t cueId, std::string_view text, std::endian order)
{
    ByteWriter writer(order);
    writer.write(cueId);
    return withText(std::move(writer), text);
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
    put(id, cueId, cueText(cueId, text, order()));
}

void AssociatedDataList::addText(FourCC id, std::uint32_t cueId, std::string_view text)
{
    insert(items().size(), id, cueText(cueId, text, order()));
}

void AssociatedDataList::changeRanges(const std::function<void(CueRangeFields& fields)>& change)
{
    for (std::size_t index = 0; index < items().size(); ++index) {
        const ListItem& item = items()[index];
        ByteReader reader(item.body, order());
        auto fields = takeRecord<CueRangeFields>(reader, order());
        if (item.id != kRange || !fields)
            continue;
        change(*fields);
        ByteWriter writer(order());
        putRecord(writer, *fields, order());
        writer.write(reader.rest());
        if (const Bytes body = writer.take(); body != item.body)
            replaceBody(index, body);
    }
}

void AssociatedDataList::renameCue(std::uint32_t from, std::uint32_t to)
{
    for (std::size_t index = 0; index < items().size(); ++index)
        if (cueIdOf(items()[index], order()) == from) {
            Bytes body = items()[index].body;
            store(body.data(), to, order());
            replaceBody(index, std::move(body));
        }
}

std::set<std::uint32_t> AssociatedDataList::cueIds() const
{
    std::set<std::uint32_t> ids;
    for (const ListItem& item : items())
        if (const auto cueId = cueIdOf(item, order()))
            ids.insert(*cueId);
    return ids;
}

void AssociatedDataList::eraseCues(const std::function<bool(std::uint32_t cueId)>& isGone)
{
    eraseIf([&](const ListItem& item) {
        const auto cueId = cueIdOf(item, order());
        return cueId && item.id != kFile && isGone(*cueId);
    });
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

bool AssociatedDataList::eraseFirst(FourCC id, std::uint32_t cueId)
{
    const auto found = std::ranges::find_if(items(), speaksOf(id, cueId, order()));
    if (found == items().end())
        return false;
    erase(static_cast<std::size_t>(found - items().begin()));
    return true;
}

void AssociatedDataList::eraseCue(std::uint32_t cueId)
{
    eraseCues([cueId](std::uint32_t each) { return each == cueId; });
}
