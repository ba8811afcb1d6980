// VireoLoopChunksManager opens one file and applies a list of loop chunks to it: reads, writes or removes them all.
#pragma once

#include "loops/VireoLoopChunks.h"
#include "media/userdata/AudioFileService.h"
#include "platform/URL.h"

#include <memory>
#include <span>

/// Reads, writes and removes loop chunks of one open file, which it owns. Does nothing when the file could not be
/// opened, and for files that are neither AIFF nor CAF.
class KT_EXPORT VireoLoopChunksManager {
public:
    /// Chunk objects of a caller.
    using Chunks = std::span<const std::unique_ptr<VireoLoopBaseChunk>>;

    /// Opens an existing file, by default for reading and writing; reading alone needs less.
    explicit VireoLoopChunksManager(platform::URLRef fileURL, platform::AudioFile::Permission permission =
                                                                  platform::AudioFile::Permission::readWrite);

    /// Takes a file over that the audio-file service has open, of any kind; fileURL() is null.
    explicit VireoLoopChunksManager(std::unique_ptr<platform::AudioFile> file);

    /// The status of opening: 0, or why the manager does nothing.
    std::int32_t status() const { return status_; }
    /// The file, as it was given; null for an open file that was taken over.
    const platform::URLRef& fileURL() const { return fileURL_; }
    /// "AIFF", "AIFC", "WAVE" or "caff", or the service's type of an open file; 0 until it is known.
    FourCC audioFileTypeID() const { return audioFileTypeID_; }
    /// The open file, owned by the manager; null when there is none.
    platform::AudioFile* audioFile() { return file_.get(); }

    /// Fills the data objects of the chunks that the file has; others stay as they are.
    void readChunks(Chunks chunks);
    /// Writes the chunks; empty ones are skipped, not removed. False when one could not be written, as in files that
    /// are neither AIFF nor CAF; the others still are.
    bool writeChunks(Chunks chunks);
    /// Removes the chunks from the file, empty or not. False when one could not be removed; the others still are.
    bool removeChunks(Chunks chunks);

private:
    platform::URLRef fileURL_;
    FourCC audioFileTypeID_ = 0;
    std::int32_t status_ = 0;
    std::unique_ptr<platform::AudioFile> file_;
};
