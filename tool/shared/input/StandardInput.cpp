#include "tool/shared/input/StandardInput.h"

#include "tool/shared/output/Failure.h"

#include <fmt/format.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <fcntl.h>
#include <memory>
#include <string_view>
#include <sys/mman.h>
#include <sys/stat.h>
#include <unistd.h>

namespace {

/// Kept until the process ends, because readers may open it by its path at any time.
struct Input {
    std::string path;
    std::string problem;
    bool isPiped = false;
};

std::string pathOf(int descriptor)
{
    return fmt::format("/proc/self/fd/{}", descriptor);
}

/// Whether it can be opened again, which a file opened for us by another user may forbid.
bool isFileFromItsStart()
{
    struct stat status = {};
    if (::fstat(STDIN_FILENO, &status) != 0 || !S_ISREG(status.st_mode) || ::lseek(STDIN_FILENO, 0, SEEK_CUR) != 0)
        return false;
    const int again = ::open(pathOf(STDIN_FILENO).c_str(), O_RDONLY | O_CLOEXEC);
    if (again >= 0)
        ::close(again);
    return again >= 0;
}

/// The text of an error; empty if there is none.
std::string copyInput(int to)
{
    constexpr std::size_t pieceSize = 1 << 20;
    const auto piece = std::make_unique<std::array<char, pieceSize>>();
    std::int64_t size = 0;
    for (;;) {
        const ssize_t got = ::read(STDIN_FILENO, piece->data(), pieceSize);
        if (got < 0 && errno == EINTR)
            continue;
        if (got < 0)
            return errno == EISDIR ? "is a folder" : SystemErrorText(errno);
        if (got == 0)
            return {};
        size += got;
        if (size > kMostOfStandardInput)
            return fmt::format("more than {} GiB come from standard input, which are kept in memory: name a file",
                               kMostOfStandardInput >> 30);
        for (std::string_view rest(piece->data(), static_cast<std::size_t>(got)); !rest.empty();) {
            const ssize_t written = ::write(to, rest.data(), rest.size());
            if (written < 0 && errno != EINTR)
                return "standard input cannot be kept in memory: " + SystemErrorText(errno);
            rest.remove_prefix(static_cast<std::size_t>(std::max<ssize_t>(written, 0)));
        }
    }
}

Input takeInput()
{
    if (isFileFromItsStart())
        return {pathOf(STDIN_FILENO), {}, false};
    const int memory = ::memfd_create("standard input", MFD_CLOEXEC);
    if (memory < 0)
        return {{}, "standard input cannot be kept in memory: " + SystemErrorText(errno), true};
    std::string problem = copyInput(memory);
    if (!problem.empty())
        ::close(memory);
    return {pathOf(memory), std::move(problem), true};
}

// A failure is final: a second attempt would read the rest of a pipe.
const Input& input()
{
    static const Input taken = takeInput();
    return taken;
}

} // namespace

std::string systemPath(const std::string& name)
{
    if (name != kStandardInput)
        return name;
    if (!input().problem.empty())
        throw Failure(input().problem);
    return input().path;
}

bool isPiped(const std::string& name)
{
    return name == kStandardInput && input().isPiped;
}
