#include "tool/decode/DecodeTargets.h"

#include "files/AudioFileNames.h"
#include "tool/shared/input/FolderWalk.h"
#include "tool/shared/output/Failure.h"

#include <fmt/format.h>

#include <cerrno>
#include <cstring>
#include <map>
#include <sys/stat.h>
#include <unistd.h>

namespace {

// Follows the suite's rule for extensions, by which a take number is none.
std::string outputName(const std::string& name, const DecodeFormat& format)
{
    std::string stem = name;
    CFileUtilCutExtension(stem.data(), nullptr);
    stem.resize(std::strlen(stem.c_str()));
    return fmt::format("{}.{}", stem.empty() ? name : stem, format.name);
}

std::string resolvedFolder(const std::string& folder)
{
    std::error_code error;
    const std::string path = std::filesystem::canonical(folder, error).string();
    return error ? "" : path + "/";
}

} // namespace

bool isDecodeFolder(const std::string& out)
{
    return out.ends_with('/') || isFolder(out);
}

DecodeTargets::DecodeTargets(const std::string& out, const DecodeFormat& format)
    : out_(out),
      format_(format),
      toFolder_(out.empty() || isDecodeFolder(out))
{
}

DecodeTargets::~DecodeTargets()
{
    for (auto folder = made_.rbegin(); folder != made_.rend(); ++folder)
        ::rmdir(folder->c_str());
}

std::string DecodeTargets::nameOf(const FoundFile& file) const
{
    if (!toFolder_)
        return out_;
    const std::filesystem::path below = file.path.substr(file.folderLength); // may begin with a slash
    const std::filesystem::path folder = file.isBelowFolder() ? below.relative_path().parent_path() : "";
    return (out_ / folder / outputName(below.filename().string(), format_)).string();
}

bool DecodeTargets::isEarlierOutput(const FoundFile& file) const
{
    if (!file.isBelowFolder() || out_.empty())
        return false;
    static const std::string outputs = resolvedFolder(out_);
    return !outputs.empty() && resolvedFolder(std::filesystem::path(file.path).parent_path()).starts_with(outputs);
}

std::vector<FoundFile> DecodeTargets::plan(const std::vector<std::string>& names)
{
    std::vector<FoundFile> files;
    std::map<std::string, std::string> sources;
    FolderWalk walk(names, [&](FoundFile file) {
        if (isEarlierOutput(file))
            return true;
        // Other files beside the sound, such as pictures, are skipped when their turn comes.
        if (toFolder_ && file.problem.empty() && (!file.isBelowFolder() || isCalledAudio(file.path))) {
            const std::string output = nameOf(file);
            if (const auto [other, isFirst] = sources.try_emplace(output, file.path); !isFirst) {
                shared_.insert({other->second, file.path});
                reportFailure(file.path,
                              fmt::format("{} would be decoded to {} too; neither is", other->second, output));
            }
        }
        files.push_back(std::move(file));
        return true;
    });
    walk.run();
    return files;
}

std::string DecodeTargets::outputOf(const FoundFile& file)
{
    std::string output = nameOf(file);
    if (shared_.contains(file.path))
        throw ToldFailure(fmt::format("is not the only file that would be decoded to {}", output));
    if (toFolder_) {
        const std::lock_guard guard(mutex_);
        makeFolder(std::filesystem::path(output).parent_path());
    }
    return output;
}

void DecodeTargets::makeFolder(const std::filesystem::path& folder)
{
    if (folder.empty() || isFolder(folder))
        return;
    makeFolder(folder.parent_path());
    if (::mkdir(folder.c_str(), 0777) == 0)
        made_.push_back(folder);
    else if (errno != EEXIST)
        throw Failure("the folder " + folder.string() + ": " + SystemErrorText(errno));
}
