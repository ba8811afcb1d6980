// What the decoders of packets and of files have in common: decoded frames have numbers, and where none come there is
// silence, so that every number stays what it is.
#pragma once

#include "media/decoding/AudioDecoder.h"
#include "media/ffmpeg/DecodedFileHandle.h"
#include "media/ffmpeg/FrameSpans.h"
#include "media/ffmpeg/SoundDigest.h"

#include <cstddef>
#include <optional>

struct AVFrame;

namespace platform::ffmpeg {

class SpanDecoder : public AudioDecoder {
public:
    const StreamDescription& fileFormat() const override { return fileFormat_; }
    const StreamDescription& frameFormat() const override { return frameFormat_; }
    SoundFacts facts() const override { return facts_; }
    std::uint64_t frameCount() const override { return frameCount_; }
    std::uint64_t missingFrames() const override { return missing_.count(); }
    ConvertingReader::Checksum checksum() const override
    {
        return digest_ ? digest_->compare(frameCount_) : ConvertingReader::Checksum::notCompared;
    }
    void compareChecksum() override;
    AudioHandle* file() override { return handle_ ? &*handle_ : nullptr; }
    std::int32_t seek(std::uint64_t frame) override;
    std::int32_t read(std::uint32_t& frames, void* to) override;

protected:
    /// The numbers of the frames that lie in decoded(), from its first on.
    struct Span {
        std::uint64_t start = 0, end = 0;
    };
    static constexpr std::uint64_t kNever = ~std::uint64_t{0};

    /// Decodes the next span; {kNever, kNever} when there is none.
    virtual std::int32_t next(Span& span) = 0;
    /// Goes to where decoding gives `number` as in a run from the start, and sets `number` to one, not after it, from
    /// which on the spans that follow are to be had.
    virtual std::int32_t startAt(std::uint64_t& number) = 0;
    /// How many frames it is better to decode than to start anew.
    virtual std::uint64_t reach(std::uint64_t number) = 0;
    virtual const AVFrame& decoded() const = 0;

    /// What the subclass says of the file before anything is read. `first` is the number of the first frame that is
    /// sound.
    void describe(FourCC fileType, const StreamDescription& fileFormat, const StreamDescription& frameFormat,
                  std::uint64_t first, std::uint64_t frameCount, std::uint64_t packetCount);
    /// What the file says of all its sound, samples of `bits` bits.
    void noteChecksum(const SoundDigest::Value& stated, std::uint32_t bits);
    /// What the subclass knows beside that.
    void note(const SoundFacts& facts) { facts_ = facts; }
    /// What is decoded is no longer there.
    void forget() { isLost_ = true; }

private:
    std::int32_t bring(std::uint64_t number);

    StreamDescription fileFormat_, frameFormat_;
    std::optional<DecodedFileHandle> handle_;
    SoundFacts facts_;
    std::uint64_t first_ = 0;
    std::uint64_t frameCount_ = 0;
    std::uint64_t frame_ = 0; // the one to be read next
    // Numbers from silentFrom_ to the held span are silent.
    Span held_;
    std::uint64_t silentFrom_ = 0;
    bool isLost_ = true;
    std::optional<SoundDigest::Value> stated_;
    std::uint32_t statedBits_ = 0;
    std::optional<SoundDigest> digest_;
    FrameSpans missing_; // that were read as silence
};

} // namespace platform::ffmpeg
