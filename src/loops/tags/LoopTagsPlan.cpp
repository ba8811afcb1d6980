#include "loops/tags/LoopTagsPlan.h"

#include "loops/tags/LoopTagsError.h"
#include "platform/core/SystemErrorText.h"

#include <algorithm>
#include <cerrno>

using platform::Value;

namespace {

const Value* find(const std::vector<LoopTagValue>& tags, const std::string& name)
{
    const auto found = std::ranges::find(tags, name, &LoopTagValue::name);
    return found != tags.end() ? &found->value : nullptr;
}

// Every member once, in the order of `after`, followed by those that only `before` has.
void addDifferences(const std::vector<LoopTagValue>& before, const std::vector<LoopTagValue>& after,
                    std::vector<LoopTagChange>& changes)
{
    for (const auto& [name, to] : after) {
        const Value* const known = find(before, name);
        const Value from = known != nullptr ? *known : Value();
        if (from != to && !(isAbsentLoopTag(from) && isAbsentLoopTag(to)))
            changes.push_back({name, isAbsentLoopTag(from) ? Value() : from, isAbsentLoopTag(to) ? Value() : to});
    }
    for (const auto& [name, from] : before)
        if (find(after, name) == nullptr && !isAbsentLoopTag(from))
            changes.push_back({name, from, {}});
}

Value countOf(const std::vector<VireoLoopTransient>& transients)
{
    return transients.empty() ? Value() : Value(transients.size());
}

std::vector<LoopTagValue> chunkSizes(const LoopTags& tags)
{
    std::vector<LoopTagValue> sizes;
    for (const LoopTags::Chunk& chunk : tags.chunks)
        sizes.push_back({chunk.id, std::to_string(chunk.size) + " bytes"});
    return sizes;
}

} // namespace

std::vector<LoopTagChange> loopTagDifferences(const LoopTags& before, const LoopTags& after)
{
    std::vector<LoopTagChange> changes;
    addDifferences(loopTagValues(before), loopTagValues(after), changes);
    if (before.transients != after.transients)
        changes.push_back({"transients", countOf(before.transients), countOf(after.transients)});
    addDifferences(chunkSizes(before), chunkSizes(after), changes);
    return changes;
}

bool carryOutLoopTagsPlan(const platform::URLRef& file, const LoopTagsPlan& plan, platform::Error* error)
{
    using Permission = platform::AudioFile::Permission;
    {
        auto manager = openLoopFile(file, Permission::readWrite, LoopFiles::waveToo, error);
        if (!manager)
            return false;
        errno = 0;
        if (!plan.write(*manager)) {
            const int systemError = errno;
            return systemError != 0
                       ? platform::fail(error, platform::ErrorDomain::system, systemError, SystemErrorText(systemError))
                       : platform::fail(error, platform::ErrorDomain::status, kStatusIOError,
                                        "its tags cannot be written");
        }
    }
    auto manager = openLoopFile(file, Permission::read, LoopFiles::waveToo, error);
    const auto bytes = manager ? readRawLoopTags(*manager, error) : std::nullopt;
    if (!bytes)
        return false;
    constexpr const char* notAsPlanned = "the tags are not found as they should be after the edit";
    if (*bytes != plan.bytes)
        return failWith(error, LoopTagsError::notAsPlanned, notAsPlanned);
    const auto found = readOwnLoopTags(file, error);
    if (!found)
        return false;
    const auto wrong = loopTagDifferences(*found, plan.after);
    return wrong.empty() ||
           failWith(error, LoopTagsError::notAsPlanned, std::string(notAsPlanned) + ": " + wrong.front().key);
}
