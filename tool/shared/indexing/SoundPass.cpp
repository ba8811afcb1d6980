#include "tool/shared/indexing/SoundPass.h"

#include "loops/overview/MDOverview.h"
#include "media/containers/AudioHandle.h"
#include "platform/Digest.h"
#include "platform/core/HexText.h"
#include "tool/shared/indexing/SparseFile.h"
#include "tool/shared/indexing/WaveformFold.h"

#include <algorithm>

namespace {

constexpr std::int64_t kPieceSize = 128 * 1024;                                        // stays in the processor's cache
constexpr std::int64_t kFramesPerBlock = std::int64_t{4096} * kOverviewFramesPerPoint; // of an overview in memory

class SoundPassing {
public:
    SoundPassing(CAudioFileIO& file, const std::string& path, const SoundPassWish& wanted)
        : file_(file),
          info_(file.Info()),
          hashesBytes_(info_.dataOffset > 0 && info_.dataSize > 0),
          sparse_(path, info_.fileLength),
          goesOn_(wanted.goesOn)
    {
        const std::int32_t status = file.OpenDecoder();
        decoding_ = status == platform::AudioHandle::kFormatNotSupported ? std::int32_t{kStatusOK} : status;
        canBeRead_ = status == kStatusOK && (info_.compressed || info_.IsLinearPCM()) && info_.frames > 0 &&
                     info_.channels > 0 && info_.channels <= MDOverview::kMostChannels;
        if (wanted.waveform && canBeRead_)
            waveform_.emplace();
        if (wanted.hash && (hashesBytes_ || canBeRead_))
            hash_.emplace(platform::Digest::Kind::sha256);
    }

    SoundPass run()
    {
        SoundPass pass;
        pass.status = decoding_;
        if (pass.status != kStatusOK)
            return pass;
        const bool isOnePass = !info_.compressed && canBeRead_; // of the bytes, for both
        if (waveform_ || (hash_ && !hashesBytes_) || (hash_ && isOnePass))
            pass.status = passFrames();
        if (pass.status == kStatusOK && hash_ && hashesBytes_)
            pass.status = hashBytes(isOnePass ? info_.frames * info_.bytesPerFrame : 0);
        if (pass.status != kStatusOK)
            return pass;
        if (waveform_ && framesPassed_ > 0)
            pass.waveform = waveform_->finish();
        if (hash_ && (hashesBytes_ || framesPassed_ > 0))
            pass.hash = hexText(hash_->finish());
        return pass;
    }

private:
    std::int64_t frameSize() const
    {
        return info_.compressed ? info_.channels * std::int64_t{sizeof(float)} : info_.bytesPerFrame;
    }

    std::int32_t passFrames()
    {
        std::int64_t most = std::max<std::int64_t>(kPieceSize / frameSize(), 1);
        if (most > kOverviewFramesPerPoint)
            most -= most % kOverviewFramesPerPoint;
        piece_.resize(static_cast<std::size_t>(most * frameSize()));
        for (std::int64_t begin = 0; begin < info_.frames && !isAtEnd_; begin += kFramesPerBlock) {
            const std::int64_t frames = std::min(kFramesPerBlock, info_.frames - begin);
            if (const std::int32_t status = passBlock(begin, frames, most); status != kStatusOK)
                return status;
        }
        return kStatusOK;
    }

    /// At most kFramesPerBlock frames.
    std::int32_t passBlock(std::int64_t begin, std::int64_t frames, std::int64_t most)
    {
        if (goesOn_ && !goesOn_())
            return kStatusUserCancelled;
        if (isInHole(begin, frames)) {
            addSilence(frames);
            return kStatusOK;
        }
        KTMem block;
        if (waveform_ && !block.allocate(OverviewBlockSize(frames)))
            return kStatusOutOfMemory;
        MDOverview overview(waveform_ ? &block : nullptr);
        std::int64_t done = 0;
        while (done < frames && !isAtEnd_) {
            std::int64_t got = std::min(most, frames - done);
            if (const std::int32_t status = readPiece(begin + done, got); status != kStatusOK)
                return status;
            pass(overview, done, got);
            done += got;
        }
        overview.Finalize();
        framesPassed_ += done;
        if (waveform_ && done > 0)
            waveform_->add({OverviewPointsOf(block), OverviewPoints(block)});
        return kStatusOK;
    }

