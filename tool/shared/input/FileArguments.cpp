#include "tool/shared/input/FileArguments.h"

#include "platform/OwnedDescriptor.h"
#include "tool/shared/arguments/UsageError.h"
#include "tool/shared/input/FolderWalk.h"
#include "tool/shared/input/StandardInput.h"
#include "tool/shared/output/Failure.h"
#include "tool/shared/output/ShownName.h"

#include <algorithm>
#include <array>
#include <cerrno>
#include <fcntl.h>
#include <string_view>
#include <unistd.h>

namespace {

// A list may come from a pipe that never ends a line; no path is that long.
constexpr std::size_t kLongestName = 1 << 16;

void addName(std::vector<std::string>& names, std::string_view name)
{
    if (name.size() > kLongestName)
        throw Failure("is no list of files: a name has more than 65536 bytes");
    if (!name.empty()) // here "-" is a file's name
        names.push_back(name == kStandardInput ? "./-" : nameMeantBy(std::string(name)));
}

void addListed(std::vector<std::string>& names, int descriptor, char separator)
{
    std::array<char, 1 << 16> piece;
    std::string begun; // an incomplete name
    for (;;) {
        const ssize_t got = ::read(descriptor, piece.data(), piece.size());
        if (got < 0 && errno == EINTR)
            continue;
        if (got < 0)
            throw Failure(errno == EISDIR ? "is a folder, not a list of files" : SystemErrorText(errno));
        if (got == 0)
            break;
        std::string_view rest(piece.data(), static_cast<std::size_t>(got));
        for (std::size_t end = rest.find(separator); end != rest.npos; end = rest.find(separator)) {
            addName(names, begun.append(rest.substr(0, end)));
            begun.clear();
            rest.remove_prefix(end + 1);
        }
        if (begun.append(rest).size() > kLongestName)
            addName(names, begun);
    }
    addName(names, begun);
}

} // namespace

void requireNoInput(const std::string& name)
{
    if (name == kStandardInput)
        throw UsageError("\"-\" is standard input, and this needs a file's name; a file called so is \"./-\"");
}

bool FileArguments::maybeSeveral() const
{
    return names.size() != 1 || !list.empty() || isFolder(nameMeantBy(names.front()));
}

std::vector<std::string> allNames(const FileArguments& files)
{
    if (files.names.empty() && files.list.empty())
        throw MissingArgument(files.label);
    std::vector<std::string> names;
    for (const std::string& name : files.names)
        names.push_back(nameMeantBy(name));
    if (std::ranges::find(names, kStandardInput) != names.end()) {
        requireNoInput(files.takesInput ? "" : kStandardInput);
        if (files.list == kStandardInput)
            throw UsageError("\"-\" is standard input, which is the list of files already");
    }
    if (files.list.empty())
        return names;
    const bool fromInput = files.list == "-";
    const platform::OwnedDescriptor opened(fromInput ? -1
                                                     : ::open(files.list.c_str(), O_RDONLY | O_NOCTTY | O_CLOEXEC));
    if (!fromInput && !opened)
        throw Failure(SystemErrorText(errno));
    addListed(names, fromInput ? STDIN_FILENO : opened.get(), files.isNulSeparated ? '\0' : '\n');
    if (names.size() == files.names.size())
        throw Failure("names no file");
    return names;
}
