#include "tool/page/PagePreviews.h"

#include "platform/SecureHash.h"
#include "platform/core/HexText.h"
#include "tool/page/PageLink.h"
#include "tool/page/PageWave.h"
#include "tool/page/WaveStream.h"
#include "tool/shared/arguments/ThreadsOption.h"
#include "tool/shared/edits/OutputFile.h"
#include "tool/shared/input/FileByFile.h"

#include <fmt/format.h>

#include <algorithm>
#include <filesystem>
#include <unordered_map>

namespace {

// Enough to know a sound by: 64 kB a second.
constexpr WaveLimits kPreviewLimits = {.sampleRate = 32'000, .channels = 1, .seconds = 10};
constexpr double kBytesPerSecond = 32'000 * 2;
constexpr double kMostEmbeddedBytes = 64e6; // of base64

bool needsPreview(const PageRow& row)
{
    return !row.isSilent() && !isPlayedEverywhere(row.type);
}

// The same sound has the same name, so that a preview that is there need not be made again.
std::string previewName(const PageRow& row)
{
    const std::string what = fmt::format("{}\n{} {} {}", row.place.path(), row.size, row.modified, kBytesPerSecond);
    const platform::SHA256Digest digest = platform::sha256(bytesOf(what));
    std::string name;
    for (const std::byte byte : BytesView(digest).first(12))
        name += fmt::format("{:02x}", static_cast<unsigned>(byte));
    return name + ".wav";
}

std::string soundOf(WaveStream& stream)
{
    std::string sound;
    while (std::ssize(sound) < stream.size())
        sound += stream.read(std::ssize(sound), static_cast<std::size_t>(stream.size()) - sound.size());
    return sound;
}

void makeFolder(const std::string& folder)
{
    std::error_code error;
    std::filesystem::create_directory(folder, error);
    if (error)
        throw Failure("the folder " + folder + ": " + SystemErrorText(error.value()));
}

void requireRoom(const std::vector<PageRow>& rows)
{
    double bytes = 0;
    std::int64_t count = 0;
    for (const PageRow& row : rows)
        if (needsPreview(row)) {
            bytes += std::min(row.durationSeconds.value_or(kPreviewLimits.seconds), kPreviewLimits.seconds) *
                     kBytesPerSecond * 4 / 3;
            ++count;
        }
    if (bytes > kMostEmbeddedBytes)
        throw Failure(
            fmt::format("the previews of {} sounds would take {:.0f} MB, and {:.0f} MB at most are put into a "
                        "page: --previews writes them beside it",
                        count, bytes / 1e6, kMostEmbeddedBytes / 1e6));
}

} // namespace

std::string PagePreviews::folderName() const
{
    return std::filesystem::path(page).stem().string() + "-previews";
}

bool PagePreviews::make(std::vector<PageRow>& rows) const
{
    if (where == Where::none)
        return true;
    if (where == Where::embedded)
        requireRoom(rows);
    FoundFiles found{page, {}};
    std::unordered_map<std::string, PageRow*> rowOf;
    for (PageRow& row : rows)
        if (needsPreview(row)) {
            found.files.push_back({.path = row.place.path(), .problem = {}});
            rowOf.emplace(found.files.back().path, &row);
        }
    if (found.files.empty())
        return true;
    const std::string folder = (std::filesystem::path(page).parent_path() / folderName()).string();
    if (where == Where::beside)
        makeFolder(folder);
    prepareOutputFiles();
    const FileLoop loop{
        .threads = std::min(threadsFor(0), kMostTemporaryFiles), .doing = "making previews", .quiet = quiet};
    const auto start = [&](const FoundFile& file) -> FileRest {
        PageRow& row = *rowOf.at(file.path);
        WaveStream stream(file.path, kPreviewLimits);
        row.previewSeconds = stream.seconds();
        if (where == Where::embedded) {
            row.previewSound = base64(soundOf(stream));
            return [] {};
        }
        const std::string name = previewName(row), out = folder + "/" + name;
        if (!std::filesystem::exists(out))
            writeOutputFile(out, file.path, OutputFile::Existing::replace,
                            [&](const Sink& sink) { sink(soundOf(stream)); });
        row.previewLink = percentEncoded(folderName()) + "/" + name;
        return [] {};
    };
    return forEachFile(found, loop, start, [](const std::string&, const std::string&) {});
}
