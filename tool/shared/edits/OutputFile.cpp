#include "tool/shared/edits/OutputFile.h"

#include "files/FileCopy.h"
#include "platform/SystemCalls.h"
#include "tool/shared/edits/EditProblems.h"
#include "tool/shared/edits/EndingSignals.h"
#include "tool/shared/input/StandardInput.h"
#include "tool/shared/output/Failure.h"

#include <algorithm>
#include <cerrno>
#include <fcntl.h>
#include <filesystem>
#include <unistd.h>

namespace {

[[noreturn]] void failToWrite(int error)
{
    throw Failure("the output cannot be written: " + SystemErrorText(error));
}

[[noreturn]] void failSinceItExists(const std::string& out)
{
    throw Failure(out + " exists; --force replaces it");
}

// The mask can only be read by changing it, which other threads must not notice.
mode_t creationMask()
{
    static const mode_t mask = [] {
        const mode_t found = ::umask(0);
        ::umask(found);
        return found;
    }();
    return mask;
}

void requireFolderOf(const std::string& out)
{
    const std::string folder = std::filesystem::path(out).parent_path().string();
    struct stat found = {};
    if (!folder.empty() && ::stat(folder.c_str(), &found) != 0)
        throw Failure("the folder " + folder + ": " + SystemErrorText(errno));
}

} // namespace

OutputFile::OutputFile(const std::string& out, const std::string& source, Existing existing)
    : out_(out),
      target_(out),
      existing_(existing)
{
    struct stat original = {}, found = {};
    const bool exists = ::stat(out.c_str(), &found) == 0;
    if (exists && S_ISDIR(found.st_mode))
        throw Failure(out + " is a folder");
    if (exists && ::stat(systemPath(source).c_str(), &original) == 0 && original.st_dev == found.st_dev &&
        original.st_ino == found.st_ino)
        throw Failure("the output would be written over the file itself");
    if (exists && !S_ISREG(found.st_mode)) {
        device_ = platform::OwnedDescriptor(::open(out.c_str(), O_WRONLY | O_NOCTTY | O_CLOEXEC));
        if (!device_)
            throw Failure(out + ": " + SystemErrorText(errno));
        return;
    }
    if (exists && existing == Existing::refuse)
        failSinceItExists(out);
    requireFolderOf(out);
    if (exists)
        target_ = replaced_ = std::filesystem::canonical(out).string();
    if (exists && ::access(target_.c_str(), W_OK) != 0)
        throw Failure(out + ": " + SystemErrorText(errno));
    mode_ = 0666 & ~creationMask();
    removeTemporaryFilesAtEndingSignals();
    file_ = std::make_unique<CTemporaryFile>();
    const BeforeTheEnd notTooLate;
    requireNone(file_->Create(target_));
}

void OutputFile::write(std::string_view bytes)
{
    while (!bytes.empty()) {
        const ssize_t written = ::write(file_ ? file_->Descriptor() : device_.get(), bytes.data(), bytes.size());
        if (written < 0 && errno != EINTR)
            failToWrite(errno);
        bytes.remove_prefix(static_cast<std::size_t>(std::max<ssize_t>(written, 0)));
        letTheDiskBegin(static_cast<std::size_t>(std::max<ssize_t>(written, 0)));
    }
}

/// Starts writing to the disk early, so that the commit at the end is quick. The commit reports errors.
void OutputFile::letTheDiskBegin(std::size_t written)
{
    constexpr std::int64_t worthIt = 8 << 20;
    length_ += static_cast<std::int64_t>(written);
    if (!file_ || length_ - begun_ < worthIt)
        return;
    ::sync_file_range(file_->Descriptor(), begun_, length_ - begun_, SYNC_FILE_RANGE_WRITE);
    begun_ = length_;
}

