#include "tool/shared/input/InputFile.h"

#include "audiofile/ContainerChanges.h"
#include "platform/core/Status.h"
#include "tool/shared/edits/EditProblems.h"
#include "tool/shared/input/FoundFile.h"
#include "tool/shared/output/Failure.h"

#include <cerrno>
#include <filesystem>
#include <sys/stat.h>

void requireRegularFile(const std::string& path)
{
    struct stat status = {};
    if (::stat(path.c_str(), &status) != 0)
        throw Failure(systemErrorText(errno));
    if (S_ISDIR(status.st_mode))
        throw Failure("is a folder");
    if (!S_ISREG(status.st_mode))
        throw Failure(S_ISFIFO(status.st_mode)   ? "is a FIFO, not a regular file"
                      : S_ISSOCK(status.st_mode) ? "is a socket, not a regular file"
                                                 : "is a device, not a regular file");
}

std::string resolvedPath(const std::string& path)
{
    requireRegularFile(path);
    std::error_code error;
    const std::filesystem::path resolved = std::filesystem::canonical(path, error);
    if (error)
        throw Failure(systemErrorText(error.value()));
    return resolved.string();
}

CFileRef referenceTo(const std::string& path)
{
    requireRegularFile(path);
    // Absolute, since the library expands a "~" at the start of a path, which the shell has done already.
    std::error_code error;
    const std::filesystem::path absolute = std::filesystem::absolute(path, error);
    if (error)
        throw Failure(systemErrorText(error.value()));
    if (platform::String::fromFileSystemRepresentation(absolute.c_str()).isNull())
        throw OtherKind("its path is not valid UTF-8", OtherKind::Kind::unknown);
    CFileRef reference(absolute.c_str(), false);
    if (!reference.IsValid())
        throw Failure("its path cannot be a file URL");
    return reference;
}

void openAudio(CAudioFileIO& file, const std::string& path)
{
    requireOK(file.Open(referenceTo(path), 0));
    if (file.GetEOF() == 0)
        throw OtherKind("is empty", OtherKind::Kind::unknown);
    if (file.Info().fileType == 0)
        throw OtherKind("no audio file known here", OtherKind::Kind::unknown);
}

void requireDecoder(CAudioFileIO& file)
{
    platform::Error error;
    if (const std::int32_t status = file.OpenDecoder(&error); status != kStatusOK)
        throw Failure(error.code == status ? error.description : StatusText(status));
}

void openContainer(CAudioFileIO& file, const std::string& path, unsigned int mode)
{
    requireNone(OpenContainer(file, referenceTo(path), mode));
}

void openChunks(CAudioFileIO& file, const std::string& path)
{
    requireOK(file.OpenForChunks(referenceTo(path), 0));
    if (file.HasChunks())
        return;
    try {
        openContainer(file, path, 0);
    } catch (const Failure& failure) { // which says why
        throw OtherKind(failure.what(), isCalledContainer(path) ? OtherKind::Kind::unknown : OtherKind::Kind::audio);
    }
}
