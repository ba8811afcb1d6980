// The readers of one sound file: one, and where its sound is compressed and processors are idle, further ones that
// decode the rest of a long read meanwhile.
#pragma once

#include "media/decoding/ConvertingReader.h"

#include <atomic>
#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <sys/stat.h>
#include <vector>

/// Called without the interpreter's lock. One thread at a time.
class SoundReaders {
public:
    /// Frames come as 32-bit floats, of the file's rate and channels or of those given. Of `threads` as many are at
    /// work as there are idle processors. Throws Problem.
    SoundReaders(std::string path, std::optional<double> rate, std::optional<std::uint32_t> channels, unsigned threads);

    const platform::StreamDescription& fileFormat() const { return reader_->fileFormat(); }
    const platform::StreamDescription& clientFormat() const { return client_; }
    std::uint64_t frameCount() const { return reader_->frameCount(); }
    std::uint64_t clientFrameCount() const { return reader_->clientFrameCount(); }
    std::uint64_t missingFrames() const { return reader_->missingFrames(); }

    /// How many frames were read, fewer only where the file ends. Throws Problem, and what heedSignals throws.
    std::int64_t read(float* to, std::int64_t start, std::int64_t wanted);

private:
    using Reader = std::unique_ptr<platform::ConvertingReader>;
    struct Part;

    bool isSameFile() const;
    std::size_t partsFor(std::int64_t wanted) const;
    bool openHelpers(std::size_t count);
    bool readInParts(float* to, std::int64_t start, std::int64_t wanted, std::size_t parts);
    std::int64_t readAlone(float* to, std::int64_t start, std::int64_t wanted);

    std::string path_; // as it was given, for messages
    platform::URLRef location_;
    struct stat status_ = {}; // ahead of the first opening
    unsigned threads_;
    platform::StreamDescription client_;
    Reader reader_;
    std::vector<Reader> helpers_;
};