void OutputFile::rewrite(std::int64_t offset, std::string_view bytes)
{
    while (!bytes.empty()) {
        const ssize_t written = ::pwrite(file_->Descriptor(), bytes.data(), bytes.size(), offset);
        if (written < 0 && errno != EINTR)
            failToWrite(errno);
        offset += std::max<ssize_t>(written, 0);
        bytes.remove_prefix(static_cast<std::size_t>(std::max<ssize_t>(written, 0)));
    }
}

/// Until here all bytes are in a temporary file beside the target. A signal that ends the process removes it; if the
/// process is killed, the next output of the same name does. Now it is flushed and takes its name:
///
/// - A new name: by a rename, which replaces nothing unless that was asked for.
/// - The name of a file: the new file gets its attributes and replaces it by a rename, so the name leads to the whole
/// old content or to the whole new one.
/// - The name of a file with further names, or with attributes that cannot be given to another: the content is written
/// into that file. Only this way can leave half of it when the process dies; writeInto makes sure of the room first.
///
/// Last the folder is flushed, so that the name survives a power failure.
void OutputFile::finish()
{
    if (!file_)
        return;
    if (::fchmod(file_->Descriptor(), mode_) != 0)
        throw Failure(SystemErrorText(errno));
    requireNone(file_->Commit());
    if (const platform::OwnedDescriptor replaced = openReplaced())
        takePlaceOf(replaced);
    else if (existing_ == Existing::replace)
        requireNone(file_->Replace());
    else
        publish();
    if (const FileProblem problem = file_->CommitFolder())
        throw Failure("the output is written, but its folder cannot be committed to storage: " +
                      SystemErrorText(problem.systemError));
}

platform::OwnedDescriptor OutputFile::openReplaced() const
{
    return platform::OwnedDescriptor(
        replaced_.empty()
            ? -1
            : platform::systemCalls().openFile(replaced_.c_str(), platform::OpenFor::readingAndWriting, nullptr));
}

void OutputFile::publish()
{
    const FileProblem problem = file_->Publish(target_);
    if (problem.kind == FileProblem::Kind::system && problem.systemError == EEXIST) // created meanwhile
        failSinceItExists(out_);
    requireNone(problem);
}

void OutputFile::takePlaceOf(const platform::OwnedDescriptor& replaced)
{
    platform::FileStatus status;
    platform::FileAttributes attributes;
    if (!platform::systemCalls().status(replaced.get(), &status) ||
        !platform::fileAttributes(replaced.get(), attributes))
        failToWrite(errno);
    // Writes into a file that has other names, or an owner that the new file cannot get, instead of replacing it.
    if (status.links > 1 || CopyFileAttributes(replaced.get(), attributes, file_->Descriptor(), KeptTimes::accessOnly))
        return writeInto(replaced);
    requireNone(file_->Replace());
}

// Reserves the room while the old content is still there.
void OutputFile::writeInto(const platform::OwnedDescriptor& replaced)
{
    struct stat status = {};
    if (::fstat(file_->Descriptor(), &status) != 0)
        failToWrite(errno);
    if (::fallocate(replaced.get(), FALLOC_FL_KEEP_SIZE, 0, std::max<off_t>(status.st_size, 1)) != 0 && errno == ENOSPC)
        failToWrite(errno);
    if (::ftruncate(replaced.get(), 0) != 0)
        failToWrite(errno);
    requireNone(CopyFileContent(file_->Descriptor(), replaced.get()));
    synchronize(replaced.get());
}

void prepareOutputFiles()
{
    creationMask();
    removeTemporaryFilesAtEndingSignals();
}

void requireFreeName(const std::string& out, OutputFile::Existing existing)
{
    struct stat found = {};
    if (existing == OutputFile::Existing::refuse && ::stat(out.c_str(), &found) == 0 && S_ISREG(found.st_mode))
        failSinceItExists(out);
}

void writeOutputFile(const std::string& out, const std::string& source, OutputFile::Existing existing,
                     const std::function<void(const Sink&)>& produce)
{
    OutputFile file(out, source, existing);
    produce([&](std::string_view bytes) { file.write(bytes); });
    file.finish();
}
