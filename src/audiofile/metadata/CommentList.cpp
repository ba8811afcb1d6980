#include "audiofile/metadata/CommentList.h"

#include "platform/core/ByteReader.h"
#include "platform/core/ByteWriter.h"

#include <algorithm>

namespace {

constexpr std::size_t kLongestText = 65535;

} // namespace

std::optional<CommentList> CommentList::read(BytesView body)
{
    ByteReader reader(body);
    const auto count = reader.read<std::uint16_t>();
    if (!reader.ok())
        return std::nullopt;
    CommentList list;
    BytesView behind = reader.rest();
    while (list.comments.size() < count && list.lastIsPadded) {
        AIFFComment comment;
        comment.timeStamp = reader.read<std::uint32_t>();
        comment.marker = reader.read<std::int16_t>();
        const BytesView text = reader.take(reader.read<std::uint16_t>());
        comment.text = textOf(text);
        if (!reader.ok())
            break;
        list.lastIsPadded = text.size() % 2 == 0 || reader.remaining() != 0;
        if (text.size() % 2 != 0 && list.lastIsPadded)
            comment.pad = reader.take(1)[0];
        list.comments.push_back(std::move(comment));
        behind = reader.rest();
    }
    list.missingComments = static_cast<std::uint16_t>(count - list.comments.size());
    list.behind.assign(behind.begin(), behind.end());
    return list;
}

Bytes CommentList::write() const
{
    const std::size_t count = std::min(comments.size(), kMostComments);
    ByteWriter writer;
    writer.write(static_cast<std::uint16_t>(std::min<std::size_t>(count + missingComments, kMostComments)));
    for (std::size_t i = 0; i < count; ++i) {
        const AIFFComment& comment = comments[i];
        const std::string_view text = std::string_view(comment.text).substr(0, kLongestText);
        writer.write(comment.timeStamp);
        writer.write(comment.marker);
        writer.write(static_cast<std::uint16_t>(text.size()));
        writer.write(bytesOf(text));
        if (text.size() % 2 != 0 && (lastIsPadded || i + 1 != count))
            writer.write(static_cast<std::uint8_t>(comment.pad));
    }
    writer.write(behind);
    return writer.take();
}
