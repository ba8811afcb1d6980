// The tags of loops, under the names that `ktfiles tags --json` has.
#include "binding/Bindings.h"
#include "binding/Editing.h"
#include "binding/Interpreter.h"
#include "binding/Location.h"
#include "binding/Problem.h"
#include "binding/Values.h"

#include "loops/tags/LoopTags.h"
#include "loops/tags/LoopTagsError.h"
#include "loops/tags/LoopTagsSetting.h"

#include <pybind11/stl.h>

#include <algorithm>
#include <array>
#include <unistd.h>
#include <variant>

namespace py = pybind11;

namespace {

LoopTags readTags(const std::string& path)
{
    platform::Error error;
    std::optional<LoopTags> tags = readLoopTags(locationOf(path), &error);
    if (!tags)
        throwProblem(path, error);
    return std::move(*tags);
}

py::list listOf(const std::vector<SamplerTags::Loop>& loops)
{
    py::list made;
    for (const SamplerTags::Loop& loop : loops) {
        py::dict one;
        one[keyFrom("firstFrame")] = loop.firstFrame;
        one[keyFrom("lastFrame")] = loop.lastFrame;
        one[keyFrom("kind")] = loopKindName(loop.kind);
        if (loop.playCount > 0)
            one[keyFrom("playCount")] = loop.playCount;
        one[keyFrom("source")] = fourCCText(loop.source);
        made.append(std::move(one));
    }
    return made;
}

py::list listOf(const std::vector<SamplerTags::Marker>& markers)
{
    py::list made;
    for (const SamplerTags::Marker& marker : markers) {
        py::dict one;
        one[keyFrom("frame")] = marker.frame;
        if (marker.frames > 0)
            one[keyFrom("frames")] = marker.frames;
        if (!marker.name.empty())
            one[keyFrom("name")] = textFrom(marker.name);
        one[keyFrom("source")] = fourCCText(marker.source);
        made.append(std::move(one));
    }
    return made;
}

py::list listOf(const std::vector<VireoLoopTransient>& transients)
{
    const py::handle type = keyFrom("type"), frame = keyFrom("frame"); // once: there may be millions
    py::list made;
    for (const VireoLoopTransient& transient : transients) {
        py::dict one;
        one[type] = transient.transientType();
        one[frame] = transient.frame();
        made.append(std::move(one));
    }
    return made;
}

py::list listOf(const std::vector<LoopTags::Chunk>& chunks)
{
    py::list made;
    for (const LoopTags::Chunk& chunk : chunks) {
        py::dict one;
        one[keyFrom("id")] = textFrom(chunk.id);
        one[keyFrom("size")] = chunk.size;
        made.append(std::move(one));
    }
    return made;
}

py::dict dictFrom(const LoopTags& tags)
{
    py::dict made;
    for (const LoopTagValue& tag : loopTagRecord(tags))
        made[keyFrom(tag.name)] = objectFrom(tag.value);
    if (!tags.chunks.empty())
        made[keyFrom("chunks")] = listOf(tags.chunks);
    if (const auto sources = loopTagSources(tags); !sources.empty()) {
        py::dict ofTags;
        for (const auto& [name, chunk] : sources)
            ofTags[keyFrom(name)] = keyFrom(chunk);
        made[keyFrom("sources")] = ofTags;
    }
    if (!tags.sampler.loops.empty())
        made[keyFrom("loops")] = listOf(tags.sampler.loops);
    if (!tags.sampler.markers.empty())
        made[keyFrom("markers")] = listOf(tags.sampler.markers);
    if (!tags.transients.empty())
        made[keyFrom("transients")] = listOf(tags.transients);
    return made;
}

py::dict tagsOf(const std::string& path)
{
    LoopTags tags;
    {
        const Unlocked unlocked;
        tags = readTags(path);
    }
    return dictFrom(tags);
}

bool isCalledLoop(const std::string& path)
{
    constexpr std::array extensions{"aif", "aiff", "aifc", "caf", "wav"};
    const CFileRef file(locationOf(path));
    return std::ranges::any_of(extensions, [&](const char* extension) { return file.HasExtension(extension); });
}

/// Nothing of a file that is no loop, as of one that is no known audio and is not called so; else its tags, or what is
/// wrong with it.
using Scanned = std::variant<std::monostate, LoopTags, Problem>;

Scanned scanned(const std::string& path)
try {
    platform::Error error;
    std::optional<LoopTags> tags = readLoopTags(locationOf(path), &error);
    if (tags)
        return tags->isLoop() ? Scanned(std::move(*tags)) : Scanned();
    const bool isOther = error.domain == kLoopTagsErrorDomain;
    if (isOther && error.code != static_cast<std::int64_t>(LoopTagsError::unknownFile))
        return {};
    // A link that leads nowhere is of interest only when it should lead to a loop.
    if (isCalledLoop(path) || (!isOther && ::access(path.c_str(), F_OK) == 0))
        throwProblem(path, error);
    return {};
} catch (const Problem& problem) {
    return problem;
} catch (const std::bad_alloc&) {
    return Problem(path, kStatusOutOfMemory, StatusText(kStatusOutOfMemory));
}

/// For each file None, a dictionary of its tags, or an Error.
py::list loopsOf(const std::vector<std::string>& paths)
{
    std::vector<Scanned> files;
    {
        const Unlocked unlocked;
        files.reserve(paths.size());
        for (const std::string& path : paths)
            files.push_back(scanned(path));
    }
    py::list made;
    for (const Scanned& file : files)
        if (const auto* const tags = std::get_if<LoopTags>(&file))
            made.append(dictFrom(*tags));
        else if (const auto* const problem = std::get_if<Problem>(&file))
            made.append(exceptionFrom(*problem));
        else
            made.append(py::none());
    return made;
}

platform::Value valueFrom(const py::handle& value)
{
    if (value.is_none())
        return {};
    if (py::isinstance<py::str>(value))
        return value.cast<std::string>();
    if (py::isinstance<py::sequence>(value)) {
        platform::Array list;
        for (const py::handle each : py::reinterpret_borrow<py::sequence>(value))
            list.push_back(valueFrom(each));
        return list;
    }
    if (!py::isinstance<py::int_>(value))
        throw py::type_error("a tag is a number, a text, a list of texts, or None");
    return value.cast<std::int64_t>();
}

std::vector<LoopTagAssignment> assignmentsFrom(const py::dict& values)
{
    std::vector<LoopTagAssignment> assignments;
    for (const auto& [name, value] : values) {
        platform::Error error;
        const auto assignment = loopTagAssignment(name.cast<std::string>(), valueFrom(value), &error);
        if (!assignment)
            throw py::value_error(error.description);
        assignments.push_back(*assignment);
    }
    return assignments;
}

py::dict dictFrom(const std::vector<LoopTagChange>& changes)
{
    py::dict made;
    for (const LoopTagChange& change : changes)
        made[textFrom(change.key)] = py::make_tuple(objectFrom(change.from), objectFrom(change.to));
    return made;
}

using Plan = std::function<std::optional<LoopTagsPlan>(const LoopTags& before, const platform::URLRef& file,
                                                       platform::Error& error)>;

/// What changed.
std::vector<LoopTagChange> editTags(const std::string& path, const Editing& editing, const Plan& makePlan)
{
    platform::Error error;
    LoopTagsPlan plan;
    editSafely(
        path, editing,
        [&](const std::string& target) -> std::optional<EditScope> {
            const platform::URLRef file = locationOf(target);
            const std::optional<LoopTags> before = readOwnLoopTags(file, &error);
            std::optional<LoopTagsPlan> made = before ? makePlan(*before, file, error) : std::nullopt;
            if (!made)
                throwProblem(path, error);
            plan = std::move(*made);
            return plan.changes.empty() ? std::nullopt : std::optional(EditScope::ofLoopTags());
        },
        [&](const std::string& copy) {
            if (!carryOutLoopTagsPlan(locationOf(copy), plan, &error))
                throwProblem(path, error);
        });
    return plan.changes;
}

py::dict setTags(const std::string& path, const py::dict& values, bool inPlace, bool backup, bool keepTimes,
                 Timeout timeout)
{
    const std::vector<LoopTagAssignment> assignments = assignmentsFrom(values);
    std::vector<LoopTagChange> changes;
    {
        const Unlocked unlocked;
        changes = editTags(path, {inPlace, backup, keepTimes, timeout},
                           [&](const LoopTags& before, const platform::URLRef& file, platform::Error& error) {
                               return planLoopTagAssignments(before, file, assignments, &error);
                           });
    }
    return dictFrom(changes);
}

py::dict removeTags(const std::string& path, bool inPlace, bool backup, bool keepTimes, Timeout timeout)
{
    std::vector<LoopTagChange> changes;
    {
        const Unlocked unlocked;
        changes = editTags(path, {inPlace, backup, keepTimes, timeout},
                           [](const LoopTags& before, const platform::URLRef& file, platform::Error& error) {
                               return planLoopTagsRemoval(before, file, &error);
                           });
    }
    return dictFrom(changes);
}

} // namespace

void bindTags(py::module_& module)
{
    module.def("tags", &tagsOf, py::arg("path"));
    module.def("loops", &loopsOf, py::arg("paths"));
    module.def("set_tags", &setTags, py::arg("path"), py::arg("values"), py::arg("in_place"), py::arg("backup"),
               py::arg("keep_times"), py::arg("timeout"));
    module.def("remove_tags", &removeTags, py::arg("path"), py::arg("in_place"), py::arg("backup"),
               py::arg("keep_times"), py::arg("timeout"));
}
