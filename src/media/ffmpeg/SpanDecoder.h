// Common base of the packet and file decoders: frames are numbered, and missing ones are silence, so that no number
// shifts.
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
    /// The numbers of the frames in decoded(), from its first on.
    struct Span {
        std::uint64_t start = 0, end = 0;
    };
    static constexpr std::uint64_t kNever = ~std::uint64_t{0};

    /// Decodes the next span; {kNever, kNever} at the end.
    virtual std::int32_t next(Span& span) = 0;
    /// Moves to where decoding `number` gives the same frames as a run from the start, and sets `number` to the first
    /// number, not after it, from which the following spans are available.
    virtual std::int32_t startAt(std::uint64_t& number) = 0;
    /// How many frames ahead decoding on is better than starting anew.
    virtual std::uint64_t reach(std::uint64_t number) = 0;
    virtual const AVFrame& decoded() const = 0;

    /// Called by the subclass before anything is read. `first` is the number of the first frame that belongs to the
    /// sound.
    void describe(FourCC fileType, const StreamDescription& fileFormat, const StreamDescription& frameFormat,
                  std::uint64_t first, std::uint64_t frameCount, std::uint64_t packetCount);
    /// Sets the digest that the file states for all of its sound, in samples of `bits` bits.
    void noteChecksum(const SoundDigest::Value& stated, std::uint32_t bits);
    /// Sets further facts.
    void note(const SoundFacts& facts) { facts_ = facts; }
    /// Marks decoded frames as gone.
    void forget() { isLost_ = true; }

private:
    std::int32_t bring(std::uint64_t number);

    StreamDescription fileFormat_, frameFormat_;
    std::optional<DecodedFileHandle> handle_;
    SoundFacts facts_;
    std::uint64_t first_ = 0;
    std::uint64_t frameCount_ = 0;
    std::uint64_t frame_ = 0; // next frame to read
    // Frames from silentFrom_ to the held span are silent.
    Span held_;
    std::uint64_t silentFrom_ = 0;
    bool isLost_ = true;
    std::optional<SoundDigest::Value> stated_;
    std::uint32_t statedBits_ = 0;
    std::optional<SoundDigest> digest_;
    FrameSpans missing_; // frames read as silence
};

} // namespace platform::ffmpeg
