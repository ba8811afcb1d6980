// The chunks of containers: listed, read, added and removed.
#include "binding/Bindings.h"
#include "binding/Editing.h"
#include "binding/Interpreter.h"
#include "binding/Location.h"
#include "binding/Problem.h"

#include "audiofile/ContainerChanges.h"

#include <pybind11/stl.h>

#include <tuple>

namespace py = pybind11;

namespace {

/// The id, where its header and its body begin, and how long the body says that it is.
using ListedChunk = std::tuple<FourCC, std::int64_t, std::int64_t, std::int64_t>;

std::vector<ListedChunk> listChunks(const std::string& path)
{
    const Unlocked unlocked;
    CAudioFileIO file;
    require(path, OpenContainer(file, referenceTo(path), 0));
    std::vector<ListedChunk> chunks;
    require(path, file.ForEachChunk([&](const ChunkEntry& entry) {
        chunks.emplace_back(entry.id, entry.offset, entry.body, entry.size);
        return true;
    }));
    return chunks;
}

/// The chunk that the library answers with; none where there is none of the id.
std::optional<ChunkEntry> findWholeChunk(const std::string& path, CAudioFileIO& file, FourCC id)
{
    require(path, OpenContainer(file, referenceTo(path), 0));
    ChunkSurvey survey;
    require(path, SurveyChunks(file, id, survey));
    if (!survey.found)
        return std::nullopt;
    const std::int64_t there = std::max<std::int64_t>(survey.extent.fileLength - survey.found->body, 0);
    if (survey.found->size < 0 || survey.found->size > there)
        throw Problem(path, kStatusEndOfFile,
                      "its chunk \"" + fourCCText(id) + "\" claims " + std::to_string(survey.found->size) +
                          " bytes, but " + std::to_string(there) + " are there");
    return survey.found;
}

/// None where there is none.
py::object readChunk(const std::string& path, FourCC id)
{
    CAudioFileIO file;
    std::optional<ChunkEntry> chunk;
    {
        const Unlocked unlocked;
        chunk = findWholeChunk(path, file, id);
    }
    if (!chunk)
        return py::none();
    PyObject* const made = PyBytes_FromStringAndSize(nullptr, chunk->size); // not filled
    if (made == nullptr)
        throw py::error_already_set();
    auto bytes = py::reinterpret_steal<py::bytes>(made);
    char* const to = PyBytes_AS_STRING(made);
    {
        const Unlocked unlocked;
        constexpr std::int64_t piece = 16 << 20;
        for (std::int64_t done = 0; done < chunk->size; done += piece) {
            if (done > 0)
                heedSignals();
            require(path, file.Read(to + done, chunk->body + done,
                                    static_cast<long>(std::min(piece, chunk->size - done)), nullptr));
        }
    }
    return bytes;
}

std::string objectionText(const ChunkObjection& objection, FourCC id)
{
    const std::string name = '"' + fourCCText(id) + '"';
    switch (objection.kind) {
    case ChunkObjection::Kind::none:
        return {};
    case ChunkObjection::Kind::oneOnly:
        return "it has a chunk " + name + ", which describes or holds its sound, and has room for one only";
    case ChunkObjection::Kind::soundLost:
        return "the chunk " + name + " describes or holds its sound, which would be lost";
    case ChunkObjection::Kind::tail:
        return "what stands behind its last chunk would be written over or hidden";
    }
    return {};
}

void refuse(const std::string& path, const ChunkObjection& objection, FourCC id)
{
    if (objection)
        throw Problem(path, kStatusParameterError, objectionText(objection, id));
}

std::string addChunk(const std::string& path, FourCC id, const py::buffer& body, bool replaces, bool isForced,
                     bool inPlace, bool backup, bool keepTimes, Timeout timeout)
{
    const py::buffer_info info = body.request();
    if (PyBuffer_IsContiguous(info.view(), 'C') == 0)
        throw py::value_error("the data is not contiguous");
    const BytesView bytes(static_cast<const std::byte*>(info.ptr), static_cast<std::size_t>(info.size * info.itemsize));
    const Unlocked unlocked;
    return editSafely(
        path, {inPlace, backup, keepTimes, timeout},
        [&](const std::string& target) -> std::optional<EditScope> {
            CAudioFileIO file;
            ChunkSurvey survey;
            ChunkObjection objection;
            require(path, OpenContainer(file, referenceTo(target), 0));
            require(path, SurveyChunks(file, id, survey));
            require(path, ObjectToAdding(file, survey, id, objection));
            if (!isForced)
                refuse(path, objection, id);
            return objection ? EditScope::wholeFile() : EditScope::chunk(id);
        },
        [&](const std::string& copy) {
            require(path, AddChunkTo(referenceTo(copy), {id, bytes, replaces, isForced}));
        });
}

/// How many there were.
std::int64_t removeChunk(const std::string& path, FourCC id, bool isForced, bool inPlace, bool backup, bool keepTimes,
                         Timeout timeout)
{
    const Unlocked unlocked;
    std::int64_t count = 0;
    editSafely(
        path, {inPlace, backup, keepTimes, timeout},
        [&](const std::string& target) -> std::optional<EditScope> {
            CAudioFileIO file;
            ChunkSurvey survey;
            require(path, OpenContainer(file, referenceTo(target), 0));
            require(path, SurveyChunks(file, id, survey));
            count = survey.count;
            if (count == 0)
                return std::nullopt;
            const ChunkObjection objection = ObjectionToRemoving(survey, id);
            if (!isForced)
                refuse(path, objection, id);
            return objection ? EditScope::wholeFile() : EditScope::chunk(id);
        },
        [&](const std::string& copy) { require(path, RemoveChunksFrom(referenceTo(copy), id, count)); });
    return count;
}

} // namespace

void bindChunks(py::module_& module)
{
    module.def("list_chunks", &listChunks, py::arg("path"));
    module.def("read_chunk", &readChunk, py::arg("path"), py::arg("id"));
    module.def("add_chunk", &addChunk, py::arg("path"), py::arg("id"), py::arg("data"), py::arg("replace"),
               py::arg("force"), py::arg("in_place"), py::arg("backup"), py::arg("keep_times"), py::arg("timeout"));
    module.def("remove_chunk", &removeChunk, py::arg("path"), py::arg("id"), py::arg("force"), py::arg("in_place"),
               py::arg("backup"), py::arg("keep_times"), py::arg("timeout"));
}
