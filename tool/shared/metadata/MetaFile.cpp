#include "tool/shared/metadata/MetaFile.h"

#include "tool/shared/input/InputFile.h"
#include "tool/shared/output/Failure.h"

namespace {

bool is(const platform::Error& error, MetadataError code)
{
    return error.domain == kMetadataErrorDomain && error.code == static_cast<std::int64_t>(code);
}

} // namespace

FileMetadata readMetadata(const std::string& path, const MetaGroups& groups)
{
    platform::Error error;
    if (auto metadata = ReadMetadataFields(referenceTo(path), groups, &error))
        return std::move(*metadata);
    if (CAudioFileIO audio; is(error, MetadataError::noAudio))
        openAudio(audio, path); // knows best what is wrong with it
    throw Failure(error.description);
}

HeldMetadata holdMetadata(const std::string& path, const MetaGroups& groups)
{
    platform::Error error;
    if (auto held = HoldMetadata(referenceTo(path), groups, &error))
        return std::move(*held);
    if (CAudioFileIO file; is(error, MetadataError::noChunks))
        openChunks(file, path); // likewise
    throw Failure(error.description);
}
