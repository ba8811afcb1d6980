#include "audiofile/metadata/CAFStringTable.h"

std::optional<CAFStringTable> CAFStringTable::read(BytesView body)
{
    ByteReader reader(body);
    const auto count = reader.read<std::uint32_t>();
    if (!reader.ok())
        return std::nullopt;
    CAFStringTable table;
    table.entries = takeRecords<CAFStringEntry>(reader, count, std::endian::big);
    table.missingEntries = count - static_cast<std::uint32_t>(table.entries.size());
    table.texts = takeRest(reader);
    return table;
}

Bytes CAFStringTable::write() const
{
    ByteWriter writer;
    writer.write(static_cast<std::uint32_t>(entries.size()) + missingEntries);
    for (const CAFStringEntry& entry : entries)
        putRecord(writer, entry, std::endian::big);
    writer.write(texts);
    return writer.take();
}

std::optional<std::string> CAFStringTable::textOf(const CAFStringEntry& entry) const
{
    const std::int64_t offset = entry.offset;
    if (offset < 0 || static_cast<std::uint64_t>(offset) >= texts.size())
        return std::nullopt;
    const std::string_view text = ::textOf(texts).substr(static_cast<std::size_t>(offset));
    return std::string(text.substr(0, text.find('\0')));
}

std::optional<std::string> CAFStringTable::find(std::uint32_t id) const
{
    const auto found = std::ranges::find_if(entries, [id](const CAFStringEntry& entry) { return entry.id == id; });
    return found == entries.end() ? std::nullopt : textOf(*found);
}
