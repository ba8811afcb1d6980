#include "tool/decode/DecodeTargets.h"

#include "files/AudioFileNames.h"
#include "tool/shared/arguments/UsageError.h"
#include "tool/shared/output/Failure.h"
#include "tool/shared/output/Terminal.h"

#include <fmt/format.h>

#include <cerrno>
#include <cstring>
#include <filesystem>
#include <map>
#include <sys/stat.h>
#include <unistd.h>

namespace {

// By the suite's rule of what an extension is: the number of a take is none.
std::string outputIn(const std::filesystem::path& folder, const std::string& file, const DecodeFormat& format)
{
    const std::string name = std::filesystem::path(file).filename().string();
    std::string stem = name;
    CFileUtilCutExtension(stem.data(), nullptr);
    stem.resize(std::strlen(stem.c_str()));
    return (folder / fmt::format("{}.{}", stem.empty() ? name : stem, format.name)).string();
}

void refuseSharedOutputs(const std::vector<DecodeJob>& jobs)
{
    std::map<std::string, const DecodeJob*> byOutput;
    for (const DecodeJob& job : jobs)
        if (const auto [other, isFirst] = byOutput.try_emplace(job.output, &job); !isFirst)
            throw UsageError(fmt::format("{} and {} would both be decoded to {}", printable(other->second->file),
                                         printable(job.file), printable(job.output)));
}

} // namespace

bool isDecodeFolder(const std::string& out)
{
    std::error_code error;
    return out.ends_with('/') || std::filesystem::is_directory(out, error);
}

std::vector<DecodeJob> decodeJobs(const std::vector<std::string>& files, const std::string& out,
                                  const DecodeFormat& format)
{
    const bool toFolder = out.empty() || isDecodeFolder(out);
    if (files.size() > 1 && !toFolder)
        throw UsageError(out == "-" ? "one file at a time goes to standard output"
                                    : "of several files the output is a folder: \"" + printable(out) +
                                          "\" is none; one to be made ends with \"/\"");
    std::vector<DecodeJob> jobs;
    for (const std::string& file : files)
        jobs.push_back({file, toFolder ? outputIn(out, file, format) : out});
    refuseSharedOutputs(jobs);
    return jobs;
}

DecodeFolder::DecodeFolder(const std::string& out)
{
    if (!out.ends_with('/'))
        return;
    if (::mkdir(out.c_str(), 0777) == 0)
        made_ = out;
    else if (errno != EEXIST)
        throw Failure(systemErrorText(errno));
}

DecodeFolder::~DecodeFolder()
{
    if (!made_.empty())
        ::rmdir(made_.c_str());
}
