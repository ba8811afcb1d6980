#include "audiofile/metadata/ListChunk.h"

#include "platform/core/ByteReader.h"
#include "platform/core/ByteWriter.h"

#include <algorithm>

namespace {

constexpr std::size_t kItemHeaderSize = 8;

bool isIdCharacter(std::byte byte)
{
    const auto c = std::to_integer<unsigned char>(byte);
    return (c >= '0' && c <= '9') || (c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z') || c == ' ';
}

/// Whether an item begins where a pad byte should stand: some writers omit that byte.
bool beginsAnItem(BytesView bytes, std::endian order)
{
    return bytes.size() >= kItemHeaderSize && std::ranges::all_of(bytes.first(4), isIdCharacter) &&
           load<std::uint32_t>(bytes.data() + 4, order) <= bytes.size() - kItemHeaderSize;
}

} // namespace

bool ListChunk::readItems(BytesView body)
{
    ByteReader reader(body, order_);
    if (reader.remaining() < sizeof(FourCC) || reader.readFourCC() != form_)
        return false;
    while (reader.remaining() >= kItemHeaderSize) {
        ListItem& item = items_.emplace_back();
        item.id = reader.readFourCC();
        const auto size = reader.read<std::uint32_t>();
        const BytesView there = reader.take(std::min<std::size_t>(size, reader.remaining()));
        item.body.assign(there.begin(), there.end());
        item.missing = size - static_cast<std::uint32_t>(there.size());
        if (there.size() % 2 == 0 || item.missing != 0)
            continue;
        item.isPadded = reader.remaining() != 0 && !beginsAnItem(reader.rest(), order_);
        if (item.isPadded)
            item.pad = reader.take(1)[0];
    }
    const BytesView behind = reader.rest();
    behind_.assign(behind.begin(), behind.end());
    return true;
}

Bytes ListChunk::write() const
{
    ByteWriter writer(order_);
    writer.writeFourCC(form_);
    for (const ListItem& item : items_) {
        writer.writeFourCC(item.id);
        writer.write(static_cast<std::uint32_t>(item.body.size()) + item.missing);
        writer.write(item.body);
        if (item.body.size() % 2 != 0 && item.isPadded && item.missing == 0)
            writer.write(BytesView(&item.pad, 1));
    }
    writer.write(behind_);
    return writer.take();
}

void ListChunk::replaceBody(std::size_t index, Bytes body)
{
    items_[index] = {.id = items_[index].id, .body = std::move(body)};
    settlePadding();
}

void ListChunk::insert(std::size_t index, FourCC id, Bytes body)
{
    // An item that ended with the list no longer does.
    if (index != 0 && index == items_.size())
        items_.back().missing = 0;
    items_.insert(items_.begin() + static_cast<std::ptrdiff_t>(index), {.id = id, .body = std::move(body)});
    settlePadding();
}

void ListChunk::erase(std::size_t index)
{
    items_.erase(items_.begin() + static_cast<std::ptrdiff_t>(index));
    settlePadding();
}

// Gives every item a pad byte of its own. Reading inferred a missing one from the item that follows, which an edit may
// change.
void ListChunk::settlePadding()
{
    for (ListItem& item : items_) {
        item.isPadded = true;
        if (isIdCharacter(item.pad))
            item.pad = std::byte{0};
    }
}

std::string textUpToNUL(BytesView text)
{
    const std::string_view characters = textOf(text);
    return std::string(characters.substr(0, characters.find('\0')));
}

Bytes textAndNUL(std::string_view text)
{
    const BytesView characters = bytesOf(text);
    Bytes bytes(characters.begin(), characters.end());
    bytes.push_back(std::byte{0});
    return bytes;
}
