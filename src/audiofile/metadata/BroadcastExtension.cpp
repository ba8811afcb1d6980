#include "audiofile/metadata/BroadcastExtension.h"

std::optional<BroadcastExtension> BroadcastExtension::read(BytesView body, std::endian order)
{
    ByteReader reader(body, order);
    const auto fields = takeRecord<BroadcastFields>(reader, order);
    if (!fields)
        return std::nullopt;
    return BroadcastExtension{*fields, takeRest(reader)};
}

Bytes BroadcastExtension::write(std::endian order) const
{
    ByteWriter writer(order);
    putRecord<BroadcastFields>(writer, *this, order);
    writer.write(codingHistory);
    return writer.take();
}

std::vector<std::string> BroadcastExtension::codingHistoryLines() const
{
    std::string_view text = textOf(codingHistory);
    text = text.substr(0, text.find('\0'));
    std::vector<std::string> lines;
    while (!text.empty()) {
        const std::size_t end = std::min(text.find_first_of("\r\n"), text.size());
        if (end != 0)
            lines.emplace_back(text.substr(0, end));
        text.remove_prefix(std::min(end + 1, text.size()));
    }
    return lines;
}
