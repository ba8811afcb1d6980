// The CAF information dictionary "info": the number of pairs (u32), then for each pair the key and the value, both
// ended by NUL.
#include "media/userdata/AudioFileImplementation.h"
#include "platform/core/ByteReader.h"
#include "platform/core/ByteWriter.h"
#include "platform/core/Status.h"

#include <limits>

namespace platform {

namespace {

constexpr FourCC kInfo = fourCC("info");

/// The text up to the next NUL; none if there is no NUL.
std::optional<std::string> readText(ByteReader& reader)
{
    const std::string_view rest = textOf(reader.rest());
    const std::size_t length = rest.find('\0');
    if (length == std::string_view::npos)
        return std::nullopt;
    reader.skip(length + 1);
    return std::string(rest.substr(0, length));
}

/// The complete pairs, at most as many as the count says; of two pairs with one key, the first.
Dictionary parseInformation(BytesView body)
{
    Dictionary texts;
    ByteReader reader(body);
    for (auto left = reader.read<std::uint32_t>(); left > 0; --left) {
        auto key = readText(reader);
        auto value = key ? readText(reader) : std::nullopt;
        if (!value)
            break;
        texts.emplace(std::move(*key), std::move(*value));
    }
    return texts;
}

} // namespace

std::int32_t AudioFile::information(Dictionary& information)
{
    information.clear();
    if (implementation_->layout.kind() != ContainerKind::caf)
        return kStatusParameterError;
    if (const std::int32_t status = implementation_->refresh(); status != kStatusOK)
        return status;
    std::uint32_t size = 0;
    if (implementation_->itemsOf(kInfo).empty())
        return kStatusOK;
    if (const std::int32_t status = userDataSize(kInfo, 0, size); status != kStatusOK)
        return status;
    Bytes body(size);
    if (const std::int32_t status = userData(kInfo, 0, size, body.data()); status != kStatusOK)
        return status;
    information = parseInformation(body);
    return kStatusOK;
}

std::int32_t AudioFile::setInformation(const Dictionary& information)
{
    if (implementation_->layout.kind() != ContainerKind::caf)
        return kStatusParameterError;
    ByteWriter writer;
    writer.write(static_cast<std::uint32_t>(information.size()));
    for (const auto& [key, value] : information) {
        const std::string* text = value.get<std::string>();
        if (text == nullptr || text->find('\0') != std::string::npos || key.find('\0') != std::string::npos)
            return kStatusParameterError;
        for (const std::string& part : {key, *text}) {
            writer.write(bytesOf(part));
            writer.writeZeros(1);
        }
    }
    if (writer.size() > std::numeric_limits<std::uint32_t>::max())
        return kStatusFileTooBig;
    if (!information.empty())
        return implementation_->setItem(kInfo, 0, writer.view());
    // Removes the last "info" first: a further one, which nobody reads, would otherwise become the first.
    std::uint32_t count = 0;
    std::int32_t status = countUserData(kInfo, count);
    for (; status == kStatusOK && count > 0; --count)
        status = implementation_->removeItem(kInfo, count - 1);
    return status;
}

} // namespace platform
