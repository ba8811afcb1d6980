#include "OutputFile.h"

#include "Failure.h"

#include <algorithm>
#include <cerrno>
#include <fcntl.h>
#include <filesystem>
#include <unistd.h>

namespace {

[[noreturn]] void failToWrite(int error)
{
    throw Failure("the output cannot be written: " + systemErrorText(error));
}

[[noreturn]] void failSinceItExists(const std::string& out)
{
    throw Failure(out + " exists; --force replaces it");
}

void requireFolderOf(const std::string& out)
{
    const std::string folder = std::filesystem::path(out).parent_path().string();
    struct stat found = {};
    if (!folder.empty() && ::stat(folder.c_str(), &found) != 0)
        throw Failure("the folder " + folder + ": " + systemErrorText(errno));
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
    if (exists && ::stat(source.c_str(), &original) == 0 && original.st_dev == found.st_dev &&
        original.st_ino == found.st_ino)
        throw Failure("the output would be written over the file itself");
    if (exists && !S_ISREG(found.st_mode)) {
        device_ = Descriptor(::open(out.c_str(), O_WRONLY | O_NOCTTY | O_CLOEXEC));
        if (!device_)
            throw Failure(out + ": " + systemErrorText(errno));
        return;
    }
    if (exists && existing == Existing::refuse)
        failSinceItExists(out);
    requireFolderOf(out);
    if (exists)
        target_ = replaced_ = std::filesystem::canonical(out).string();
    if (exists && ::access(target_.c_str(), W_OK) != 0)
        throw Failure(out + ": " + systemErrorText(errno));
    const mode_t mask = ::umask(0);
    ::umask(mask);
    mode_ = exists ? found.st_mode & 0777 : 0666 & ~mask;
    file_.emplace(target_);
}

void OutputFile::write(std::string_view bytes)
{
    while (!bytes.empty()) {
        const ssize_t written = ::write(file_ ? file_->descriptor() : device_.get(), bytes.data(), bytes.size());
        if (written < 0 && errno != EINTR)
            failToWrite(errno);
        bytes.remove_prefix(static_cast<std::size_t>(std::max<ssize_t>(written, 0)));
    }
}

void OutputFile::rewrite(std::int64_t offset, std::string_view bytes)
{
    while (!bytes.empty()) {
        const ssize_t written = ::pwrite(file_->descriptor(), bytes.data(), bytes.size(), offset);
        if (written < 0 && errno != EINTR)
            failToWrite(errno);
        offset += std::max<ssize_t>(written, 0);
        bytes.remove_prefix(static_cast<std::size_t>(std::max<ssize_t>(written, 0)));
    }
}

void OutputFile::finish()
{
    if (!file_)
        return;
    if (::fchmod(file_->descriptor(), mode_) != 0)
        throw Failure(systemErrorText(errno));
    if (existing_ == Existing::replace)
        file_->replace(target_);
    else if (!file_->publish(target_)) // it came meanwhile
        failSinceItExists(out_);
}

void writeOutputFile(const std::string& out, const std::string& source, const std::function<void(const Sink&)>& produce)
{
    OutputFile file(out, source, OutputFile::Existing::replace);
    produce([&](std::string_view bytes) { file.write(bytes); });
    file.finish();
}
