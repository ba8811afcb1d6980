#include "media/packets/EditList.h"

#include "media/containers/AudioHandle.h"
#include "platform/core/ByteReader.h"
#include "platform/core/Status.h"

#include <algorithm>
#include <array>
#include <charconv>

namespace platform {

namespace {

/// The first bytes of a box's body, at most `most`; valid until the file is used again.
BytesView bodyOf(PacketFile& file, const std::optional<MP4Box>& box, std::size_t most)
{
    return box ? file.at(box->body, static_cast<std::size_t>(std::min<std::uint64_t>(box->size(), most))) : BytesView{};
}

/// The hexadecimal numbers of a text, separated by spaces.
template <std::size_t count>
bool readNumbers(std::string_view text, std::array<std::uint64_t, count>& numbers)
{
    for (std::uint64_t& number : numbers) {
        text.remove_prefix(std::min(text.find_first_not_of(' '), text.size()));
        const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number, 16);
        if (error != std::errc{})
            return false;
        text.remove_prefix(static_cast<std::size_t>(end - text.data()));
    }
    return true;
}

} // namespace

std::int32_t readEditList(PacketFile& file, const MP4Box& track, std::optional<MP4Edit>& edit)
{
    const auto edits = MP4Boxes(file, track).find(fourCC("edts"));
    const auto list = edits ? MP4Boxes(file, *edits).find(fourCC("elst")) : std::nullopt;
    if (!list)
        return kStatusOK;
    ByteReader reader(bodyOf(file, list, 28));
    const bool is64Bit = reader.read<std::uint8_t>() == 1;
    reader.skip(3); // flags
    const auto count = reader.read<std::uint32_t>();
    if (count == 0 && reader.ok())
        return kStatusOK;
    const std::uint64_t duration = is64Bit ? reader.read<std::uint64_t>() : reader.read<std::uint32_t>();
    const std::int64_t start = is64Bit ? reader.read<std::int64_t>() : reader.read<std::int32_t>();
    const auto rate = reader.read<std::uint32_t>(); // 16.16
    if (!reader.ok())
        return kStatusIOError;
    if (count > 1 || start < 0 || rate != 0x10000)
        return AudioHandle::kFormatNotSupported;
    edit = {.start = static_cast<std::uint64_t>(start), .duration = duration};
    return kStatusOK;
}

std::optional<GaplessItem> readGaplessItem(PacketFile& file, const MP4Box& movie)
{
    constexpr std::uint64_t kVersionSize = 4; // version and flags
    const auto userData = MP4Boxes(file, movie).find(fourCC("udta"));
    const auto meta = userData ? MP4Boxes(file, *userData).find(fourCC("meta")) : std::nullopt;
    const auto items = meta ? MP4Boxes(file, *meta, kVersionSize).find(fourCC("ilst")) : std::nullopt;
    if (!items)
        return {};
    MP4Boxes list(file, *items);
    while (const auto item = list.find(fourCC("----"))) {
        const BytesView name = bodyOf(file, MP4Boxes(file, *item).find(fourCC("name")), 256);
        if (name.size() < kVersionSize || !textOf(name.subspan(kVersionSize)).ends_with("SMPB"))
            continue;
        const BytesView data = bodyOf(file, MP4Boxes(file, *item).find(fourCC("data")), 256);
        std::array<std::uint64_t, 4> numbers{}; // 0, priming, remainder, valid frames, …
        if (data.size() < 8 || !readNumbers(textOf(data.subspan(8)), numbers) || numbers[1] > INT32_MAX ||
            numbers[2] > INT32_MAX)
            continue;
        return GaplessItem{.priming = static_cast<std::uint32_t>(numbers[1]),
                           .remainder = static_cast<std::uint32_t>(numbers[2]),
                           .validFrames = numbers[3]};
    }
    return {};
}

} // namespace platform
