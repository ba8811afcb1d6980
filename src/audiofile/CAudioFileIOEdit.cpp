// CAudioFileIO: adding and removing chunks.
#include "audiofile/CAudioFileIO.h"

#include "audiofile/ContainerEditor.h"

namespace {

constexpr std::int32_t kNotWritable = -6;
constexpr std::int32_t kNotRemoved = -7;

} // namespace

/// What is still in the write cache belongs to the file; by a header that does not count the samples yet, a walk would
/// end among them; and without a description nobody knows where the samples begin.
std::int32_t CAudioFileIO::PrepareToEdit()
{
    if (mReadFailure != kStatusOK)
        return mReadFailure;
    const std::int32_t status = FlushWCache();
    return status != kStatusOK ? status : UpdateHeader();
}

std::int32_t CAudioFileIO::AddChunk(unsigned int id, const void* data, long size, bool replace)
{
    if (!IsOpenForWriting())
        return kNotWritable;
    if (size < 0 || (data == nullptr && size > 0))
        return kStatusParameterError;
    if (const std::int32_t status = PrepareToEdit(); status != kStatusOK)
        return status;
    ContainerEditor editor(*this, mInfo);
    if (replace && editor.remove(id) != kStatusOK)
        return kNotRemoved;
    return editor.append(id, BytesView(static_cast<const std::byte*>(data), static_cast<std::size_t>(size)));
}

std::int32_t CAudioFileIO::AddChunk(const CChunkData& chunk, bool replace)
{
    return AddChunk(chunk.id, chunk.data.get(), static_cast<long>(chunk.size), replace);
}

std::int32_t CAudioFileIO::AddChunk(unsigned int id, BytesView data, bool replace)
{
    return AddChunk(id, data.data(), static_cast<long>(data.size()), replace);
}

std::int32_t CAudioFileIO::RemoveChunk(unsigned int id)
{
    if (const std::int32_t status = PrepareToEdit(); status != kStatusOK)
        return status;
    return ContainerEditor(*this, mInfo).remove(id);
}
