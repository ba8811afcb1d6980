#include "platform/CompressedAudio.h"

#include "platform/ConvertingReader.h"
#include "platform/core/Status.h"
#include "platform/packets/PacketSource.h"

#include <algorithm>
#include <string_view>

namespace platform {

namespace {

/// How files begin that are left to the module.
struct Beginning {
    std::size_t offset;
    std::string_view bytes;
    FourCC fileType;
};
constexpr Beginning kBeginnings[] = {
    {0, "OggS", fourCC("OggS")},     {0, "\x30\x26\xB2\x75", fourCC("wma ")}, // ASF, by the start of its identifier
    {0, ".snd", fourCC("NeXT")},     {0, "wvPk", fourCC("wvpk")},
    {0, "MAC ", fourCC("MAC ")},     {0, "\x0B\x77", fourCC("ac-3")},
    {0, "\xFF\xFC", fourCC("MPG2")}, {0, "\xFF\xFD", fourCC("MPG2")},
    {4, "ftyp", fourCC("mp4f")}, // one that the library does not find its way in
};

FourCC fileTypeOf(BytesView start)
{
    for (const Beginning& beginning : kBeginnings)
        if (start.size() >= beginning.offset + beginning.bytes.size() &&
            std::ranges::equal(start.subspan(beginning.offset, beginning.bytes.size()),
                               std::as_bytes(std::span(beginning.bytes))))
            return beginning.fileType;
    return 0;
}

} // namespace

std::int32_t describeCompressedAudio(const URL& url, BytesView start, CompressedAudio& audio)
{
    audio = {};
    std::int32_t status = kStatusOK;
    if (const auto packets = openPacketSource(url.posixPath(), &status)) {
        audio = {packets->fileType(), packets->format(),
                 static_cast<std::uint64_t>(std::max<std::int64_t>(packets->table().validFrames, 0))};
        return kStatusOK;
    }
    if (status != AudioHandle::kFormatNotSupported)
        return status;
    audio.fileType = fileTypeOf(start);
    if (audio.fileType == 0)
        return kStatusParameterError;
    const auto reader = ConvertingReader::open(url, &status);
    if (reader) {
        audio.format = reader->fileFormat();
        audio.format.sampleRate = reader->clientFormat().sampleRate;
        audio.format.channelsPerFrame = reader->clientFormat().channelsPerFrame;
        audio.frames = reader->frameCount();
    }
    return status;
}

} // namespace platform
