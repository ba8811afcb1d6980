#include "loops/tags/LoopTagsEdit.h"

#include "loops/tags/LoopTagsCopy.h"
#include "loops/tags/LoopTagsError.h"

#include <filesystem>
#include <functional>

namespace {

using Planner = std::function<std::optional<LoopTagsPlan>(const LoopTags& before, const platform::URLRef& file)>;

platform::URLRef urlOf(const std::string& path)
{
    std::error_code ignored; // the path is empty then, and has no URL
    return platform::URL::createWithFileSystemBytes(std::filesystem::absolute(path, ignored).string(), false);
}

bool failFor(platform::Error* error, std::int32_t status, const std::string& description)
{
    return platform::fail(error, platform::ErrorDomain::status, status, description);
}

// `error` describes problems of the copy, so that the edit needs no status of its own.
std::optional<EditedLoopTags> edited(const std::string& path, const Planner& planner,
                                     const CoordinatedEditOptions& options, platform::Error* error)
{
    CCoordinatedEdit edit;
    if (const FileProblem problem = edit.Begin(path, options)) {
        failFor(error, problem.Status(), problem.Description());
        return std::nullopt;
    }
    const platform::URLRef file = urlOf(edit.Target());
    const auto before = readOwnLoopTags(file, error);
    auto plan = before ? planner(*before, file) : std::nullopt;
    if (!plan)
        return std::nullopt;
    EditedLoopTags result{std::move(plan->changes), std::move(plan->notKept), {}};
    if (result.changes.empty())
        return result;
    platform::Error why;
    const FileProblem problem = edit.Apply(EditScope::ofLoopTags(), [&](const std::string& copy) {
        return carryOutLoopTagsPlan(urlOf(copy), *plan, &why) ? kStatusOK : kStatusIOError;
    });
    if (problem) {
        if (!why.domain.empty() && error != nullptr)
            *error = why;
        else if (edit.Difference())
            failFor(error, edit.Difference().Status(), edit.Difference().Description());
        else
            failFor(error, problem.Status(), problem.Description());
        return std::nullopt;
    }
    result.backup = edit.Backup();
    return result;
}

} // namespace

std::optional<EditedLoopTags> setLoopTags(const std::string& path, std::span<const LoopTagAssignment> assignments,
                                          const CoordinatedEditOptions& options, platform::Error* error)
{
    const auto plan = [&](const LoopTags& before, const platform::URLRef& file) {
        return planLoopTagAssignments(before, file, assignments, error);
    };
    return edited(path, plan, options, error);
}

std::optional<EditedLoopTags> removeLoopTags(const std::string& path, const CoordinatedEditOptions& options,
                                             platform::Error* error)
{
    const auto plan = [&](const LoopTags& before, const platform::URLRef& file) {
        return planLoopTagsRemoval(before, file, error);
    };
    return edited(path, plan, options, error);
}

std::optional<EditedLoopTags> copyLoopTags(const std::string& from, const std::string& path,
                                           const CoordinatedEditOptions& options, platform::Error* error)
{
    const std::shared_ptr<const LoopSource> source = readLoopSource(urlOf(from), error);
    if (source == nullptr)
        return std::nullopt;
    if (source->isEmpty()) {
        failWith(error, LoopTagsError::badValue, from + " has no loop tags");
        return std::nullopt;
    }
    const auto plan = [&](const LoopTags& before, const platform::URLRef& file) {
        return planLoopTagsCopy(source, before, file, error);
    };
    return edited(path, plan, options, error);
}
