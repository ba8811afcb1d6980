// Small audio files in memory.
#pragma once

#include "audiofile/AudioFileInfo.h"
#include "files/CFileIO.h"

#include <algorithm>
#include <memory>

/// Describes a file with these bytes; `status` may be null.
inline AudioFileInfo describe(BytesView content, std::int32_t* status = nullptr)
{
    auto block = std::make_shared<KTMem>(content.size());
    std::copy(content.begin(), content.end(), block->data());
    CFileIO file;
    file.SetCache(block);
    file.Open(CFileRef(), kFileIOMemory);
    AudioFileInfo info;
    const std::int32_t result = GetAudioFileInfo(file, kFileIOMemory, info);
    if (status != nullptr)
        *status = result;
    return info;
}
