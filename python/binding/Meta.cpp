// What files say about themselves, field by field, under the names that `ktfiles meta --json` has.
#include "binding/Bindings.h"
#include "binding/Interpreter.h"
#include "binding/Location.h"
#include "binding/Problem.h"
#include "binding/Values.h"

#include "audiofile/fields/FileMetadata.h"

#include <pybind11/stl.h>

#include <cmath>

namespace py = pybind11;

namespace {

FileMetadata readFields(const std::string& path, const std::vector<std::string>& groups)
{
    const Unlocked unlocked;
    platform::Error error;
    std::optional<FileMetadata> metadata = ReadMetadataFields(referenceTo(path), groups, &error);
    if (!metadata)
        throwProblem(path, error);
    return std::move(*metadata);
}

struct ValueMaker {
    py::object operator()(const std::string& text) const { return textFrom(text); }
    py::object operator()(double number) const
    {
        return std::isfinite(number) ? py::object(py::float_(number)) : py::none(); // as JSON has it
    }
    py::object operator()(std::int64_t number) const { return py::int_(number); }
    py::object operator()(std::uint64_t number) const { return py::int_(number); }
};

py::dict dictFrom(const MetaField& field)
{
    py::dict made;
    made[keyFrom("field")] = textFrom(field.fullName());
    made[keyFrom("value")] = std::visit(ValueMaker(), field.value);
    if (!field.words.empty())
        made[keyFrom("words")] = textFrom(field.words);
    if (field.seconds && std::isfinite(*field.seconds))
        made[keyFrom("seconds")] = *field.seconds;
    if (field.byteSize)
        made[keyFrom("size")] = *field.byteSize;
    if (!field.ascii.empty())
        made[keyFrom("ascii")] = textFrom(field.ascii);
    if (field.encoding != nullptr)
        made[keyFrom("encoding")] = field.encoding;
    if (field.chunk != 0) {
        made[keyFrom("chunk")] = fourCCText(field.chunk);
        made[keyFrom("offset")] = field.offset;
    }
    return made;
}

py::list metaFields(const std::string& path, const std::vector<std::string>& groups)
{
    const FileMetadata metadata = readFields(path, groups);
    py::list made;
    for (const MetaField& field : metadata.fields)
        made.append(dictFrom(field));
    return made;
}

/// By their names alone.
py::dict metaValues(const std::string& path, const std::vector<std::string>& groups)
{
    const FileMetadata metadata = readFields(path, groups);
    py::dict made;
    for (const MetaField& field : metadata.fields)
        made[textFrom(field.fullName())] = std::visit(ValueMaker(), field.value);
    return made;
}

} // namespace

void bindMeta(py::module_& module)
{
    module.def("meta", &metaValues, py::arg("path"), py::arg("groups"));
    module.def("meta_fields", &metaFields, py::arg("path"), py::arg("groups"));
}
