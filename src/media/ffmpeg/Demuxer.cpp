#include "media/ffmpeg/Demuxer.h"

#include "media/containers/AudioHandle.h"
#include "media/ffmpeg/CodingNames.h"
#include "platform/core/Status.h"

#include <algorithm>
#include <cstddef>
#include <new>
#include <span>
#include <vector>

extern "C" {
#include <libavformat/avformat.h>
}

namespace platform::ffmpeg {

namespace {

/// EINVAL means that the demultiplexer is not allowed.
std::int32_t statusOf(int error)
{
    const bool isSystemError = error > -4096 && error != AVERROR(EINVAL);
    return isSystemError ? PosixErrorToOSErr(AVUNERROR(error)) : AudioHandle::kFormatNotSupported;
}

/// Formats that random bytes may resemble are accepted only if the file's name agrees.
bool isCredible(const AVFormatContext& context, const std::string& url)
{
    return context.probe_score >= AVPROBE_SCORE_RETRY ||
           (context.iformat->extensions != nullptr && av_match_ext(url.c_str(), context.iformat->extensions) != 0);
}

/// Makes a context that logs nothing. The log raises a message's level by a number to which the class of its context
/// points; demultiplexers have none, so the class here points at `opaque`. The level itself belongs to the host.
AVFormatContext* makeSilentContext()
{
    static const AVClass silent = [] {
        AVClass made = *avformat_get_class();
        made.log_level_offset_offset = offsetof(AVFormatContext, opaque);
        return made;
    }();
    AVFormatContext* const context = avformat_alloc_context();
    if (context == nullptr)
        throw std::bad_alloc();
    context->av_class = &silent;
    context->opaque = reinterpret_cast<void*>(std::intptr_t{kLogLevelOffset});
    return context;
}

bool isAudio(const AVStream& stream)
{
    return stream.codecpar->codec_type == AVMEDIA_TYPE_AUDIO;
}

/// The first audio stream that has a decoder, as packet readers choose it, rather than the one that FFmpeg prefers; -1
/// if there is none.
int firstAudioStream(const AVFormatContext& context)
{
    for (unsigned i = 0; i < context.nb_streams; ++i) {
        const AVCodecParameters& parameters = *context.streams[i]->codecpar;
        if (isAudio(*context.streams[i]) && parameters.sample_rate > 0 && parameters.ch_layout.nb_channels > 0 &&
            avcodec_find_decoder(parameters.codec_id) != nullptr)
            return static_cast<int>(i);
    }
    return -1;
}

/// avformat_find_stream_info with silent decoders for the streams known so far.
int findStreamInfo(AVFormatContext& context)
{
    std::vector<AVDictionary*> options(context.nb_streams);
    bool isSet = true;
    for (AVDictionary*& ofStream : options)
        isSet = isSet && av_dict_set_int(&ofStream, "log_level_offset", kLogLevelOffset, 0) >= 0;
    const int result = isSet ? avformat_find_stream_info(&context, options.data()) : AVERROR(ENOMEM);
    for (AVDictionary*& ofStream : options)
        av_dict_free(&ofStream);
    return result;
}

} // namespace

Demuxer::Demuxer(const char* path, std::int32_t& status) : url_(std::string("file:") + path)
{
    status = open();
}

std::int32_t Demuxer::open()
{
    context_.reset();
    frames_.reset();
    FormatContext made(makeSilentContext());
    AVDictionary* options = nullptr;
    if (av_dict_set(&options, "protocol_whitelist", "file", 0) < 0 ||
        av_dict_set(&options, "format_whitelist", usedDemuxers, 0) < 0)
        throw std::bad_alloc();
    AVFormatContext* context = made.release(); // freed by avformat_open_input when it fails
    int result = avformat_open_input(&context, url_.c_str(), nullptr, &options);
    av_dict_free(&options);
    if (result < 0)
        return statusOf(result);
    FormatContext opened(context);
    const std::int64_t begin = opened->pb != nullptr ? avio_tell(opened->pb) : -1;
    if (!isCredible(*opened, url_))
        return AudioHandle::kFormatNotSupported;
    result = findStreamInfo(*opened);
    if (result < 0)
        return statusOf(result);
    stream_ = firstAudioStream(*opened);
    if (stream_ < 0)
        return AudioHandle::kFormatNotSupported;
    for (unsigned i = 0; i < opened->nb_streams; ++i)
        if (static_cast<int>(i) != stream_)
            opened->streams[i]->discard = AVDISCARD_ALL;
    context_ = std::move(opened);
    const AVCodecParameters& parameters = *stream().codecpar;
    const bool countsSamples = stream().time_base.num == 1 && stream().time_base.den == parameters.sample_rate;
    if (name() == "flac" && countsSamples && parameters.extradata != nullptr)
        frames_ = FLACFrames::from(
            begin, std::span(parameters.extradata, static_cast<std::size_t>(parameters.extradata_size)));
    return kStatusOK;
}

const AVStream& Demuxer::stream() const
{
    return *context_->streams[stream_];
}

unsigned Demuxer::audioStreams() const
{
    unsigned count = 0;
    for (unsigned i = 0; i < context_->nb_streams; ++i)
        count += isAudio(*context_->streams[i]) ? 1U : 0U;
    return count;
}

unsigned Demuxer::streams() const
{
    return context_->nb_streams;
}

std::string_view Demuxer::name() const
{
    return context_->iformat->name;
}

std::string_view Demuxer::brand() const
{
    const AVDictionaryEntry* entry = av_dict_get(context_->metadata, "major_brand", nullptr, 0);
    return entry != nullptr ? entry->value : std::string_view{};
}

/// Where frames stop FFmpeg goes on: from there, or if that place is not found from the start.
std::int32_t Demuxer::leaveFrames()
{
    const std::int64_t next = frames_->next();
    if (seek(next))
        return kStatusOK;
    const std::int32_t status = restart();
    frames_.reset();
    return status;
}

bool Demuxer::read(AVPacket& packet, std::int32_t& status)
{
    status = kStatusOK;
    if (frames_) {
        const FLACFrames::Result result = frames_->read(*context_->pb, packet);
        packet.stream_index = stream_;
        if (result == FLACFrames::Result::packet)
            return true;
        if (result == FLACFrames::Result::stopped)
            status = leaveFrames();
        if (status != kStatusOK)
            return false;
    }
    for (int failures = 0; failures < 100 && !frames_;) {
        const int result = av_read_frame(context_.get(), &packet);
        if (result >= 0 && packet.stream_index == stream_ && packet.size > 0)
            return true;
        if (result >= 0)
            av_packet_unref(&packet);
        else if (result == AVERROR_EOF)
            break;
        else
            ++failures;
    }
    const int error = context_->pb != nullptr ? context_->pb->error : 0; // the end of the file may hide it
    if (error < 0 && error != AVERROR_EOF)
        status = statusOf(error);
    return false;
}

bool Demuxer::seek(std::int64_t time)
{
    frames_.reset();
    return av_seek_frame(context_.get(), stream_, time, AVSEEK_FLAG_BACKWARD) >= 0;
}

std::int32_t Demuxer::readAt(std::uint64_t position, std::byte* to, std::size_t count, std::size_t& got)
{
    constexpr std::size_t most = 4096;
    got = 0;
    AVIOContext* const file = context_->pb;
    if (file == nullptr || position >= size())
        return kStatusOK;
    const std::int64_t before = avio_tell(file);
    std::int64_t result = avio_seek(file, static_cast<std::int64_t>(position), SEEK_SET);
    if (result >= 0)
        result = avio_read(file, reinterpret_cast<unsigned char*>(to), static_cast<int>(std::min(count, most)));
    avio_seek(file, before, SEEK_SET);
    got = static_cast<std::size_t>(std::max<std::int64_t>(result, 0));
    return result >= 0 || result == AVERROR_EOF ? kStatusOK : PosixErrorToOSErr(AVUNERROR(static_cast<int>(result)));
}

std::uint64_t Demuxer::size() const
{
    const std::int64_t size = context_->pb != nullptr ? avio_size(context_->pb) : 0;
    return size > 0 ? static_cast<std::uint64_t>(size) : 0;
}

std::int32_t Demuxer::restart()
{
    const int stream = stream_;
    const std::int32_t status = open();
    return status == kStatusOK && stream_ != stream ? kStatusIOError : status;
}

} // namespace platform::ffmpeg
