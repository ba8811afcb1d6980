// The overview of one audio file: computed from its samples, or the one that is stored in it.
#pragma once

#include "audiofile/AudioFileInfo.h"
#include "platform/core/KTMem.h"
#include "tool/overview/WaveformOutline.h"

#include <memory>
#include <string>

/// Owns the overview block. Throws Failure where a file has no overview.
class FileOverview {
public:
    /// Reads all samples, with a progress bar where that lasts. Says so on standard error, unless `quiet`, when the
    /// file ends ahead of its sample data; the overview is then of what is there.
    static FileOverview computed(const std::string& path, bool quiet);
    static FileOverview stored(const std::string& path);

    /// The points, for as long as this lives.
    Waveform waveform() const;
    KTMem& block() { return *block_; }
    const AudioFileInfo& info() const { return info_; }

private:
    AudioFileInfo info_;
    std::unique_ptr<KTMem> block_;
};
