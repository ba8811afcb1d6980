#include "tool/chunks/SidecarChunks.h"

#include "audiofile/BusFormats.h"
#include "audiofile/ContainerChanges.h"
#include "files/CTemporaryFile.h"
#include "tool/shared/arguments/CommandLine.h"
#include "tool/shared/edits/EditProblems.h"
#include "tool/shared/edits/EndingSignals.h"
#include "tool/shared/input/InputFile.h"
#include "tool/shared/output/Failure.h"

#include <algorithm>
#include <cerrno>
#include <fcntl.h>
#include <filesystem>
#include <fstream>
#include <sys/stat.h>
#include <unistd.h>

namespace {

constexpr char kMetadataExtension[] = "ktmd";

bool isRegularFile(const std::string& path)
{
    struct stat status = {};
    return !path.empty() && ::stat(path.c_str(), &status) == 0 && S_ISREG(status.st_mode);
}

bool isSameFile(const std::string& a, const std::string& b)
{
    std::error_code error; // set if one of the two does not exist
    return a == b || std::filesystem::equivalent(a, b, error);
}

std::string beside(const std::string& path, const std::string& extension)
{
    CFileRef sidecar = referenceTo(path);
    sidecar.ReplaceExtensionBy(extension);
    return std::string(sidecar);
}

struct SidecarNames {
    std::string metadata, raw; // empty if there is none

    SidecarNames(const std::string& file, const std::string& extension)
        : metadata(beside(file, kMetadataExtension)),
          raw(beside(file, extension))
    {
        if (isSameFile(raw, file) || isSameFile(raw, metadata))
            raw.clear();
        if (isSameFile(metadata, file))
            metadata.clear();
    }
};

/// None if the chunk does not exist; throws Failure if it cannot be read.
std::optional<Bytes> chunkIn(const std::string& container, FourCC id)
{
    CAudioFileIO file;
    openContainer(file, container, 0);
    CChunkData chunk;
    const std::int32_t found = file.FindChunk(id, chunk);
    if (found == 0)
        return std::nullopt;
    if (found != 1)
        throw Failure(container + ": its chunk \"" + fourCCText(id) + "\" cannot be read");
    const BytesView body = chunk.bytes();
    return Bytes(body.begin(), body.end());
}

Bytes contentOf(const std::string& path)
{
    CFileIO file;
    requireOK(file.OpenRead(referenceTo(path), 0));
    Bytes content(static_cast<std::size_t>(file.GetEOF()));
    requireOK(file.Read(content.data(), static_cast<long>(content.size())));
    return content;
}

std::int64_t sizeOf(const std::string& path)
{
    struct stat status = {};
    if (::stat(path.c_str(), &status) != 0)
        throw Failure(SystemErrorText(errno));
    return status.st_size;
}

/// Whether the file is what an interrupted creation leaves: the start of a container, shorter than one.
bool isTorn(const std::string& path)
{
    constexpr std::int64_t kLeast = 20;
    constexpr std::string_view kStart = "FORM";
    if (sizeOf(path) >= kLeast)
        return false;
    const Bytes content = contentOf(path);
    return textOf(content).substr(0, kStart.size()) == kStart.substr(0, content.size());
}

/// Replaces the file's content by an AIFF file without sound that holds the one chunk.
void makeMetadata(const std::string& path, FourCC id, const Bytes& body)
{
    CAudioFileIO file;
    requireOK(file.CreateAndOpenCommon(referenceTo(path), 0, kAudioBusMono, 0, 16, 44100, kAIFF, true));
    requireOK(file.Close());
    requireNone(AddChunkTo(referenceTo(path), {id, body}));
}

[[noreturn]] void failToChange(const std::string& sidecar, const Failure& failure)
{
    throw Failure(sidecar + ": " + failure.what());
}

} // namespace

void addSidecarOption(Verb& verb, std::string& extension)
{
    const auto problem = [](const std::string& text) {
        return text.empty() || text.find('/') != text.npos ? "\"" + text + "\" is no extension" : std::string();
    };
    verb.addText("--sidecar", extension, "Any kind of file: chunks of what is no container lie beside it", problem)
        .label("EXT");
}

bool keepsItsChunks(const std::string& path)
{
    CAudioFileIO file;
    requireOK(file.OpenForChunks(referenceTo(path), 0));
    return file.TakesChunks();
}

SidecarChunk readFromAnywhere(const std::string& path, FourCC id, const std::string& extension)
{
    const std::string file = resolvedPath(path);
    const SidecarNames names(file, extension);
    if (isRegularFile(names.metadata) && !isTorn(names.metadata)) {
        if (!keepsItsChunks(names.metadata))
            return {contentOf(names.metadata), asGiven(names.metadata, path)};
        if (auto body = chunkIn(names.metadata, id))
            return {std::move(*body), asGiven(names.metadata, path)};
    }
    if (isRegularFile(names.raw) && keepsItsChunks(names.raw))
        if (auto body = chunkIn(names.raw, id))
            return {std::move(*body), asGiven(names.raw, path)};
    if (keepsItsChunks(file))
        if (auto body = chunkIn(file, id))
            return {std::move(*body), path};
    throw Failure("has no chunk \"" + fourCCText(id) + "\", and neither have its sidecars");
}

