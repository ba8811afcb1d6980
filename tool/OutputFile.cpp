#include "OutputFile.h"

#include "Failure.h"
#include "TemporaryFile.h"

#include <algorithm>
#include <cerrno>
#include <fcntl.h>
#include <filesystem>
#include <sys/stat.h>
#include <unistd.h>

namespace {

void writeWhole(int descriptor, std::string_view bytes)
{
    while (!bytes.empty()) {
        const ssize_t written = ::write(descriptor, bytes.data(), bytes.size());
        if (written < 0 && errno != EINTR)
            throw Failure("the output cannot be written: " + systemErrorText(errno));
        bytes.remove_prefix(static_cast<std::size_t>(std::max<ssize_t>(written, 0)));
    }
}

} // namespace

void writeOutputFile(const std::string& out, const std::string& source, const std::function<void(const Sink&)>& produce)
{
    struct stat original = {}, existing = {};
    const bool exists = ::stat(out.c_str(), &existing) == 0;
    if (exists && S_ISDIR(existing.st_mode))
        throw Failure(out + " is a folder");
    if (exists && ::stat(source.c_str(), &original) == 0 && original.st_dev == existing.st_dev &&
        original.st_ino == existing.st_ino)
        throw Failure("the output would be written over the file itself");
    if (exists && !S_ISREG(existing.st_mode)) {
        const Descriptor device(::open(out.c_str(), O_WRONLY | O_NOCTTY | O_CLOEXEC));
        if (!device)
            throw Failure(out + ": " + systemErrorText(errno));
        produce([&](std::string_view bytes) { writeWhole(device.get(), bytes); });
        return;
    }
    const std::string target = exists ? std::filesystem::canonical(out).string() : out;
    if (exists && ::access(target.c_str(), W_OK) != 0)
        throw Failure(out + ": " + systemErrorText(errno));
    TemporaryFile file(target);
    produce([&](std::string_view bytes) { writeWhole(file.descriptor(), bytes); });
    const mode_t mask = ::umask(0);
    ::umask(mask);
    if (::fchmod(file.descriptor(), exists ? existing.st_mode & 0777 : 0666 & ~mask) != 0)
        throw Failure(systemErrorText(errno));
    file.replace(target);
}
