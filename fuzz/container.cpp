// Containers of any bytes, as a memory file: described, checked, walked, searched and edited. Walks must advance within
// the file, and no edit may make it longer by more than it adds.
#include "audiofile/AudioFileCheck.h"
#include "audiofile/CAudioFileIO.h"

#include <cstring>
#include <memory>

namespace {

bool open(CAudioFileIO& file, const std::uint8_t* data, std::size_t size)
{
    auto block = std::make_shared<KTMem>(size);
    if (size > 0)
        std::memcpy(block->data(), data, size);
    file.SetCache(block);
    return file.Open(CFileRef(), kFileIOReadWrite | kFileIOMemory) == kStatusOK;
}

void require(bool condition)
{
    if (!condition)
        __builtin_trap();
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    constexpr FourCC added = fourCC("fuzz");
    CAudioFileIO file;
    if (!open(file, data, size))
        return 0;
    std::vector<platform::ContainerFinding> findings;
    CheckAudioFile(file, findings);
    for (const platform::ContainerFinding& finding : findings)
        require(finding.offset <= size);

    FourCC middle = 0;
    std::int64_t position = -1;
    int count = 0;
    file.ForEachChunk([&](const ChunkEntry& chunk) {
        require(chunk.offset > position && chunk.offset < static_cast<std::int64_t>(size));
        position = chunk.offset;
        middle = count++ % 3 == 1 ? chunk.id : middle;
        return true;
    });
    CChunkData chunk;
    const std::int32_t found = file.FindChunk(middle, chunk);
    require(found != 1 || (chunk.size >= 0 && chunk.size <= static_cast<std::int64_t>(size)));

    file.RemoveChunk(middle);
    require(file.GetEOF() <= static_cast<std::int64_t>(size));
    const char body[] = {'o', 'd', 'd'};
    file.AddChunk(added, body, sizeof body, true);
    file.FindChunk(added);
    file.RemoveChunk(added);
    file.Close();
    return 0;
}
