// The overview of one audio file: computed from its samples, or the one that is stored in it.
#pragma once

#include "platform/core/KTMem.h"
#include "tool/overview/WaveformOutline.h"
#include "tool/shared/input/SoundReader.h"

#include <memory>
#include <string>

/// Owns the overview block. Throws Failure where a file has no overview.
class FileOverview {
public:
    /// Without points.
    static FileOverview described(const SoundReader& sound);
    /// Reads all samples, with a progress bar where that lasts and it is asked for.
    static FileOverview computed(SoundReader& sound, bool showsProgress);
    static FileOverview stored(const std::string& path);

    /// What people should know, when the file ends ahead of its sample data and the overview is of what is there.
    const std::string& note() const { return note_; }

    /// The points, which there must be, for as long as this lives.
    Waveform waveform() const;
    /// For people.
    std::string duration() const;
    KTMem& block() { return *block_; }
    const AudioFileInfo& info() const { return info_; }

private:
    AudioFileInfo info_;
    std::string note_;
    std::unique_ptr<KTMem> block_;
};
