// The overview of one audio file, computed from its samples or stored in it.
#pragma once

#include "platform/core/KTMem.h"
#include "tool/shared/input/SoundReader.h"
#include "tool/shared/waveform/WaveformOutline.h"

#include <memory>
#include <string>

/// Owns the overview block. Throws Failure if a file has no overview.
class FileOverview {
public:
    /// Has no points.
    static FileOverview described(const SoundReader& sound);
    /// Reads all samples; shows a progress bar if that is requested and reading takes long.
    static FileOverview computed(SoundReader& sound, bool showsProgress);
    static FileOverview stored(const std::string& path);

    /// A note if the file ends before its sample data does, so that the overview covers only a part.
    const std::string& note() const { return note_; }

    /// The points, which must exist; valid during the lifetime of this object.
    Waveform waveform() const;
    /// In words.
    std::string duration() const;
    KTMem& block() { return *block_; }
    const AudioFileInfo& info() const { return info_; }

private:
    AudioFileInfo info_;
    std::string note_;
    std::unique_ptr<KTMem> block_;
};
