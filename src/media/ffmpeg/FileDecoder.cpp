#include "media/ffmpeg/FileDecoder.h"

#include "media/ffmpeg/CodingNames.h"
#include "media/ffmpeg/FrameFormat.h"
#include "platform/core/Status.h"

#include <algorithm>
#include <array>
#include <new>
#include <utility>
#include <vector>

extern "C" {
#include <libavcodec/avcodec.h>
#include <libavcodec/codec_desc.h>
#include <libavformat/avformat.h>
}

namespace platform::ffmpeg {

namespace {

/// Frames decoded ahead for codings that depend on earlier packets: 13 packets of MP3; four times what Opus asks for.
constexpr std::uint64_t kWarmUp = 16384, kOpusWarmUp = 96000;
/// Decoding this far costs less than seeking.
constexpr std::uint64_t kReach = 32768;
/// More frames than any coding makes of one byte: FLAC has at least 16 bytes for up to 65,535 frames.
constexpr std::uint64_t kFramesPerByte = 8192;
/// Larger times are invalid.
constexpr std::uint64_t kMostFrames = std::uint64_t{1} << 62;

template <std::size_t N>
bool isOneOf(std::string_view name, const std::array<std::string_view, N>& names)
{
    return std::find(names.begin(), names.end(), name) != names.end();
}

/// Demultiplexers whose timestamps are those that the file states for each place.
bool hasExactTimes(const Demuxer& demuxer)
{
    constexpr std::array<std::string_view, 6> exact{"flac", "ogg", "tta", "wv", "ape", "tak"};
    const AVStream& stream = demuxer.stream();
    return isOneOf(demuxer.name(), exact) && stream.time_base.num == 1 &&
           stream.time_base.den == stream.codecpar->sample_rate;
}

/// Demultiplexers that split one run of bytes into packets.
bool isOneRun(const Demuxer& demuxer)
{
    constexpr std::array<std::string_view, 6> runs{"wav", "w64", "aiff", "au", "caf", "ircam"};
    return isOneOf(demuxer.name(), runs);
}

std::uint64_t framesPerBlockOf(const AVCodecParameters& parameters)
{
    return parameters.block_align > 0 ? framesOfBlocks(parameters, parameters.block_align) : 0;
}

/// Codings in which each packet decodes to one frame without delay, all of one length unless the stream changes.
bool hasConstantPackets(AVCodecID coding)
{
    constexpr std::array constant{AV_CODEC_ID_MP1,    AV_CODEC_ID_MP2,   AV_CODEC_ID_MP3,      AV_CODEC_ID_AC3,
                                  AV_CODEC_ID_EAC3,   AV_CODEC_ID_AAC,   AV_CODEC_ID_AAC_LATM, AV_CODEC_ID_DTS,
                                  AV_CODEC_ID_AMR_NB, AV_CODEC_ID_AMR_WB};
    return std::ranges::find(constant, coding) != constant.end();
}

/// Whether every packet decodes by itself.
bool isIndependent(const AVCodecParameters& parameters)
{
    if (parameters.codec_id == AV_CODEC_ID_GSM_MS) // blocks of one size, but each depends on those before it
        return false;
    constexpr int both = AV_CODEC_PROP_INTRA_ONLY | AV_CODEC_PROP_LOSSLESS;
    const AVCodecDescriptor* descriptor = avcodec_descriptor_get(parameters.codec_id);
    return framesPerBlockOf(parameters) > 0 || (descriptor != nullptr && (descriptor->props & both) == both);
}

} // namespace

std::unique_ptr<FileDecoder> FileDecoder::open(const char* path, std::int32_t& status)
{
    Demuxer demuxer(path, status);
    if (!demuxer.isOpen())
        return nullptr;
    std::unique_ptr<CorrectionFile> corrections = CorrectionFile::beside(path, demuxer);
    std::unique_ptr<FileDecoder> decoder(new FileDecoder(std::move(demuxer), std::move(corrections)));
    status = readMusepackInfo(decoder->demuxer_, decoder->musepack_);
    if (status == kStatusOK)
        status = decoder->begin();
    if (status == kStatusOK)
        status = decoder->describeAsDecoded();
    return status == kStatusOK ? std::move(decoder) : nullptr;
}

FileDecoder::FileDecoder(Demuxer demuxer, std::unique_ptr<CorrectionFile> corrections)
    : demuxer_(std::move(demuxer)),
      corrections_(std::move(corrections)),
      packet_(makePacket())
{
    const AVCodecParameters& parameters = *demuxer_.stream().codecpar;
    framesPerBlock_ = isOneRun(demuxer_) ? framesPerBlockOf(parameters) : 0;
    numbers_ = framesPerBlock_ > 0 ? Numbers::byPosition : hasExactTimes(demuxer_) ? Numbers::byTime : Numbers::byCount;
    isPaged_ = demuxer_.name() == "ogg";
    endsWithTime_ = isPaged_ && parameters.codec_id == AV_CODEC_ID_VORBIS;
    // The low bits of "ima4" predictors depend on all packets before.
    isChained_ = parameters.codec_id == AV_CODEC_ID_ADPCM_IMA_QT;
    warmUp_ = isIndependent(parameters) ? 0 : parameters.codec_id == AV_CODEC_ID_OPUS ? kOpusWarmUp : kWarmUp;
}

/// Resets to the first packet, with a new decoder, because flushing may not clear all of its state.
std::int32_t FileDecoder::begin()
{
    const AVRational unit = numbers_ == Numbers::byTime ? demuxer_.stream().time_base : AVRational{0, 1};
    std::int32_t status = kStatusOK;
    codec_ = Codec::open(*demuxer_.stream().codecpar, unit.num, unit.den,
                         endsWithTime_ ? Codec::Padding::kept : Codec::Padding::dropped, status);
    expected_ = sent_ = 0;
    isNumbered_ = true;
    search_ = {};
    pending_.reset();
    return status;
}

std::int32_t FileDecoder::restart()
{
    codec_.reset();
    const std::int32_t status = demuxer_.restart();
    if (corrections_)
        corrections_->seek(0);
    return status == kStatusOK ? begin() : status;
}

std::int32_t FileDecoder::describeAsDecoded()
{
    base_ = AV_NOPTS_VALUE;
    isCounting_ = numbers_ == Numbers::byCount;
    Span span;
    std::int32_t status = next(span);
    if (status != kStatusOK)
        return status;
    if (span.start == kNever)
        return kStatusIOError;
    const auto frames = frameFormatOf(codec_->sourceBits(), decoded());
    if (!frames)
        return AudioHandle::kFormatNotSupported;
    SoundFacts facts{
        .speakers = speakersOf(decoded()), .profile = codec_->profile(), .tracks = demuxer_.audioStreams()};
    if (codec_->decodesDSD())
        facts.bitstreamRate = static_cast<std::uint64_t>(decoded().sample_rate) * 8;
    const AVCodecParameters& parameters = *demuxer_.stream().codecpar;
    const StreamDescription file =
        fileFormatOf(parameters, codec_->sourceBits(), frames->sampleRate, frames->channelsPerFrame);
    const bool isAnew = numbers_ == Numbers::byTime && decoded().sample_rate != parameters.sample_rate;
    if (isAnew)
        numbers_ = Numbers::byCount;
    const bool isLayerII = parameters.codec_id == AV_CODEC_ID_MP2 && std::string_view(demuxer_.name()) == "mp3";
    const FourCC fileType =
        isLayerII ? fourCC("MPG2") : fileTypeOf(demuxer_.name(), demuxer_.brand(), parameters.codec_id);
    const auto stated = SoundDigest::statedBy(parameters);
    std::uint64_t count = 0;
    if (status = countFrames(isAnew ? 0 : span.end, count); status != kStatusOK)
        return status;
    limit_ = count;
    const std::uint64_t lead = musepack_ ? musepack_->lead : 0;
    if (musepack_)
        count = std::min(count - std::min(count, lead), musepack_->frames);
    facts.promisedFrames = promisedFrames(count, frames->sampleRate);
    note(facts);
    describe(fileType, file, *frames, lead, count, DecodedFileHandle::unknownCount);
    if (stated)
        noteChecksum(*stated, file.bitsPerChannel);
    forget(); // the first read starts anew; a caller who only asks for facts does not pay for it
    return kStatusOK;
}

/// Counts the frames. If frames can be numbered anywhere, the last ones tell; if every packet has as many frames as the
/// first, the number of packets does; otherwise everything is decoded once. `first` is the number of frames decoded so
/// far, or 0 if they do not count.
std::int32_t FileDecoder::countFrames(std::uint64_t first, std::uint64_t& count)
{
    constexpr std::uint64_t tail = 1u << 16;
    const AVStream& stream = demuxer_.stream();
    const std::int64_t stated = stream.duration != AV_NOPTS_VALUE ? stream.duration : 0;
    const auto length = static_cast<std::uint64_t>(std::max<std::int64_t>(stated, 0));
    count = 0;
    std::int32_t status = kStatusOK;
    const bool isLong = canLand() && length > 2 * tail && length < std::uint64_t{1} << 48;
    const bool isCounted =
        numbers_ == Numbers::byCount && first > 0 && sent_ == 1 && hasConstantPackets(stream.codecpar->codec_id);
    if (isCounted) {
        status = countPackets(first, count);
    } else if (isLong) {
        if (land(length, tail, 0))
            status = decodeRest(count);
    } else if (first > 0) {
        count = first;
        status = decodeRest(count);
    }
    if (status == kStatusOK && count == 0)
        status = countFromStart(count);
    if (status == kStatusOK && numbers_ == Numbers::byTime && count / kFramesPerByte > demuxer_.size()) {
        numbers_ = Numbers::byCount; // the timestamps are invalid
        status = countFromStart(count);
    }
    if (endsWithTime_ && length > 0)
        count = std::min(count, length);
    // If the file states a length, the sound ends in the last block, or before padding to 8 bytes (Wave64).
    if (numbers_ == Numbers::byPosition && length < count && count - length < framesPerBlock_ + 8)
        count = length;
    isCounting_ = false;
    return status;
}

/// The length in the file's header, for kinds that have it; 0 for others, and if the excess is within rounding or
/// within what primes a decoder.
std::uint64_t FileDecoder::promisedFrames(std::uint64_t count, double sampleRate) const
{
    if (musepack_)
        return musepack_->frames > count ? musepack_->frames : 0;
    constexpr std::array<std::string_view, 5> exact{"flac", "tta", "wv", "ape", "tak"};
    constexpr std::array<std::string_view, 5> inexact{"mpc", "mpc8", "dsf", "iff", "mov,mp4,m4a,3gp,3g2,mj2"};
    const AVStream& stream = demuxer_.stream();
    const std::string_view name = demuxer_.name();
    const auto rate = static_cast<int>(sampleRate);
    // In Matroska the length is that of the longest stream.
    const bool isInexact = isOneOf(name, inexact) || (name == "matroska,webm" && demuxer_.streams() == 1);
    if ((!isOneOf(name, exact) && !isInexact) || stream.duration == AV_NOPTS_VALUE || stream.duration <= 0)
        return 0;
    const std::int64_t frames = av_rescale_q(stream.duration, stream.time_base, {1, rate});
    const auto promised = static_cast<std::uint64_t>(std::max<std::int64_t>(frames, 0));
    const auto tolerance = static_cast<std::uint64_t>(isInexact ? rate / 4 : 0);
    return promised > count + tolerance ? promised : 0;
}

/// Counts packets, beginning with the second, which is the next. 0 if packets may differ. Decodes the last few, because
/// a packet that is cut short yields no frames.
std::int32_t FileDecoder::countPackets(std::uint64_t framesPerPacket, std::uint64_t& count)
{
    constexpr std::size_t kLast = 4;
    std::vector<Packet> last;
    count = 0;
    std::uint64_t packets = 1;
    for (std::int32_t status = kStatusOK;; ++packets) {
        Packet packet = makePacket();
        if (!demuxer_.read(*packet, status)) {
            if (status != kStatusOK)
                return status;
            break;
        }
        if (av_packet_get_side_data(packet.get(), AV_PKT_DATA_SKIP_SAMPLES, nullptr) != nullptr)
            return kStatusOK;
        if (packet->pts != AV_NOPTS_VALUE)
            checkpoints_.offer({packet->pts, packet->pos, packets * framesPerPacket});
        packet->pts = packet->dts = static_cast<std::int64_t>(packets);
        if (last.size() == kLast)
            last.erase(last.begin());
        last.push_back(std::move(packet));
    }
    count = packets * framesPerPacket;
    if (!endOfLastPackets(last, framesPerPacket, count))
        count = 0;
    return kStatusOK;
}

/// Sets the number after the last frame of the last packets; false if their frames have other lengths.
bool FileDecoder::endOfLastPackets(std::span<const Packet> last, std::uint64_t framesPerPacket, std::uint64_t& count)
{
    if (last.empty())
        return true;
    count = 0;
    codec_->flush();
    for (const Packet& packet : last) {
        if (codec_->send(packet.get()) == Codec::Sent::outOfMemory)
            throw std::bad_alloc();
        for (Codec::Result result = codec_->receive(); result == Codec::Result::frame; result = codec_->receive()) {
            const AVFrame& frame = decoded();
            if (static_cast<std::uint64_t>(frame.nb_samples) != framesPerPacket || frame.pts < packet->pts)
                return false;
            count = (static_cast<std::uint64_t>(frame.pts) + 1) * framesPerPacket;
        }
    }
    return count > 0;
}

std::int32_t FileDecoder::countFromStart(std::uint64_t& count)
{
    count = 0;
    checkpoints_ = {};
    isCounting_ = numbers_ == Numbers::byCount;
    std::int32_t status = restart();
    if (status == kStatusOK)
        status = decodeRest(count);
    isCounting_ = false;
    return status;
}

std::int32_t FileDecoder::decodeRest(std::uint64_t& end)
{
    for (Span span;;) {
        if (const std::int32_t status = next(span); status != kStatusOK)
            return status;
        if (span.start == kNever)
            return kStatusOK;
        end = std::max(end, span.end);
    }
}

/// The time of frame 0, from the first frame that decodes. In a FLAC file that states its length, times count from the
/// first sample even if its frame does not decode.
std::int64_t FileDecoder::startOf(const AVFrame& frame) const
{
    const bool countsFromZero = demuxer_.name() == "flac" && frame.pts < demuxer_.stream().duration;
    return countsFromZero ? 0 : frame.pts - static_cast<std::int64_t>(expected_);
}

// Seeking.

bool FileDecoder::canLand() const
{
    return numbers_ == Numbers::byPosition || (numbers_ == Numbers::byTime && base_ != AV_NOPTS_VALUE);
}

std::uint64_t FileDecoder::reach(std::uint64_t)
{
    return isChained_ ? kNever : kReach + warmUp_;
}

std::int32_t FileDecoder::startAt(std::uint64_t& number)
{
    constexpr int attempts = 5;
    const bool isWhole = demuxer_.isOpen() && codec_; // false if restarting failed
    bool hasLanded = isWhole && numbers_ == Numbers::byCount && landAtCheckpoint(number);
    const int tries = !isWhole || !canLand() || isChained_ ? 0 : attempts;
    std::uint64_t back = warmUp_;
    for (int i = 0; i < tries && !hasLanded && number > back; ++i, back = 4 * back + kReach)
        hasLanded = land(number, back, warmUp_);
    if (hasLanded) {
        number = pending_->start;
        return kStatusOK;
    }
    number = 0;
    return restart();
}

/// The time to seek to. A demultiplexer that splits blocks finds them by the file's bit rate, which is unreliable for
/// ADPCM.
std::int64_t FileDecoder::timeOf(std::uint64_t number) const
{
    const auto place = static_cast<std::int64_t>(number);
    if (numbers_ == Numbers::byTime)
        return base_ + place;
    const AVCodecParameters& parameters = *demuxer_.stream().codecpar;
    const std::int64_t block = parameters.block_align;
    const std::int64_t byteRate = parameters.bit_rate >= 8 ? parameters.bit_rate / 8 : block * parameters.sample_rate;
    return av_rescale_rnd(place / static_cast<std::int64_t>(framesPerBlock_) * block, parameters.sample_rate, byteRate,
                          AV_ROUND_DOWN);
}

/// Seeks to `back` frames before `number` and decodes; false if the first frame is less than `needed` ahead of it.
bool FileDecoder::land(std::uint64_t number, std::uint64_t back, std::uint64_t needed)
{
    pending_.reset();
    if (!demuxer_.seek(timeOf(number - back)))
        return false;
    if (corrections_)
        corrections_->seek(timeOf(number - back));
    codec_->flush();
    isNumbered_ = false;
    search_ = {};
    page_ = -1;
    Span span;
    if (decodeNext(span) != kStatusOK || span.start == kNever || span.start > number - needed)
        return false;
    pending_ = span;
    return true;
}

/// As land(), with two checkpoints: at the first the decoder starts to build its state, at the second frames get their
/// numbers.
bool FileDecoder::landAtCheckpoint(std::uint64_t number)
{
    const std::size_t before = checkpoints_.countUpTo(number);
    if (before < 2)
        return false;
    pending_.reset();
    if (!demuxer_.seek(checkpoints_[before - 2].time))
        return false;
    codec_->flush();
    isNumbered_ = false;
    search_ = {.end = checkpoints_[before - 1].time};
    Span span;
    const bool isFound = decodeNext(span) == kStatusOK && span.start <= number;
    if (isFound)
        pending_ = span;
    return isFound;
}

// Decoding.

std::int32_t FileDecoder::next(Span& span)
{
    if (pending_) {
        span = *std::exchange(pending_, std::nullopt);
        return kStatusOK;
    }
    return decodeNext(span);
}

/// Ogg states one time per page, and FFmpeg derives the others from packet durations, which are wrong in Vorbis where
/// short blocks follow long ones. Therefore a frame of Ogg has a number only if its length is its packet's duration.
bool FileDecoder::tellsNumber(const AVFrame& frame) const
{
    if (numbers_ == Numbers::byCount || frame.pts == AV_NOPTS_VALUE)
        return false;
    return !isPaged_ || frame.pkt_duration == frame.nb_samples;
}

/// Gives the frame that was decoded its numbers. False if nobody knows them, and if they lie outside the sound: then
/// the frame is dropped.
bool FileDecoder::numberFrame(const AVFrame& frame, Span& span)
{
    std::uint64_t number = expected_;
    if (tellsNumber(frame)) {
        if (numbers_ == Numbers::byTime && base_ == AV_NOPTS_VALUE)
            base_ = startOf(frame);
        const std::int64_t origin = numbers_ == Numbers::byTime ? base_ : 0;
        number = static_cast<std::uint64_t>(frame.pts) - static_cast<std::uint64_t>(origin);
        if (frame.pts < origin || number >= std::min(limit_, kMostFrames))
            return false;
        isNumbered_ = true;
    }
    if (!isNumbered_ || frame.nb_samples <= 0)
        return false;
    length_ = static_cast<std::uint64_t>(frame.nb_samples);
    expected_ = number + length_;
    span = {number, expected_};
    return true;
}

std::int32_t FileDecoder::decodeNext(Span& span)
{
    for (;;) {
        const Codec::Result result = codec_->receive();
        if (result == Codec::Result::frame && numberFrame(decoded(), span))
            return kStatusOK;
        if (result == Codec::Result::failed)
            passOver();
        bool isOver = result == Codec::Result::end;
        if (result == Codec::Result::needsPacket) {
            if (const std::int32_t status = sendPacket(); status != kStatusOK)
                return status;
            isOver = search_.hasFailed;
        }
        if (isOver) {
            span = {kNever, kNever};
            return kStatusOK;
        }
    }
}

/// Skips a failed packet: if frames are counted, as many as in the last packet are missing.
void FileDecoder::passOver()
{
    if (numbers_ == Numbers::byCount && isNumbered_ && expected_ > 0)
        expected_ += length_;
}

std::int32_t FileDecoder::sendPacket()
{
    std::int32_t status = kStatusOK;
    if (!demuxer_.read(*packet_, status))
        return status != kStatusOK || codec_->send(nullptr) != Codec::Sent::outOfMemory ? status : kStatusOutOfMemory;
    if (corrections_)
        corrections_->attachTo(*packet_);
    numberPacket(*packet_);
    ++sent_;
    const Codec::Sent sent = codec_->send(packet_.get());
    if (sent == Codec::Sent::failed)
        passOver();
    av_packet_unref(packet_.get());
    return sent != Codec::Sent::outOfMemory ? kStatusOK : kStatusOutOfMemory;
}

/// Puts into `pts` the number of the packet's first frame, as far as the packet tells.
void FileDecoder::numberPacket(AVPacket& packet)
{
    switch (numbers_) {
    case Numbers::byTime:
        return numberByTime(packet);
    case Numbers::byPosition:
        return numberByPosition(packet);
    case Numbers::byCount:
        return meetCheckpoint(packet);
    }
}

/// Times count frames as they stand, except in Ogg on the page that a seek leads to: there they are derived from the
/// page's end, which may be cut on the last page. Times on the next page follow from the page before.
void FileDecoder::numberByTime(AVPacket& packet)
{
    const bool isOnFirstPage = page_ < 0 || packet.pos == page_;
    if (!isPaged_ || isNumbered_ || !isOnFirstPage)
        return;
    page_ = packet.pos;
    packet.pts = AV_NOPTS_VALUE;
}

void FileDecoder::numberByPosition(AVPacket& packet)
{
    if (base_ == AV_NOPTS_VALUE)
        base_ = packet.pos;
    const int block = demuxer_.stream().codecpar->block_align;
    const std::int64_t distance = packet.pos - base_;
    const bool isKnown = packet.pos >= base_ && distance % block == 0;
    packet.pts = isKnown ? distance / block * static_cast<std::int64_t>(framesPerBlock_) : AV_NOPTS_VALUE;
}

/// Counted frames have no numbers in their packets. Keeps a checkpoint while everything is counted from the start;
/// after a seek, numbers begin at the second checkpoint that the packets meet.
void FileDecoder::meetCheckpoint(AVPacket& packet)
{
    const std::int64_t time = std::exchange(packet.pts, AV_NOPTS_VALUE);
    if (time == AV_NOPTS_VALUE)
        return;
    if (isCounting_)
        checkpoints_.offer({time, packet.pos, expected_});
    if (!isNumbered_) {
        const Checkpoint* const checkpoint = checkpoints_.find(time, packet.pos);
        search_.met += checkpoint != nullptr ? 1 : 0;
        isNumbered_ = checkpoint != nullptr && search_.met == 2;
        if (isNumbered_)
            expected_ = checkpoint->frame;
    }
    search_.hasFailed = !isNumbered_ && time > search_.end;
}

std::unique_ptr<AudioDecoder> openFile(const char* path, std::int32_t& status)
{
    return FileDecoder::open(path, status);
}

} // namespace platform::ffmpeg
