#include "media/ffmpeg/PacketDecoder.h"

#include "media/ffmpeg/CodingNames.h"
#include "media/ffmpeg/FrameFormat.h"
#include "platform/core/Status.h"

#include <algorithm>
#include <cstring>
#include <new>
#include <utility>

extern "C" {
#include <libavcodec/avcodec.h>
}

namespace platform::ffmpeg {

namespace {

/// Passes the decoder its configuration in the form that it expects.
void setCookie(AVCodecParameters& parameters, BytesView cookie)
{
    constexpr std::size_t alacHead = 12, maxCookie = 1u << 20; // an atom's head: size, "alac", version and flags
    if (cookie.empty() || cookie.size() > maxCookie)
        return;
    const bool isBareALAC = parameters.codec_id == AV_CODEC_ID_ALAC &&
                            (cookie.size() < 8 || std::memcmp(cookie.data() + 4, "alac", 4) != 0);
    const std::size_t head = isBareALAC ? alacHead : 0;
    parameters.extradata = static_cast<std::uint8_t*>(av_mallocz(head + cookie.size() + AV_INPUT_BUFFER_PADDING_SIZE));
    if (parameters.extradata == nullptr)
        throw std::bad_alloc();
    parameters.extradata_size = static_cast<int>(head + cookie.size());
    if (isBareALAC) {
        parameters.extradata[3] = static_cast<std::uint8_t>(head + cookie.size());
        std::memcpy(parameters.extradata + 4, "alac", 4);
    }
    std::memcpy(parameters.extradata + head, cookie.data(), cookie.size());
}

CodecParameters parametersOf(PacketSource& source)
{
    const StreamDescription& format = source.format();
    CodecParameters parameters = makeCodecParameters();
    parameters->codec_type = AVMEDIA_TYPE_AUDIO;
    parameters->codec_id = static_cast<AVCodecID>(codecIdOf(format.formatId));
    parameters->sample_rate = static_cast<int>(std::clamp(format.sampleRate, 0.0, 1e7));
    parameters->block_align = static_cast<int>(std::min(format.bytesPerPacket, 1u << 24));
    parameters->bits_per_coded_sample = static_cast<int>(std::min(format.bitsPerChannel, 64u));
    parameters->ch_layout.order = AV_CHANNEL_ORDER_UNSPEC;
    parameters->ch_layout.nb_channels = static_cast<int>(std::min(format.channelsPerFrame, 255u));
    setCookie(*parameters, source.cookie());
    return parameters;
}

std::unique_ptr<Codec> openCodec(const AVCodecParameters& parameters, std::int32_t& status)
{
    return Codec::open(parameters, 0, 1, Codec::Padding::kept, status);
}

} // namespace

std::unique_ptr<PacketDecoder> PacketDecoder::open(std::unique_ptr<PacketSource> source, std::int32_t& status)
{
    CodecParameters parameters = parametersOf(*source);
    const PacketTable& table = source->table();
    const std::uint64_t framesPerPacket = source->format().framesPerPacket;
    status = AudioHandle::kFormatNotSupported;
    if (parameters->codec_id == AV_CODEC_ID_NONE)
        return nullptr;
    const bool isSound = source->format().channelsPerFrame > 0 && framesPerPacket > 0 && framesPerPacket < 1u << 20 &&
                         table.validFrames >= 0 && table.primingFrames >= 0 &&
                         source->packetCount() < std::uint64_t{1} << 40;
    std::unique_ptr<Codec> codec = openCodec(*parameters, status);
    if (!codec)
        return nullptr;
    status = kStatusIOError;
    if (!isSound)
        return nullptr;
    std::unique_ptr<PacketDecoder> decoder(
        new PacketDecoder(std::move(source), std::move(parameters), std::move(codec)));
    status = decoder->describeAsDecoded();
    return status == kStatusOK ? std::move(decoder) : nullptr;
}

PacketDecoder::PacketDecoder(std::unique_ptr<PacketSource> source, CodecParameters parameters,
                             std::unique_ptr<Codec> codec)
    : source_(std::move(source)),
      parameters_(std::move(parameters)),
      codec_(std::move(codec)),
      packet_(makePacket()),
      table_(source_->table()),
      framesPerPacket_(source_->format().framesPerPacket)
{
}

/// Sets what only decoding tells: sample format and channels.
std::int32_t PacketDecoder::describeAsDecoded()
{
    StreamDescription file = source_->format();
    SoundFacts facts = source_->facts();
    StreamDescription frames = nativePCM(file.sampleRate, file.channelsPerFrame, {.bits = 32, .isFloat = true});
    if (table_.validFrames > 0) { // otherwise there is nothing to read, which is no error
        Span span;
        if (const std::int32_t status = next(span); status != kStatusOK)
            return status;
        if (span.start == kNever)
            return kStatusIOError;
        const auto found = frameFormatOf(codec_->sourceBits(), decoded());
        if (!found)
            return AudioHandle::kFormatNotSupported;
        facts.speakers = speakersOf(decoded());
        frames = *found;
        if (static_cast<std::uint64_t>(decoded().nb_samples) > framesPerPacket_) // AAC at twice the stated rate
            return AudioHandle::kFormatNotSupported;
        frames.sampleRate = file.sampleRate;
        file.channelsPerFrame = frames.channelsPerFrame;
    }
    note(facts);
    describe(source_->fileType(), file, frames, static_cast<std::uint64_t>(table_.primingFrames),
             static_cast<std::uint64_t>(table_.validFrames), source_->packetCount());
    return kStatusOK;
}

bool PacketDecoder::packetTable(PacketTable& table) const
{
    table = table_;
    return true;
}

std::uint64_t PacketDecoder::packetOf(std::uint64_t number) const
{
    return number / framesPerPacket_;
}

std::int32_t PacketDecoder::startAt(std::uint64_t& number)
{
    const std::uint64_t packet = std::min(packetOf(number), source_->packetCount());
    std::int32_t status = kStatusOK;
    sent_ = awaited_ = packet < source_->packetCount() ? packet - std::min(source_->preRoll(packet), packet) : packet;
    number = std::min(number, awaited_ * framesPerPacket_);
    // Nothing is dropped before the first packet, and flushing a decoder does not reset the shape of its last window.
    if (awaited_ == 0 || !codec_)
        codec_ = openCodec(*parameters_, status);
    else
        codec_->flush();
    return status;
}

std::uint64_t PacketDecoder::reach(std::uint64_t number)
{
    const std::uint64_t packet = packetOf(number);
    return packet < source_->packetCount() ? (source_->preRoll(packet) + 2) * framesPerPacket_ : kNever;
}

std::int32_t PacketDecoder::sendPacket()
{
    std::int32_t status = kStatusEndOfFile; // also if the file has fewer packets than it says
    if (sent_ < source_->packetCount())
        status = source_->read(sent_, bytes_);
    if (status == kStatusEndOfFile)
        return codec_->send(nullptr) != Codec::Sent::outOfMemory ? kStatusOK : kStatusOutOfMemory;
    if (status != kStatusOK)
        return status;
    const std::size_t size = bytes_.size();
    const auto pts = static_cast<std::int64_t>(sent_++); // the decoder copies it to the frame
    if (size == 0 || size > std::size_t{1} << 24)        // an empty packet would mean the end
        return kStatusOK;
    bytes_.resize(size + AV_INPUT_BUFFER_PADDING_SIZE);
    std::fill(bytes_.begin() + static_cast<std::ptrdiff_t>(size), bytes_.end(), std::byte{0});
    packet_->data = reinterpret_cast<std::uint8_t*>(bytes_.data());
    packet_->size = static_cast<int>(size);
    packet_->pts = packet_->dts = pts;
    packet_->flags = AV_PKT_FLAG_KEY;
    return codec_->send(packet_.get()) != Codec::Sent::outOfMemory ? kStatusOK : kStatusOutOfMemory;
}

std::int32_t PacketDecoder::next(Span& span)
{
    for (;;) {
        switch (codec_->receive()) {
        case Codec::Result::frame: {
            const AVFrame& frame = decoded();
            const bool isNew =
                frame.pts != AV_NOPTS_VALUE && frame.pts >= 0 && static_cast<std::uint64_t>(frame.pts) >= awaited_;
            if (!isNew || frame.nb_samples <= 0) // more frames than the packet may have
                break;
            const auto packet = static_cast<std::uint64_t>(frame.pts);
            awaited_ = packet + 1;
            span.start = packet * framesPerPacket_;
            span.end =
                span.start + std::min<std::uint64_t>(framesPerPacket_, static_cast<std::uint64_t>(frame.nb_samples));
            return kStatusOK;
        }
        case Codec::Result::needsPacket:
            if (const std::int32_t status = sendPacket(); status != kStatusOK)
                return status;
            break;
        case Codec::Result::end:
            span = {kNever, kNever};
            return kStatusOK;
        case Codec::Result::failed:
            break;
        }
    }
}

std::unique_ptr<AudioDecoder> openPackets(std::unique_ptr<PacketSource> source, std::int32_t& status)
{
    return PacketDecoder::open(std::move(source), status);
}

} // namespace platform::ffmpeg