Sidecars::Sidecars(const std::string& path, const std::string& extension, const EditOptions& options)
    : given_(path),
      file_(resolvedPath(path)),
      options_(options)
{
    const SidecarNames names(file_, extension);
    metadata_ = names.metadata;
    raw_ = names.raw;
    options_.inPlace = options_.backup = false; // sidecars are small
}

std::optional<std::string> Sidecars::objection() const
{
    if (!isRegularFile(raw_))
        return std::nullopt;
    CAudioFileIO file;
    requireOK(file.Open(referenceTo(raw_), 0));
    if (file.Info().fileType == 0 && !file.HasChunks())
        return std::nullopt;
    return asGiven(raw_, given_) + " is an audio file of its own, and would be lost as an older copy of the chunk";
}

std::string Sidecars::add(FourCC id, const Bytes& body, bool force)
{
    if (metadata_.empty())
        throw Failure("is no container, and has the name that its metadata sidecar would have");
    try {
        addToMetadata(id, body, force);
    } catch (const Failure& failure) {
        failToChange(asGiven(metadata_, given_), failure);
    }
    rewriteRaw(body);
    return asGiven(metadata_, given_);
}

void Sidecars::addToMetadata(FourCC id, const Bytes& body, bool force)
{
    // If others create it meanwhile, the next attempt finds it.
    while (!isRegularFile(metadata_))
        if (options_.dryRun || createMetadata(id, body))
            return;
    SafeEdit edit(metadata_, options_);
    std::optional<std::string> objection;
    const bool torn = isTorn(edit.target());
    const bool isWhole = !torn && keepsItsChunks(edit.target());
    if (isWhole) {
        CAudioFileIO file;
        openContainer(file, edit.target(), 0);
        objection = objectionToAdding(file, surveyChunks(file, id), id);
    } else if (!torn) {
        objection = "is no metadata sidecar, and would be lost";
    }
    if (objection && !force)
        throw Failure(*objection + "; --force does it all the same");
    if (options_.dryRun)
        return;
    if (isWhole)
        edit.apply(objection ? EditScope::wholeFile() : EditScope::chunk(id), [&](const std::string& path) {
            requireNone(AddChunkTo(referenceTo(path), {id, body, true, force}));
        });
    else
        edit.apply(EditScope::wholeFile(), [&](const std::string& path) { makeMetadata(path, id, body); });
}

/// False if another process was faster.
bool Sidecars::createMetadata(FourCC id, const Bytes& body)
{
    const FileAccess access =
        accessForWriting(metadata_, platform::FileCoordinator::WritingOptions::none, options_.waiting());
    struct stat sound = {};
    if (::stat(file_.c_str(), &sound) != 0)
        throw Failure(SystemErrorText(errno));
    removeTemporaryFilesAtEndingSignals();
    CTemporaryFile made;
    requireNone(made.Create(metadata_));
    makeMetadata(made.Path(), id, body);
    // Grants the sidecar the readers of the sound; the same owner if possible.
    if (::fchown(made.Descriptor(), sound.st_uid, sound.st_gid) != 0 && errno != EPERM)
        throw Failure(SystemErrorText(errno));
    if (::fchmod(made.Descriptor(), sound.st_mode & 0666) != 0)
        throw Failure(SystemErrorText(errno));
    requireNone(made.Commit());
    const FileProblem problem = made.Publish(metadata_);
    if (problem.kind == FileProblem::Kind::system && problem.systemError == EEXIST)
        return false;
    requireNone(problem);
    requireNone(made.CommitFolder());
    return true;
}

void Sidecars::rewriteRaw(const Bytes& body)
{
    if (!isRegularFile(raw_))
        return;
    try {
        SafeEdit edit(raw_, options_);
        if (!options_.dryRun)
            edit.apply(EditScope::wholeFile(), [&](const std::string& path) {
                CFileIO file;
                requireOK(file.Open(referenceTo(path), kFileIOReadWrite));
                requireOK(file.SetEOF(0));
                requireOK(file.Write(body.data(), 0, static_cast<long>(body.size())));
                requireOK(file.Close());
            });
    } catch (const Failure& failure) {
        failToChange(asGiven(raw_, given_), failure);
    }
}

void Sidecars::removeRaw()
{
    if (!isRegularFile(raw_) || options_.dryRun)
        return;
    const FileAccess access =
        accessForWriting(raw_, platform::FileCoordinator::WritingOptions::none, options_.waiting());
    if (::unlink(raw_.c_str()) != 0 && errno != ENOENT)
        throw Failure(asGiven(raw_, given_) + ": " + SystemErrorText(errno));
    synchronizeFolderOf(raw_);
}

SidecarRemoval Sidecars::remove(FourCC id)
{
    SidecarRemoval removal;
    if (isRegularFile(metadata_)) {
        SafeEdit edit(metadata_, options_);
        if (!isTorn(edit.target()) && keepsItsChunks(edit.target()))
            removal.count = surveyOf(edit.target(), id).count;
        if (removal.count > 0) {
            removal.where = asGiven(metadata_, given_);
            if (!options_.dryRun)
                edit.apply(EditScope::chunk(id), [&](const std::string& path) {
                    requireNone(RemoveChunksFrom(referenceTo(path), id, removal.count));
                });
        }
    }
    if (isRegularFile(raw_)) {
        ++removal.count;
        removal.where = asGiven(raw_, given_);
        removeRaw();
    }
    return removal;
}
