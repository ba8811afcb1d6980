#include "support/ContainerBuilder.h"

#include <algorithm>
#include <cstring>

ContainerBuilder::ContainerBuilder(std::string_view id, std::string_view formType)
    : out_(id == "RIFF" || id == "RF64" || id == "BW64" ? std::endian::little : std::endian::big),
      isCAF_(id == "caff")
{
    out_.write(bytesOf(id));
    out_.write<std::uint32_t>(isCAF_ ? 0x00010000 : 0);
    if (!isCAF_)
        out_.write(bytesOf(formType));
}

ContainerBuilder& ContainerBuilder::chunk(std::string_view id, BytesView body, std::optional<std::int64_t> storedSize)
{
    const std::int64_t size = storedSize.value_or(static_cast<std::int64_t>(body.size()));
    out_.write(bytesOf(id));
    if (isCAF_)
        out_.write(size);
    else
        out_.write(static_cast<std::uint32_t>(size));
    out_.write(body);
    if (!isCAF_)
        out_.writeZeros(body.size() & 1);
    return *this;
}

ContainerBuilder& ContainerBuilder::unpadded(std::string_view id, std::string_view body)
{
    out_.write(bytesOf(id));
    out_.write(static_cast<std::uint32_t>(body.size()));
    out_.write(bytesOf(body));
    return *this;
}

ContainerBuilder& ContainerBuilder::format(std::uint32_t frames)
{
    using namespace std::string_view_literals;
    if (isCAF_)
        return chunk("desc", "\x40\xE5\x88\x80\0\0\0\0lpcm\0\0\0\2\0\0\0\2\0\0\0\1\0\0\0\1\0\0\0\x10"sv);
    if (textOf(out_.view()).substr(0, 4) != "FORM")
        return chunk("fmt ", "\1\0\1\0\x44\xAC\0\0\x88\x58\1\0\2\0\x10\0"sv);
    ByteWriter common;
    common.write<std::uint16_t>(1);
    common.write(frames);
    common.write<std::uint16_t>(16);
    common.write(bytesOf("\x40\x0E\xAC\x44\0\0\0\0\0\0"sv));
    return chunk("COMM", common.view());
}

ContainerBuilder& ContainerBuilder::ds64(std::uint64_t riffSize, std::uint64_t dataSize,
                                         std::initializer_list<std::pair<FourCC, std::uint64_t>> table)
{
    ByteWriter body(std::endian::little);
    body.write(riffSize);
    body.write(dataSize);
    body.write(std::uint64_t{0});
    body.write(static_cast<std::uint32_t>(table.size()));
    for (const auto& [id, size] : table) {
        body.writeFourCC(id);
        body.write(size);
    }
    return chunk("ds64", body.view());
}

Bytes ContainerBuilder::bytes(std::optional<std::uint32_t> storedSize) const
{
    ByteWriter image(out_);
    if (!isCAF_)
        image.patch(4, storedSize.value_or(static_cast<std::uint32_t>(out_.size() - 8)));
    return image.take();
}

Bytes waveFormat(int tag, int channels, int rate, int blockAlign, int bits)
{
    ByteWriter out(std::endian::little);
    out.write(static_cast<std::uint16_t>(tag));
    out.write(static_cast<std::uint16_t>(channels));
    out.write(static_cast<std::uint32_t>(rate));
    out.write(static_cast<std::uint32_t>(rate * blockAlign));
    out.write(static_cast<std::uint16_t>(blockAlign));
    out.write(static_cast<std::uint16_t>(bits));
    return out.take();
}

Bytes cafDescription(double rate, std::string_view format, const std::array<std::uint32_t, 5>& numbers)
{
    ByteWriter out;
    out.write(rate);
    out.write(bytesOf(format));
    for (const std::uint32_t number : numbers)
        out.write(number);
    return out.take();
}

std::int32_t openInMemory(CAudioFileIO& file, BytesView content, unsigned int mode)
{
    auto block = std::make_shared<KTMem>(content.size());
    std::copy(content.begin(), content.end(), block->data());
    file.SetCache(block);
    return file.Open(CFileRef(), mode | kFileIOMemory);
}

BytesView contentOf(const CAudioFileIO& file)
{
    return {file.CacheBlock()->data(), file.CacheBlock()->size()};
}

std::string listing(CAudioFileIO& file)
{
    std::string text;
    file.ForEachChunk([&](const ChunkEntry& chunk) {
        text += (text.empty() ? "" : " ") + fourCCText(chunk.id) + ":" + std::to_string(chunk.size);
        return true;
    });
    return text;
}
