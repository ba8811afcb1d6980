#include "media/userdata/AudioFileService.h"

#include "media/containers/ContainerTraits.h"
#include "media/containers/NewContainer.h"
#include "media/userdata/AudioFileImplementation.h"
#include "media/userdata/UserDataEditor.h"
#include "platform/SystemCalls.h"
#include "platform/core/Status.h"

#include <algorithm>
#include <cstdio>
#include <functional>
#include <limits>

namespace platform {

namespace {

std::int32_t statusOfError()
{
    const std::int32_t status = PosixErrorToOSErr();
    return status != kStatusOK ? status : kStatusIOError;
}

} // namespace

AudioFile::AudioFile(std::unique_ptr<Implementation> implementation)
    : AudioHandle(Kind::file),
      implementation_(std::move(implementation))
{
}
AudioFile::~AudioFile() = default;

std::unique_ptr<AudioFile> AudioFile::open(const URL& url, Permission permission, FourCC, std::int32_t* status)
{
    std::int32_t ignored;
    std::int32_t& result = status != nullptr ? *status : ignored;
    auto file = openAny(url, permission, result);
    if (file && !file->implementation_->layout.container.traits->isEditable) {
        result = kStatusParameterError;
        return nullptr;
    }
    return file;
}

std::unique_ptr<AudioFile> AudioFile::openToRead(const URL& url, std::int32_t* status)
{
    std::int32_t ignored;
    return openAny(url, Permission::read, status != nullptr ? *status : ignored);
}

std::unique_ptr<AudioFile> AudioFile::openToRead(const ByteSource& bytes, std::uint64_t length, std::int32_t* status)
{
    auto implementation = std::make_unique<Implementation>(bytes, length);
    const std::int32_t result = implementation->scan(length);
    if (status != nullptr)
        *status = result;
    return result == kStatusOK ? std::unique_ptr<AudioFile>(new AudioFile(std::move(implementation))) : nullptr;
}

std::unique_ptr<AudioFile> AudioFile::openAny(const URL& url, Permission permission, std::int32_t& result)
{
    const std::string& path = url.posixPath();
    if (path.empty()) {
        result = kStatusParameterError;
        return nullptr;
    }
    FileStatus found;
    const OpenFor access = permission == Permission::read ? OpenFor::reading : OpenFor::readingAndWriting;
    // Few paths contain links; one that does not is opened for reading with one call less.
    int descriptor =
        permission == Permission::read ? systemCalls().openFileWithoutLinks(path.c_str(), access, &found) : -1;
    if (descriptor < 0)
        descriptor = systemCalls().openFile(path.c_str(), access, &found);
    if (descriptor < 0) {
        result = statusOfError();
        return nullptr;
    }
    auto implementation = std::make_unique<Implementation>(descriptor, permission);
    result = implementation->scan(static_cast<std::uint64_t>(std::max<std::int64_t>(found.size, 0)));
    if (result != kStatusOK)
        return nullptr;
    return std::unique_ptr<AudioFile>(new AudioFile(std::move(implementation)));
}

std::unique_ptr<AudioFile> AudioFile::create(const URL& url, FourCC fileType, const StreamDescription& format,
                                             std::int32_t* status, std::uint32_t flags)
{
    std::int32_t ignored;
    std::int32_t& result = status != nullptr ? *status : ignored;
    const std::string& path = url.posixPath();
    // Samples begin on a page; the filler before them is room for user data.
    const Bytes content = headerOf({.fileType = fileType,
                                    .format = format,
                                    .speakers = std::nullopt,
                                    .isCounted = false,
                                    .hasReservation = true,
                                    .dataOffset = 4096});
    if (path.empty() || content.empty()) {
        result = kStatusParameterError;
        return nullptr;
    }
    int descriptor = systemCalls().createFile(path.c_str(), 0666);
    result = descriptor < 0 ? statusOfError() : kStatusOK;
    const bool isThere = result == kStatusDuplicateName && (flags & eraseExisting);
    if (isThere) {
        descriptor = systemCalls().openFile(path.c_str(), OpenFor::readingAndWriting, nullptr);
        result = descriptor < 0 ? statusOfError() : kStatusOK;
    }
    if (result != kStatusOK)
        return nullptr;
    {
        const FileBytes bytes(descriptor);
        result = isThere ? bytes.setLength(0) : kStatusOK;
        if (result == kStatusOK)
            result = bytes.write(0, content.data(), content.size());
    }
    std::unique_ptr<AudioFile> file;
    if (result == kStatusOK)
        file = open(url, Permission::readWrite, fileType, &result);
    if (!file && !isThere)
        std::remove(path.c_str()); // ours: it was created just now, or creating it failed
    return file;
}

FourCC AudioFile::fileType() const
{
    return implementation_->layout.fileType();
}

std::int32_t AudioFile::Implementation::scan()
{
    std::uint64_t length = 0;
    const std::int32_t status = bytes.length(length);
    isStale = true;
    return status == kStatusOK ? scan(length) : status;
}

std::int32_t AudioFile::Implementation::scan(std::uint64_t fileLength)
{
    description.reset();
    itemsType.reset();
    const std::int32_t status = scanChunks(window.emplace(bytes, fileLength), layout);
    isStale = status != kStatusOK;
    return status;
}

std::int32_t AudioFile::Implementation::refresh()
{
    if (!isWritable && !isStale)
        return kStatusOK;
    std::uint64_t length = 0;
    if (const std::int32_t status = bytes.length(length); status != kStatusOK)
        return status;
    return isStale || length != layout.fileLength ? scan(length) : kStatusOK;
}

// User data.

const std::vector<std::uint32_t>& AudioFile::Implementation::itemsOf(FourCC type)
{
    if (itemsType != type) {
        items.clear();
        if (type != ContainerLayout::filler)
            for (std::size_t i = 0; i < layout.chunks.size(); ++i)
                if (layout.chunks[i].id == type)
                    items.push_back(static_cast<std::uint32_t>(i));
        itemsType = type;
    }
    return items;
}

/// Reuses what the scan has read.
std::int32_t AudioFile::Implementation::readBody(const Chunk& chunk, void* to, std::size_t count) const
{
    const std::uint64_t position = layout.bodyOf(chunk);
    const std::byte* held = isWritable ? nullptr : window->held(position, count);
    if (held == nullptr)
        return bytes.read(position, to, count);
    std::copy_n(held, count, static_cast<std::byte*>(to));
    return kStatusOK;
}

std::int32_t AudioFile::Implementation::findItem(FourCC type, std::uint32_t index, const Chunk*& chunk)
{
    if (const std::int32_t status = refresh(); status != kStatusOK)
        return status;
    const auto& found = itemsOf(type);
    if (index >= found.size())
        return kStatusParameterError;
    chunk = &layout.chunks[found[index]];
    return kStatusOK;
}

std::int32_t AudioFile::Implementation::checkEdit(FourCC type) const
{
    if (type == 0 || roleOfChunk(layout.kind(), type) != ChunkRole::userData)
        return kStatusParameterError;
    return isWritable ? kStatusOK : kStatusWritePermission;
}

std::int32_t AudioFile::Implementation::setItem(FourCC type, std::uint32_t index, BytesView body)
{
    std::int32_t status = checkEdit(type);
    if (status == kStatusOK)
        status = scan();
    if (status != kStatusOK)
        return status;
    const auto& found = itemsOf(type);
    if (index > found.size())
        return kStatusParameterError;
    UserDataEditor editor(bytes, layout);
    status = index < found.size() ? editor.replace(found[index], body) : editor.append(type, body);
    isStale = true;
    return status;
}

std::int32_t AudioFile::Implementation::removeItems(FourCC type, std::span<const std::uint32_t> indices)
{
    std::int32_t status = checkEdit(type);
    if (status == kStatusOK)
        status = scan();
    if (status != kStatusOK)
        return status;
    const auto& found = itemsOf(type);
    if (std::adjacent_find(indices.begin(), indices.end(), std::greater_equal<>()) != indices.end() ||
        (!indices.empty() && indices.back() >= found.size()))
        return kStatusParameterError;
    std::vector<std::size_t> chunks;
    for (const std::uint32_t index : indices)
        chunks.push_back(found[index]);
    status = UserDataEditor(bytes, layout).remove(chunks);
    isStale = true;
    return status;
}

std::int32_t AudioFile::countUserData(FourCC type, std::uint32_t& count)
{
    count = 0;
    // Chunks that may be edited are scanned anew: others may have changed them, and enumeration begins here.
    const std::int32_t status = implementation_->isWritable ? implementation_->scan() : implementation_->refresh();
    if (status != kStatusOK)
        return status;
    count = static_cast<std::uint32_t>(implementation_->itemsOf(type).size());
    return kStatusOK;
}

std::int32_t AudioFile::userDataSize(FourCC type, std::uint32_t index, std::uint32_t& size)
{
    size = 0;
    const Chunk* chunk = nullptr;
    if (const std::int32_t status = implementation_->findItem(type, index, chunk); status != kStatusOK)
        return status;
    if (chunk->size > std::numeric_limits<std::uint32_t>::max())
        return kStatusFileTooBig;
    size = static_cast<std::uint32_t>(chunk->size);
    return kStatusOK;
}

std::int32_t AudioFile::userData(FourCC type, std::uint32_t index, std::uint32_t& size, void* data)
{
    const Chunk* chunk = nullptr;
    const std::uint32_t capacity = std::exchange(size, 0);
    if (data == nullptr && capacity > 0)
        return kStatusParameterError;
    if (const std::int32_t status = implementation_->findItem(type, index, chunk); status != kStatusOK)
        return status;
    const auto count = static_cast<std::uint32_t>(std::min<std::uint64_t>(capacity, chunk->size));
    const std::int32_t status = implementation_->readBody(*chunk, data, count);
    if (status == kStatusOK)
        size = count;
    return status;
}

std::int32_t AudioFile::setUserData(FourCC type, std::uint32_t index, std::uint32_t size, const void* data)
{
    if (data == nullptr && size > 0)
        return kStatusParameterError;
    return implementation_->setItem(type, index, {static_cast<const std::byte*>(data), size});
}

std::int32_t AudioFile::removeUserData(FourCC type, std::uint32_t index)
{
    return implementation_->removeItem(type, index);
}

std::int32_t AudioFile::removeUserData(FourCC type, std::span<const std::uint32_t> indices)
{
    return implementation_->removeItems(type, indices);
}

} // namespace platform
