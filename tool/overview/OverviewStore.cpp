#include "tool/overview/OverviewStore.h"

#include "audiofile/ContainerChanges.h"
#include "loops/overview/StoredOverview.h"
#include "media/containers/ContainerHeaders.h"
#include "tool/shared/edits/EditProblems.h"
#include "tool/shared/input/InputFile.h"
#include "tool/shared/output/Failure.h"

#include <fmt/format.h>

#include <algorithm>
#include <cerrno>
#include <cstring>

namespace {

constexpr FourCC kOverviewId = fourCC("LGWV");
constexpr FourCC kCAFOverviewId = fourCC("ovvw");
const EditScope kScope{EditScope::Kind::chunks, {kOverviewId, kCAFOverviewId}, false};

std::unique_ptr<KTMem> storedIn(const std::string& path)
{
    return ReadOverviewFromAudioFile(referenceTo(path), 0);
}

bool areEqual(const KTMem& a, const KTMem& b)
{
    return a.size() == b.size() && std::memcmp(a.data(), b.data(), a.size()) == 0;
}

// CAF stores no overview of silence.
bool isKept(const FileOverview& overview)
{
    const auto points = overview.waveform().points;
    return overview.info().fileType != kCaff || std::any_of(points.begin(), points.end(), [](OverviewPoint point) {
               return point.minimum != 0 || point.maximum != 0;
           });
}

void refuseObjections(const std::string& path, const FileOverview& overview)
{
    CAudioFileIO file;
    openContainer(file, path, 0);
    if (file.Info().frames != overview.info().frames) // of compressed sound
        throw Failure(fmt::format("says that it has {} frames and holds {}: its overview would not be found again",
                                  file.Info().frames, overview.info().frames));
    const FourCC id = overview.info().fileType == kCaff ? kCAFOverviewId : kOverviewId;
    if (const auto objection = objectionToAdding(file, surveyChunks(file, id), id))
        throw Failure(*objection);
}

void write(const std::string& path, FileOverview& overview, bool kept)
{
    requireNone(SettleContainerEnd(referenceTo(path)));
    errno = 0;
    bool stored = false;
    const std::int32_t status = WriteOverviewToAudioFile(referenceTo(path), &overview.block(), 0, &stored);
    if (status != kStatusOK)
        throw Failure(errno != 0 ? SystemErrorText(errno)
                                 : std::string("its overview cannot be stored: ") + StatusText(status));
    const std::unique_ptr<KTMem> found = storedIn(path);
    if (kept ? !stored || !found || !areEqual(*found, overview.block()) : found != nullptr)
        throw Failure("the overview is not found as it should be after the edit");
}

} // namespace

void requireRoomForOverview(const std::string& path)
{
    CAudioFileIO file;
    openContainer(file, path, 0);
}

StoreResult storeOverview(SafeEdit& edit, FileOverview& overview, const EditOptions& options)
{
    StoreResult result;
    result.stored = isKept(overview);
    const std::unique_ptr<KTMem> before = storedIn(edit.target());
    result.changed = result.stored ? !before || !areEqual(*before, overview.block()) : before != nullptr;
    if (!result.changed)
        return result;
    refuseObjections(edit.target(), overview);
    if (!options.dryRun)
        result.backup = edit.apply(kScope, [&](const std::string& path) { write(path, overview, result.stored); });
    return result;
}
