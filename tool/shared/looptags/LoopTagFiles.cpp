#include "tool/shared/looptags/LoopTagFiles.h"

#include "loops/tags/LoopTagsError.h"
#include "tool/shared/input/FileLocation.h"
#include "tool/shared/input/InputFile.h"

namespace {

LoopTags tagsOf(const std::string& path, std::optional<LoopTags> (*read)(const platform::URLRef&, platform::Error*))
{
    platform::Error error;
    auto tags = read(fileLocation(path), &error);
    if (!tags)
        failForTags(path, error);
    return std::move(*tags);
}

} // namespace

void failForTags(const std::string& path, const platform::Error& error)
{
    const bool isOurs = error.domain == kLoopTagsErrorDomain;
    const auto is = [&](LoopTagsError code) { return isOurs && error.code == static_cast<std::int64_t>(code); };
    if (is(LoopTagsError::otherFile))
        throw OtherKind(error.description, OtherKind::Kind::audio);
    if (!isOurs || is(LoopTagsError::unknownFile))
        requireRegularFile(path); // knows best what is wrong with it
    if (is(LoopTagsError::unknownFile)) {
        requireKnown(path);
        throw OtherKind(error.description, OtherKind::Kind::unknown);
    }
    throw Failure(error.description);
}

LoopTags loopTagsOf(const std::string& path)
{
    return tagsOf(path, readLoopTags);
}

LoopTags ownLoopTagsOf(const std::string& path)
{
    return tagsOf(path, readOwnLoopTags);
}

void writeTags(const std::string& path, const LoopTagsPlan& plan)
{
    if (platform::Error error; !carryOutLoopTagsPlan(fileLocation(path), plan, &error))
        failForTags(path, error);
}
