// The chunks of containers, found and read.
#include "c/Calls.h"
#include "c/OpenFile.h"

#include <algorithm>
#include <limits>

namespace {

constexpr std::size_t kFirstChunkSize = 32; // of the first version's ktf_chunk
constexpr std::int32_t kNoContainer = -2;   // of CAudioFileIO::ForEachChunk
constexpr std::int32_t kHeaderUnreadable = -3;

const char* nameOf(const ktf_file* file)
{
    return file != nullptr ? file->name.c_str() : nullptr;
}

ktf_chunk chunkOf(const ChunkEntry& entry)
{
    return {.offset = entry.offset, .body = entry.body, .size = entry.size, .id = entry.id, .reserved = 0};
}

/// Reads what there is in the file of so many bytes.
ktf_status readBytes(CAudioFileIO& file, std::int64_t position, char* to, std::size_t size, std::size_t& got)
{
    while (got < size) {
        const auto piece = static_cast<long>(std::min<std::size_t>(size - got, 1 << 30));
        long actual = 0;
        const std::int32_t status = file.Read(to + got, position + static_cast<std::int64_t>(got), piece, &actual);
        got += static_cast<std::size_t>(std::max(actual, 0L));
        if (status != kStatusOK)
            return status;
    }
    return KTF_OK;
}

} // namespace

ktf_status ktf_each_chunk(ktf_file* file, ktf_chunk_function function, void* context)
{
    if (file == nullptr || function == nullptr)
        return failCallByNull(nameOf(file));
    const char* const name = nameOf(file);
    return guardedCall(name, [&]() -> ktf_status {
        const std::int32_t status = file->file.ForEachChunk([&](const ChunkEntry& entry) {
            const ktf_chunk chunk = chunkOf(entry);
            return function(context, &chunk) == 0;
        });
        switch (status) {
        case kStatusOK:
            return KTF_OK;
        case kNoContainer:
            return failCall(name, KTF_NOT_SUPPORTED, "has no chunks that are known here");
        case kHeaderUnreadable:
            return failCall(name, KTF_END_OF_FILE, "ends within its header");
        default:
            return failCall(name, status);
        }
    });
}

ktf_status ktf_find_chunk(ktf_file* file, std::uint32_t id, ktf_chunk* chunk, std::size_t size)
{
    if (file == nullptr || chunk == nullptr)
        return failCallByNull(nameOf(file));
    const char* const name = nameOf(file);
    return guardedCall(name, [&]() -> ktf_status {
        if (size < kFirstChunkSize)
            return failCall(name, KTF_PARAMETER_ERROR);
        if (!file->file.HasChunks())
            return failCall(name, KTF_NOT_SUPPORTED, "has no chunks that are known here");
        ChunkEntry found;
        const std::int32_t status = file->file.LocateChunk(id, found);
        if (status == 0)
            return failCall(name, KTF_NOT_THERE, "has no chunk \"" + fourCCText(id) + "\"");
        if (status < 0)
            return failCall(name, status == kHeaderUnreadable ? ktf_status{KTF_END_OF_FILE} : status);
        giveStruct(chunk, size, chunkOf(found));
        return KTF_OK;
    });
}

ktf_status ktf_read_chunk(ktf_file* file, const ktf_chunk* chunk, std::int64_t offset, void* buffer, std::size_t size,
                          std::size_t* read)
{
    if (read != nullptr)
        *read = 0;
    if (file == nullptr || chunk == nullptr || buffer == nullptr || read == nullptr)
        return failCallByNull(nameOf(file));
    const char* const name = nameOf(file);
    return guardedCall(name, [&]() -> ktf_status {
        const std::int64_t most = std::numeric_limits<std::int64_t>::max();
        if (offset < 0 || chunk->body < 0 || chunk->size > most - chunk->body)
            return failCall(name, KTF_PARAMETER_ERROR);
        if (offset >= chunk->size)
            return KTF_OK;
        const auto left = static_cast<std::uint64_t>(chunk->size - offset);
        const auto wanted = static_cast<std::size_t>(std::min<std::uint64_t>(size, left));
        const ktf_status status =
            readBytes(file->file, chunk->body + offset, static_cast<char*>(buffer), wanted, *read);
        return status == KTF_OK ? status : failCall(name, status);
    });
}
