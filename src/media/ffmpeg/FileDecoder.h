// Decodes files in which only FFmpeg finds its way: FLAC, Ogg, WMA and others.
#pragma once

#include "media/ffmpeg/Checkpoints.h"
#include "media/ffmpeg/Codec.h"
#include "media/ffmpeg/CorrectionFile.h"
#include "media/ffmpeg/Demuxer.h"
#include "media/ffmpeg/MusepackInfo.h"
#include "media/ffmpeg/SpanDecoder.h"

#include <memory>
#include <optional>
#include <span>

namespace platform::ffmpeg {

class FileDecoder final : public SpanDecoder {
public:
    static std::unique_ptr<FileDecoder> open(const char* path, std::int32_t& status);

private:
    /// Source of the frame numbers.
    enum class Numbers {
        byTime,     // timestamps count frames; a run is consecutive except for gaps
        byPosition, // packets are consecutive blocks of one size
        byCount,    // all frames from the start were decoded
    };

    /// The search for two checkpoints after a seek: at the first the decoder starts to build its state, at the second
    /// frames get their numbers.
    struct CheckpointSearch {
        std::size_t met = 0;
        std::int64_t end = 0; // time by which both must have been met
        bool hasFailed = false;
    };

    FileDecoder(Demuxer demuxer, std::unique_ptr<CorrectionFile> corrections);
    std::int32_t begin();
    std::int32_t describeAsDecoded();
    std::uint64_t promisedFrames(std::uint64_t count, double sampleRate) const;
    std::int32_t countFrames(std::uint64_t first, std::uint64_t& count);
    std::int32_t countPackets(std::uint64_t framesPerPacket, std::uint64_t& count);
    bool endOfLastPackets(std::span<const Packet> last, std::uint64_t framesPerPacket, std::uint64_t& count);
    std::int32_t countFromStart(std::uint64_t& count);
    std::int32_t decodeRest(std::uint64_t& end);
    std::int64_t startOf(const AVFrame& frame) const;
    std::int32_t restart();
    bool canLand() const;
    std::int64_t timeOf(std::uint64_t number) const;
    bool land(std::uint64_t number, std::uint64_t back, std::uint64_t needed);
    bool landAtCheckpoint(std::uint64_t number);
    std::int32_t decodeNext(Span& span);
    bool tellsNumber(const AVFrame& frame) const;
    std::int32_t sendPacket();
    bool numberFrame(const AVFrame& frame, Span& span);
    void numberPacket(AVPacket& packet);
    void numberByTime(AVPacket& packet);
    void numberByPosition(AVPacket& packet);
    void meetCheckpoint(AVPacket& packet);
    void passOver();

    std::int32_t next(Span& span) override;
    std::int32_t startAt(std::uint64_t& number) override;
    std::uint64_t reach(std::uint64_t number) override;
    const AVFrame& decoded() const override { return codec_->frame(); }

    Demuxer demuxer_;
    std::unique_ptr<CorrectionFile> corrections_; // null if there are none
    std::optional<MusepackInfo> musepack_;        // of such files, if the header has them
    std::unique_ptr<Codec> codec_;
    Packet packet_;
    std::uint64_t sent_ = 0; // packets sent since the start
    Numbers numbers_ = Numbers::byCount;
    std::int64_t base_ = 0;            // time or position of frame 0
    std::uint64_t framesPerBlock_ = 0; // for blocks of one size
    bool isPaged_ = false;             // Ogg
    bool endsWithTime_ = false;        // the file states where the sound ends; the last packet may go further
    std::int64_t page_ = -1;           // the page that the last seek led to; negative until known
    bool isChained_ = false;           // decoding must begin at the start
    std::uint64_t warmUp_ = 0;         // frames to decode and drop before the wanted one
    std::uint64_t limit_ = kNever;     // no frame has this number or a higher one
    std::uint64_t expected_ = 0;       // number of the next frame, unless its packet tells
    std::uint64_t length_ = 0;         // length of the last span
    bool isNumbered_ = true;           // `expected_` is valid; otherwise frames are dropped
    std::optional<Span> pending_;      // decoded already, returned next
    Checkpoints checkpoints_;
    bool isCounting_ = false;
    CheckpointSearch search_;
};

/// As DecoderModule::openFile.
std::unique_ptr<AudioDecoder> openFile(const char* path, std::int32_t& status);

} // namespace platform::ffmpeg