    /// Reduces `frames` if decoded sound ends before the length that its file promises.
    std::int32_t readPiece(std::int64_t frame, std::int64_t& frames)
    {
        if (!info_.compressed)
            return file_.Read(piece_.data(), info_.dataOffset + frame * info_.bytesPerFrame,
                              frames * info_.bytesPerFrame, nullptr);
        long got = 0;
        const std::int32_t status = file_.ReadFrames(reinterpret_cast<float*>(piece_.data()), frame, frames, &got);
        isAtEnd_ = got < frames;
        frames = got;
        return status == kStatusEndOfFile ? std::int32_t{kStatusOK} : status;
    }

    void pass(MDOverview& overview, std::int64_t frame, std::int64_t frames)
    {
        if (frames == 0)
            return;
        if (waveform_ && info_.compressed)
            overview.Add(reinterpret_cast<const float*>(piece_.data()), frame, frames, info_.channels);
        else if (waveform_)
            overview.AddStored(piece_.data(), info_.sampleFormat, frame, frames, info_.channels);
        if (hash_ && (!info_.compressed || !hashesBytes_))
            hash_->add(BytesView(piece_).first(static_cast<std::size_t>(frames * frameSize())));
    }

    /// Holes are passed over unless their zeros are to be hashed.
    bool isInHole(std::int64_t frame, std::int64_t frames)
    {
        if (info_.compressed || hash_)
            return false;
        const std::int64_t offset = info_.dataOffset + frame * info_.bytesPerFrame;
        if (offset >= endOfHole_)
            endOfHole_ = sparse_.endOfHole(offset);
        return endOfHole_ - offset >= frames * info_.bytesPerFrame;
    }

    /// Frames of zero bytes, which some formats do not take for silence.
    void addSilence(std::int64_t frames)
    {
        if (!waveform_)
            return;
        if (!silence_) {
            std::ranges::fill(piece_, std::byte{0});
            KTMem block;
            if (!block.allocate(OverviewBlockSize(1)))
                throw std::bad_alloc();
            MDOverview overview(&block);
            overview.AddStored(piece_.data(), info_.sampleFormat, 0, 1, info_.channels);
            overview.Finalize();
            silence_ = *OverviewPointsOf(block);
        }
        framesPassed_ += frames;
        waveform_->add(*silence_, OverviewPointCount(frames));
    }

    /// The bytes of the samples from `done` on.
    std::int32_t hashBytes(std::int64_t done)
    {
        piece_.resize(static_cast<std::size_t>(kPieceSize));
        while (done < info_.dataSize) {
            if (goesOn_ && !goesOn_())
                return kStatusUserCancelled;
            const std::int64_t count = std::min<std::int64_t>(std::ssize(piece_), info_.dataSize - done);
            if (const std::int32_t status = file_.Read(piece_.data(), info_.dataOffset + done, count, nullptr);
                status != kStatusOK)
                return status;
            hash_->add(BytesView(piece_).first(static_cast<std::size_t>(count)));
            done += count;
        }
        return kStatusOK;
    }

    CAudioFileIO& file_;
    const AudioFileInfo& info_;
    const bool hashesBytes_; // they lie in one piece
    SparseFile sparse_;
    const std::function<bool()>& goesOn_;
    std::int64_t endOfHole_ = 0;
    std::int32_t decoding_ = kStatusOK; // why nothing can be decoded, unless nothing here decodes it
    bool canBeRead_ = false;
    bool isAtEnd_ = false;
    std::int64_t framesPassed_ = 0;
    Bytes piece_;
    std::optional<OverviewPoint> silence_;
    std::optional<WaveformFold> waveform_;
    std::optional<platform::Digest> hash_;
};

} // namespace

SoundPass passThroughSound(CAudioFileIO& file, const std::string& path, const SoundPassWish& wanted)
{
    return SoundPassing(file, path, wanted).run();
}
