#include "platform/ConvertingReader.h"

#include "platform/SystemCalls.h"
#include "platform/audio/DecoderModule.h"
#include "platform/audio/FrameConverter.h"
#include "platform/audio/LinearPCMDecoder.h"
#include "platform/core/Status.h"

#include <algorithm>
#include <bit>
#include <cstddef>
#include <cstring>
#include <limits>
#include <utility>

namespace platform {

struct ConvertingReader::Implementation {
    std::unique_ptr<AudioDecoder> decoder;
    StreamDescription client;
    Bytes layout; // of the client's channels; empty when none was set
    FrameConverter converter;
    Bytes piece; // what the decoder gave and the converter takes
    std::uint64_t frame = 0;
    bool isLost = false; // the decoder is not at `frame`

    explicit Implementation(std::unique_ptr<AudioDecoder> opened)
        : decoder(std::move(opened)),
          client(decoder->frameFormat())
    {
    }

    std::int32_t readFrames(std::byte* to, std::uint32_t wanted, std::uint32_t& done);
};

namespace {

/// Linear PCM that the library reads itself; null, with the status, when it is none. Status kFormatNotSupported says
/// that others may be asked.
std::unique_ptr<AudioDecoder> openLinearPCM(const URL& url, std::int32_t& status)
{
    auto file = AudioFile::open(url, AudioFile::Permission::read, 0, &status);
    if (!file) {
        FileStatus found;
        const bool isOther = status == kStatusParameterError && !url.posixPath().empty() &&
                             systemCalls().pathStatus(url.posixPath().c_str(), &found) && found.kind == FileKind::file;
        if (isOther)
            status = AudioHandle::kFormatNotSupported;
        return nullptr;
    }
    StreamDescription format;
    std::uint64_t frames = 0;
    status = file->dataFormat(format);
    if (status == kStatusOK)
        status = file->audioDataPacketCount(frames);
    if (status == kStatusOK && !LinearPCMDecoder::canDecode(format))
        status = AudioHandle::kFormatNotSupported;
    return status == kStatusOK ? std::make_unique<LinearPCMDecoder>(std::move(file), format, frames) : nullptr;
}

} // namespace

ConvertingReader::ConvertingReader(std::unique_ptr<Implementation> implementation)
    : AudioHandle(Kind::reader),
      implementation_(std::move(implementation))
{
}
ConvertingReader::~ConvertingReader() = default;

std::unique_ptr<ConvertingReader> ConvertingReader::open(const URL& url, std::int32_t* status, Error* error)
{
    std::int32_t ignored;
    std::int32_t& result = status != nullptr ? *status : ignored;
    std::unique_ptr<AudioDecoder> decoder = openLinearPCM(url, result);
    if (!decoder && result == kFormatNotSupported)
        decoder = openWithDecoderModule(url.posixPath(), result, error);
    else if (!decoder)
        fail(error, ErrorDomain::status, result, StatusText(result));
    if (!decoder)
        return nullptr;
    return std::unique_ptr<ConvertingReader>(
        new ConvertingReader(std::make_unique<Implementation>(std::move(decoder))));
}

const StreamDescription& ConvertingReader::fileFormat() const
{
    return implementation_->decoder->fileFormat();
}

const StreamDescription& ConvertingReader::clientFormat() const
{
    return implementation_->client;
}

std::uint64_t ConvertingReader::frameCount() const
{
    return implementation_->decoder->frameCount();
}

std::int32_t ConvertingReader::setClientFormat(const StreamDescription& format)
{
    const StreamDescription& frames = implementation_->decoder->frameFormat();
    if (!isPackedPCM(format) || format.sampleRate != frames.sampleRate)
        return kFormatNotSupported;
    FrameConverter converter(frames, format);
    Bytes piece(converter.isCopy() ? 0 : converter.piece() * frames.bytesPerFrame);
    implementation_->converter = std::move(converter);
    implementation_->piece = std::move(piece);
    implementation_->client = format;
    implementation_->layout.clear();
    return kStatusOK;
}

std::int32_t ConvertingReader::setLayout(BytesView layout)
{
    constexpr std::size_t head = offsetof(ChannelLayout, descriptions);
    std::uint32_t tag = 0, bitmap = 0, count = 0;
    if (layout.size() < head)
        return kBadPropertySize;
    std::memcpy(&tag, layout.data(), sizeof tag);
    std::memcpy(&bitmap, layout.data() + offsetof(ChannelLayout, bitmap), sizeof bitmap);
    std::memcpy(&count, layout.data() + offsetof(ChannelLayout, descriptionCount), sizeof count);
    if (count > (layout.size() - head) / sizeof(ChannelLayout::Description))
        return kBadPropertySize;
    const std::uint32_t channels = tag == ChannelLayout::byDescriptions ? count
                                   : tag == ChannelLayout::byBitmap ? static_cast<std::uint32_t>(std::popcount(bitmap))
                                                                    : tag & 0xFFFF;
    if (channels != implementation_->client.channelsPerFrame)
        return kStatusParameterError;
    implementation_->layout.assign(layout.begin(), layout.end());
    return kStatusOK;
}

std::int32_t ConvertingReader::seek(std::int64_t frame)
{
    if (frame < 0)
        return kStatusBeforeStart;
    const auto target = static_cast<std::uint64_t>(frame);
    if (target == implementation_->frame && !implementation_->isLost)
        return kStatusOK;
    const std::int32_t status = implementation_->decoder->seek(target);
    implementation_->isLost = status != kStatusOK;
    if (status == kStatusOK)
        implementation_->frame = target;
    return status;
}

/// Adds to `done` what was read; a piece at a time where frames are converted.
std::int32_t ConvertingReader::Implementation::readFrames(std::byte* to, std::uint32_t wanted, std::uint32_t& done)
{
    const auto most =
        static_cast<std::uint32_t>(converter.isCopy() ? wanted : std::min<std::size_t>(converter.piece(), wanted));
    while (done < wanted) {
        std::byte* const target = to + std::size_t{done} * client.bytesPerFrame;
        std::uint32_t got = std::min(most, wanted - done);
        const std::int32_t status = decoder->read(got, converter.isCopy() ? target : piece.data());
        if (status != kStatusOK || got == 0)
            return status;
        if (!converter.isCopy())
            converter.convert(piece.data(), target, got);
        done += got;
    }
    return kStatusOK;
}

std::int32_t ConvertingReader::read(std::uint32_t& frames, std::span<AudioBuffer> buffers)
{
    Implementation& self = *implementation_;
    std::uint32_t wanted = std::exchange(frames, 0);
    if (buffers.size() != 1 || buffers[0].channels != self.client.channelsPerFrame)
        return kStatusParameterError;
    wanted = std::min(wanted, std::exchange(buffers[0].byteSize, 0) / self.client.bytesPerFrame);
    if (buffers[0].data == nullptr && wanted > 0)
        return kStatusParameterError;
    std::int32_t status = kStatusOK;
    if (self.isLost)
        status = self.decoder->seek(self.frame);
    self.isLost = status != kStatusOK;
    std::uint32_t done = 0;
    if (status == kStatusOK)
        status = self.readFrames(static_cast<std::byte*>(buffers[0].data), wanted, done);
    if (status != kStatusOK) {
        self.isLost = true;
        return status;
    }
    self.frame += done;
    frames = done;
    buffers[0].byteSize = done * self.client.bytesPerFrame;
    return kStatusOK;
}

// Properties.

std::int32_t ConvertingReader::propertyInfo(FourCC id, std::uint32_t& size, bool& isWritable)
{
    PacketTable table;
    isWritable = id == clientFormatProperty || id == clientLayoutProperty;
    size = id == fileFormatProperty || id == clientFormatProperty ? sizeof(StreamDescription)
           : id == clientLayoutProperty ? static_cast<std::uint32_t>(implementation_->layout.size())
           : id == frameCountProperty   ? sizeof(std::uint64_t)
           : id == audioFileProperty    ? sizeof(AudioHandle*)
           : id == packetTableProperty && implementation_->decoder->packetTable(table) ? sizeof table
                                                                                       : 0;
    return size > 0 || id == clientLayoutProperty ? kStatusOK : kPropertyNotSupported;
}

std::int32_t ConvertingReader::property(FourCC id, std::uint32_t& size, void* data)
{
    const auto giveValue = [&](const auto& value) { return give(&value, sizeof value, size, data); };
    PacketTable table;
    switch (id) {
    case fileFormatProperty:
        return giveValue(fileFormat());
    case clientFormatProperty:
        return giveValue(clientFormat());
    case frameCountProperty:
        return giveValue(frameCount());
    case audioFileProperty:
        return giveValue(implementation_->decoder->file());
    case clientLayoutProperty: {
        const Bytes& layout = implementation_->layout;
        if (layout.empty())
            break;
        return give(layout.data(), static_cast<std::uint32_t>(layout.size()), size, data);
    }
    case packetTableProperty:
        if (implementation_->decoder->packetTable(table))
            return giveValue(table);
        break;
    }
    return kPropertyNotSupported;
}

std::int32_t ConvertingReader::setProperty(FourCC id, std::uint32_t size, const void* data)
{
    if (id != clientFormatProperty && id != clientLayoutProperty)
        return kPropertyNotSupported;
    if (data == nullptr)
        return kStatusParameterError;
    if (id == clientLayoutProperty)
        return setLayout({static_cast<const std::byte*>(data), size});
    StreamDescription format;
    if (size != sizeof format)
        return kBadPropertySize;
    std::memcpy(&format, data, sizeof format);
    return setClientFormat(format);
}

} // namespace platform
