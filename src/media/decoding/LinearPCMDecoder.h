// Linear PCM as a decoder: the packets of the audio-file service are frames.
#pragma once

#include "media/decoding/AudioDecoder.h"
#include "media/userdata/AudioFileService.h"

#include <memory>

namespace platform {

class LinearPCMDecoder final : public AudioDecoder {
public:
    /// Samples that are no whole number of bytes are read as the bytes that hold them, which they fill from the top.
    static bool canDecode(const StreamDescription& fileFormat);
    /// canDecode() must accept the file's format.
    LinearPCMDecoder(std::unique_ptr<AudioFile> file, const StreamDescription& fileFormat, std::uint64_t frameCount);

    const StreamDescription& fileFormat() const override { return fileFormat_; }
    const StreamDescription& frameFormat() const override { return frameFormat_; }
    std::uint64_t frameCount() const override { return frameCount_; }
    AudioHandle* file() override { return file_.get(); }
    std::int32_t seek(std::uint64_t frame) override;
    std::int32_t read(std::uint32_t& frames, void* to) override;

private:
    std::unique_ptr<AudioFile> file_;
    StreamDescription fileFormat_;
    StreamDescription frameFormat_;
    std::uint64_t frameCount_;
    std::uint64_t frame_ = 0;
};

/// Sets the sample format of frames in memory; false unless they are interleaved, packed linear PCM of a supported
/// sample format with 1 to 65,535 channels.
bool isPackedPCM(const StreamDescription& format);

} // namespace platform
