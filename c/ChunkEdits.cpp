// Chunks added and removed, by safe edits.
#include "audiofile/ContainerChanges.h"
#include "c/Calls.h"
#include "c/EditOptions.h"

#include <limits>
#include <string>

namespace {

std::string textOf(const ChunkObjection& objection, FourCC id)
{
    using Kind = ChunkObjection::Kind;
    const std::string chunk = "a chunk \"" + fourCCText(id) + "\", which describes or holds its sound";
    switch (objection.kind) {
    case Kind::none:
        break;
    case Kind::oneOnly:
        return "has " + chunk + ", and room for one only";
    case Kind::soundLost:
        return "would lose " + chunk;
    case Kind::tail:
        return "has data behind its last chunk that would be lost, or that one is not whole";
    }
    return "";
}

ktf_status failFor(const char* path, const ContainerProblem& problem)
{
    using Kind = ContainerProblem::Kind;
    switch (problem.kind) {
    case Kind::empty:
    case Kind::noContainer:
    case Kind::unknown:
    case Kind::onlyRead:
        return failCall(path, KTF_NOT_SUPPORTED, problem.Description());
    default:
        // The container's own small codes say which step failed, and are no statuses.
        const ktf_status status = problem.Status();
        return failCall(path, status > -10 && status < KTF_FAILED ? ktf_status{KTF_IO_ERROR} : status,
                        problem.Description());
    }
}

/// What is known of an edit once it has begun.
struct ChunkEdit {
    const char* path;
    FourCC id;
    bool isAdding;
    bool isForced;
    ChunkSurvey found = {};
    ChunkObjection objection = {};
};

/// Looks at the file that is to be changed, and says why it must not be.
ktf_status survey(const std::string& target, ChunkEdit& edit)
{
    CAudioFileIO file;
    ContainerProblem problem = OpenContainer(file, CFileRef(locationOfPath(target.c_str())), 0);
    if (!problem)
        problem = SurveyChunks(file, edit.id, edit.found);
    if (!problem && edit.isAdding)
        problem = ObjectToAdding(file, edit.found, edit.id, edit.objection);
    else if (!problem)
        edit.objection = ObjectionToRemoving(edit.found, edit.id);
    if (problem)
        return failFor(edit.path, problem);
    if (!edit.isAdding && edit.found.count == 0)
        return failCall(edit.path, KTF_NOT_THERE, "has no chunk \"" + fourCCText(edit.id) + "\"");
    return edit.objection && !edit.isForced ? failCall(edit.path, KTF_WOULD_LOSE, textOf(edit.objection, edit.id))
                                            : ktf_status{KTF_OK};
}

/// Runs an edit from its locks to its comparison; `change` changes the container that it is given.
template <class Change>
ktf_status runEdit(ChunkEdit& edit, const EditSettings& settings, Change change)
{
    CCoordinatedEdit safe;
    if (const FileProblem problem = safe.Begin(edit.path, settings.how))
        return failCall(edit.path, problem.Status(), problem.Description());
    if (const ktf_status status = survey(safe.Target(), edit); status != KTF_OK)
        return status;
    ContainerProblem failure;
    // What is forced may leave a file that cannot be walked, and so not be compared.
    const EditScope scope = edit.objection ? EditScope::wholeFile() : EditScope::chunk(edit.id);
    const FileProblem problem = safe.Apply(scope, [&](const std::string& copy) {
        failure = change(CFileRef(locationOfPath(copy.c_str())));
        return failure.Status();
    });
    if (failure)
        return failFor(edit.path, failure);
    if (safe.Difference())
        return failFor(edit.path, safe.Difference());
    return problem ? failCall(edit.path, problem.Status(), problem.Description()) : ktf_status{KTF_OK};
}

} // namespace

ktf_status ktf_add_chunk(const char* path, std::uint32_t id, const void* body, std::size_t size,
                         const ktf_edit_options* options)
{
    if (path == nullptr || (body == nullptr && size != 0))
        return failCallByNull(path);
    return guardedCall(path, [&]() -> ktf_status {
        if (id == 0)
            return failCall(path, KTF_PARAMETER_ERROR, "an id of four zero bytes cannot be told from no chunk");
        if (size > std::numeric_limits<std::uint32_t>::max())
            return failCall(path, KTF_FILE_TOO_BIG, "the chunk is too large for a container");
        EditSettings settings;
        if (const ktf_status status = readEditOptions(path, options, settings); status != KTF_OK)
            return status;
        const NewChunk chunk{.id = id,
                             .body = {static_cast<const std::byte*>(body), size},
                             .replaces = settings.hasFlag(KTF_EDIT_REPLACE),
                             .isForced = settings.hasFlag(KTF_EDIT_FORCE)};
        ChunkEdit edit{.path = path, .id = id, .isAdding = true, .isForced = chunk.isForced};
        return runEdit(edit, settings, [&](const CFileRef& copy) { return AddChunkTo(copy, chunk); });
    });
}

ktf_status ktf_remove_chunk(const char* path, std::uint32_t id, const ktf_edit_options* options)
{
    if (path == nullptr)
        return failCallByNull(path);
    return guardedCall(path, [&]() -> ktf_status {
        EditSettings settings;
        if (const ktf_status status = readEditOptions(path, options, settings); status != KTF_OK)
            return status;
        ChunkEdit edit{.path = path, .id = id, .isAdding = false, .isForced = settings.hasFlag(KTF_EDIT_FORCE)};
        return runEdit(edit, settings,
                       [&](const CFileRef& copy) { return RemoveChunksFrom(copy, id, edit.found.count); });
    });
}
