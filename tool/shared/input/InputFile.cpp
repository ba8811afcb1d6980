#include "tool/shared/input/InputFile.h"

#include "audiofile/ContainerChanges.h"
#include "audiofile/SoundProblem.h"
#include "media/containers/AudioHandle.h"
#include "platform/core/Status.h"
#include "tool/shared/edits/EditProblems.h"
#include "tool/shared/input/CodingWords.h"
#include "tool/shared/input/FileLocation.h"
#include "tool/shared/input/FoundFile.h"
#include "tool/shared/input/StandardInput.h"
#include "tool/shared/output/Failure.h"

#include <algorithm>
#include <cerrno>
#include <filesystem>
#include <sys/stat.h>

using platform::AudioHandle;

void requireRegularFile(const std::string& path)
{
    struct stat status = {};
    if (::stat(systemPath(path).c_str(), &status) != 0)
        throw Failure(SystemErrorText(errno));
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
        throw Failure(SystemErrorText(error.value()));
    return resolved.string();
}

std::string asGiven(const std::string& found, const std::string& given)
{
    std::error_code error;
    const std::filesystem::path path(found), folder = std::filesystem::path(given).parent_path();
    const std::filesystem::path resolved = std::filesystem::canonical(folder.empty() ? "." : folder, error);
    return !found.empty() && resolved == path.parent_path() ? (folder / path.filename()).string() : found;
}

CFileRef referenceTo(const std::string& path)
{
    requireRegularFile(path);
    return CFileRef(fileLocation(path));
}

namespace {

/// Whether both ends of the file, where headers and tables are, can be read from the disk.
bool canBeRead(CFileIO& file)
{
    constexpr std::int64_t most = 1 << 22;
    const std::int64_t length = file.GetEOF();
    const std::int64_t piece = std::min(length, most);
    Bytes bytes(static_cast<std::size_t>(piece));
    return file.Read(bytes.data(), 0, static_cast<long>(piece), nullptr) == kStatusOK &&
           file.Read(bytes.data(), length - piece, static_cast<long>(piece), nullptr) == kStatusOK;
}

} // namespace

void openAudio(CAudioFileIO& file, const std::string& path)
{
    requireOK(file.Open(referenceTo(path), 0));
    if (const std::int32_t status = file.InfoStatus(); status == AudioHandle::kFormatNotSupported)
        requireDecoder(file);
    else if (status != kStatusOK || file.Info().fileType == 0)
        failForSound(path, status);
}

void requireKnown(const std::string& path)
{
    if (!isCalledContainer(path) && isCalledAudio(path)) // then it mostly is
        return;
    CFileIO file;
    requireOK(file.OpenRead(referenceTo(path), 0));
    requireNone(SoundProblem(file));
}

void failForSound(const std::string& path, std::int32_t status)
{
    CFileIO file;
    requireOK(file.OpenRead(referenceTo(path), 0));
    requireNone(SoundProblem(file));
    if (status == kStatusEndOfFile)
        throw Failure("ends within its header");
    if (status == kStatusIOError && canBeRead(file))
        throw Failure("its sound cannot be decoded: it is damaged, or cut short");
    throw Failure(StatusText(status));
}

void requireDecoder(CAudioFileIO& file)
{
    platform::Error error;
    const std::int32_t status = file.OpenDecoder(&error);
    if (status == AudioHandle::kFormatNotSupported && error.code == status)
        throw Failure(containerWord(file.Info()) + ": " + error.description);
    if (status != kStatusOK)
        failForSound(file.GetPath(), status);
}

void openContainer(CAudioFileIO& file, const std::string& path, unsigned int mode)
{
    const ContainerProblem problem = OpenContainer(file, referenceTo(path), mode);
    if (problem.kind == ContainerProblem::Kind::noContainer)
        requireKnown(path); // knows best what is wrong with it
    requireNone(problem);
}

void openChunks(CAudioFileIO& file, const std::string& path)
{
    requireOK(file.OpenForChunks(referenceTo(path), 0));
    if (file.HasChunks())
        return;
    try {
        openContainer(file, path, 0);
    } catch (const Failure& failure) { // says why
        throw OtherKind(failure.what(), isCalledContainer(path) ? OtherKind::Kind::unknown : OtherKind::Kind::audio);
    }
}
