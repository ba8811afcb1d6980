#include "loops/VireoLoopChunksManager.h"

#include "platform/core/Status.h"

VireoLoopChunksManager::VireoLoopChunksManager(platform::URLRef fileURL, platform::AudioFile::Permission permission)
    : fileURL_(std::move(fileURL)),
      status_(kStatusFileNotFound)
{
    if (!fileURL_ || !fileURL_->isFileURL())
        return;
    file_ = platform::AudioFile::open(*fileURL_, permission, 0, &status_);
    if (file_)
        audioFileTypeID_ = file_->fileType();
}

VireoLoopChunksManager::VireoLoopChunksManager(std::unique_ptr<platform::AudioFile> file)
    : audioFileTypeID_(file ? file->fileType() : 0),
      status_(file ? kStatusOK : kStatusFileNotFound),
      file_(std::move(file))
{
}

void VireoLoopChunksManager::readChunks(Chunks chunks)
{
    if (!file_)
        return;
    for (const auto& chunk : chunks)
        if (const auto reader = chunk->chunkReader(*file_, audioFileTypeID_))
            reader->readChunk();
}

bool VireoLoopChunksManager::writeChunks(Chunks chunks)
{
    bool written = file_ != nullptr;
    for (const auto& chunk : chunks) {
        if (!file_ || chunk->chunkData().isEmpty())
            continue;
        const auto writer = chunk->chunkWriter(*file_, audioFileTypeID_);
        written = writer && writer->writeChunk() && written;
    }
    return written;
}

bool VireoLoopChunksManager::removeChunks(Chunks chunks)
{
    bool removed = file_ != nullptr;
    for (const auto& chunk : chunks) {
        if (!file_)
            break;
        const auto remover = chunk->chunkRemover(*file_, audioFileTypeID_);
        removed = remover && remover->removeChunk() && removed;
    }
    return removed;
}
