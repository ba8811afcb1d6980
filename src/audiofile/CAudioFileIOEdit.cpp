// CAudioFileIO: adding and removing chunks.
#include "audiofile/CAudioFileIO.h"

#include "audiofile/ContainerEditor.h"
#include "audiofile/ContainerTail.h"

namespace {

constexpr std::int32_t kNotWritable = -6;
constexpr std::int32_t kNotRemoved = -7;
constexpr std::int64_t kCAFOpenEnd = -1;

} // namespace

/// Writes out the cached bytes and the header before a walk: a header that does not count the samples yet would end the
/// walk among them. A file that could not be described is refused, because nobody knows where its samples begin.
std::int32_t CAudioFileIO::PrepareToEdit()
{
    if (readFailure_ != kStatusOK)
        return readFailure_;
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
    ContainerEditor editor(*this, info_);
    if (replace && editor.remove(id) != kStatusOK)
        return kNotRemoved;
    return editor.append(id, BytesView(static_cast<const std::byte*>(data), static_cast<std::size_t>(size)),
                         endAtOpen_.get());
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
    return ContainerEditor(*this, info_).remove(id);
}

std::int32_t CAudioFileIO::RemoveAllChunks(unsigned int id)
{
    if (const std::int32_t status = PrepareToEdit(); status != kStatusOK)
        return status;
    return ContainerEditor(*this, info_).remove(id, ContainerEditor::OfCAF::all);
}

std::int32_t CAudioFileIO::PrepareToAppend()
{
    if (!IsOpenForWriting())
        return kStatusWritePermission;
    if (const std::int32_t status = PrepareToEdit(); status != kStatusOK)
        return status;
    ContainerTail tail;
    if (const std::int32_t status = ExamineContainerTail(*this, tail); status != kStatusOK)
        return status;
    if (tail.fault != ContainerTail::Fault::none)
        return kStatusParameterError;
    std::int32_t status = kStatusOK;
    if (tail.extent.id == kCaff && tail.last.id == kData)
        status = SettleOpenEnd(tail.last);
    if (status != kStatusOK)
        return status;
    const bool lacksPad = tail.stray == -1 && (tail.last.size & 1) != 0;
    if (tail.stray < 0 && !lacksPad) // AddChunk gives a last chunk that was cut short its real size
        return kStatusOK;
    if (lacksPad) {
        const char pad = 0;
        status = Write(&pad, tail.end - 1, sizeof pad);
    } else if (tail.stray > 0) {
        status = SetEOF(tail.end);
    }
    if (status == kStatusOK)
        info_.fileLength = tail.end;
    return status;
}

/// Gives a "data" chunk that extends to the end of the file the size that it has there.
std::int32_t CAudioFileIO::SettleOpenEnd(const ChunkEntry& data)
{
    const std::int64_t position = data.offset + std::int64_t{offsetof(CAFChunkHeader, size)};
    std::int64_t stored = 0;
    if (const std::int32_t status = Read(&stored, position, sizeof stored, nullptr); status != kStatusOK)
        return status;
    if (inByteOrder(stored, std::endian::big) != kCAFOpenEnd)
        return kStatusOK;
    stored = inByteOrder(data.size, std::endian::big);
    return Write(&stored, position, sizeof stored);
}
