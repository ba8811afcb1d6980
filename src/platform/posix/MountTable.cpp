#include "platform/posix/MountTable.h"

#include <charconv>
#include <fstream>
#include <vector>

#include <fcntl.h>
#include <sys/stat.h>

namespace platform {

namespace {

/// Replaces "\ooo", which stands for space, tab, newline and backslash.
std::string withoutOctals(std::string_view text)
{
    std::string plain;
    for (std::size_t i = 0; i < text.size(); ++i) {
        unsigned code = 0;
        if (text[i] == '\\' && i + 3 < text.size()) {
            const char* digits = text.data() + i + 1;
            if (std::from_chars(digits, digits + 3, code, 8).ptr == digits + 3) {
                plain += static_cast<char>(code);
                i += 3;
                continue;
            }
        }
        plain += text[i];
    }
    return plain;
}

std::vector<std::string_view> fieldsOf(std::string_view line)
{
    std::vector<std::string_view> fields;
    while (!line.empty()) {
        const std::size_t space = std::min(line.find(' '), line.size());
        fields.push_back(line.substr(0, space));
        line.remove_prefix(std::min(space + 1, line.size()));
    }
    return fields;
}

} // namespace

std::optional<Mount> mountFromLine(std::string_view line)
{
    // id, parent, device, root, folder, options, optional fields, "-", file system, source, options
    constexpr std::size_t folder = 4, firstOptional = 6;
    const std::vector<std::string_view> fields = fieldsOf(line);
    Mount mount;
    if (fields.size() <= firstOptional ||
        std::from_chars(fields[0].data(), fields[0].data() + fields[0].size(), mount.id).ec != std::errc())
        return std::nullopt;
    for (std::size_t i = firstOptional; i + 1 < fields.size(); ++i)
        if (fields[i] == "-") {
            mount.folder = withoutOctals(fields[folder]);
            mount.fileSystem = withoutOctals(fields[i + 1]);
            return mount;
        }
    return std::nullopt;
}

std::optional<Mount> mountOf(const char* path)
{
#ifdef STATX_MNT_ID
    struct statx found = {};
    if (statx(AT_FDCWD, path, AT_NO_AUTOMOUNT, STATX_MNT_ID, &found) != 0 || (found.stx_mask & STATX_MNT_ID) == 0)
        return std::nullopt;
    std::ifstream table("/proc/self/mountinfo");
    for (std::string line; std::getline(table, line);)
        if (auto mount = mountFromLine(line); mount && mount->id == found.stx_mnt_id)
            return mount;
#endif
    return std::nullopt;
}

} // namespace platform
