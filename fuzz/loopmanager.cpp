// The chunks manager on any AIFF or CAF bytes, with the file in memory: all kinds are read, one is changed, and all are
// written back and read again. The first byte chooses what is changed, the second the write from which the disk fails.
// Whatever happens, the file opens afterwards and its samples are what they were.
#include "MemoryDisk.h"

#include "loops/VireoLoopChunksManager.h"

namespace {

using State = std::optional<Bytes>;

/// What a chunk comes down to in a file of the type, however often it is written and read; none when it is not written.
State settled(const VireoLoopChunkData& data, FourCC type)
{
    if (data.isEmpty())
        return std::nullopt;
    if (const auto* transients = dynamic_cast<const VireoLoopTransientChunkData*>(&data)) {
        VireoLoopTransientChunkData read; // in CAF bytes: the AIFF form holds the time, which passes
        read.setChunkData(*transients->chunkDataForAudioFileType(type), type);
        return read.cafDataRepresentation();
    }
    State bytes = data.chunkDataForAudioFileType(type);
    VireoLoopCombinedTagsChunkData combined;
    if (dynamic_cast<const VireoLoopCombinedTagsChunkData*>(&data) != nullptr)
        for (int round = 0; round < 3; ++round) { // a text without a NUL loses a byte, and half a character is dropped
            combined.setChunkData(*bytes, type);
            bytes = combined.chunkDataForAudioFileType(type);
        }
    return bytes;
}

void change(VireoLoopBaseChunk& chunk, std::uint8_t length)
{
    const Bytes bytes(length, std::byte{'c'});
    if (auto* combined = dynamic_cast<VireoLoopCombinedTaggingChunk*>(&chunk))
        combined->tags().setDataDictionary({{VireoLoopCombinedTagsChunkDataGenreKey, std::string(length % 60, 'g')},
                                            {VireoLoopCombinedTagsChunkDataBeatCountKey, length}});
    else if (auto* transients = dynamic_cast<VireoLoopTransientChunk*>(&chunk))
        transients->transients().setTransients(std::vector<VireoLoopTransient>(length, {1, 7}));
    else if (auto* info = dynamic_cast<VireoLoopFileInfoChunk*>(&chunk))
        info->fileInfo().setDataDictionary({{VireoLoopFileInfoChunkDataTitleKey, "t" + std::string(length, 't')},
                                            {VireoLoopFileInfoChunkDataCommentsKey, "c" + std::string(length, 'c')}});
    else
        chunk.chunkData().setChunkData(bytes, fourCC("caff"));
}

void editAll(std::uint8_t choice)
{
    const VireoLoopChunkList list = VireoLoopChunks::Empty(), read = VireoLoopChunks::Empty();
    VireoLoopChunksManager manager(fileURL());
    const FourCC type = manager.audioFileTypeID();
    manager.readChunks(list);
    change(*list[choice % list.size()], choice);
    if (choice >= 250)
        manager.removeChunks(list);
    if (!manager.writeChunks(list) || (type != fourCC("AIFF") && type != fourCC("caff")))
        return;
    VireoLoopChunksManager(fileURL(), platform::AudioFile::Permission::read).readChunks(read);
    for (std::size_t i = 0; i < list.size(); ++i) {
        const bool isInFile = type == fourCC("caff") || i == 0 || list[i]->aifChunkID() != 0;
        // Where nothing was written, the file keeps what it had, of which nothing could be read.
        const State wanted = isInFile ? settled(list[i]->chunkData(), type) : std::nullopt;
        if (wanted && settled(read[i]->chunkData(), type) != wanted)
            std::abort();
    }
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    if (size < 2)
        return 0;
    useMemory();
    fileBytes.assign(data + 2, data + size);
    auto opened = open();
    if (!opened)
        return 0;
    const Audio before = audioOf(*opened);
    opened.reset();
    callsLeft = data[1] < 64 ? data[1] : 1 << 20;
    editAll(data[0]);
    opened = open();
    if (!opened || audioOf(*opened) != before)
        std::abort();
    return 0;
}
