#include "media/decoding/ConvertingReader.h"

#include "media/decoding/DecoderModule.h"
#include "media/decoding/FrameConverter.h"
#include "media/decoding/LinearPCMDecoder.h"
#include "media/decoding/ResamplingDecoder.h"
#include "platform/SystemCalls.h"
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
    std::unique_ptr<ResamplingDecoder> resampling; // on top of the decoder if the client's rate differs
    StreamDescription client;
    Bytes layout; // the client's channel layout; empty if none was set
    FrameConverter converter;
    Bytes piece; // bytes from the decoder for the converter
    std::uint64_t frame = 0;
    bool isLost = false; // the source is not at `frame`

    explicit Implementation(std::unique_ptr<AudioDecoder> opened)
        : decoder(std::move(opened)),
          client(decoder->frameFormat())
    {
    }

    AudioDecoder& source() const { return resampling ? *resampling : *decoder; }
    std::int32_t readFrames(std::byte* to, std::uint32_t wanted, std::uint32_t& done);
};

namespace {

/// Opens linear PCM that the library reads itself; null, with the status, if the file is none. kFormatNotSupported
/// means that other decoders may be tried.
std::unique_ptr<AudioDecoder> openLinearPCM(const URL& url, std::int32_t& status)
{
    auto file = AudioFile::openToRead(url, &status);
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

/// Makes a rate conversion if the client's rate differs from the decoder's; null, with status 0, if it does not.
/// Converts either the file's channels or the client's, whichever are fewer.
std::unique_ptr<ResamplingDecoder> makeResampling(AudioDecoder& decoder, const StreamDescription& client,
                                                  std::int32_t& status, Error* error)
{
    const StreamDescription& frames = decoder.frameFormat();
    if (client.sampleRate == frames.sampleRate)
        return nullptr;
    const std::uint32_t channels = std::min(frames.channelsPerFrame, client.channelsPerFrame);
    std::unique_ptr<Resampler> resampler = makeResampler(channels, frames.sampleRate, client.sampleRate, status, error);
    if (!resampler)
        return nullptr;
    return std::make_unique<ResamplingDecoder>(decoder, std::move(resampler), channels,
                                               static_cast<std::uint32_t>(client.sampleRate));
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

SoundFacts ConvertingReader::facts() const
{
    return implementation_->decoder->facts();
}

std::uint64_t ConvertingReader::frameCount() const
{
    return implementation_->decoder->frameCount();
}

std::uint64_t ConvertingReader::missingFrames() const
{
    return implementation_->decoder->missingFrames();
}

ConvertingReader::Checksum ConvertingReader::checksum() const
{
    return implementation_->decoder->checksum();
}

void ConvertingReader::compareChecksum()
{
    implementation_->decoder->compareChecksum();
}

std::uint64_t ConvertingReader::clientFrameCount() const
{
    return implementation_->source().frameCount();
}

std::int32_t ConvertingReader::setClientFormat(const StreamDescription& format, Error* error)
{
    Implementation& self = *implementation_;
    if (!isPackedPCM(format)) {
        fail(error, ErrorDomain::status, kFormatNotSupported, "frames can be read as packed linear PCM only");
        return kFormatNotSupported;
    }
    std::int32_t status = kStatusOK;
    std::unique_ptr<ResamplingDecoder> resampling = makeResampling(*self.decoder, format, status, error);
    if (status != kStatusOK)
        return status;
    const StreamDescription& frames = (resampling ? *resampling : *self.decoder).frameFormat();
    FrameConverter converter(frames, format);
    Bytes piece(converter.isCopy() ? 0 : converter.piece() * frames.bytesPerFrame);
    self.isLost = self.isLost || resampling || self.resampling;
    if (self.client.sampleRate != format.sampleRate)
        self.frame = 0;
    self.resampling = std::move(resampling);
    self.converter = std::move(converter);
    self.piece = std::move(piece);
    self.client = format;
    self.layout.clear();
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
    const std::int32_t status = implementation_->source().seek(target);
    implementation_->isLost = status != kStatusOK;
    if (status == kStatusOK)
        implementation_->frame = target;
    return status;
}

/// Adds the frames read to `done`; if frames are converted, reads piece by piece.
std::int32_t ConvertingReader::Implementation::readFrames(std::byte* to, std::uint32_t wanted, std::uint32_t& done)
{
    const auto most =
        static_cast<std::uint32_t>(converter.isCopy() ? wanted : std::min<std::size_t>(converter.piece(), wanted));
    while (done < wanted) {
        std::byte* const target = to + std::size_t{done} * client.bytesPerFrame;
        std::uint32_t got = std::min(most, wanted - done);
        const std::int32_t status = source().read(got, converter.isCopy() ? target : piece.data());
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
        status = self.source().seek(self.frame);
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
    isWritable = id == clientFormatProperty || id == clientLayoutProperty || id == checksumProperty;
    size = 0;
    switch (id) {
    case fileFormatProperty:
    case clientFormatProperty:
        size = sizeof(StreamDescription);
        return kStatusOK;
    case clientLayoutProperty:
        size = static_cast<std::uint32_t>(implementation_->layout.size());
        return kStatusOK;
    case frameCountProperty:
    case missingFramesProperty:
        size = sizeof(std::uint64_t);
        return kStatusOK;
    case checksumProperty:
        size = sizeof(Checksum);
        return kStatusOK;
    case audioFileProperty:
        size = sizeof(AudioHandle*);
        return kStatusOK;
    case packetTableProperty:
        if (!implementation_->decoder->packetTable(table))
            return kPropertyNotSupported;
        size = sizeof table;
        return kStatusOK;
    default:
        return kPropertyNotSupported;
    }
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
    case checksumProperty:
        return giveValue(checksum());
    case missingFramesProperty:
        return giveValue(missingFrames());
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
    if (id == checksumProperty) {
        compareChecksum();
        return kStatusOK;
    }
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
